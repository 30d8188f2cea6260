#include "contacts/ContactDeletion.h"
#include "contacts/ContactPersistence.h"
#include "db/TDM2.h"
#include "phone/TvkMiniKontakt.h"
#include "tests/contacts/ContactTestEnv.h"
#include "tests/support/TestRegistry.h"

#include <QTest>

using namespace orvanta;
using orvanta::test::ContactTestEnv;

namespace {

TvkKommItem number(const QString& label, const QString& lc, const QString& vorw, const QString& nr,
                   EntryStatus status = EntryStatus::New)
{
    TvkKommItem e;
    e.KOMMBEZ = label;
    e.LC = lc;
    e.VORW = vorw;
    e.NUMBER = nr;
    e.status = status;
    return e;
}

TvkMailItem mail(const QString& addr, const QString& remark)
{
    TvkMailItem e;
    e.MAILADDR = addr;
    e.BEMERK = remark;
    e.status = EntryStatus::New;
    return e;
}

int count(ContactTestEnv& env, const QString& sql)
{
    return env.db().scalar(sql).toInt();
}

QStringList numbersOf(ContactTestEnv& env, int cid)
{
    DataSet& q = env.dm().GetDetailQuery;
    q.close();
    q.setCommandText(QStringLiteral("SELECT KOMMBEZ, LC, VORW, NUMBER, NUMBEROF, VORWNUMBER FROM COM WHERE CID = %1 "
                                    "ORDER BY KOMMBEZ").arg(cid));
    q.open();
    QStringList out;
    for (q.first(); !q.eof(); q.next())
        out << q.fieldByName(u"KOMMBEZ").asString() + QLatin1Char('|') + q.fieldByName(u"LC").asString()
                + QLatin1Char('|') + q.fieldByName(u"VORW").asString() + QLatin1Char('|')
                + q.fieldByName(u"NUMBER").asString() + QLatin1Char('|') + q.fieldByName(u"NUMBEROF").asString()
                + QLatin1Char('|') + q.fieldByName(u"VORWNUMBER").asString();
    q.close();
    env.dm().DetailTS.rollbackQuietly();
    return out;
}

} // namespace

class TstContactPersistence : public QObject {
    Q_OBJECT

private Q_SLOTS:
    void aNewContactIsStoredWhole_andDeletedEntriesAreNotSent()
    {
        ContactTestEnv env;
        env.db().exec(QStringLiteral("INSERT INTO KAT (LID, KATBEZ) VALUES (3, 'Kunden')"));
        TvkMiniKontakt r;
        r.setANREDE(QStringLiteral("Herr"));
        r.setVNAME(QStringLiteral("Jürgen"));
        r.setNAME(QStringLiteral("Müller"));
        r.setFIRMA(QStringLiteral("Bäckerei € & Söhne"));
        r.setCONTBEZ(QStringLiteral("Bäckerei € & Söhne / Müller, Jürgen"));
        r.setORT(QStringLiteral("München"));
        r.setKATBEZ(QStringLiteral("Kunden"));
        r.StoreNotes(QByteArray("{\\rtf1 Notiz}"), QStringLiteral("Notiz"));
        r.AddKD(number(QStringLiteral("Büro"), QStringLiteral("0049"), QStringLiteral("089"), QStringLiteral("123 45-6")));
        const int gone = r.AddKD(number(QStringLiteral("Alt"), {}, {}, QStringLiteral("999")));
        r.DeleteKD(gone);
        r.AddMail(mail(QStringLiteral("j@mueller.de"), QStringLiteral("privat")));

        QVERIFY(InsertConData(env.dm(), &r));
        QCOMPARE(env.dialogs().count(), 0);
        const int lid = r.LID();
        QVERIFY(lid > 0);
        QCOMPARE(count(env, QStringLiteral("SELECT COUNT(*) FROM CONTACT")), 1);
        QCOMPARE(numbersOf(env, lid), QStringList{QStringLiteral("Büro|0049|089|123 45-6|123456|89123456")});
        QCOMPARE(count(env, QStringLiteral("SELECT COUNT(*) FROM E_MAIL WHERE CID = %1").arg(lid)), 1);
        QCOMPARE(count(env, QStringLiteral("SELECT KID FROM CONKAT WHERE CID = %1").arg(lid)), 3);

        // The record was reloaded from the database: the deleted entry is gone, the rest unchanged.
        QCOMPARE(r.KD().size(), 1);
        QCOMPARE(r.KD().at(0).status, EntryStatus::Unchanged);
        QVERIFY(r.KD().at(0).LID > 0);
        TvkMiniKontakt again;
        QVERIFY(GetDSID_Data(env.dm(), &again, lid));
        QCOMPARE(again.FIRMA(), QStringLiteral("Bäckerei € & Söhne"));
        QCOMPARE(again.VNAME(), QStringLiteral("Jürgen"));
        QCOMPARE(again.ORT(), QStringLiteral("München"));
        QCOMPARE(again.KATBEZ(), QStringLiteral("Kunden"));
        QCOMPARE(again.notes(), QByteArray("{\\rtf1 Notiz}"));
        QCOMPARE(again.Mail().at(0).BEMERK, QStringLiteral("privat"));
    }

    void aSaveThatFailsHalfWayLeavesNoPartialContact()
    {
        ContactTestEnv env;
        // The database fails on the second number, after the contact row and the first number.
        env.db().exec(QStringLiteral("CREATE EXCEPTION E_LINE_LOST 'Verbindung verloren';\n"
                                     "SET TERM ^ ;\n"
                                     "CREATE TRIGGER T_FAIL FOR COM BEFORE INSERT AS BEGIN\n"
                                     "  IF (NEW.NUMBER = '666') THEN EXCEPTION E_LINE_LOST;\n"
                                     "END^\n"
                                     "SET TERM ; ^\n"));
        TvkMiniKontakt r;
        r.setNAME(QStringLiteral("Teilweise"));
        r.AddKD(number(QStringLiteral("Erst"), {}, QStringLiteral("030"), QStringLiteral("111")));
        r.AddKD(number(QStringLiteral("Zweit"), {}, QStringLiteral("030"), QStringLiteral("666")));
        r.AddMail(mail(QStringLiteral("a@b.de"), {}));
        QVERIFY(!InsertConData(env.dm(), &r));
        QCOMPARE(count(env, QStringLiteral("SELECT COUNT(*) FROM CONTACT")), 0);
        QCOMPARE(count(env, QStringLiteral("SELECT COUNT(*) FROM COM")), 0);
        QCOMPARE(count(env, QStringLiteral("SELECT COUNT(*) FROM ADDR")), 0);
        QCOMPARE(env.dialogs().count(), 1);
        QVERIFY(env.dialogs().last().text.startsWith(QStringLiteral("# Orvanta - InsertConData\r\n")));
        QVERIFY(env.dialogs().last().text.contains(QStringLiteral("E_LINE_LOST")));
        // The record is as the user left it, ready to be saved again.
        QCOMPARE(r.LID(), 0);
        QCOMPARE(r.NAME(), QStringLiteral("Teilweise"));
        QCOMPARE(r.KD().size(), 2);
        QCOMPARE(r.KD().at(0).status, EntryStatus::New);
        QVERIFY(!env.dm().IBSQLTS.isActive());

        // A refused entry (result code, no exception) rolls back just the same.
        env.db().exec(QStringLiteral("DROP TRIGGER T_FAIL"));
        env.add(9, QStringLiteral("Fremd"));
        env.addNumber(90, 9, {}, {}, QStringLiteral("1"), QStringLiteral("Fremd"), 0, {});
        TvkMiniKontakt s;
        s.setNAME(QStringLiteral("Dieb"));
        TvkKommItem foreign = number(QStringLiteral("X"), {}, {}, QStringLiteral("2"), EntryStatus::Changed);
        foreign.LID = 90;
        s.AddKD(foreign);
        QVERIFY(!InsertConData(env.dm(), &s));
        QCOMPARE(env.dialogs().last().text,
                 QStringLiteral("# Orvanta - InsertConData\r\nEs ist ein Datenbankfehler bei der Bearbeitung der "
                                "Kontaktdaten aufgetreten!\r\nDie Bearbeitung wird abgebrochen."));
        QCOMPARE(count(env, QStringLiteral("SELECT COUNT(*) FROM CONTACT")), 1);
    }

    void editingSendsChangedNewAndDeletedEntries()
    {
        ContactTestEnv env;
        env.add(5, QStringLiteral("Huber"));
        env.addNumber(51, 5, {}, QStringLiteral("030"), QStringLiteral("111"), QStringLiteral("Alt"), 0, {});
        env.addNumber(52, 5, {}, QStringLiteral("030"), QStringLiteral("222"), QStringLiteral("Bleibt"), 0, {});
        env.addNumber(53, 5, {}, QStringLiteral("030"), QStringLiteral("333"), QStringLiteral("Weg"), 0, {});
        env.addMail(61, 5, QStringLiteral("alt@h.de"), {});
        TvkMiniKontakt r;
        QVERIFY(GetDSID_Data(env.dm(), &r, 5));
        QCOMPARE(r.KD().size(), 3);
        r.setVNAME(QStringLiteral("Hans"));
        r.EditKD(number(QStringLiteral("Geändert"), QStringLiteral("0049"), QStringLiteral("030"), QStringLiteral("444")), 0);
        r.DeleteKD(2);
        r.AddKD(number(QStringLiteral("Neu"), {}, QStringLiteral("089"), QStringLiteral("555")));
        const int shortLived = r.AddKD(number(QStringLiteral("Kurz"), {}, {}, QStringLiteral("777")));
        r.DeleteKD(shortLived);
        r.EditMail(mail(QStringLiteral("neu@h.de"), QStringLiteral("jetzt")), 0);
        QVERIFY(EditConData(env.dm(), &r));
        QCOMPARE(env.dialogs().count(), 0);
        QCOMPARE(numbersOf(env, 5), (QStringList{QStringLiteral("Bleibt||030|222||"),
                                                 QStringLiteral("Geändert|0049|030|444|444|30444"),
                                                 QStringLiteral("Neu||089|555|555|89555")}));
        QCOMPARE(count(env, QStringLiteral("SELECT COUNT(*) FROM COM WHERE LID = 51")), 1); // changed in place
        QCOMPARE(env.db().scalar(QStringLiteral("SELECT MAILADDR FROM E_MAIL WHERE LID = 61")).toString(),
                 QStringLiteral("neu@h.de"));
        QCOMPARE(env.db().scalar(QStringLiteral("SELECT VNAME FROM CONTACT WHERE LID = 5")).toString(),
                 QStringLiteral("Hans"));
        QCOMPARE(r.KD().size(), 3);
        for (const TvkKommItem& e : r.KD())
            QCOMPARE(e.status, EntryStatus::Unchanged);
    }

    void aContactDeletedMeanwhileIsReportedAndTheRecordKept()
    {
        ContactTestEnv env;
        env.add(5, QStringLiteral("Huber"));
        TvkMiniKontakt r;
        QVERIFY(GetDSID_Data(env.dm(), &r, 5));
        r.setFIRMA(QStringLiteral("Getippt"));
        r.AddKD(number(QStringLiteral("Neu"), {}, {}, QStringLiteral("1")));
        QVERIFY(DeleteDS(env.dm(), 5));
        QVERIFY(!EditConData(env.dm(), &r));
        QCOMPARE(env.dialogs().last().text,
                 QStringLiteral("# Orvanta - EditConData\r\nEs ist ein Datenbankfehler bei der Bearbeitung der "
                                "Kontaktdaten aufgetreten!\r\nDie Bearbeitung wird abgebrochen."));
        QCOMPARE(r.FIRMA(), QStringLiteral("Getippt"));
        QCOMPARE(r.KD().at(0).status, EntryStatus::New);
        QCOMPARE(count(env, QStringLiteral("SELECT COUNT(*) FROM COM")), 0);

        TvkMiniKontakt fresh;
        QVERIFY(!EditConData(env.dm(), &fresh));
        QCOMPARE(env.dialogs().last().text,
                 QStringLiteral("# Orvanta - EditConData\r\nFehler bei der Ermittlung des Kontaktdatensatzes!\r\n"
                                "Kontaktdaten können nicht gespeichert werden."));
        QVERIFY(!GetDSID_Data(env.dm(), &fresh, 5));
        QCOMPARE(env.dialogs().last().text,
                 QStringLiteral("# Orvanta - GetDSID_Data\r\nKontakt konnte in der Datenbank nicht gefunden werden!\r\n"
                                "Aufgabe kann nicht durchgeführt werden."));
        QVERIFY(!GetDSID_Data(env.dm(), nullptr, 5));
        QCOMPARE(env.dialogs().last().text,
                 QStringLiteral("# Orvanta - GetDSID_Data\r\nTyp zum Vorhalten der Daten ist nicht initialisiert!\r\n"
                                "Aufgabe kann nicht durchgeführt werden."));
        QVERIFY(!InsertConData(env.dm(), nullptr));
        QCOMPARE(env.dialogs().last().text, QStringLiteral("# Orvanta - InsertConData\r\nDatentyp ist nicht "
                                                           "initialisiert!\r\nKontakt kann nicht gespeichert werden."));
    }

    void theCallersNumberIsOfferedForRelinkingInAnyOfItsForms()
    {
        ContactTestEnv env;
        struct Offer {
            QString number, label, contbez;
            int key = 0;
        };
        QList<Offer> offers;
        const LogRelink relink = [&](const QString& n, const QString& l, int k, const QString& c) {
            offers.append({n, l, c, k});
        };
        TvkMiniKontakt r;
        r.setCONTBEZ(QStringLiteral("Anrufer"));
        r.setNAME(QStringLiteral("Anrufer"));
        r.AddKD(number(QStringLiteral("Privat"), {}, QStringLiteral("030"), QStringLiteral("999")));
        r.AddKD(number(QStringLiteral("Mobil"), QStringLiteral("0049"), QStringLiteral("0171"), QStringLiteral("12 34")));
        // Stored as dialled in full (NUMBEROF form), deleted entries never match.
        const int deleted = r.AddKD(number(QStringLiteral("Gelöscht"), {}, {}, QStringLiteral("0891234567")));
        r.DeleteKD(deleted);
        QVERIFY(InsertConData(env.dm(), &r, QStringLiteral("0891234567"), relink));
        QVERIFY(offers.isEmpty());

        TvkMiniKontakt s;
        s.setCONTBEZ(QStringLiteral("Zweiter"));
        s.setNAME(QStringLiteral("Zweiter"));
        s.AddKD(number(QStringLiteral("Festnetz"), {}, {}, QStringLiteral("0891234567")));
        QVERIFY(InsertConData(env.dm(), &s, QStringLiteral("0891234567"), relink));
        QCOMPARE(offers.size(), 1);
        QCOMPARE(offers.at(0).label, QStringLiteral("Festnetz"));
        QCOMPARE(offers.at(0).key, s.LID());
        QCOMPARE(offers.at(0).contbez, QStringLiteral("Zweiter"));
        QCOMPARE(offers.at(0).number, QStringLiteral("0891234567"));

        TvkMiniKontakt t;
        t.setNAME(QStringLiteral("Dritter"));
        t.AddKD(number(QStringLiteral("Mobil"), QStringLiteral("0049"), QStringLiteral("0171"), QStringLiteral("1234")));
        QVERIFY(InsertConData(env.dm(), &t, QStringLiteral("0171 1234"), relink));
        QCOMPARE(offers.size(), 2);
        QCOMPARE(offers.at(1).label, QStringLiteral("Mobil"));
    }
};

ORVANTA_TEST(TstContactPersistence)
#include "tst_contactpersistence.moc"
