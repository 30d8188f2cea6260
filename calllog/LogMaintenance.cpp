#include "calllog/LogMaintenance.h"

#include "calllog/LogConnection.h"
#include "calllog/LogStatements.h"
#include "db/FbStatement.h"
#include "db/FbTransaction.h"
#include "db/TDM2.h"
#include "db/TransactionWork.h"
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
    const QString failure = QStringLiteral("# Orvanta - gettinglogdates\r\nTabelle konnte nicht geöffnet werden!\r\n"
                                           "Vorhandene Protokolleinträge konnten nicht ermittelt werden.");
    DataSet& query = m_dm->LogAllgemeinQuery;
    bool unopened = false;
    const bool ok = runInTransaction(m_dm->LogAllgemeinTS, failure, [&] {
        query.close();
        query.setCommandText(QString::fromLatin1(logsql::kSelectLogDays));
        query.open();
        if (!query.isActive()) {
            unopened = true;
            return false;
        }
        for (query.first(); !query.eof(); query.next()) {
            const DataSetField field = query.fieldByName(u"TSDATE");
            if (field.isNull())
                continue;
            const QDate day = field.asDate();
            calendar.addEvent(day, QStringLiteral("Protokoll vom ") + day.toString(kDateFormat));
        }
        return true;
    });
    query.close();
    if (unopened)
        reportError(failure);
    return ok;
}

bool LogMaintenance::markLogDays(DayMarking mode, const LogMarkContext& context)
{
    if (!context.calendar)
        return false;
    FrozenCalendar frozen(context.calendar);
    PlannerCalendar& calendar = *context.calendar;
    const bool ok = gettinglogdates(calendar);
    if (mode != DayMarking::MarksAndShowDay || !ok || !context.frame || !context.calendarViewShown)
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
    DataSet& query = m_dm->LogAllgemeinQuery;
    const bool ok = runInTransaction(m_dm->LogAllgemeinTS, label, [&] {
        query.close();
        query.setCommandText(sql);
        query.setParam(param, value);
        query.execSQL();
    });
    query.close();
    // The main window re-reads the log once the deletion is committed.
    if (ok && mainWindow)
        postMessage(mainWindow, WMUPDATEVOICEBOXGRID, 0, 0);
    return ok;
}

bool LogMaintenance::DeleteLogItem(int lid, QObject* mainWindow)
{
    return deleteWhere(QString::fromLatin1(logsql::kDeleteLogRecord), QStringLiteral("ID"), lid,
                       QStringLiteral("# Orvanta - DeleteLogItem"), mainWindow);
}

bool LogMaintenance::DeleteLogDay(QDate day, QObject* mainWindow)
{
    return deleteWhere(QString::fromLatin1(logsql::kDeleteLogDay), QStringLiteral("DT"), day,
                       QStringLiteral("# Orvanta - DeleteLogDay"), mainWindow);
}

bool LogMaintenance::GetFromphoneByLog(int lid, QString& number)
{
    number.clear();
    if (!connected(m_dm))
        return false;
    const QString head = QStringLiteral("# Orvanta - GetFromphoneByLog\r\n");
    const QString tail = QStringLiteral("\r\nAufgabe kann nicht durchgeführt werden.");
    const QString unopened = QStringLiteral("Eine benötigte Tabelle konnte nicht geöffnet werden!");
    DataSet& query = m_dm->GetFromNr;
    QString failure;
    const bool ok = runInTransaction(m_dm->GetFromTS, head + unopened + tail, [&] {
        query.close();
        query.setParam(QStringLiteral("ID"), lid);
        query.open();
        if (!query.isActive())
            failure = unopened;
        else if (query.rowCount() < 1)
            failure = QStringLiteral("Der Protokolleintrag konnte in der Datenbank nicht gefunden werden!");
        else if ((number = (query.first(), query.fieldByName(u"FROMPHONE").asString())).isEmpty())
            failure = QStringLiteral("Die Telefonnummer des Anrufers im Protokolleintrag ist leer!");
    });
    query.close();
    if (ok && failure.isEmpty())
        return true;
    number.clear();
    if (ok)
        reportError(head + failure + tail);
    return false;
}

NumberCheck LogMaintenance::CheckOfNumber(const QString& number)
{
    const QString failure = QStringLiteral("# Orvanta - CheckOfNumber\r\nRufnummer konnte nicht überprüft werden!\r\n"
                                           "Die Bearbeitung wird abgebrochen.");
    if (!connected(m_dm))
        return NumberCheck::Failed;
    FbStatement& sql = m_dm->NumCheck_SQL;
    QString label;
    QString name;
    int key = 0;
    const bool ok = runInTransaction(m_dm->NumCheck_SQLTS, failure, [&] {
        sql.close();
        sql.setSql(QString::fromLatin1(logsql::kSelectLogContact));
        sql.setParam(QStringLiteral("PHONENR"), number);
        sql.execute();
        label = sql.isNull(1) ? QString() : sql.asString(1);
        name = sql.isNull(2) ? QString() : sql.asString(2);
        key = sql.isNull(3) ? 0 : sql.asInt(3);
    });
    sql.close();
    if (!ok)
        return NumberCheck::Failed;
    if (key <= 0)
        return NumberCheck::NotStored;
    BusyCursor::resetCursor();
    const QString question = QStringLiteral("Die Rufnummer ist bereits als\r\n\"") + label + QStringLiteral("\"\r\n")
        + QStringLiteral("bei dem Kontakt") + QStringLiteral("\r\n\"") + name + QStringLiteral("\"\r\n")
        + QStringLiteral("hinterlegt!") + QStringLiteral("\r\n\r\n")
        + QStringLiteral("Möchten Sie die Logbucheinträge mit dem Kontakt verknüpfen?");
    if (dialogs().question(question) == DialogButton::Yes) {
        if (!LogbuchAnpassen(number, label, key, name))
            return NumberCheck::Failed;
        dialogs().information(QStringLiteral("Logbucheinträge wurden angepasst."));
    }
    return NumberCheck::Stored;
}

bool LogMaintenance::LogCheckOfNumber(const QString& number)
{
    if (!connected(m_dm))
        return false;
    FbStatement& sql = m_dm->NumCheck_SQL;
    bool found = false;
    const bool ok = runInTransaction(m_dm->NumCheck_SQLTS, QStringLiteral("# Orvanta - LogCheckOfNumber"), [&] {
        sql.close();
        sql.setSql(QString::fromLatin1(logsql::kCountOfNumber));
        sql.setParam(QStringLiteral("PN"), number);
        sql.execute();
        found = !sql.isNull(0) && sql.asInt64(0) > 0;
    });
    sql.close();
    return ok && found;
}

bool LogMaintenance::LogbuchAnpassen(const QString& number, const QString& numberLabel, int contactKey,
                                     const QString& contactName)
{
    if (!connected(m_dm))
        return false;
    const QString failure = QStringLiteral("# Orvanta - LogbuchAnpassen\r\nLogbuch konnte nicht angepasst werden!\r\n"
                                           "Die Bearbeitung wird abgebrochen.");
    FbStatement& sql = m_dm->NumCheck_SQL;
    return runInTransaction(m_dm->NumCheck_SQLTS, failure, [&] {
        sql.close();
        sql.setSql(QString::fromLatin1(logsql::kRelinkLog));
        sql.setParam(QStringLiteral("FB"), contactName);
        sql.setParam(QStringLiteral("FA"), numberLabel);
        sql.setParam(QStringLiteral("C"), contactKey);
        sql.setParam(QStringLiteral("FP"), number);
        sql.setParam(QStringLiteral("FS"), number);
        sql.execute();
    });
}

} // namespace orvanta
