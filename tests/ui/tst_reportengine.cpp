#include "platform/AppException.h"
#include "tests/support/ReportCapture.h"
#include "tests/support/TestRegistry.h"
#include "ui/report/ReportLayout.h"
#include "ui/report/ReportParser.h"
#include "ui/report/ReportRenderer.h"
#include "ui/rtf/RtfWriter.h"

#include <QElapsedTimer>
#include <QPdfWriter>
#include <QTemporaryDir>
#include <QTest>
#include <QTextCursor>
#include <QTextDocument>
#include <QTextList>

using namespace orvanta;
using namespace orvanta::test;

namespace {

class MemorySource final : public ReportDataSource {
public:
    MemorySource(QStringList names, QList<QStringList> rows)
        : m_names(std::move(names))
        , m_rows(std::move(rows))
    {
    }
    QList<ReportField> fields() const override
    {
        QList<ReportField> f;
        for (const QString& n : m_names)
            f.append({n, 20, QStringLiteral("Feld ") + n});
        return f;
    }
    void open() override
    {
        m_at = 0;
        ++opens;
    }
    bool atEnd() const override { return m_at >= m_rows.size(); }
    QStringList row() const override { return m_rows.at(m_at); }
    void next() override { ++m_at; }
    void restore() override { ++restores; }

    int opens = 0;
    int restores = 0;

private:
    QStringList m_names;
    QList<QStringList> m_rows;
    qsizetype m_at = 0;
};

const QByteArray kProject = "orvex 1\n"
                            "report Liste\n"
                            "  band title 12\n"
                            "    text 0 0 175 6 size=14 bold \"Orte {Zeitraum}\"\n"
                            "  band pageheader 6\n"
                            "    text 0 0 60 5 bold \"Name\"\n"
                            "  band groupheader 7 by=Ort\n"
                            "    text 0 1 175 5 bold \"Ort: {Ort}\"\n"
                            "  band detail 5 shade=Odd\n"
                            "    text 0 0 60 5 \"{Name}\"\n"
                            "    text 60 0 60 5 \"{Ort}\"\n"
                            "  band groupfooter 6 by=Ort\n"
                            "    text 0 0 175 5 \"Ende {Ort}\"\n"
                            "  band pagefooter 8\n"
                            "    text 0 2 175 5 align=right \"Seite {Seite} von {Seiten}\"\n"
                            "  band summary 6\n"
                            "    text 0 0 175 5 \"Gedruckt {Druckdatum}\"\n"
                            "end\n"
                            "report Notiz\n"
                            "  band title 14\n"
                            "    text 0 0 175 8 bold \"Notiz zu {KontaktBezeichnung}\"\n"
                            "  band summary 1\n"
                            "    richtext 0 0 175 1 NotizText\n"
                            "  band pagefooter 8\n"
                            "    text 0 2 175 5 align=right \"Seite {Seite} von {Seiten}\"\n"
                            "end\n";

ReportDefinition definition(const char* name)
{
    const ReportParseResult result = ReportParser::parse(kProject);
    if (!result.ok())
        qFatal("%s", qPrintable(result.error));
    return *result.project.find(QLatin1String(name));
}

QList<QStringList> townRows(int count)
{
    QList<QStringList> rows;
    const char* towns[] = {"Aachen", "Köln", "Zürich"};
    for (int i = 0; i < count; ++i)
        rows.append({QStringLiteral("Person %1").arg(i, 3, 10, QLatin1Char('0')), QString::fromUtf8(towns[i * 3 / count]),
                     i % 2 ? QStringLiteral("F") : QStringLiteral("T")});
    return rows;
}

ReportParameters zeitraum()
{
    ReportParameters p;
    p.text.insert(QStringLiteral("Zeitraum"), QStringLiteral("(alles)"));
    return p;
}

int linesEqual(const QString& text, const QString& line)
{
    int n = 0;
    for (const QString& l : text.split(u'\n'))
        n += l.trimmed() == line ? 1 : 0;
    return n;
}

const QDateTime kPrinted(QDate(2026, 3, 9), QTime(14, 5));

} // namespace

class TestReportEngine : public QObject {
    Q_OBJECT

private Q_SLOTS:
    void groupedListRunsOverPagesWithHeadsAndPageNumbers()
    {
        MemorySource source({QStringLiteral("Name"), QStringLiteral("Ort"), QStringLiteral("Odd")}, townRows(150));
        ReportLayout layout(definition("Liste"), zeitraum(), &source, kPrinted);
        // The first page is ready before the rest is laid out.
        QVERIFY(!layout.layoutMore(1));
        QCOMPARE(layout.completePages(), 1);
        QTemporaryDir dir;
        const QString pdf = dir.filePath(QStringLiteral("liste.pdf"));
        ReportRenderer::writePdf(pdf, layout);
        QVERIFY(layout.finished());
        QCOMPARE(source.opens, 1);
        QCOMPARE(source.restores, 1);
        const int pages = layout.pageCount();
        QVERIFY(pages >= 3);
        QCOMPARE(pdfPages(pdf), pages);

        const QString text = pdfText(pdf);
        if (qEnvironmentVariableIsSet("DUMP_PDF"))
            QFile::copy(pdf, QStringLiteral("/tmp/p14/liste.pdf"));
        const QStringList sheets = text.split(u'\f', Qt::SkipEmptyParts);
        QVERIFY(sheets.first().contains(QStringLiteral("Orte (alles)")));
        QCOMPARE(text.count(QStringLiteral("Orte (alles)")), 1); // the title opens the first page only
        QVERIFY(sheets.first().contains(QStringLiteral("Seite 1 von %1").arg(pages)));
        QVERIFY(sheets.at(pages - 1).contains(QStringLiteral("Seite %1 von %1").arg(pages)));
        QCOMPARE(linesEqual(text, QStringLiteral("Name")), pages); // the page header on every page
        for (const char* town : {"Aachen", "Köln", "Zürich"}) {
            QCOMPARE(text.count(QStringLiteral("Ort: ") + QString::fromUtf8(town)), 1);
            QCOMPARE(text.count(QStringLiteral("Ende ") + QString::fromUtf8(town)), 1);
        }
        // Every row once, in order; the summary closes the last page.
        qsizetype at = 0;
        for (int i = 0; i < 150; ++i) {
            const qsizetype found = text.indexOf(QStringLiteral("Person %1").arg(i, 3, 10, QLatin1Char('0')), at);
            QVERIFY2(found > at || (i == 0 && found >= 0), qPrintable(QString::number(i)));
            at = found;
        }
        QVERIFY(sheets.at(pages - 1).contains(QStringLiteral("Gedruckt 09.03.2026")));
        // A group head is never left alone at the foot of a page.
        for (const QString& sheet : sheets) {
            const QStringList lines = sheet.trimmed().split(u'\n');
            for (qsizetype i = 0; i + 1 < lines.size(); ++i)
                if (lines[i].trimmed().startsWith(QLatin1String("Ort: ")))
                    QVERIFY(lines[i + 1].contains(QLatin1String("Person")));
        }
    }

    void anEmptyReportStillHasItsPage()
    {
        MemorySource source({QStringLiteral("Name"), QStringLiteral("Ort"), QStringLiteral("Odd")}, {});
        ReportLayout layout(definition("Liste"), zeitraum(), &source, kPrinted);
        QTemporaryDir dir;
        const QString pdf = dir.filePath(QStringLiteral("leer.pdf"));
        ReportRenderer::writePdf(pdf, layout);
        QCOMPARE(layout.pageCount(), 1);
        const QString text = pdfText(pdf);
        QVERIFY(text.contains(QStringLiteral("Orte (alles)")));
        QVERIFY(text.contains(QStringLiteral("Seite 1 von 1")));
        QVERIFY(!text.contains(QStringLiteral("Ort: ")));
    }

    // A template is compiled once and expanded per cell; both ways give the same text.
    void templatesExpandFieldsParametersPagesAndBraces()
    {
        MemorySource source({QStringLiteral("Name"), QStringLiteral("Ort"), QStringLiteral("Odd")}, townRows(3));
        ReportLayout layout(definition("Liste"), zeitraum(), &source, kPrinted);
        layout.layoutAll();
        const QList<std::pair<const char*, const char*>> cases{
            {"{Name}", "Person 001"},
            {"{Ort}", "Köln"},
            {"{{{Name}}} {Zeitraum}", "{Person 001} (alles)"},
            {"{{Seite}} Seite {Seite} von { Seiten }", "{Seite} Seite 2 von 1"},
            {"{Druckdatum}, {Druckzeit} Uhr", "09.03.2026, 14:05 Uhr"},
            {"ohne Namen", "ohne Namen"},
            {"", ""},
        };
        for (const auto& [templ, expected] : cases) {
            const QString t = QString::fromUtf8(templ);
            QString scratch = QStringLiteral("vorher");
            const QStringView compiled = layout.expand(layout.compile(t), 1, 1, scratch);
            QCOMPARE(compiled.toString(), QString::fromUtf8(expected));
            QCOMPARE(layout.expand(t, 1, 1), QString::fromUtf8(expected));
        }
        // A row beyond the report has empty fields, not stale ones.
        QString scratch;
        QVERIFY(layout.expand(layout.compile(QStringLiteral("{Name}")), 99, 0, scratch).isEmpty());
    }

    void oddValuesPrintAsTheyAre()
    {
        // A separator character inside a value, characters the report font lacks, an empty row.
        MemorySource source({QStringLiteral("Name"), QStringLiteral("Ort"), QStringLiteral("Odd")},
                            {{QStringLiteral("Vor\x1fNach"), QStringLiteral("Köln"), QStringLiteral("T")},
                             {QStringLiteral("漢字 ☎ Anruf"), QStringLiteral("Köln"), QStringLiteral("F")},
                             {QString(), QString(), QString()}});
        ReportLayout layout(definition("Liste"), zeitraum(), &source, kPrinted);
        QTemporaryDir dir;
        const QString pdf = dir.filePath(QStringLiteral("odd.pdf"));
        ReportRenderer::writePdf(pdf, layout);
        const QString text = pdfText(pdf);
        QVERIFY2(text.contains(QStringLiteral("Vor Nach")), qPrintable(text));
        QVERIFY(text.contains(QStringLiteral("Anruf")));
        QCOMPARE(text.count(QStringLiteral("Ort:")), 2); // "Köln" and the empty town
    }

    void aNoteFlowsAcrossPages()
    {
        QTextDocument note;
        QTextCursor cursor(&note);
        cursor.insertText(QStringLiteral("Erster Absatz: Größe, Äpfel, Übermaß."));
        QTextListFormat bullets;
        bullets.setStyle(QTextListFormat::ListDisc);
        cursor.insertList(bullets);
        for (int i = 1; i <= 140; ++i) {
            if (i > 1)
                cursor.insertBlock();
            cursor.insertText(QStringLiteral("Punkt %1 mit Umlauten äöü ß").arg(i));
        }
        cursor.insertBlock(QTextBlockFormat());
        cursor.currentList() ? cursor.currentList()->remove(cursor.block()) : void();
        cursor.insertText(QStringLiteral("Letzter Absatz."));
        ReportParameters p;
        p.text.insert(QStringLiteral("KontaktBezeichnung"), QStringLiteral("Müller GmbH"));
        p.rich.insert(QStringLiteral("NotizText"), RtfWriter::write(note));
        ReportLayout layout(definition("Notiz"), p, nullptr, kPrinted);
        QTemporaryDir dir;
        const QString pdf = dir.filePath(QStringLiteral("notiz.pdf"));
        ReportRenderer::writePdf(pdf, layout);
        const int pages = layout.pageCount();
        QVERIFY(pages >= 3);
        if (qEnvironmentVariableIsSet("DUMP_PDF"))
            QFile::copy(pdf, QStringLiteral("/tmp/p14/notiz.pdf"));
        const QStringList sheets = pdfText(pdf).split(u'\f', Qt::SkipEmptyParts);
        QCOMPARE(sheets.size(), pages);
        QVERIFY(sheets.first().contains(QStringLiteral("Notiz zu Müller GmbH")));
        QVERIFY(sheets.first().contains(QStringLiteral("Erster Absatz: Größe, Äpfel, Übermaß.")));
        QVERIFY(sheets.last().contains(QStringLiteral("Letzter Absatz.")));
        QVERIFY(sheets.last().contains(QStringLiteral("Seite %1 von %1").arg(pages)));
        // Every line once: no line is lost or repeated at a page break.
        const QString all = sheets.join(u'\n');
        for (int i = 1; i <= 140; ++i)
            QCOMPARE(linesEqual(all, QStringLiteral("Punkt %1 mit Umlauten äöü ß").arg(i)), 1);
    }

    void aHugeNoteStaysBounded()
    {
        // 10 MB of note text: laid out and paged without hanging; every page is filled.
        QByteArray text;
        text.reserve(10 * 1024 * 1024);
        while (text.size() < 10 * 1024 * 1024)
            text += "Zeile mit etwas Text, damit sie umbricht und die Seite füllt, äöü.\n";
        ReportParameters p;
        p.text.insert(QStringLiteral("KontaktBezeichnung"), QStringLiteral("Groß"));
        p.rich.insert(QStringLiteral("NotizText"), text);
        QElapsedTimer t;
        t.start();
        ReportLayout layout(definition("Notiz"), p, nullptr, kPrinted);
        layout.layoutAll();
        qInfo("10 MB note: %d pages in %lld ms", layout.pageCount(), t.elapsed());
        QVERIFY(layout.pageCount() > 1000);
    }

    void unknownNamesFailBeforeAnythingIsPrinted_data()
    {
        QTest::addColumn<QByteArray>("from");
        QTest::addColumn<QByteArray>("to");
        QTest::addColumn<QString>("error");
        QTest::newRow("field") << QByteArray("\"{Name}\"") << QByteArray("\"{Nachname}\"")
                               << QStringLiteral("Bericht „Liste“, Zeile 10: unbekanntes Feld oder unbekannter Parameter „Nachname“");
        QTest::newRow("group") << QByteArray("by=Ort") << QByteArray("by=Stadt")
                               << QStringLiteral("Bericht „Liste“, Zeile 7: unbekanntes Feld");
        QTest::newRow("parameter") << QByteArray("{Zeitraum}") << QByteArray("{Periode}")
                                   << QStringLiteral("Bericht „Liste“, Zeile 4: unbekanntes Feld oder unbekannter Parameter „Periode“");
    }

    void unknownNamesFailBeforeAnythingIsPrinted()
    {
        QFETCH(QByteArray, from);
        QFETCH(QByteArray, to);
        QFETCH(QString, error);
        QByteArray project = kProject;
        project.replace(from, to);
        const ReportParseResult parsed = ReportParser::parse(project);
        QVERIFY2(parsed.ok(), qPrintable(parsed.error));
        MemorySource source({QStringLiteral("Name"), QStringLiteral("Ort"), QStringLiteral("Odd")}, townRows(3));
        ReportLayout layout(*parsed.project.find(QStringLiteral("Liste")), zeitraum(), &source, kPrinted);
        try {
            layout.start();
            QFAIL("no error");
        } catch (const AppException& e) {
            QVERIFY2(e.message().startsWith(error), qPrintable(e.message()));
        }
        QCOMPARE(source.opens, 0);
        QCOMPARE(layout.pageCount(), 0);
    }

    void printsRangesAndCopies()
    {
        MemorySource source({QStringLiteral("Name"), QStringLiteral("Ort"), QStringLiteral("Odd")}, townRows(150));
        ReportLayout layout(definition("Liste"), zeitraum(), &source, kPrinted);
        QTemporaryDir dir;
        const QString pdf = dir.filePath(QStringLiteral("druck.pdf"));
        {
            QPdfWriter writer(pdf);
            ReportRenderer::print(&writer, layout, 2, 3, 2);
        }
        QCOMPARE(pdfPages(pdf), 4);
        const QStringList sheets = pdfText(pdf).split(u'\f', Qt::SkipEmptyParts);
        QVERIFY(sheets.at(0).contains(QStringLiteral("Seite 2 von")));
        QVERIFY(sheets.at(1).contains(QStringLiteral("Seite 3 von")));
        QVERIFY(sheets.at(2).contains(QStringLiteral("Seite 2 von")));
    }

    void anUnwritablePdfTargetIsReported()
    {
        MemorySource source({QStringLiteral("Name"), QStringLiteral("Ort"), QStringLiteral("Odd")}, townRows(3));
        ReportLayout layout(definition("Liste"), zeitraum(), &source, kPrinted);
        try {
            ReportRenderer::writePdf(QStringLiteral("/nonexistent-folder/x.pdf"), layout);
            QFAIL("no error");
        } catch (const AppException& e) {
            QVERIFY(e.message().startsWith(QStringLiteral("Die Datei „/nonexistent-folder/x.pdf“ kann nicht geschrieben werden")));
        }
    }
};

ORVANTA_TEST(TestReportEngine)
#include "tst_reportengine.moc"
