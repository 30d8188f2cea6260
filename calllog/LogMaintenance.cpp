#include "calllog/LogMaintenance.h"

#include "calllog/LogConnection.h"
#include "db/FbStatement.h"
#include "db/FbTransaction.h"
#include "db/TDM2.h"
#include "ui/dialogs/BusyCursor.h"
#include "platform/Clock.h"
#include "platform/DialogService.h"
#include "platform/ErrorLog.h"
#include "platform/WindowMessages.h"
#include "ui/calendar/PlannerCalendar.h"
#include "ui/frames/LogListFrame.h"

namespace orvanta {

namespace {

const QString kDateFormat = QStringLiteral("dd.MM.yyyy");

// Shorthand for the check every operation starts with.
bool connected(TDM2* dm)
{
    return logDatabaseConnected(dm);
}

// A failed operation leaves nothing open or half-done behind and says what went wrong.
template <typename Query>
bool abandon(Query& query, FbTransaction& tx, const QString& failure, const std::exception& e)
{
    query.close();
    tx.rollbackQuietly();
    reportError(failure, &e);
    return false;
}

// Keeps the calendar from repainting while its marks change.
class FrozenCalendar final {
public:
    explicit FrozenCalendar(PlannerCalendar* calendar)
        : m_calendar(calendar)
    {
        if (m_calendar)
            m_calendar->beginUpdate();
    }
    ~FrozenCalendar()
    {
        if (m_calendar)
            m_calendar->endUpdate();
    }
    FrozenCalendar(const FrozenCalendar&) = delete;
    FrozenCalendar& operator=(const FrozenCalendar&) = delete;

private:
    PlannerCalendar* m_calendar;
};

} // namespace

LogMaintenance::LogMaintenance(TDM2* dm)
    : m_dm(dm)
{
}

std::recursive_mutex& LogMaintenance::processLock()
{
    static std::recursive_mutex lock;
    return lock;
}

bool LogMaintenance::gettinglogdates(PlannerCalendar& calendar)
{
    if (!connected(m_dm))
        return false;
    BusyCursor busy;
    calendar.clearEvents();
    std::lock_guard guard(processLock());
    FbTransaction& tx = m_dm->LogAllgemeinTS;
    DataSet& query = m_dm->LogAllgemeinQuery;
    try {
        query.close();
        query.setCommandText(QStringLiteral("SELECT DISTINCT TSDATE FROM LOG"));
        TDM2::restart(tx);
        query.open();
        if (!query.isActive()) {
            tx.rollbackQuietly();
            reportError(QStringLiteral("# Orvanta - gettinglogdates\r\nTabelle konnte nicht geöffnet werden!\r\n"
                                       "Vorhandene Protokolleinträge konnten nicht ermittelt werden."));
            return false;
        }
        for (query.first(); !query.eof(); query.next()) {
            const DataSetField field = query.fieldByName(u"TSDATE");
            if (field.isNull())
                continue;
            const QDate day = field.asDate();
            calendar.addEvent(day, QStringLiteral("Protokoll vom ") + day.toString(kDateFormat));
        }
        query.close();
        TDM2::commitIfActive(tx);
        return true;
    } catch (const std::exception& e) {
        return abandon(query, tx,
                       QStringLiteral("# Orvanta - gettinglogdates\r\nTabelle konnte nicht geöffnet werden!\r\n"
                                      "Vorhandene Protokolleinträge konnten nicht ermittelt werden."),
                       e);
    }
}

bool LogMaintenance::markLogDays(int mode, const LogMarkContext& context)
{
    if (!context.calendar)
        return false;
    FrozenCalendar frozen(context.calendar);
    PlannerCalendar& calendar = *context.calendar;
    const bool ok = gettinglogdates(calendar);
    if (mode != 1 || !ok || !context.frame || !context.calendarViewShown)
        return ok;
    LogListFrame& frame = *context.frame;
    if (calendar.hasEvents()) {
        frame.setNoLog(false);
        frame.setBusy(false);
        if (calendar.hasEvent(frame.logDay())) {
            calendar.setDate(frame.logDay());
        } else {
            const QDate latest = calendar.latestEventDay(QDate(1900, 1, 1));
            calendar.setDate(latest);
            frame.setLogDay(latest);
            frame.OpenDBonDay(latest);
        }
    } else {
        const QDate today = Clock::today();
        calendar.setDate(today);
        frame.setLogDay(today);
        frame.OpenDBonDay(today);
        frame.setBusy(true);
        frame.setNoLog(true);
        frame.setCaptionText(QStringLiteral("Kein Protokoll vorhanden."));
    }
    return ok;
}

bool LogMaintenance::deleteWhere(const QString& sql, const QString& param, const QVariant& value, const QString& label,
                                 QObject* mainWindow)
{
    if (!connected(m_dm))
        return false;
    BusyCursor busy;
    std::lock_guard guard(processLock());
    FbTransaction& tx = m_dm->LogAllgemeinTS;
    DataSet& query = m_dm->LogAllgemeinQuery;
    try {
        query.close();
        query.setCommandText(sql);
        query.setParam(param, value);
        TDM2::restart(tx);
        query.execSQL();
        if (mainWindow)
            postMessage(mainWindow, WMUPDATEVOICEBOXGRID, 0, 0);
        query.close();
        tx.commit();
        return true;
    } catch (const std::exception& e) {
        return abandon(query, tx, label, e);
    }
}

bool LogMaintenance::DeleteLogItem(int lid, QObject* mainWindow)
{
    return deleteWhere(QStringLiteral("DELETE FROM LOG WHERE LID = :ID"), QStringLiteral("ID"), lid,
                       QStringLiteral("# Orvanta - DeleteLogItem"), mainWindow);
}

bool LogMaintenance::DeleteLogDay(QDate day, QObject* mainWindow)
{
    return deleteWhere(QStringLiteral("DELETE FROM LOG WHERE TSDATE = :DT"), QStringLiteral("DT"), day,
                       QStringLiteral("# Orvanta - DeleteLogDay"), mainWindow);
}

bool LogMaintenance::GetFromphoneByLog(int lid, QString& number)
{
    number.clear();
    if (!connected(m_dm))
        return false;
    const QString head = QStringLiteral("# Orvanta - GetFromphoneByLog\r\n");
    const QString tail = QStringLiteral("\r\nAufgabe kann nicht durchgeführt werden.");
    FbTransaction& tx = m_dm->GetFromTS;
    DataSet& query = m_dm->GetFromNr;
    try {
        query.close();
        TDM2::restart(tx);
        query.setParam(QStringLiteral("ID"), lid);
        query.open();
        QString failure;
        if (!query.isActive())
            failure = QStringLiteral("Eine benötigte Tabelle konnte nicht geöffnet werden!");
        else if (query.rowCount() < 1)
            failure = QStringLiteral("Der Protokolleintrag konnte in der Datenbank nicht gefunden werden!");
        else if ((number = (query.first(), query.fieldByName(u"FROMPHONE").asString())).isEmpty())
            failure = QStringLiteral("Die Telefonnummer des Anrufers im Protokolleintrag ist leer!");
        query.close();
        TDM2::commitIfActive(tx);
        if (!failure.isEmpty()) {
            number.clear();
            reportError(head + failure + tail);
            return false;
        }
        return true;
    } catch (const std::exception& e) {
        query.close();
        tx.rollbackQuietly();
        number.clear();
        reportError(head + QStringLiteral("Eine benötigte Tabelle konnte nicht geöffnet werden!") + tail, &e);
        return false;
    }
}

int LogMaintenance::CheckOfNumber(const QString& number)
{
    const QString failure = QStringLiteral("# Orvanta - CheckOfNumber\r\nRufnummer konnte nicht überprüft werden!\r\n"
                                           "Die Bearbeitung wird abgebrochen.");
    if (!connected(m_dm))
        return 2;
    FbTransaction& tx = m_dm->NumCheck_SQLTS;
    FbStatement& sql = m_dm->NumCheck_SQL;
    QString label;
    QString name;
    int key = 0;
    try {
        sql.close();
        sql.setSql(QStringLiteral("EXECUTE PROCEDURE P_SELECT_LOG_CONTACT(:PHONENR)"));
        sql.setParam(QStringLiteral("PHONENR"), number);
        TDM2::restart(tx);
        sql.execute();
        label = sql.isNull(1) ? QString() : sql.asString(1);
        name = sql.isNull(2) ? QString() : sql.asString(2);
        key = sql.isNull(3) ? 0 : sql.asInt(3);
        sql.close();
        tx.commit();
    } catch (const std::exception& e) {
        abandon(sql, tx, failure, e);
        return 2;
    }
    if (key <= 0)
        return 0;
    BusyCursor::resetCursor();
    const QString question = QStringLiteral("Die Rufnummer ist bereits als\r\n\"") + label + QStringLiteral("\"\r\n")
        + QStringLiteral("bei dem Kontakt") + QStringLiteral("\r\n\"") + name + QStringLiteral("\"\r\n")
        + QStringLiteral("hinterlegt!") + QStringLiteral("\r\n\r\n")
        + QStringLiteral("Möchten Sie die Logbucheinträge mit dem Kontakt verknüpfen?");
    if (dialogs().question(question) == DialogButton::Yes) {
        if (!LogbuchAnpassen(number, label, key, name))
            return 2;
        dialogs().information(QStringLiteral("Logbucheinträge wurden angepasst."));
    }
    return 1;
}

bool LogMaintenance::LogCheckOfNumber(const QString& number)
{
    if (!connected(m_dm))
        return false;
    FbTransaction& tx = m_dm->NumCheck_SQLTS;
    FbStatement& sql = m_dm->NumCheck_SQL;
    try {
        sql.close();
        sql.setSql(QStringLiteral("EXECUTE PROCEDURE P_GET_COUNT_OF_NUMBER(:PN)"));
        sql.setParam(QStringLiteral("PN"), number);
        TDM2::restart(tx);
        sql.execute();
        const bool found = !sql.isNull(0) && sql.asInt64(0) > 0;
        sql.close();
        tx.commit();
        return found;
    } catch (const std::exception& e) {
        return abandon(sql, tx, QStringLiteral("# Orvanta - LogCheckOfNumber"), e);
    }
}

bool LogMaintenance::LogbuchAnpassen(const QString& number, const QString& numberLabel, int contactKey,
                                     const QString& contactName)
{
    if (!connected(m_dm))
        return false;
    FbTransaction& tx = m_dm->NumCheck_SQLTS;
    FbStatement& sql = m_dm->NumCheck_SQL;
    try {
        sql.close();
        sql.setSql(QStringLiteral("UPDATE LOG SET FROMBEZ = :FB,FROMANSCHLUSS = :FA,CID = :C "
                                  "WHERE (FROMPHONE = :FP)or(FROMSUBB = :FS)"));
        sql.setParam(QStringLiteral("FB"), contactName);
        sql.setParam(QStringLiteral("FA"), numberLabel);
        sql.setParam(QStringLiteral("C"), contactKey);
        sql.setParam(QStringLiteral("FP"), number);
        sql.setParam(QStringLiteral("FS"), number);
        TDM2::restart(tx);
        sql.execute();
        tx.commit();
        return true;
    } catch (const std::exception& e) {
        tx.rollbackQuietly();
        reportError(QStringLiteral("# Orvanta - LogbuchAnpassen\r\nLogbuch konnte nicht angepasst werden!\r\n"
                                   "Die Bearbeitung wird abgebrochen."),
                    &e);
        return false;
    }
}

} // namespace orvanta
