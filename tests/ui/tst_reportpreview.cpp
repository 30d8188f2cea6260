#include "platform/ErrorLog.h"
#include "tests/support/ReportCapture.h"
#include "tests/support/ScriptedDialogService.h"
#include "tests/support/TestRegistry.h"
#include "ui/report/ReportLayout.h"
#include "ui/report/ReportParser.h"
#include "ui/report/TPrintF.h"
#include "ui/report/TRavePreviewF.h"

#include <QAction>
#include <QLabel>
#include <QLineEdit>
#include <QPdfWriter>
#include <QPrinter>
#include <QPushButton>
#include <QRadioButton>
#include <QScrollArea>
#include <QScrollBar>
#include <QTemporaryDir>
#include <QTest>

using namespace orvanta;
using namespace orvanta::test;

namespace {

class Rows final : public ReportDataSource {
public:
    explicit Rows(int count)
        : m_count(count)
    {
    }
    QList<ReportField> fields() const override { return {{QStringLiteral("Nr"), 10, QStringLiteral("Feld Nr")}}; }
    void open() override { m_at = 0; }
    bool atEnd() const override { return m_at >= m_count; }
    QStringList row() const override { return {QStringLiteral("Zeile %1").arg(m_at + 1)}; }
    void next() override { ++m_at; }

private:
    int m_count;
    int m_at = 0;
};

ReportDefinition listReport()
{
    const ReportParseResult r = ReportParser::parse("orvex 1\nreport Zeilen\n"
                                                    "  band detail 5\n    text 0 0 100 5 \"{Nr}\"\n"
                                                    "  band pagefooter 8\n    text 0 2 170 5 \"Seite {Seite} von {Seiten}\"\n"
                                                    "end\n");
    if (!r.ok())
        qFatal("%s", qPrintable(r.error));
    return r.project.reports.first();
}

QAction* action(const TRavePreviewF& w, const char* name)
{
    return w.findChild<QAction*>(QLatin1String(name));
}

QString panel(const TRavePreviewF& w, int i)
{
    return w.findChild<QLabel*>(QStringLiteral("dxSB1Panel%1").arg(i))->text();
}

bool pageActions(const TRavePreviewF& w, bool first, bool prior, bool next, bool last)
{
    return action(w, "rv_FirstPage")->isEnabled() == first && action(w, "rv_PriorPage")->isEnabled() == prior
        && action(w, "rv_NextPage")->isEnabled() == next && action(w, "rv_LastPage")->isEnabled() == last;
}

// Printing goes to a PDF file; each job replaces the last.
class PdfPrinter {
public:
    explicit PdfPrinter(bool available = true)
    {
        setPrintTarget({[available] { return available; },
                        [this]() -> std::unique_ptr<QPagedPaintDevice> {
                            ++jobs;
                            return std::make_unique<QPdfWriter>(path());
                        }});
    }
    ~PdfPrinter() { setPrintTarget({}); }
    QString path() const { return m_dir.filePath(QStringLiteral("druck.pdf")); }
    int jobs = 0;

private:
    QTemporaryDir m_dir;
};

// A printer that takes `pages` pages and then goes away: the next page is refused, as a printer
// device reports a job it cannot go on with.
class VanishingPrinter final : public QPdfWriter {
public:
    VanishingPrinter(const QString& path, int pages)
        : QPdfWriter(path)
        , m_pages(pages)
    {
    }
    bool newPage() override { return ++m_done < m_pages && QPdfWriter::newPage(); }

private:
    int m_pages;
    int m_done = 0;
};

// What the user is shown: the error log's dialogs, scripted.
struct ShownErrors {
    QTemporaryDir dir;
    ScopedScriptedDialogs dialogs;
    TvkErrorLog log{dir.path(), 20, QStringLiteral("OXError.log")};
    ShownErrors() { setErrorLog(&log); }
    ~ShownErrors() { setErrorLog(nullptr); }
    ShownErrors(const ShownErrors&) = delete;
    ShownErrors& operator=(const ShownErrors&) = delete;
};

} // namespace

class TestReportPreview : public QObject {
    Q_OBJECT

private Q_SLOTS:
    void aOnePageReportOffersNoPaging()
    {
        PdfPrinter printer;
        Rows rows(3);
        ReportLayout layout(listReport(), {}, &rows, QDateTime::currentDateTime());
        layout.start();
        TRavePreviewF w(layout, QStringLiteral("Vorschau Test"));
        w.show();
        QTRY_VERIFY(layout.finished());
        QCOMPARE(w.windowTitle(), QStringLiteral("Vorschau Test"));
        QCOMPARE(panel(w, 1), QStringLiteral("Seite 1 von 1"));
        QVERIFY(pageActions(w, false, false, false, false));
        QVERIFY(action(w, "rv_Print")->isEnabled());
        QCOMPARE(action(w, "rv_PDF")->toolTip(), QStringLiteral("Ausgeben als PDF"));
        QCOMPARE(action(w, "rv_ZoomPageSize")->text(), QStringLiteral("Ganze Seite"));
    }

    void pagesZoomAndThePageEdit()
    {
        PdfPrinter printer(false);
        Rows rows(3000);
        ReportLayout layout(listReport(), {}, &rows, QDateTime::currentDateTime());
        layout.start();
        TRavePreviewF w(layout, QStringLiteral("Vorschau"));
        // The first page shows while the rest is still being laid out.
        QVERIFY(!layout.finished());
        QCOMPARE(w.currentPage(), 1);
        QCOMPARE(panel(w, 0), QStringLiteral("die Vorschau wird vorbereitet..."));
        w.show();
        QTRY_VERIFY(layout.finished());
        QVERIFY(panel(w, 0).isEmpty());
        const int pages = layout.pageCount();
        QVERIFY(pages > 10);
        QCOMPARE(panel(w, 1), QStringLiteral("Seite 1 von %1").arg(pages));
        QVERIFY(!action(w, "rv_Print")->isEnabled()); // no printer installed
        QVERIFY(pageActions(w, false, false, true, true));
        action(w, "rv_NextPage")->trigger();
        QCOMPARE(w.currentPage(), 2);
        QVERIFY(pageActions(w, true, true, true, true));
        action(w, "rv_LastPage")->trigger();
        QCOMPARE(panel(w, 1), QStringLiteral("Seite %1 von %1").arg(pages));
        QVERIFY(pageActions(w, true, true, false, false));
        action(w, "rv_FirstPage")->trigger();
        QCOMPARE(w.currentPage(), 1);

        auto* edit = w.findChild<QLineEdit*>(QStringLiteral("dxPage"));
        QCOMPARE(edit->text(), QStringLiteral("1"));
        edit->setFocus();
        edit->selectAll();
        QTest::keyClicks(edit, QStringLiteral("9x9a9"));
        QCOMPARE(edit->text(), QStringLiteral("999")); // digits only
        QTest::keyClick(edit, Qt::Key_Return);
        QCOMPARE(w.currentPage(), pages); // clamped to the page count
        edit->setText(QStringLiteral("0"));
        Q_EMIT edit->editingFinished();
        QCOMPARE(w.currentPage(), 1);

        auto* zoomText = w.findChild<QLabel*>(QStringLiteral("dxBS1"));
        action(w, "rv_Zoom100")->trigger();
        QCOMPARE(zoomText->text(), QStringLiteral("Seitengröße: 100.0%"));
        QCOMPARE(panel(w, 2), zoomText->text());
        action(w, "rv_ZoomIn")->trigger();
        QCOMPARE(zoomText->text(), QStringLiteral("Seitengröße: 110.0%"));
        w.setZoom(10);
        action(w, "rv_ZoomOut")->trigger();
        QCOMPARE(w.zoom(), 10.0); // never down to nothing
        QCOMPARE(zoomText->text(), QStringLiteral("Seitengröße: 10.0%"));
        action(w, "rv_ZoomPageSize")->trigger();
        QCOMPARE(w.zoom(), w.fitPageZoom());
        // Resizing fits the width.
        w.resize(900, 700);
        QTRY_COMPARE(w.zoom(), w.fitWidthZoom());

        // The wheel scrolls by 4 steps, 1 with Shift, 15 with Ctrl.
        w.setZoom(300);
        QScrollBar* bar = w.findChild<QScrollArea*>(QStringLiteral("ScrollBox1"))->verticalScrollBar();
        bar->setValue(bar->maximum() / 2);
        const int middle = bar->value();
        auto wheel = [&](Qt::KeyboardModifiers modifiers, int delta) {
            QWheelEvent e(QPointF(10, 10), QPointF(10, 10), QPoint(), QPoint(0, delta), Qt::NoButton, modifiers,
                          Qt::NoScrollPhase, false);
            QCoreApplication::sendEvent(&w, &e);
        };
        wheel(Qt::NoModifier, -120);
        QCOMPARE(bar->value(), middle + 4 * bar->singleStep());
        wheel(Qt::ShiftModifier, 120);
        QCOMPARE(bar->value(), middle + 3 * bar->singleStep());
        wheel(Qt::ControlModifier, 120);
        QCOMPARE(bar->value(), middle - 12 * bar->singleStep());
    }

    void thePrintDialogPrintsRangesAndCopies()
    {
        PdfPrinter printer;
        Rows rows(600);
        ReportLayout layout(listReport(), {}, &rows, QDateTime::currentDateTime());
        layout.start();
        TRavePreviewF w(layout, QStringLiteral("Vorschau"));
        w.show();
        QTRY_VERIFY(layout.finished());
        const int pages = layout.pageCount();
        QVERIFY(pages >= 6);

        auto open = [&w]() -> TPrintF* {
            action(w, "rv_Print")->trigger();
            return w.printDialog();
        };
        TPrintF* dialog = open();
        QVERIFY(dialog && dialog->isVisible());
        QCOMPARE(dialog->windowTitle(), QStringLiteral("Druckdialog"));
        // A second click brings the same dialog forward.
        QCOMPARE(open(), dialog);
        QCOMPARE(w.findChildren<TPrintF*>().size(), 1);
        auto* from = dialog->findChild<QLineEdit*>(QStringLiteral("cxTE1"));
        auto* to = dialog->findChild<QLineEdit*>(QStringLiteral("cxTE2"));
        auto* copies = dialog->findChild<QLineEdit*>(QStringLiteral("cxTE3"));
        QVERIFY(!from->isEnabled() && !to->isEnabled());
        QCOMPARE(copies->maxLength(), 4);
        dialog->findChild<QRadioButton*>(QStringLiteral("cxRB3"))->click();
        QVERIFY(from->isEnabled() && to->isEnabled());
        from->setText(QStringLiteral("5"));
        to->setText(QStringLiteral("2"));
        QTest::mouseClick(dialog->findChild<QPushButton*>(QStringLiteral("AdvTB1")), Qt::LeftButton);
        QTRY_VERIFY(!w.printDialog());
        QCOMPARE(pdfPages(printer.path()), 4); // 2 to 5
        QVERIFY(pdfText(printer.path()).split(u'\f').first().contains(QStringLiteral("Seite 2 von %1").arg(pages)));

        // "from" 0 is 1, "to" beyond the end is the last page, two copies.
        dialog = open();
        dialog->findChild<QRadioButton*>(QStringLiteral("cxRB3"))->click();
        dialog->findChild<QLineEdit*>(QStringLiteral("cxTE1"))->setText(QStringLiteral("0"));
        dialog->findChild<QLineEdit*>(QStringLiteral("cxTE2"))->setText(QStringLiteral("9999"));
        dialog->findChild<QLineEdit*>(QStringLiteral("cxTE3"))->setText(QStringLiteral("2"));
        dialog->AdvTB1Click();
        QCOMPARE(pdfPages(printer.path()), 2 * pages);

        // The current page only.
        action(w, "rv_NextPage")->trigger();
        action(w, "rv_NextPage")->trigger();
        dialog = open();
        dialog->findChild<QRadioButton*>(QStringLiteral("cxRB2"))->click();
        dialog->AdvTB1Click();
        QCOMPARE(pdfPages(printer.path()), 1);
        QVERIFY(pdfText(printer.path()).contains(QStringLiteral("Seite 3 von")));

        // No copies: nothing printed, the dialog closes all the same.
        const int jobs = printer.jobs;
        dialog = open();
        dialog->findChild<QLineEdit*>(QStringLiteral("cxTE3"))->setText(QStringLiteral("0"));
        dialog->AdvTB1Click();
        QCOMPARE(printer.jobs, jobs);
        QTRY_VERIFY(!w.printDialog());
    }

    // Every way a printer can fail during a job ends in one message, the dialog closed and the
    // preview still usable: the next job prints as if nothing had happened.
    void aPrinterThatGoesAwayIsReported()
    {
        ShownErrors errors;
        QTemporaryDir dir;
        const QString path = dir.filePath(QStringLiteral("druck.pdf"));
        std::function<std::unique_ptr<QPagedPaintDevice>()> device;
        bool installed = true;
        setPrintTarget({[&installed] { return installed; }, [&device] { return device(); }});
        Rows rows(300);
        ReportLayout layout(listReport(), {}, &rows, QDateTime::currentDateTime());
        layout.start();
        TRavePreviewF w(layout, QStringLiteral("Vorschau"));
        w.show();
        auto print = [&w](auto&& makeDevice, std::function<std::unique_ptr<QPagedPaintDevice>()>& slot) {
            slot = makeDevice;
            action(w, "rv_Print")->trigger();
            QVERIFY(w.printDialog());
            QTest::mouseClick(w.printDialog()->findChild<QPushButton*>(QStringLiteral("AdvTB1")), Qt::LeftButton);
            QTRY_VERIFY(!w.printDialog());
        };
        auto lastError = [&errors] { return errors.dialogs->count() ? errors.dialogs->last().text : QString(); };

        // Gone after the second page.
        print([&path] { return std::make_unique<VanishingPrinter>(path, 2); }, device);
        QCOMPARE(errors.dialogs->count(), 1);
        QVERIFY2(lastError().contains(QStringLiteral("Der Bericht konnte nicht gedruckt werden.")), qPrintable(lastError()));
        QVERIFY2(lastError().contains(QStringLiteral("Seite 3")), qPrintable(lastError()));
        QCOMPARE(pdfPages(path), 2); // what reached the printer is a whole document

        // Gone before the job starts: the system no longer names a printer, and "Drucken" goes
        // off until one is back.
        installed = false;
        print([] { return std::unique_ptr<QPagedPaintDevice>(); }, device);
        QCOMPARE(errors.dialogs->count(), 2);
        QVERIFY2(lastError().contains(QStringLiteral("kein Drucker")), qPrintable(lastError()));
        QVERIFY(!action(w, "rv_Print")->isEnabled());
        installed = true;
        w.updatePrintAction();

        // A printer that refuses the job outright.
        print(
            [&dir] {
                auto printer = std::make_unique<QPrinter>(QPrinter::HighResolution);
                printer->setOutputFormat(QPrinter::PdfFormat);
                printer->setOutputFileName(dir.filePath(QStringLiteral("fehlt/druck.pdf")));
                return printer;
            },
            device);
        QCOMPARE(errors.dialogs->count(), 3);
        QVERIFY2(lastError().contains(QStringLiteral("nimmt den Bericht nicht an")), qPrintable(lastError()));

        // Back again: the whole report.
        print([&path] { return std::make_unique<QPdfWriter>(path); }, device);
        QCOMPARE(errors.dialogs->count(), 3);
        QCOMPARE(pdfPages(path), layout.pageCount());
        QVERIFY(w.isVisible());
        setPrintTarget({});
    }

    void pdfSavesTheWholeReport()
    {
        QTemporaryDir dir;
        Rows rows(300);
        ReportLayout layout(listReport(), {}, &rows, QDateTime::currentDateTime());
        layout.start();
        TRavePreviewF w(layout, QStringLiteral("Vorschau"));
        QString suggested;
        TRavePreviewF::setPdfPathChooser([&](QWidget*, const QString& name) {
            suggested = name;
            return dir.filePath(name);
        });
        action(w, "rv_PDF")->trigger();
        TRavePreviewF::setPdfPathChooser({});
        QCOMPARE(suggested, QStringLiteral("Zeilen.pdf"));
        QCOMPARE(pdfPages(dir.filePath(suggested)), layout.pageCount());
        QVERIFY(layout.pageCount() > 1);
    }
};

ORVANTA_TEST(TestReportPreview)
#include "tst_reportpreview.moc"
