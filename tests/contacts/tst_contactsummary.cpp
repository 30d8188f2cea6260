#include "contacts/ContactAnchors.h"
#include "contacts/ContactCardRows.h"
#include "contacts/ContactDeletion.h"
#include "contacts/ContactSummary.h"
#include "contacts/Tcontactlistframe.h"
#include "contacts/Tnotizviewform.h"
#include "db/TDM2.h"
#include "tests/contacts/ContactTestEnv.h"
#include "tests/support/TestRegistry.h"
#include "ui/grid/GridController.h"
#include "ui/markup/MarkupPanel.h"

#include <QLabel>
#include <QPushButton>
#include <QTest>
#include <QTextEdit>
#include <QTextDocument>

using namespace orvanta;
using orvanta::test::ContactTestEnv;

namespace {

const QString kTitleStart = QStringLiteral("<BR>  <IMG src=\"idx:0\" align=\"middle\">  <B>");
const QString kHeading = QStringLiteral("<IND x=\"35\"><B><U>Kontakt</U><IND x=\"310\"><U>Adresse</U></B><BR>");

} // namespace

class TstContactSummary : public QObject {
    Q_OBJECT

private Q_SLOTS:
    void fullContactCharacterForCharacter()
    {
        ContactTestEnv env;
        ContactTestEnv::Contact c;
        c.lid = 7;
        c.contbez = QStringLiteral("Müller & <Söhne> \"GmbH\"");
        c.kategorie = QStringLiteral("Kunden");
        c.anrede = QStringLiteral("Herr");
        c.titel = QStringLiteral("Dr.");
        c.vname = QStringLiteral("Jürgen");
        c.name = QStringLiteral("Müller");
        c.firma = QStringLiteral("Müller & <Söhne>");
        c.website = QStringLiteral("www.müller.de");
        c.notiz = QStringLiteral("{\\rtf1 x}");
        c.str = QStringLiteral("Hauptstraße 1");
        c.plz = QStringLiteral("80331");
        c.ort = QStringLiteral("München");
        c.land = QStringLiteral("Deutschland");
        env.addContact(c);
        env.addNumber(1, 7, QStringLiteral("+49"), QStringLiteral("89"), QStringLiteral("123456"),
                      QStringLiteral("Büro"), 1, QStringLiteral("nur vormittags"));
        env.addNumber(2, 7, QString(), QString(), QStringLiteral("0171"), QString(), 0, QString());
        env.addMail(1, 7, QStringLiteral("j@m.de"), QStringLiteral("privat"));
        env.addMail(2, 7, QStringLiteral("info@m.de"), QString());

        const QStringList expected{
            kTitleStart + QStringLiteral("Müller & <Söhne> \"GmbH\"  -  Kunden</B><BR><BR>"),
            kHeading,
            QStringLiteral("<IND x=\"35\">Herr<IND x=\"310\">Hauptstraße 1<BR>"),
            QStringLiteral("<IND x=\"35\">Dr. Jürgen Müller<IND x=\"310\">80331  München<BR>"),
            QStringLiteral("<IND x=\"35\">Müller & <Söhne><IND x=\"310\">Deutschland<BR>"),
            QStringLiteral("<IND x=\"35\"><A href=\"Web_www.müller.de\">www.müller.de</A><BR>"),
            QStringLiteral("<IND x=\"35\"><A href=\"Notiz_7\">Notizen</A><BR>"),
            QStringLiteral("<BR>"),
            QStringLiteral("<IND x=\"35\"><B><U>Telekommunikationsdaten</U></B><BR><BR>"),
            QStringLiteral("<IND x=\"35\">+49 (89) - 123456  <B>Büro</B>   <FONT color=\"clred\">(automatisch "
                           "Ablehnen)</FONT><BR>"),
            QStringLiteral("<IND x=\"50\"><I>nur vormittags</I><BR>"),
            QStringLiteral("<IND x=\"35\">0171 <BR>"),
            QStringLiteral("<BR>"),
            QStringLiteral("<IND x=\"35\"><B><U>Emailadressen</U></B><BR><BR>"),
            QStringLiteral("<IND x=\"35\"><A href=\"Mail_j@m.de\">j@m.de</A> - <I>privat</I><BR>"),
            QStringLiteral("<IND x=\"35\"><A href=\"Mail_info@m.de\">info@m.de</A><BR>"),
        };
        QCOMPARE(contactSummaryLines(env.dm(), 7), expected);
        QVERIFY(!env.dm().DetailTS.isActive());
        QVERIFY(!env.dm().GetDetailQuery.isActive());

        // The panel renders the values it gets (a tag it does not know shows nothing) and the rest
        // of the summary stays intact.
        MarkupPanel panel;
        SetHTMLStaticText(&panel, env.dm(), 7);
        const QString shown = panel.document()->toPlainText();
        QVERIFY2(shown.contains(QStringLiteral("Müller &  \"GmbH\"  -  Kunden")), qPrintable(shown));
        QVERIFY(shown.contains(QStringLiteral("Dr. Jürgen Müller")));
        QVERIFY(shown.contains(QStringLiteral("+49 (89) - 123456  Büro   (automatisch Ablehnen)")));
        QVERIFY(shown.contains(QStringLiteral("info@m.de")));
    }

    void sparseContacts()
    {
        ContactTestEnv env;
        ContactTestEnv::Contact only;
        only.lid = 1;
        only.name = QStringLiteral("Solo");
        only.address = false;
        env.addContact(only);
        QCOMPARE(contactSummaryLines(env.dm(), 1),
                 (QStringList{kTitleStart + QStringLiteral("</B><BR><BR>"), kHeading,
                              QStringLiteral("<IND x=\"35\">Solo<BR>"), QStringLiteral("<BR>")}));

        // Three contact entries, five address entries; post code without town; mail, no numbers.
        ContactTestEnv::Contact c;
        c.lid = 2;
        c.contbez = QStringLiteral("X");
        c.anrede = QStringLiteral("Frau");
        c.name = QStringLiteral("Y");
        c.firma = QStringLiteral("Z");
        c.str = QStringLiteral("S");
        c.zusatz = QStringLiteral("Hof");
        c.plz = QStringLiteral("12345");
        c.bundesland = QStringLiteral("Bayern");
        c.land = QStringLiteral("DE");
        env.addContact(c);
        env.addMail(5, 2, QStringLiteral("x@y.de"), QString());
        QCOMPARE(contactSummaryLines(env.dm(), 2),
                 (QStringList{kTitleStart + QStringLiteral("X</B><BR><BR>"), kHeading,
                              QStringLiteral("<IND x=\"35\">Frau<IND x=\"310\">S<BR>"),
                              QStringLiteral("<IND x=\"35\">Y<IND x=\"310\">Hof<BR>"),
                              QStringLiteral("<IND x=\"35\">Z<IND x=\"310\">12345  <BR>"),
                              QStringLiteral("<IND x=\"310\">Bayern<BR>"), QStringLiteral("<IND x=\"310\">DE<BR>"),
                              QStringLiteral("<BR>"), QStringLiteral("<IND x=\"35\"><B><U>Emailadressen</U></B><BR><BR>"),
                              QStringLiteral("<IND x=\"35\"><A href=\"Mail_x@y.de\">x@y.de</A><BR>")}));

        QCOMPARE(contactSummaryLines(env.dm(), 0), QStringList{kEmptySummary});
        QCOMPARE(contactSummaryLines(env.dm(), -3), QStringList{kEmptySummary});
        QCOMPARE(contactSummaryLines(env.dm(), 99), QStringList{kEmptySummary});
        QCOMPARE(kEmptySummary, QStringLiteral("<BR>  <IMG src=\"idx:0\" align=\"middle\">"));
    }

    void anchorsOpenOnlyWebAndMail()
    {
        QList<QUrl> opened;
        setUrlOpener([&opened](const QUrl& u) {
            opened << u;
            return true;
        });
        ContactTestEnv env;
        env.add(1, QStringLiteral("Anna"));
        Tcontactlistframe f(&env.dm());
        QVERIFY(f.DBConnect(&env.host()));
        int noteOpened = 0;
        f.setNoteOpener([&noteOpened](int lid) { noteOpened = lid; });

        f.HTMLStaticText1AnchorClick(QStringLiteral("Web_www.example.de"));
        f.HTMLStaticText1AnchorClick(QStringLiteral("Web_https://example.de/a?b=1"));
        f.HTMLStaticText1AnchorClick(QStringLiteral("Mail_a@b.de"));
        f.HTMLStaticText1AnchorClick(QStringLiteral("Notiz_12"));
        QCOMPARE(opened, (QList<QUrl>{QUrl(QStringLiteral("http://www.example.de")),
                                      QUrl(QStringLiteral("https://example.de/a?b=1")),
                                      QUrl(QStringLiteral("mailto:a@b.de"))}));
        QCOMPARE(noteOpened, 12);

        opened.clear();
        for (const char* bad : {"Web_javascript:alert(1)", "Web_file:///etc/passwd", "Web_javascript://x%0Aalert(1)",
                                "Mail_a@b.de?attach=/etc/passwd", "Web_ftp://x.de", "Rm_-rf", "Mail_"})
            f.HTMLStaticText1AnchorClick(QLatin1String(bad));
        QVERIFY(opened.isEmpty());
        const QString log = env.errorLogText();
        QVERIFY2(log.contains(QStringLiteral("Adresse abgelehnt: javascript:alert(1)")), qPrintable(log));
        QVERIFY(log.contains(QStringLiteral("Adresse abgelehnt: file:///etc/passwd")));
        QCOMPARE(env.dialogs().count(), 0);
        setUrlOpener({});
        f.DBDisconnect();
    }

    void notesWindowFollowsTheAnchors()
    {
        ContactTestEnv env;
        ContactTestEnv::Contact c;
        c.lid = 3;
        c.contbez = QStringLiteral("Bäcker \"Ost\"");
        c.notiz = QStringLiteral("{\\rtf1\\ansi Hallo Welt\\par}");
        env.addContact(c);
        env.add(4, QStringLiteral("Leer"));
        Tcontactlistframe f(&env.dm());
        QVERIFY(f.DBConnect(&env.host()));
        f.HTMLStaticText1AnchorClick(QStringLiteral("Notiz_3"));
        Tnotizviewform* w = Tnotizviewform::instance();
        QVERIFY(w);
        QCOMPARE(w->findChild<QLabel*>(QStringLiteral("L1"))->text(),
                 QStringLiteral("Notizen zum Kontakt \"Bäcker \"Ost\"\""));
        QCOMPARE(w->noteView()->toPlainText().trimmed(), QStringLiteral("Hallo Welt"));
        QVERIFY(w->findChild<QPushButton*>(QStringLiteral("RzB2"))->isEnabled());
        QCOMPARE(w->loads(), 1);
        // The same contact again only brings the window forward; another one reloads in place.
        f.HTMLStaticText1AnchorClick(QStringLiteral("Notiz_3"));
        QCOMPARE(w->loads(), 1);
        f.HTMLStaticText1AnchorClick(QStringLiteral("Notiz_4"));
        QCOMPARE(Tnotizviewform::instance(), w);
        QCOMPARE(w->loads(), 2);
        QVERIFY(w->findChild<QPushButton*>(QStringLiteral("RzB2"))->isEnabled());
        QVERIFY(w->noteView()->toPlainText().isEmpty());
        QVERIFY(!env.dm().BlobTS.isActive());
        // "Drucken" hands designation and note to the printing.
        QString printed;
        Tnotizviewform::setNotePrinter([&printed](const QString& designation, const QByteArray& rtf) {
            printed = designation + QLatin1Char('|') + QString::number(rtf.startsWith("{\\rtf"));
            return true;
        });
        w->findChild<QPushButton*>(QStringLiteral("RzB2"))->click();
        QCOMPARE(printed, QStringLiteral("Leer|1"));
        Tnotizviewform::setNotePrinter({});
        // A contact deleted meanwhile leaves an empty window.
        env.db().exec(QStringLiteral("DELETE FROM ADDR WHERE CID = 3"));
        env.db().exec(QStringLiteral("DELETE FROM CONTACT WHERE LID = 3"));
        f.HTMLStaticText1AnchorClick(QStringLiteral("Notiz_3"));
        QVERIFY(w->designation().isEmpty());
        QVERIFY(w->findChild<QLabel*>(QStringLiteral("L1"))->text().isEmpty());
        // Leaving the list closes it.
        f.DBDisconnect();
        QTRY_VERIFY(!Tnotizviewform::instance());
    }

    void cardRowTexts()
    {
        QCOMPARE(contactCardName(QStringLiteral("Meier"), QString()), QStringLiteral("Meier"));
        QCOMPARE(contactCardName(QStringLiteral("Meier"), QStringLiteral("Eva")), QStringLiteral("Meier Eva"));
        QCOMPARE(contactCardName(QString(), QStringLiteral("Eva")), QStringLiteral("Eva"));
        QCOMPARE(contactCardPlace(QString(), QStringLiteral("Bonn")), QStringLiteral("Bonn"));
        QCOMPARE(contactCardPlace(QStringLiteral("53111"), QStringLiteral("Bonn")), QStringLiteral("53111  Bonn"));
        QCOMPARE(contactCardPlace(QStringLiteral("53111"), QString()), QStringLiteral("53111"));
    }

    void deleteRemovesTheContactAndItsData()
    {
        ContactTestEnv env;
        env.add(1, QStringLiteral("Anna"), QStringLiteral("Berlin"), QStringLiteral("Familie"));
        env.add(2, QStringLiteral("Bernd"));
        env.addNumber(1, 1, QString(), QStringLiteral("30"), QStringLiteral("1234"), QStringLiteral("Büro"), 0, {});
        env.addMail(1, 1, QStringLiteral("a@b.de"), {});
        Tcontactlistframe f(&env.dm());
        QVERIFY(f.DBConnect(&env.host()));
        QCOMPARE(f.footerText(), QStringLiteral(" Kontakte: 2"));
        QVERIFY(DeleteDS(env.dm(), 1));
        f.Refresh_View(-1);
        QCOMPARE(f.footerText(), QStringLiteral(" Kontakte: 1"));
        QCOMPARE(contactSummaryLines(env.dm(), 1), QStringList{kEmptySummary});
        QVERIFY(!env.dm().IBSQLTS.isActive());
        f.Refresh_View(2);
        QCOMPARE(f.GetSelectedLID(), 2);
        f.DBDisconnect();
    }
};

ORVANTA_TEST(TstContactSummary)
#include "tst_contactsummary.moc"
