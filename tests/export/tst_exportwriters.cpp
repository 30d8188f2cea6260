// The four export formats read back by readers we did not write (xlrd, lxml, Python's csv
// module, LibreOffice): every cell must equal what the grid shows.
#include "export/writers/BiffWriter.h"
#include "export/writers/ExportWriter.h"
#include "tests/export/ExportReadBack.h"
#include "tests/TestPaths.h"
#include "tests/support/TestRegistry.h"
#include "ui/grid/GridController.h"
#include "ui/grid/GridSnapshot.h"
#include "ui/grid/MemoryGridSource.h"

#include <QDir>
#include <QFile>
#include <QJsonArray>
#include <QJsonDocument>
#include <QProcess>
#include <QTemporaryDir>
#include <QTest>

using namespace orvanta;

namespace {

// Text the store cannot hold (it keeps ISO 8859-1) comes through a display-text column.
const QStringList notes = {
    QStringLiteral("Grüße aus Köln – 12,50 €"),
    QStringLiteral("<b>&amp; \"quoted\" 'single'</b>"),
    QStringLiteral("line one\nline two\r\nthree, with comma"),
    QStringLiteral("ctrl\x01\x1f" "bell\x07"),
    QString(32000, u'ä') + QStringLiteral("€"),
    QString(),
};

struct Grid {
    MemoryGridSource src{{{QStringLiteral("LID"), GridFieldType::Integer},
                          {QStringLiteral("ABID"), GridFieldType::Integer},
                          {QStringLiteral("FROMBEZ"), GridFieldType::Text},
                          {QStringLiteral("TSDATE"), GridFieldType::Date},
                          {QStringLiteral("HIDDEN"), GridFieldType::Text}}};
    GridController g;
    int lid, abid, caller, day, note, hidden;

    explicit Grid(int rows = 6)
    {
        lid = g.addColumn(GridColumn(QStringLiteral("cLID"), QStringLiteral("LID"), QStringLiteral("Nr.")));
        abid = g.addColumn(GridColumn(QStringLiteral("cABID"), QStringLiteral("ABID"), QStringLiteral("ABID")));
        caller = g.addColumn(GridColumn(QStringLiteral("cFROMBEZ"), QStringLiteral("FROMBEZ"), QStringLiteral("Anrufer, Name")));
        day = g.addColumn(GridColumn(QStringLiteral("cTSDATE"), QStringLiteral("TSDATE"), QStringLiteral("Datum")));
        GridColumn noteColumn(QStringLiteral("cNOTE"), {}, QStringLiteral("<Notiz> & \"mehr\""));
        noteColumn.displayText = [](const GridSource&, quint32 row) { return notes[row % notes.size()]; };
        note = g.addColumn(noteColumn);
        hidden = g.addColumn(GridColumn(QStringLiteral("cHIDDEN"), QStringLiteral("HIDDEN"), QStringLiteral("Versteckt")));
        g.setColumnVisible(hidden, false);
        g.moveColumn(day, 0);
        for (int i = 0; i < rows; ++i) {
            const quint32 r = src.appendRow();
            src.setInt(r, 0, 100 + i);
            src.setInt(r, 1, 7);
            src.setText(r, 2, i % 3 == 0 ? QStringLiteral("Müller") : QStringLiteral("Abel"));
            src.setDate(r, 3, QDate(2024, 3, 1 + i % 28));
            src.setText(r, 4, QStringLiteral("geheim"));
        }
        g.setSource(&src);
    }
};

const QStringList excluded{QStringLiteral("cABID")};

} // namespace

class TestExportWriters : public QObject {
    Q_OBJECT

private Q_SLOTS:
    void formats_data()
    {
        QTest::addColumn<int>("format");
        QTest::addColumn<bool>("grouped");
        QTest::addColumn<int>("rows");
        for (const auto& [name, format] : {std::pair{"html", ExportFormat::Html}, std::pair{"xls", ExportFormat::Excel},
                                           std::pair{"xml", ExportFormat::Xml}, std::pair{"txt", ExportFormat::Text}}) {
            QTest::addRow("%s plain", name) << int(format) << false << 12;
            QTest::addRow("%s grouped", name) << int(format) << true << 12;
            QTest::addRow("%s empty", name) << int(format) << false << 0;
        }
    }

    // Every cell, the header, group rows and the left-out and hidden columns, per format.
    void formats()
    {
        QFETCH(int, format);
        QFETCH(bool, grouped);
        QFETCH(int, rows);
        Grid grid(rows);
        if (grouped)
            grid.g.groupBy(grid.caller);
        QTemporaryDir dir;
        const auto f = static_cast<ExportFormat>(format);
        const QString path = dir.filePath(QStringLiteral("Export.") + exportExtension(f));
        GridSnapshot snapshot(grid.g, excluded);
        const ExportResult result = exportGrid(snapshot, f, path);
        QVERIFY2(result.ok, qPrintable(result.error));
        const QList<test::Table> tables = test::readBack(exportExtension(f), path);
        QCOMPARE(tables.size(), 1);
        const test::Table want = test::shownTable(grid.g, excluded);
        // Hidden columns (the grouped one too) and ABID are not written.
        QCOMPARE(want.front().size(), grouped ? 3 : 4);
        test::compareTables(tables.front(), want, f == ExportFormat::Html || f == ExportFormat::Xml);
        QCOMPARE(result.rowsWritten, qint64(want.size() - 1));
    }

    // Numbers and dates reach the spreadsheet as values, not text.
    void excelValueTypes()
    {
        Grid grid(3);
        QTemporaryDir dir;
        const QString path = dir.filePath(QStringLiteral("v.xls"));
        GridSnapshot snapshot(grid.g, excluded);
        QVERIFY(exportGrid(snapshot, ExportFormat::Excel, path).ok);
        QProcess p;
        p.start(test::python(), {QStringLiteral("-c"),
                           QStringLiteral("import sys, xlrd\n"
                                          "s = xlrd.open_workbook(sys.argv[1]).sheet_by_index(0)\n"
                                          "print(s.cell(1, 0).ctype, s.cell(1, 1).ctype, s.cell(1, 2).ctype, s.cell(1,0).value)"),
                           path});
        QVERIFY(p.waitForFinished(60000));
        QCOMPARE(p.exitCode(), 0);
        // date (3), number (2), text (1); 1 March 2024 is day 45352 of the spreadsheet calendar
        QCOMPARE(QString::fromLatin1(p.readAllStandardOutput()).trimmed(), QStringLiteral("3 2 1 45352.0"));
    }

    // More rows than a sheet holds: further sheets, each with the header.
    void excelSheetLimit()
    {
        Grid grid(BiffWorkbook::maxRows + 10);
        for (const int c : {grid.caller, grid.note, grid.day})
            grid.g.setColumnVisible(c, false);
        QTemporaryDir dir;
        const QString path = dir.filePath(QStringLiteral("big.xls"));
        GridSnapshot snapshot(grid.g, excluded);
        QVERIFY(exportGrid(snapshot, ExportFormat::Excel, path).ok);
        const QList<test::Table> tables = test::readBack(QStringLiteral("xls"), path);
        QCOMPARE(tables.size(), 2);
        QCOMPARE(tables[0].size(), BiffWorkbook::maxRows);
        QCOMPARE(tables[1].size(), 1 + 10 + 1);
        QCOMPARE(tables[1].front(), QStringList{QStringLiteral("Nr.")});
        QCOMPARE(tables[1].back(), QStringList{QString::number(100 + BiffWorkbook::maxRows + 9)});
    }

    // Excel's own kind of reader: LibreOffice converts the workbook to text.
    void excelOpensInLibreOffice()
    {
        Grid grid(8);
        grid.g.groupBy(grid.caller);
        QTemporaryDir dir;
        const QString path = dir.filePath(QStringLiteral("lo.xls"));
        GridSnapshot snapshot(grid.g, excluded);
        QVERIFY(exportGrid(snapshot, ExportFormat::Excel, path).ok);
        QProcess lo;
        lo.setWorkingDirectory(dir.path());
        lo.start(QStringLiteral("soffice"),
                 {QStringLiteral("-env:UserInstallation=file://") + dir.filePath(QStringLiteral("profile")),
                  QStringLiteral("--headless"), QStringLiteral("--convert-to"),
                  QStringLiteral("csv:Text - txt - csv (StarCalc):44,34,76,1"), QStringLiteral("--outdir"),
                  dir.filePath(QStringLiteral("out")), path});
        QVERIFY2(lo.waitForFinished(240000), "LibreOffice (libreoffice-calc-nogui) did not finish");
        QCOMPARE(lo.exitCode(), 0);
        const QList<test::Table> tables = test::readBack(QStringLiteral("txt"), dir.filePath(QStringLiteral("out/lo.csv")));
        QCOMPARE(tables.size(), 1);
        // LibreOffice writes line breaks inside a cell as LF only.
        test::Table want = test::shownTable(grid.g, excluded);
        for (QStringList& row : want) {
            for (QString& cell : row)
                cell.replace(QLatin1String("\r\n"), QLatin1String("\n"));
        }
        test::compareTables(tables.front(), want, false);
    }

    // A failed or cancelled export leaves the target as it was and reports the failure.
    void failures()
    {
        Grid grid(1200);
        QTemporaryDir dir;
        GridSnapshot snapshot(grid.g, excluded);
        for (const ExportFormat f : {ExportFormat::Html, ExportFormat::Excel, ExportFormat::Xml, ExportFormat::Text}) {
            const QString missing = dir.filePath(QStringLiteral("gone/Export.") + exportExtension(f));
            const ExportResult r = exportGrid(snapshot, f, missing);
            QVERIFY(!r.ok);
            QVERIFY(!r.error.isEmpty());
            QVERIFY(!QFile::exists(missing));

            const QString existing = dir.filePath(QStringLiteral("old.") + exportExtension(f));
            {
                QFile old(existing);
                QVERIFY(old.open(QIODevice::WriteOnly));
                old.write("old content");
            }
            qint64 seen = 0;
            const ExportResult cancelled = exportGrid(snapshot, f, existing, [&](qint64 rows) {
                seen = rows;
                return rows < 1000;
            });
            QVERIFY(!cancelled.ok);
            QVERIFY(cancelled.cancelled);
            QCOMPARE(seen, qint64(1000));
            QFile old(existing);
            QVERIFY(old.open(QIODevice::ReadOnly));
            QCOMPARE(old.readAll(), QByteArray("old content"));
            QCOMPARE(QDir(dir.path()).entryList(QDir::Files), QStringList{existing.section(u'/', -1)});
            QVERIFY(QFile::remove(existing));
        }
    }

    // The writer stops where the disk ends: a device that takes no more bytes.
    void excelDiskFull()
    {
        if (!QFile::exists(QStringLiteral("/dev/full")))
            QFAIL("/dev/full is missing");
        QFile full(QStringLiteral("/dev/full"));
        QVERIFY(full.open(QIODevice::WriteOnly | QIODevice::Unbuffered));
        Grid grid(50);
        GridSnapshot snapshot(grid.g, excluded);
        BiffExportWriter writer;
        QVERIFY(writer.begin(full, snapshot));
        while (snapshot.next())
            QVERIFY(writer.dataRow(full, snapshot));
        QVERIFY(!writer.finish(full));
        QVERIFY(!writer.error().isEmpty());
    }
};

ORVANTA_TEST(TestExportWriters)
#include "tst_exportwriters.moc"
