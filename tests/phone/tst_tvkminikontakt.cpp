#include "phone/TvkMiniKontakt.h"
#include "tests/phone/ErrorLogFixture.h"
#include "tests/support/TestRegistry.h"

#include <QTest>

using namespace orvanta;

namespace {

TvkKommItem number(const QString& lc, const QString& vorw, const QString& nr, EntryStatus status = EntryStatus::New)
{
    TvkKommItem item;
    item.KOMMBEZ = QStringLiteral("Telefon");
    item.LC = lc;
    item.VORW = vorw;
    item.NUMBER = nr;
    item.status = status;
    return item;
}

TvkMailItem mail(const QString& address, EntryStatus status)
{
    TvkMailItem item;
    item.MAILADDR = address;
    item.status = status;
    return item;
}

} // namespace

class TestTvkMiniKontakt : public QObject {
    Q_OBJECT

private Q_SLOTS:
    void derivesDigitForms()
    {
        TvkMiniKontakt contact;
        TvkKommItem item = number("0049", "030", "123-45");
        item.LID = 7;
        item.CID = 3;
        item.BEMERKUNG = QStringLiteral("Berlin");
        item.AUTOREJECT = 1;
        item.NUMBEROF = QStringLiteral("ignored");
        QCOMPARE(contact.AddKD(item), 0);
        const TvkKommItem& stored = contact.KD().at(0);
        QCOMPARE(stored.NUMBEROF, QStringLiteral("12345"));
        QCOMPARE(stored.VORWNUMBER, QStringLiteral("3012345"));
        QCOMPARE(stored.LCVORWNUMBER, QStringLiteral("4903012345"));
        QCOMPARE(stored.LID, 7);
        QCOMPARE(stored.CID, 3);
        QCOMPARE(stored.BEMERKUNG, QStringLiteral("Berlin"));
        QCOMPARE(stored.AUTOREJECT, std::uint8_t(1));
        QCOMPARE(stored.status, EntryStatus::New);

        // Edit recomputes the forms from the new texts.
        QVERIFY(contact.EditKD(number("0043", "01", "5880"), 0));
        QCOMPARE(contact.KD().at(0).VORWNUMBER, QStringLiteral("15880"));
        QCOMPARE(contact.KD().at(0).LCVORWNUMBER, QStringLiteral("43015880"));
        QCOMPARE(contact.KD().at(0).AUTOREJECT, std::uint8_t(0));
    }

    void cutsToColumnWidths()
    {
        TvkMiniKontakt contact;
        TvkKommItem item = number("004912", "0301234567890", "1234567890123456789");
        item.KOMMBEZ = QString(25, u'K');
        item.BEMERKUNG = QString(45, u'B');
        QCOMPARE(contact.AddKD(item), 0);
        const TvkKommItem& stored = contact.KD().at(0);
        QCOMPARE(stored.KOMMBEZ.size(), 20);
        QCOMPARE(stored.LC, QStringLiteral("00491"));
        QCOMPARE(stored.VORW, QStringLiteral("0301234567"));
        QCOMPARE(stored.NUMBER, QStringLiteral("123456789012345"));
        QCOMPARE(stored.BEMERKUNG.size(), 40);
        QCOMPARE(stored.LCVORWNUMBER, QStringLiteral("4910301234567123456789012345").left(29));
        QVERIFY(stored.LCVORWNUMBER.size() <= 29);
        QCOMPARE(stored.VORWNUMBER, QStringLiteral("301234567123456789012345"));

        QCOMPARE(contact.AddMail(mail(QString(50, u'm'), EntryStatus::New)), 0);
        QCOMPARE(contact.Mail().at(0).MAILADDR.size(), 40);

        contact.setFIRMA(QString(40, u'F'));
        QCOMPARE(contact.FIRMA(), QString(40, u'F'));
        contact.setCONTBEZ(QString(80, u'C') + u'X');
        QCOMPARE(contact.CONTBEZ(), QString(80, u'C'));
        contact.setPLZ(QStringLiteral("12345678901"));
        QCOMPARE(contact.PLZ(), QStringLiteral("1234567890"));
        // A cut never leaves half of a surrogate pair behind.
        contact.setPLZ(QString(9, u'1') + QString::fromUtf8("\U0001F4DE"));
        QCOMPARE(contact.PLZ(), QString(9, u'1'));
    }

    void changeStates()
    {
        TvkMiniKontakt contact;
        const int loaded = contact.AddKD(number("", "030", "1", EntryStatus::Unchanged));
        const int fresh = contact.AddKD(number("", "030", "2", EntryStatus::New));
        const int gone = contact.AddKD(number("", "030", "3", EntryStatus::Unchanged));
        QCOMPARE(fresh, 1);

        TvkKommItem edit = number("", "089", "9", EntryStatus::Unchanged);
        edit.LID = 99;
        QVERIFY(contact.EditKD(edit, loaded));
        QVERIFY(contact.EditKD(edit, fresh));
        QCOMPARE(contact.KD().at(loaded).status, EntryStatus::Changed);
        QCOMPARE(contact.KD().at(loaded).LID, 0); // the key is not taken from the item
        QCOMPARE(contact.KD().at(fresh).status, EntryStatus::New);

        QVERIFY(contact.DeleteKD(gone));
        QVERIFY(contact.EditKD(edit, gone));
        QCOMPARE(contact.KD().at(gone).status, EntryStatus::Deleted);
        QCOMPARE(contact.KD().at(gone).NUMBER, QStringLiteral("9"));

        QVERIFY(contact.DeleteKD(fresh));
        QCOMPARE(contact.KD().at(fresh).status, EntryStatus::Deleted);
        QCOMPARE(contact.KD().size(), 3); // deleted entries stay until saved

        QVERIFY(contact.setKDStatus(loaded, EntryStatus::Unchanged));
        QCOMPARE(contact.KD().at(loaded).status, EntryStatus::Unchanged);
        contact.ClearKD();
        QVERIFY(contact.KD().isEmpty());

        const int m0 = contact.AddMail(mail("a@example.org", EntryStatus::Unchanged));
        const int m1 = contact.AddMail(mail("b@example.org", EntryStatus::New));
        TvkMailItem changed = mail("c@example.org", EntryStatus::Deleted);
        changed.BEMERK = QStringLiteral("privat");
        QVERIFY(contact.EditMail(changed, m0));
        QVERIFY(contact.EditMail(changed, m1));
        QCOMPARE(contact.Mail().at(m0).status, EntryStatus::Changed);
        QCOMPARE(contact.Mail().at(m0).BEMERK, QStringLiteral("privat"));
        QCOMPARE(contact.Mail().at(m1).status, EntryStatus::New);
        QVERIFY(contact.DeleteMail(m1));
        QVERIFY(contact.EditMail(changed, m1));
        QCOMPARE(contact.Mail().at(m1).status, EntryStatus::Deleted);
        contact.ClearMail();
        QVERIFY(contact.Mail().isEmpty());
    }

    void indexOutsideListIsRefused()
    {
        test::ErrorLogFixture log;
        TvkMiniKontakt contact;
        contact.AddKD(number("", "030", "1"));
        contact.AddMail(mail("a@example.org", EntryStatus::New));
        QVERIFY(!contact.EditKD(number("", "", "2"), 1));
        QVERIFY(!contact.DeleteKD(-1));
        QVERIFY(!contact.EditMail(mail("x", EntryStatus::New), 5));
        QVERIFY(!contact.DeleteMail(1));
        QVERIFY(!contact.setKDStatus(1, EntryStatus::Unchanged));
        QCOMPARE(contact.KD().at(0).NUMBER, QStringLiteral("1"));
        QCOMPARE(contact.KD().at(0).status, EntryStatus::New);
        QCOMPARE(contact.Mail().at(0).status, EntryStatus::New);
        const QStringList shown = log.dialogs().texts(DialogKind::Error);
        QCOMPARE(shown.size(), 4);
        QVERIFY(shown.at(0).startsWith(QStringLiteral("# TvkMiniKontakt - EditKD\r\n")));
        QVERIFY(shown.at(3).startsWith(QStringLiteral("# TvkMiniKontakt - DeleteMail\r\n")));
        QVERIFY(log.logged().contains("# TvkMiniKontakt - DeleteKD\r\n"));
    }

    void storesNotes()
    {
        TvkMiniKontakt contact;
        contact.StoreNotes(QStringList {QString::fromUtf8("Grüße"), QStringLiteral("2 €")}, QStringLiteral("x"));
        QCOMPARE(contact.notes(), QByteArray("Gr\xfc\xdf" "e\r\n2 \x80\r\n"));
        contact.StoreNotes(QStringList {QStringLiteral("{\\rtf1}")}, QString());
        QVERIFY(contact.notes().isEmpty());
        contact.StoreNotes(QByteArray("{\\rtf1 a}"), QStringLiteral("a"));
        QCOMPARE(contact.notes(), QByteArray("{\\rtf1 a}"));
    }
};

ORVANTA_TEST(TestTvkMiniKontakt)
#include "tst_tvkminikontakt.moc"
