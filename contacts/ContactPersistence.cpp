#include "contacts/ContactPersistence.h"

#include "contacts/ContactStatements.h"
#include "db/TDM2.h"
#include "db/TransactionWork.h"
#include "phone/PhoneNumbers.h"
#include "phone/TvkMiniKontakt.h"
#include "platform/ErrorLog.h"
#include "ui/dialogs/BusyCursor.h"

#include <QVariant>

namespace orvanta {

namespace {

using Field = TvkMiniKontakt::Field;

const QString kCancelled = QStringLiteral("\r\nDie Bearbeitung wird abgebrochen.");

QString textOf(const DataSet& q, QStringView field)
{
    return q.fieldIndex(field) < 0 ? QString() : q.fieldByName(field).asString();
}

// The contact's columns in the order both procedures take them after their key.
void bindContact(FbStatement& sql, const TvkMiniKontakt& r)
{
    sql.setParam(u"ANR", r.ANREDE());
    sql.setParam(u"VNA", r.VNAME());
    sql.setParam(u"NA", r.NAME());
    sql.setParam(u"FA", r.FIRMA());
    sql.setParam(u"TIT", r.TITEL());
    sql.setParam(u"CONTB", r.CONTBEZ());
    sql.setParam(u"WEB", r.WEBSITE());
    sql.setParam(u"ABT", r.ABTEILUNG());
    sql.setParam(u"KATB", r.KATBEZ());
    sql.setParam(u"ST", r.STR());
    sql.setParam(u"PL", r.PLZ());
    sql.setParam(u"OT", r.ORT());
    sql.setParam(u"ZUSA", r.ZUSATZ());
    sql.setParam(u"L", r.LAND());
    sql.setParam(u"BUND", r.BUNDESLAND());
    if (r.notes().isEmpty())
        sql.setNull(u"TEXT");
    else
        sql.setParam(u"TEXT", r.notes());
}

// Runs one entry's synchronising statement; false when the procedure refused it.
bool syncNumber(FbStatement& sql, const TvkKommItem& e, int contactKey)
{
    sql.setSql(QString::fromLatin1(contactsql::kSyncNumber));
    sql.setParam(u"L", e.LID);
    sql.setParam(u"C", contactKey);
    sql.setParam(u"KB", e.KOMMBEZ);
    sql.setParam(u"LC", e.LC);
    sql.setParam(u"V", e.VORW);
    sql.setParam(u"N", e.NUMBER);
    sql.setParam(u"VN", e.VORWNUMBER);
    sql.setParam(u"LCVN", e.LCVORWNUMBER);
    sql.setParam(u"BEM", e.BEMERKUNG);
    sql.setParam(u"AURE", e.AUTOREJECT ? 1 : 0);
    sql.setParam(u"NOF", e.NUMBEROF);
    sql.setParam(u"STAT", static_cast<int>(e.status));
    sql.execute();
    const bool ok = sql.isNull(0) || sql.asInt(0) == 0;
    sql.close();
    return ok;
}

bool syncMail(FbStatement& sql, const TvkMailItem& e, int contactKey)
{
    sql.setSql(QString::fromLatin1(contactsql::kSyncMail));
    sql.setParam(u"LID", e.LID);
    sql.setParam(u"CID", contactKey);
    sql.setParam(u"MAILADDR", e.MAILADDR);
    sql.setParam(u"BEMERK", e.BEMERK);
    sql.setParam(u"STATUS", static_cast<int>(e.status));
    sql.execute();
    const bool ok = sql.isNull(0) || sql.asInt(0) == 0;
    sql.close();
    return ok;
}

// Sends the entries that pass `send`; false at the first one the database refuses.
template <class Send>
bool syncEntries(FbStatement& sql, const TvkMiniKontakt& r, int contactKey, Send send)
{
    for (const TvkKommItem& e : r.KD())
        if (send(e.status) && !syncNumber(sql, e, contactKey))
            return false;
    for (const TvkMailItem& e : r.Mail())
        if (send(e.status) && !syncMail(sql, e, contactKey))
            return false;
    return true;
}

// The label of the first entry (not deleted) that is the caller's number in one of its forms.
QString matchingLabel(const TvkMiniKontakt& r, const QString& callerNumber)
{
    if (callerNumber.isEmpty())
        return {};
    const QString n = NormalizeNumber(callerNumber);
    if (n.isEmpty())
        return {};
    for (const TvkKommItem& e : r.KD())
        if (e.status != EntryStatus::Deleted && (e.VORWNUMBER == n || e.LCVORWNUMBER == n || e.NUMBEROF == n))
            return e.KOMMBEZ;
    return {};
}

// A stored record that could not be reloaded: it must not send its entries a second time (deleted
// ones stay hidden; sending them again deletes nothing more).
void markSaved(TvkMiniKontakt& r, int key)
{
    r.setLID(key);
    for (int i = 0; i < r.KD().size(); ++i)
        if (r.KD().at(i).status != EntryStatus::Deleted)
            r.setKDStatus(i, EntryStatus::Unchanged);
    for (int i = 0; i < r.Mail().size(); ++i)
        if (r.Mail().at(i).status != EntryStatus::Deleted)
            r.setMailStatus(i, EntryStatus::Unchanged);
}

} // namespace

bool GetDSID_Data(TDM2& dm, TvkMiniKontakt* record, int lid)
{
    const QString head = QStringLiteral("# Orvanta - GetDSID_Data");
    const QString tail = QStringLiteral("\r\nAufgabe kann nicht durchgeführt werden.");
    if (!record) {
        reportError(head + QStringLiteral("\r\nTyp zum Vorhalten der Daten ist nicht initialisiert!") + tail);
        return false;
    }
    if (!dm.DBConnect())
        return false;
    BusyCursor busy;
    DataSet& q = dm.GetKontakt;
    TvkMiniKontakt loaded;
    QString failure;
    const bool ok = runInTransaction(dm.KontaktTS, head, [&] {
        q.close();
        q.setCommandText(QString::fromLatin1(contactsql::kSelectDetail));
        q.setParam(QStringLiteral("id"), lid);
        q.open();
        if (!q.isActive()) {
            failure = QStringLiteral("Eine benötigte Tabelle konnte nicht geöffnet werden!");
            return false;
        }
        if (q.rowCount() < 1) {
            failure = QStringLiteral("Kontakt konnte in der Datenbank nicht gefunden werden!");
            return false;
        }
        q.first();
        loaded.setLID(q.fieldByName(u"LID").asInteger());
        const int notiz = q.fieldIndex(u"NOTIZ");
        const QByteArray note = notiz >= 0 ? q.store().bytes(0, notiz).toByteArray() : QByteArray();
        loaded.StoreNotes(note, QString::fromLatin1(note));
        static constexpr struct {
            Field field;
            const char16_t* column;
        } columns[] = {{Field::ANREDE, u"ANREDE"}, {Field::VNAME, u"VNAME"},         {Field::NAME, u"NAME"},
                       {Field::FIRMA, u"FIRMA"},   {Field::TITEL, u"TITEL"},         {Field::CONTBEZ, u"CONTBEZ"},
                       {Field::WEBSITE, u"WEBSITE"}, {Field::ABTEILUNG, u"ABTEILUNG"}, {Field::STR, u"STR"},
                       {Field::PLZ, u"PLZ"},       {Field::ORT, u"ORT"},             {Field::ZUSATZ, u"ZUSATZ"},
                       {Field::LAND, u"LAND"},     {Field::BUNDESLAND, u"BUNDESLAND"}, {Field::KATBEZ, u"KATBEZ"}};
        for (const auto& c : columns)
            loaded.setValue(c.field, textOf(q, c.column));
        q.close();

        q.setCommandText(QString::fromLatin1(contactsql::kSelectNumbers));
        q.setParam(QStringLiteral("id"), lid);
        q.open();
        for (q.first(); !q.eof(); q.next()) {
            TvkKommItem e;
            e.LID = q.fieldByName(u"LID").asInteger();
            e.CID = q.fieldByName(u"CID").asInteger();
            e.KOMMBEZ = textOf(q, u"KOMMBEZ");
            e.LC = textOf(q, u"LC");
            e.VORW = textOf(q, u"VORW");
            e.NUMBER = textOf(q, u"NUMBER");
            e.BEMERKUNG = textOf(q, u"BEMERKUNG");
            e.AUTOREJECT = q.fieldByName(u"AUTOREJECT").asInteger() == 1 ? 1 : 0;
            e.status = EntryStatus::Unchanged;
            loaded.AddKD(e);
        }
        q.close();

        q.setCommandText(QString::fromLatin1(contactsql::kSelectMails));
        q.setParam(QStringLiteral("id"), lid);
        q.open();
        for (q.first(); !q.eof(); q.next()) {
            TvkMailItem e;
            e.LID = q.fieldByName(u"LID").asInteger();
            e.CID = q.fieldByName(u"CID").asInteger();
            e.MAILADDR = textOf(q, u"MAILADDR");
            e.BEMERK = textOf(q, u"BEMERK");
            loaded.AddMail(e);
        }
        q.close();
        return true;
    });
    q.close();
    if (!ok) {
        if (!failure.isEmpty())
            reportError(head + QStringLiteral("\r\n") + failure + tail);
        return false;
    }
    *record = std::move(loaded);
    return true;
}

bool InsertConData(TDM2& dm, TvkMiniKontakt* record, const QString& callerNumber, const LogRelink& relink)
{
    const QString head = QStringLiteral("# Orvanta - InsertConData");
    if (!record) {
        reportError(head + QStringLiteral("\r\nDatentyp ist nicht initialisiert!\r\nKontakt kann nicht gespeichert werden."));
        return false;
    }
    if (!dm.DBConnect())
        return false;
    BusyCursor busy;
    FbStatement& sql = dm.IBSQL1;
    int newKey = 0;
    QString failure;
    const bool ok = runInTransaction(dm.IBSQLTS, head, [&] {
        sql.close();
        sql.setSql(QString::fromLatin1(contactsql::kInsertContact));
        bindContact(sql, *record);
        sql.execute();
        newKey = sql.isNull(0) ? 0 : sql.asInt(0);
        sql.close();
        if (newKey == 0) {
            failure = QStringLiteral("Datensatz für den Kontakt konnte nicht angelegt werden!");
            return false;
        }
        if (!syncEntries(sql, *record, newKey, [](EntryStatus s) { return s != EntryStatus::Deleted; })) {
            failure = QStringLiteral("Es ist ein Datenbankfehler bei der Bearbeitung der Kontaktdaten aufgetreten!");
            return false;
        }
        return true;
    });
    sql.close();
    if (!ok) {
        if (!failure.isEmpty())
            reportError(head + QStringLiteral("\r\n") + failure + kCancelled);
        return false;
    }
    const QString label = matchingLabel(*record, callerNumber);
    const QString contbez = record->CONTBEZ();
    if (!label.isEmpty() && relink) {
        BusyCursor::resetCursor();
        relink(callerNumber, label, newKey, contbez);
    }
    if (!GetDSID_Data(dm, record, newKey))
        markSaved(*record, newKey);
    return true;
}

bool EditConData(TDM2& dm, TvkMiniKontakt* record)
{
    const QString head = QStringLiteral("# Orvanta - EditConData");
    if (!record) {
        reportError(head + QStringLiteral("\r\nDatentyp ist nicht initialisiert!\r\nKontakt kann nicht gespeichert werden."));
        return false;
    }
    if (record->LID() < 1) {
        reportError(head + QStringLiteral("\r\nFehler bei der Ermittlung des Kontaktdatensatzes!\r\n"
                                          "Kontaktdaten können nicht gespeichert werden."));
        return false;
    }
    if (!dm.DBConnect())
        return false;
    BusyCursor busy;
    FbStatement& sql = dm.IBSQL1;
    const int key = record->LID();
    bool refused = false;
    const bool ok = runInTransaction(dm.IBSQLTS, head, [&] {
        sql.close();
        sql.setSql(QString::fromLatin1(contactsql::kEditContact));
        sql.setParam(u"E_LID", key);
        bindContact(sql, *record);
        sql.execute();
        const int result = sql.isNull(0) ? 0 : sql.asInt(0);
        sql.close();
        refused = result != 0
            || !syncEntries(sql, *record, key, [](EntryStatus s) { return s != EntryStatus::Unchanged; });
        return !refused;
    });
    sql.close();
    if (!ok) {
        if (refused)
            reportError(head + QStringLiteral("\r\nEs ist ein Datenbankfehler bei der Bearbeitung der Kontaktdaten "
                                              "aufgetreten!") + kCancelled);
        return false;
    }
    if (!GetDSID_Data(dm, record, key))
        markSaved(*record, key);
    return true;
}

} // namespace orvanta
