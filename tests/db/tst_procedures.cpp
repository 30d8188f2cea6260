// The stored procedures of the call database, called the way the program calls them, with their
// outputs and their effects on the tables checked on a real embedded database.

#include "calllog/LogStatements.h"
#include "db/DatabaseError.h"
#include "db/FbAttachment.h"
#include "db/FbStatement.h"
#include "db/FbTransaction.h"
#include "db/TDM2Statements.h"
#include "tests/support/TempDatabase.h"
#include "tests/support/TestRegistry.h"

#include <QTest>

using namespace orvanta;
using orvanta::test::TempDatabase;

namespace {

// One procedure call in its own committed transaction; returns the output row (empty if none).
QVariantList call(FbAttachment& db, const QString& sql, const QVariantMap& params)
{
    FbTransaction tx(db);
    tx.start();
    QVariantList out;
    try {
        FbStatement st(db, &tx, sql);
        for (auto it = params.cbegin(); it != params.cend(); ++it)
            st.setParam(it.key(), it.value());
        st.execute();
        if (st.hasRow())
            for (int i = 0; i < st.columnCount(); ++i)
                out << st.value(i);
    } catch (...) {
        tx.rollbackQuietly();
        throw;
    }
    tx.commit();
    return out;
}

struct Contact {
    QString anr, vna, na, fa, tit, contb, web, abt, katb, st, pl, ot, zusa, l, bund;
    QVariant text; // null: no note
};

QVariantMap contactParams(const Contact& c)
{
    return {{"ANR", c.anr},   {"VNA", c.vna}, {"NA", c.na},   {"FA", c.fa},     {"TIT", c.tit},   {"CONTB", c.contb},
            {"WEB", c.web},   {"ABT", c.abt}, {"KATB", c.katb}, {"ST", c.st},   {"PL", c.pl},     {"OT", c.ot},
            {"ZUSA", c.zusa}, {"L", c.l},     {"BUND", c.bund}, {"TEXT", c.text}};
}

int contInsert(FbAttachment& db, const Contact& c)
{
    return call(db,
                "EXECUTE PROCEDURE P_CONT_INSERT (:ANR,:VNA,:NA,:FA,:TIT,:CONTB,:WEB,:ABT,:KATB,:ST,:PL,:OT,:ZUSA,:L,"
                ":BUND,:TEXT)",
                contactParams(c))
        .value(0)
        .toInt();
}

int contEdit(FbAttachment& db, int lid, const Contact& c)
{
    QVariantMap p = contactParams(c);
    p.insert("E_LID", lid);
    return call(db,
                "EXECUTE PROCEDURE P_CONT_EDIT (:E_LID,:ANR,:VNA,:NA,:FA,:TIT,:CONTB,:WEB,:ABT,:KATB,:ST,:PL,:OT,:ZUSA,"
                ":L,:BUND,:TEXT)",
                p)
        .value(0)
        .toInt();
}

Contact person(const QString& contbez, const QString& katb = {})
{
    Contact c;
    c.contb = contbez;
    c.na = contbez.section(u',', 0, 0);
    c.katb = katb;
    return c;
}

struct Number {
    int lid = 0;
    int cid = 0;
    QString kb = "Telefon", lc = "0049", v = "030", n = "123-45", vn = "3012345", lcvn = "4903012345", bem;
    int aure = 0;
    QString nof = "12345";
};

int comSync(FbAttachment& db, const Number& n, int stat)
{
    return call(db, "EXECUTE PROCEDURE P_COM_SYNCHRONIZE (:L,:C,:KB,:LC,:V,:N,:VN,:LCVN,:BEM,:AURE,:NOF,:STAT)",
                {{"L", n.lid},
                 {"C", n.cid},
                 {"KB", n.kb},
                 {"LC", n.lc},
                 {"V", n.v},
                 {"N", n.n},
                 {"VN", n.vn},
                 {"LCVN", n.lcvn},
                 {"BEM", n.bem},
                 {"AURE", n.aure},
                 {"NOF", n.nof},
                 {"STAT", stat}})
        .value(0)
        .toInt();
}

int mailSync(FbAttachment& db, int lid, int cid, const QString& addr, const QString& bem, int status)
{
    return call(db, "EXECUTE PROCEDURE P_MAIL_SYNCHRONIZE (:LID,:CID,:MAILADDR,:BEMERK,:STATUS)",
                {{"LID", lid}, {"CID", cid}, {"MAILADDR", addr}, {"BEMERK", bem}, {"STATUS", status}})
        .value(0)
        .toInt();
}

int katInsert(FbAttachment& db, int kid, const QString& name, const QString& bem = {})
{
    return call(db, "EXECUTE PROCEDURE P_KAT_INSERT (:KID,:KA,:BEM)", {{"KID", kid}, {"KA", name}, {"BEM", bem}})
        .value(0)
        .toInt();
}

struct Match {
    QString label;
    QString name;
    int cid = -1;
};

Match selectLogContact(FbAttachment& db, const QString& number)
{
    const QVariantList out = call(db, logsql::kSelectLogContact, {{"PHONENR", number}});
    return {out.value(1).toString(), out.value(2).toString(), out.value(3).toInt()};
}

int countOfNumber(FbAttachment& db, const QString& number)
{
    return call(db, logsql::kCountOfNumber, {{"PN", number}}).value(0).toInt();
}

int count(TempDatabase& db, const QString& sql) { return db.scalar(sql).toInt(); }

} // namespace

class TstProcedures final : public QObject {
    Q_OBJECT

private Q_SLOTS:
    void contactInsertStoresEveryField();
    void contactInsertWithoutNoteOrCategory();
    void contactEdit();
    void contactDeleteRemovesEverythingAndUnlinksCalls();
    void numberSynchronize();
    void numberSynchronizeRetriedAfterRollback();
    void mailSynchronize();
    void selectLogContactMatchesEachDigitForm();
    void selectLogContactIgnoresEmptyNumbers();
    void selectLogContactFirstMatchWins();
    void countOfNumberCountsBothColumns();
    void categoryInsertAndRename();
    void categoryDeleteAndMove();
};

void TstProcedures::contactInsertStoresEveryField()
{
    TempDatabase db;
    FbAttachment& a = db.attachment();
    const int kunden = katInsert(a, 0, "Kunden");
    QVERIFY(kunden > 0);

    Contact c{"Frau",           "Jürgen",    "Müller",     "Müller & Söhne GmbH", "Dr.",         "Müller, Jürgen",
              "www.example.de", "Einkauf",   "kUNDEN",     "Hauptstraße 1",       "10115",       "Berlin",
              "Hinterhaus",     "Deutschland", "Berlin",   QString("{\\rtf1 Notiz \\'e4}")};
    const int lid = contInsert(a, c);
    QVERIFY(lid > 0);

    FbTransaction tx(a);
    tx.start();
    FbStatement st(a, &tx, "SELECT * FROM V_SELECT_DETAIL WHERE LID = :id");
    st.setParam(u"id", lid);
    st.execute();
    QVERIFY(st.next());
    QCOMPARE(st.asString(u"ANREDE"), c.anr);
    QCOMPARE(st.asString(u"VNAME"), c.vna);
    QCOMPARE(st.asString(u"NAME"), c.na);
    QCOMPARE(st.asString(u"FIRMA"), c.fa);
    QCOMPARE(st.asString(u"TITEL"), c.tit);
    QCOMPARE(st.asString(u"CONTBEZ"), c.contb);
    QCOMPARE(st.asString(u"WEBSITE"), c.web);
    QCOMPARE(st.asString(u"ABTEILUNG"), c.abt);
    QCOMPARE(st.asString(u"STR"), c.st);
    QCOMPARE(st.asString(u"PLZ"), c.pl);
    QCOMPARE(st.asString(u"ORT"), c.ot);
    QCOMPARE(st.asString(u"ZUSATZ"), c.zusa);
    QCOMPARE(st.asString(u"LAND"), c.l);
    QCOMPARE(st.asString(u"BUNDESLAND"), c.bund);
    QCOMPARE(st.asString(u"KATBEZ"), QString("Kunden")); // the category's own spelling
    QCOMPARE(st.asString(u"NOTIZ"), c.text.toString());
    QVERIFY(!st.next());
    st.close();
    tx.commit();

    QCOMPARE(count(db, QString("SELECT COUNT(*) FROM CONKAT WHERE CID = %1 AND KID = %2").arg(lid).arg(kunden)), 1);
    QCOMPARE(count(db, QString("SELECT COUNT(*) FROM ADDR WHERE CID = %1").arg(lid)), 1);
    QCOMPARE(db.scalar("SELECT KATBEZ FROM V_SELECT_LIST").toString(), QString("Kunden"));
    QCOMPARE(db.scalar(QString("SELECT CONTBEZ FROM V_SELECT_NOTIZ WHERE LID = %1").arg(lid)).toString(), c.contb);

    // Keys of further contacts differ.
    const int second = contInsert(a, person("Zweiter, Kontakt"));
    QVERIFY(second > 0 && second != lid);
}

void TstProcedures::contactInsertWithoutNoteOrCategory()
{
    TempDatabase db;
    FbAttachment& a = db.attachment();
    katInsert(a, 0, "Familie");

    const int noNote = contInsert(a, person("Ohne, Notiz", ""));
    const int unknownCat = contInsert(a, person("Unbekannte, Kategorie", "Gibt es nicht"));
    QVERIFY(noNote > 0 && unknownCat > 0);

    QVERIFY(db.scalar(QString("SELECT NOTIZ FROM V_SELECT_NOTIZ WHERE LID = %1").arg(noNote)).isNull());
    QCOMPARE(count(db, "SELECT COUNT(*) FROM CONKAT"), 0);
    // Both still appear in the lists, without a category.
    QCOMPARE(count(db, "SELECT COUNT(*) FROM V_SELECT_LIST WHERE KATBEZ IS NULL"), 2);
    QCOMPARE(count(db, "SELECT COUNT(*) FROM V_SELECT_CARD"), 2);
}

void TstProcedures::contactEdit()
{
    TempDatabase db;
    FbAttachment& a = db.attachment();
    const int familie = katInsert(a, 0, "Familie");
    const int freunde = katInsert(a, 0, "Freunde");
    Contact c = person("Alt, Name", "Familie");
    c.text = QString("alte Notiz");
    const int lid = contInsert(a, c);
    const int linkKey = db.scalar(QString("SELECT LID FROM CONKAT WHERE CID = %1").arg(lid)).toInt();

    c.contb = "Neu, Name";
    c.ot = "Köln";
    c.katb = "freunde";
    c.text = QVariant();
    QCOMPARE(contEdit(a, lid, c), 0);
    QCOMPARE(db.scalar(QString("SELECT CONTBEZ FROM CONTACT WHERE LID = %1").arg(lid)).toString(), QString("Neu, Name"));
    QCOMPARE(db.scalar(QString("SELECT ORT FROM ADDR WHERE CID = %1").arg(lid)).toString(), QString("Köln"));
    QVERIFY(db.scalar(QString("SELECT NOTIZ FROM CONTACT WHERE LID = %1").arg(lid)).isNull());
    // The link row is kept and moved, so the category manager's key stays valid.
    QCOMPARE(db.scalar(QString("SELECT KID FROM CONKAT WHERE LID = %1").arg(linkKey)).toInt(), freunde);
    QCOMPARE(count(db, "SELECT COUNT(*) FROM CONKAT"), 1);
    QCOMPARE(count(db, "SELECT COUNT(*) FROM ADDR"), 1);

    c.katb.clear();
    QCOMPARE(contEdit(a, lid, c), 0);
    QCOMPARE(count(db, "SELECT COUNT(*) FROM CONKAT"), 0);
    QVERIFY(familie > 0);

    // An address added by editing a contact that had none.
    db.exec(QString("DELETE FROM ADDR WHERE CID = %1").arg(lid));
    c.st = "Domstraße 2";
    QCOMPARE(contEdit(a, lid, c), 0);
    QCOMPARE(db.scalar(QString("SELECT STR FROM V_SELECT_DETAIL WHERE LID = %1").arg(lid)).toString(), c.st);

    // A contact that does not exist is a failure and changes nothing.
    QVERIFY(contEdit(a, lid + 100, person("Geist")) != 0);
    QCOMPARE(count(db, "SELECT COUNT(*) FROM CONTACT"), 1);
}

void TstProcedures::contactDeleteRemovesEverythingAndUnlinksCalls()
{
    TempDatabase db;
    FbAttachment& a = db.attachment();
    katInsert(a, 0, "Kunden");
    const int doomed = contInsert(a, person("Weg, Damit", "Kunden"));
    const int kept = contInsert(a, person("Bleibt, Hier", "Kunden"));
    for (int cid : {doomed, kept}) {
        Number n;
        n.cid = cid;
        QCOMPARE(comSync(a, n, 1), 0);
        QCOMPARE(comSync(a, n, 1), 0);
        QCOMPARE(mailSync(a, 0, cid, "a@b.de", "", 1), 0);
    }
    db.exec(QString("INSERT INTO LOG (FROMPHONE, FROMBEZ, FROMANSCHLUSS, CID) VALUES ('03012345', 'Weg, Damit', "
                    "'Telefon', %1);\n"
                    "INSERT INTO LOG (FROMPHONE, FROMBEZ, CID) VALUES ('03012345', 'Weg, Damit', %1);\n"
                    "INSERT INTO LOG (FROMPHONE, FROMBEZ, CID) VALUES ('0309999', 'Bleibt, Hier', %2);")
                .arg(doomed)
                .arg(kept));

    call(a, "EXECUTE PROCEDURE P_CONT_DELETE (:D_LID)", {{"D_LID", doomed}});

    for (const char* table : {"CONTACT WHERE LID", "COM WHERE CID", "E_MAIL WHERE CID", "CONKAT WHERE CID",
                              "ADDR WHERE CID", "LOG WHERE CID"})
        QCOMPARE(count(db, QString("SELECT COUNT(*) FROM %1 = %2").arg(table).arg(doomed)), 0);
    // The calls stay, unlinked, with their caller text.
    QCOMPARE(count(db, "SELECT COUNT(*) FROM LOG WHERE CID = 0 AND FROMBEZ = 'Weg, Damit'"), 2);
    QCOMPARE(db.scalar("SELECT FROMANSCHLUSS FROM LOG WHERE FROMANSCHLUSS IS NOT NULL").toString(), QString("Telefon"));
    // The other contact is untouched.
    QCOMPARE(count(db, QString("SELECT COUNT(*) FROM COM WHERE CID = %1").arg(kept)), 2);
    QCOMPARE(count(db, QString("SELECT COUNT(*) FROM E_MAIL WHERE CID = %1").arg(kept)), 1);
    QCOMPARE(count(db, QString("SELECT COUNT(*) FROM CONKAT WHERE CID = %1").arg(kept)), 1);
    QCOMPARE(count(db, QString("SELECT COUNT(*) FROM LOG WHERE CID = %1").arg(kept)), 1);
    QCOMPARE(count(db, "SELECT COUNT(*) FROM V_SELECT_LIST"), 1);

    // Deleting a key that does not exist does no harm.
    call(a, "EXECUTE PROCEDURE P_CONT_DELETE (:D_LID)", {{"D_LID", 4711}});
    QCOMPARE(count(db, "SELECT COUNT(*) FROM CONTACT"), 1);
}

void TstProcedures::numberSynchronize()
{
    TempDatabase db;
    FbAttachment& a = db.attachment();
    const int cid = contInsert(a, person("Nummern, Test"));
    const int other = contInsert(a, person("Andere, Person"));

    // State 1: insert; the key passed in is ignored.
    Number n;
    n.cid = cid;
    n.bem = "Berlin";
    n.aure = 1;
    QCOMPARE(comSync(a, n, 1), 0);
    const int key = db.scalar("SELECT LID FROM COM").toInt();
    QVERIFY(key > 0);
    {
        FbTransaction tx(a);
        tx.start();
        FbStatement st(a, &tx, "SELECT * FROM COM WHERE CID = :id");
        st.setParam(u"id", cid);
        st.execute();
        QVERIFY(st.next());
        QCOMPARE(st.asInt(u"CID"), cid);
        QCOMPARE(st.asString(u"KOMMBEZ"), QString("Telefon"));
        QCOMPARE(st.asString(u"LC"), QString("0049"));
        QCOMPARE(st.asString(u"VORW"), QString("030"));
        QCOMPARE(st.asString(u"NUMBER"), QString("123-45"));
        QCOMPARE(st.asString(u"VORWNUMBER"), QString("3012345"));
        QCOMPARE(st.asString(u"LCVORWNUMBER"), QString("4903012345"));
        QCOMPARE(st.asString(u"BEMERKUNG"), QString("Berlin"));
        QCOMPARE(st.asInt(u"AUTOREJECT"), 1);
        QCOMPARE(st.asString(u"NUMBEROF"), QString("12345"));
        st.close();
        tx.commit();
    }

    // State 2: update of that key.
    n.lid = key;
    n.kb = "Büro";
    n.aure = 0;
    QCOMPARE(comSync(a, n, 2), 0);
    QCOMPARE(db.scalar(QString("SELECT KOMMBEZ FROM COM WHERE LID = %1").arg(key)).toString(), QString("Büro"));
    QCOMPARE(db.scalar(QString("SELECT AUTOREJECT FROM COM WHERE LID = %1").arg(key)).toInt(), 0);

    // Failures change nothing: a key that does not exist, another contact's key, an unknown
    // state, a contact that does not exist.
    Number missing = n;
    missing.lid = key + 100;
    QVERIFY(comSync(a, missing, 2) != 0);
    Number foreign = n;
    foreign.cid = other;
    foreign.kb = "Fremd";
    QVERIFY(comSync(a, foreign, 2) != 0);
    QVERIFY(comSync(a, foreign, 3) != 0);
    QVERIFY(comSync(a, n, 7) != 0);
    Number orphan;
    orphan.cid = 999;
    QVERIFY(comSync(a, orphan, 1) != 0);
    QCOMPARE(count(db, "SELECT COUNT(*) FROM COM"), 1);
    QCOMPARE(db.scalar("SELECT KOMMBEZ FROM COM").toString(), QString("Büro"));

    // Unchanged with a key: nothing to do.
    n.kb = "Ignoriert";
    QCOMPARE(comSync(a, n, 0), 0);
    QCOMPARE(db.scalar("SELECT KOMMBEZ FROM COM").toString(), QString("Büro"));

    // State 3 with key 0: a new entry deleted before it was saved, nothing to do.
    Number unsaved;
    unsaved.cid = cid;
    QCOMPARE(comSync(a, unsaved, 3), 0);
    QCOMPARE(count(db, "SELECT COUNT(*) FROM COM"), 1);

    // State 3: delete; repeating it finds nothing left and still succeeds.
    QCOMPARE(comSync(a, n, 3), 0);
    QCOMPARE(count(db, "SELECT COUNT(*) FROM COM"), 0);
    QCOMPARE(comSync(a, n, 3), 0);
}

void TstProcedures::numberSynchronizeRetriedAfterRollback()
{
    // A save that failed half-way leaves entries marked as saved although the transaction was
    // rolled back; a retry sends them with key 0 and must store them rather than drop them.
    TempDatabase db;
    FbAttachment& a = db.attachment();
    const int cid = contInsert(a, person("Wieder, Holt"));
    Number n;
    n.cid = cid;
    QCOMPARE(comSync(a, n, 0), 0);
    QCOMPARE(comSync(a, n, 2), 0);
    QCOMPARE(mailSync(a, 0, cid, "x@y.de", "", 0), 0);
    QCOMPARE(mailSync(a, 0, cid, "z@y.de", "", 2), 0);
    QCOMPARE(count(db, "SELECT COUNT(*) FROM COM"), 2);
    QCOMPARE(count(db, "SELECT COUNT(*) FROM E_MAIL"), 2);
}

void TstProcedures::mailSynchronize()
{
    TempDatabase db;
    FbAttachment& a = db.attachment();
    const int cid = contInsert(a, person("Post, Fach"));
    const int other = contInsert(a, person("Andere, Person"));

    QCOMPARE(mailSync(a, 0, cid, "post@fach.de", "privat", 1), 0);
    const int key = db.scalar("SELECT LID FROM E_MAIL").toInt();
    QVERIFY(key > 0);
    QCOMPARE(db.scalar("SELECT MAILADDR FROM E_MAIL").toString(), QString("post@fach.de"));
    QCOMPARE(db.scalar("SELECT BEMERK FROM E_MAIL").toString(), QString("privat"));
    QCOMPARE(db.scalar("SELECT CID FROM E_MAIL").toInt(), cid);

    QCOMPARE(mailSync(a, key, cid, "neu@fach.de", "geändert", 2), 0);
    QCOMPARE(db.scalar("SELECT MAILADDR FROM E_MAIL").toString(), QString("neu@fach.de"));
    QCOMPARE(db.scalar("SELECT BEMERK FROM E_MAIL").toString(), QString("geändert"));

    QVERIFY(mailSync(a, key + 100, cid, "x@y.de", "", 2) != 0);
    QVERIFY(mailSync(a, key, other, "x@y.de", "", 2) != 0);
    QVERIFY(mailSync(a, key, other, "", "", 3) != 0);
    QVERIFY(mailSync(a, key, cid, "x@y.de", "", -1) != 0);
    QVERIFY(mailSync(a, 0, 999, "x@y.de", "", 1) != 0);
    QCOMPARE(count(db, "SELECT COUNT(*) FROM E_MAIL"), 1);
    QCOMPARE(db.scalar("SELECT MAILADDR FROM E_MAIL").toString(), QString("neu@fach.de"));

    QCOMPARE(mailSync(a, 0, cid, "", "", 3), 0);
    QCOMPARE(count(db, "SELECT COUNT(*) FROM E_MAIL"), 1);
    QCOMPARE(mailSync(a, key, cid, "", "", 3), 0);
    QCOMPARE(count(db, "SELECT COUNT(*) FROM E_MAIL"), 0);
}

void TstProcedures::selectLogContactMatchesEachDigitForm()
{
    TempDatabase db;
    FbAttachment& a = db.attachment();
    const int cid = contInsert(a, person("Berliner, Bär"));
    Number n; // 0049 / 030 / 123-45: digit forms 12345, 3012345, 4903012345
    n.cid = cid;
    n.kb = "Büro";
    QCOMPARE(comSync(a, n, 1), 0);

    const QStringList hits{"12345",          "1-23 45",        // NUMBEROF
                           "030 / 123 45",   "(030) 12345",    // VORWNUMBER
                           "0049 030 12345", "+49 030-12345"}; // LCVORWNUMBER
    for (const QString& number : hits) {
        const Match m = selectLogContact(a, number);
        QVERIFY2(m.cid == cid, qPrintable(number));
        QCOMPARE(m.label, QString("Büro"));
        QCOMPARE(m.name, QString("Berliner, Bär"));
    }
    for (const QString& number : {QString("089 12345"), QString("123456"), QString("3012345 1")}) {
        const Match m = selectLogContact(a, number);
        QVERIFY2(m.cid == 0, qPrintable(number));
        QVERIFY(m.label.isEmpty() && m.name.isEmpty());
    }
}

void TstProcedures::selectLogContactIgnoresEmptyNumbers()
{
    // A stored number without digits must not be taken for the owner of a withheld number.
    TempDatabase db;
    FbAttachment& a = db.attachment();
    Number blank;
    blank.cid = contInsert(a, person("Leer, Nummer"));
    blank.v = blank.n = blank.vn = blank.lcvn = blank.nof = blank.lc = "";
    QCOMPARE(comSync(a, blank, 1), 0);
    for (const QString& number : {QString(), QString("Unbekannt"), QString("Nummer unterdrückt"), QString("000")})
        QVERIFY2(selectLogContact(a, number).cid == 0, qPrintable(number));
}

void TstProcedures::selectLogContactFirstMatchWins()
{
    TempDatabase db;
    FbAttachment& a = db.attachment();
    Number first; // matches 3012345 through its area code and number
    first.cid = contInsert(a, person("Erster, Eintrag"));
    first.kb = "Zentrale";
    QCOMPARE(comSync(a, first, 1), 0);
    Number second; // a local number that happens to be the same digits
    second.cid = contInsert(a, person("Zweiter, Eintrag"));
    second.kb = "Privat";
    second.v = "";
    second.n = "3012345";
    second.nof = "3012345";
    second.vn = "3012345";
    second.lcvn = "493012345";
    QCOMPARE(comSync(a, second, 1), 0);

    Match m = selectLogContact(a, "03012345");
    QCOMPARE(m.cid, first.cid);
    QCOMPARE(m.label, QString("Zentrale"));

    // Once the first entry is gone, the other one is found.
    const int firstKey = db.scalar(QString("SELECT LID FROM COM WHERE CID = %1").arg(first.cid)).toInt();
    first.lid = firstKey;
    QCOMPARE(comSync(a, first, 3), 0);
    m = selectLogContact(a, "03012345");
    QCOMPARE(m.cid, second.cid);
    QCOMPARE(m.label, QString("Privat"));
}

void TstProcedures::countOfNumberCountsBothColumns()
{
    TempDatabase db;
    FbAttachment& a = db.attachment();
    db.exec("INSERT INTO LOG (FROMPHONE, FROMSUBB) VALUES ('030123', NULL);\n"
            "INSERT INTO LOG (FROMPHONE, FROMSUBB) VALUES ('030123', '030123');\n"
            "INSERT INTO LOG (FROMPHONE, FROMSUBB) VALUES ('Unbekannt', '030123');\n"
            "INSERT INTO LOG (FROMPHONE, FROMSUBB) VALUES ('0301234', '30123');\n");
    QCOMPARE(countOfNumber(a, "030123"), 3); // a row matching in both columns counts once
    QCOMPARE(countOfNumber(a, "30123"), 1);
    QCOMPARE(countOfNumber(a, "0401234"), 0);

    // The program's relinking statement finds the same rows.
    call(a, logsql::kRelinkLog,
         {{"FB", QString("X")}, {"FA", QString("Zentrale")}, {"C", 7}, {"FP", QString("030123")},
          {"FS", QString("030123")}});
    QCOMPARE(count(db, "SELECT COUNT(*) FROM LOG WHERE CID = 7"), 3);
}

void TstProcedures::categoryInsertAndRename()
{
    TempDatabase db;
    FbAttachment& a = db.attachment();
    const int kunden = katInsert(a, 0, "Kunden", "zahlen");
    const int aerzte = katInsert(a, 0, "Ärzte");
    QVERIFY(kunden > 0 && aerzte > 0 && kunden != aerzte);
    QCOMPARE(db.scalar(QString("SELECT BEMERKUNG FROM KAT WHERE LID = %1").arg(kunden)).toString(), QString("zahlen"));

    // Duplicate names in any case, umlauts included, are refused with -2.
    QCOMPARE(katInsert(a, 0, "KUNDEN"), -2);
    QCOMPARE(katInsert(a, 0, "ärzte"), -2);
    QCOMPARE(katInsert(a, aerzte, "kunden"), -2);
    QCOMPARE(count(db, "SELECT COUNT(*) FROM KAT"), 2);

    // A category may change the case of its own name; the update returns its key.
    QCOMPARE(katInsert(a, kunden, "KUNDEN", "neu"), kunden);
    QCOMPARE(db.scalar(QString("SELECT KATBEZ FROM KAT WHERE LID = %1").arg(kunden)).toString(), QString("KUNDEN"));
    QCOMPARE(db.scalar(QString("SELECT BEMERKUNG FROM KAT WHERE LID = %1").arg(kunden)).toString(), QString("neu"));

    // Other failures give 0: an empty name, a key that does not exist.
    QCOMPARE(katInsert(a, 0, ""), 0);
    QCOMPARE(katInsert(a, 0, "   "), 0);
    QCOMPARE(katInsert(a, 4711, "Lieferanten"), 0);
    QCOMPARE(count(db, "SELECT COUNT(*) FROM KAT"), 2);
}

void TstProcedures::categoryDeleteAndMove()
{
    TempDatabase db;
    FbAttachment& a = db.attachment();
    const int familie = katInsert(a, 0, "Familie");
    const int freunde = katInsert(a, 0, "Freunde");
    const int anna = contInsert(a, person("Anna", "Familie"));
    const int bernd = contInsert(a, person("Bernd", "Familie"));
    QVERIFY(contInsert(a, person("Clara", "Freunde")) > 0);

    auto contactsOf = [&](int kid) {
        FbTransaction tx(a);
        tx.start();
        FbStatement st(a, &tx, dmsql::kSelectCategoryContacts);
        st.setParam(u"ID", kid);
        st.execute();
        QStringList names;
        while (st.next())
            names << st.asString(u"CONTBEZ");
        tx.commit();
        return names;
    };
    QCOMPARE(contactsOf(familie), (QStringList{"Anna", "Bernd"}));

    const int berndLink = db.scalar(QString("SELECT LID FROM CONKAT WHERE CID = %1").arg(bernd)).toInt();
    call(a, "EXECUTE PROCEDURE P_CHANGE_CONKAT (:CK_ID,:KID)", {{"CK_ID", berndLink}, {"KID", freunde}});
    QCOMPARE(contactsOf(familie), QStringList{"Anna"});
    QCOMPARE(contactsOf(freunde), (QStringList{"Bernd", "Clara"}));
    QCOMPARE(db.scalar(QString("SELECT KATBEZ FROM V_SELECT_DETAIL WHERE LID = %1").arg(bernd)).toString(),
             QString("Freunde"));

    call(a, "EXECUTE PROCEDURE P_KAT_DELETE (:KID)", {{"KID", freunde}});
    QCOMPARE(count(db, "SELECT COUNT(*) FROM KAT"), 1);
    QCOMPARE(count(db, "SELECT COUNT(*) FROM CONKAT"), 1);
    // The contacts stay, without a category.
    QCOMPARE(count(db, "SELECT COUNT(*) FROM V_SELECT_LIST"), 3);
    QCOMPARE(count(db, "SELECT COUNT(*) FROM V_SELECT_LIST WHERE KATBEZ IS NULL"), 2);
    QCOMPARE(db.scalar(QString("SELECT KATBEZ FROM V_SELECT_LIST WHERE LID = %1").arg(anna)).toString(),
             QString("Familie"));
}

ORVANTA_TEST(TstProcedures)
#include "tst_procedures.moc"
