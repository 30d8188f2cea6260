#include "tests/TestPaths.h"
#include "tests/support/TestRegistry.h"
#include "ui/report/ReportParser.h"

#include <QFile>
#include <QRandomGenerator>
#include <QTest>

using namespace orvanta;

namespace {

const QByteArray kGood = "orvex 1\n"
                         "# a comment\n"
                         "report Liste title=\"Vorschau \"\"Liste\"\"\"\n"
                         "  paper A4 landscape\n"
                         "  margins 10 10 10 10\n"
                         "  font \"DejaVu Sans\" 8.5\n"
                         "  band pageheader 6\n"
                         "    text 0 0 50 5 bold align=right \"Größe {{x}}\" # trailing comment\n"
                         "  band groupheader 6 by=Ort\n"
                         "    line 0 5 277 5 width=0.5 color=336699\n"
                         "  band detail 4 shade=Odd\n"
                         "    text 0 0 50 4 \"{Name}\"\n"
                         "  band groupfooter 2 by=Ort\n"
                         "  band summary 1\n"
                         "    richtext 0 0 277 1 Notiz\n"
                         "end\n";

QString errorOf(const QByteArray& text)
{
    const ReportParseResult result = ReportParser::parse(text);
    return result.error;
}

} // namespace

class TestReportParser : public QObject {
    Q_OBJECT

private Q_SLOTS:
    void readsEveryStatement()
    {
        const ReportParseResult result = ReportParser::parse(kGood);
        QVERIFY2(result.ok(), qPrintable(result.error));
        const ReportDefinition* report = result.project.find(QStringLiteral("liste"));
        QVERIFY(report);
        QCOMPARE(report->title, QStringLiteral("Vorschau \"Liste\""));
        QCOMPARE(report->paper, QSizeF(297, 210));
        QCOMPARE(report->printable(), QSizeF(277, 190));
        QCOMPARE(report->font.family, QStringLiteral("DejaVu Sans"));
        QCOMPARE(report->font.size, 8.5);
        QCOMPARE(report->bands.size(), 5);
        const ReportItem& head = report->bands[0].items[0];
        QCOMPARE(head.text, QStringLiteral("Größe {{x}}"));
        QVERIFY(head.font.bold);
        QCOMPARE(head.align & Qt::AlignHorizontal_Mask, Qt::AlignRight);
        QCOMPARE(report->bands[1].groupBy, QStringLiteral("Ort"));
        QCOMPARE(report->bands[1].items[0].color, QColor(0x33, 0x66, 0x99));
        QCOMPARE(report->bands[2].shadeField, QStringLiteral("Odd"));
        QVERIFY(report->bands[2].shade.isValid());
        QCOMPARE(report->band(ReportBand::Kind::Summary)->items[0].kind, ReportItem::Kind::RichText);
        QCOMPARE(report->band(ReportBand::Kind::Summary)->items[0].text, QStringLiteral("Notiz"));
    }

    void theShippedProjectReadsWithEveryReport()
    {
        QFile file(QStringLiteral(ORVANTA_SOURCE_DIR "/data/Orvex.rav"));
        QVERIFY(file.open(QIODevice::ReadOnly));
        const ReportParseResult result = ReportParser::parse(file.readAll());
        QVERIFY2(result.ok(), qPrintable(result.error));
        const char* names[] = {"LogEinfach", "LogDetailliert", "LogEinfachGruppeDatum", "LogDetailliertGruppeDatum",
                               "LogEinfachGruppeVerbindung", "LogDetailliertGruppeVerbindung",
                               "LogEinfachGruppeOriginating", "LogDetailliertGruppeOriginating",
                               "LogEinfachGruppeTerminating", "LogDetailliertGruppeTerminating",
                               "KontaktUebersicht", "NotizDruck"};
        for (const char* name : names)
            QVERIFY2(result.project.find(QLatin1String(name)), name);
    }

    void damagedInputNamesTheLine_data()
    {
        QTest::addColumn<QByteArray>("text");
        QTest::addColumn<QString>("error");
        QTest::newRow("empty") << QByteArray() << QStringLiteral("Zeile 1: die Datei ist leer");
        QTest::newRow("not a report file") << QByteArray("PK\x03\x04junk") << QStringLiteral("Zeile 1: keine Berichtsdatei");
        QTest::newRow("truncated") << kGood.left(kGood.indexOf("end\n"))
                                   << QStringLiteral("Zeile 15: Bericht „Liste“ (ab Zeile 3) endet ohne „end“");
        QTest::newRow("unknown band") << QByteArray(kGood).replace("band summary", "band fusszeile")
                                      << QStringLiteral("Zeile 14: unbekannte Bandart „fusszeile“");
        QTest::newRow("item outside its band") << QByteArray(kGood).replace("text 0 0 50 4", "text 0 3 50 4")
                                               << QStringLiteral("Zeile 12: Höhe 4 außerhalb");
        QTest::newRow("absurd size") << QByteArray(kGood).replace("paper A4 landscape", "paper 1e300 5")
                                     << QStringLiteral("Zeile 4: Papierbreite 1e300 außerhalb");
        QTest::newRow("not a number") << QByteArray(kGood).replace("font \"DejaVu Sans\" 8.5", "font x nan")
                                      << QStringLiteral("Zeile 6: „nan“ ist keine Zahl");
        QTest::newRow("open quote") << QByteArray(kGood).replace("\"{Name}\"", "\"{Name}")
                                    << QStringLiteral("Zeile 12: Anführungszeichen nicht geschlossen");
        QTest::newRow("open brace") << QByteArray(kGood).replace("\"{Name}\"", "\"{Name\"")
                                    << QStringLiteral("Zeile 12: „{“ ohne „}“");
        QTest::newRow("footer without head") << QByteArray(kGood).replace("groupfooter 2 by=Ort", "groupfooter 2 by=PLZ")
                                             << QStringLiteral("Zeile 13: Gruppenfuß für „PLZ“ ohne Gruppenkopf");
        QTest::newRow("twice the same band") << QByteArray(kGood).replace("band summary", "band detail")
                                             << QStringLiteral("Zeile 14: dieses Band gibt es schon (Zeile 11)");
        QTest::newRow("same report twice") << kGood + kGood.mid(8)
                                           << QStringLiteral("Zeile 18: Bericht „Liste“ gibt es schon");
        QTest::newRow("latin-1") << QByteArray(kGood).replace("Größe", "Gr\xf6\xdf" "e")
                                 << QStringLiteral("Zeile 8: kein gültiges UTF-8");
        QTest::newRow("paper after bands") << QByteArray(kGood).replace("    richtext", "  paper A5\n    richtext")
                                           << QStringLiteral("Zeile 15: „paper“ muss vor dem ersten Band stehen");
        QTest::newRow("rich text in a detail band")
            << QByteArray(kGood).replace("text 0 0 50 4 \"{Name}\"", "richtext 0 0 50 4 Name")
            << QStringLiteral("Zeile 12: „richtext“ steht nur");
        QTest::newRow("margins eat the paper") << QByteArray(kGood).replace("margins 10 10 10 10", "margins 150 10 150 10")
                                               << QStringLiteral("Zeile 5: die Ränder lassen keinen Platz");
    }

    void damagedInputNamesTheLine()
    {
        QFETCH(QByteArray, text);
        QFETCH(QString, error);
        const ReportParseResult result = ReportParser::parse(text);
        QVERIFY2(result.error.startsWith(error), qPrintable(result.error));
        QVERIFY(result.project.reports.isEmpty());
    }

    void hostileSizesAreRefusedQuickly()
    {
        // A million bands: refused at the bound, not read to the end.
        QByteArray bands = "orvex 1\nreport X\n";
        for (int i = 0; i < 1'000'000 / 64; ++i)
            bands += "band detail 1\n";
        QVERIFY(errorOf(bands).contains(QStringLiteral("dieses Band gibt es schon")));
        QByteArray groups = "orvex 1\nreport X\n";
        for (int i = 0; i < 100; ++i)
            groups += "band groupheader 1 by=F" + QByteArray::number(i) + '\n';
        QVERIFY(errorOf(groups).startsWith(QStringLiteral("Zeile 35: mehr als 32 Bänder")));
        QVERIFY(errorOf(QByteArray(ReportParser::kMaxFileSize + 1, ' ')).startsWith(QStringLiteral("die Datei ist größer")));
        QVERIFY(errorOf("orvex 1\nreport X\nband title 5\ntext 0 0 1 1 \"" + QByteArray(5000, 'a') + "\"\nend\n")
                    .contains(QStringLiteral("länger als 4000")));
    }

    void randomDamageNeverPasses()
    {
        // Cutting the good file anywhere inside its report must be refused.
        const qsizetype last = kGood.lastIndexOf("end");
        for (qsizetype cut = kGood.indexOf("report") + 1; cut < last; ++cut) {
            const ReportParseResult result = ReportParser::parse(kGood.left(cut));
            QVERIFY2(!result.ok(), qPrintable(QString::number(cut)));
            QVERIFY(result.error.startsWith(QLatin1String("Zeile ")));
        }
        auto* random = QRandomGenerator::global();
        for (int round = 0; round < 2000; ++round) {
            QByteArray text = kGood;
            for (int flips = random->bounded(1, 6); flips > 0; --flips)
                text[random->bounded(text.size())] = char(random->bounded(256));
            const ReportParseResult result = ReportParser::parse(text);
            QVERIFY(result.ok() || result.error.startsWith(QLatin1String("Zeile ")));
        }
    }
};

ORVANTA_TEST(TestReportParser)
#include "tst_reportparser.moc"
