// The call-log report on large logs: a database with N generated calls, "Alles" with the simple
// report, each step timed against the raw fetch of "SELECT * FROM LOG" in the same run:
//
//   first    from the print call to the preview's first page painted
//   pdf      from the print call to the whole report written as a PDF file
//
// Memory: the process's resident size before the PDF run and at its end. On a shared machine the
// wall-clock ratios swing with the load; the processor time of the raw fetch and of the PDF run
// (this process, all its threads) gives the steadier ratio in the last columns.
//
//   bench_print [--max N] [--dir FOLDER]      sizes 10 000, 100 000 and 1 000 000 up to N

#include "bench/BenchSupport.h"
#include "calllog/LogReport.h"
#include "platform/ProgramFolder.h"
#include "tools/demo/DemoData.h"
#include "ui/report/ReportRenderer.h"
#include "ui/report/ReportRun.h"
#include "ui/report/TRavePreviewF.h"

#include <QApplication>
#include <QElapsedTimer>
#include <QFile>
#include <QFileInfo>
#include <QTemporaryDir>

#include <cstdio>
#include <ctime>

using namespace orvanta;
using namespace orvanta::bench;

namespace {

double ms(qint64 ns)
{
    return double(ns) / 1e6;
}

qint64 cpuNs()
{
    timespec t{};
    clock_gettime(CLOCK_PROCESS_CPUTIME_ID, &t);
    return qint64(t.tv_sec) * 1'000'000'000 + t.tv_nsec;
}

// The processor time of the raw fetch, best of three.
qint64 bestRawCpu(FbAttachment& db, FbTransaction& tx)
{
    qint64 best = std::numeric_limits<qint64>::max();
    for (int run = 0; run < 3; ++run) {
        const qint64 start = cpuNs();
        rawFetch(db, tx);
        best = std::min(best, cpuNs() - start);
    }
    return best;
}

} // namespace

int main(int argc, char* argv[])
{
    if (qEnvironmentVariableIsEmpty("QT_QPA_PLATFORM"))
        qputenv("QT_QPA_PLATFORM", "offscreen");
    QApplication app(argc, argv);
    const std::optional<RunOptions> options = runOptions(app.arguments(), "bench_print");
    if (!options)
        return 2;
    const std::unique_ptr<QTemporaryDir> temp = benchProgramFolder(options->folder, "bench_print");
    if (!temp)
        return 1;
    // The report file the build puts beside the programs.
    if (!QFile::copy(QCoreApplication::applicationDirPath() + QStringLiteral("/Orvex.rav"),
                     temp->filePath(QStringLiteral("Orvex.rav")))) {
        std::fprintf(stderr, "no Orvex.rav beside the program\n");
        return 1;
    }

    std::printf("Call-log report \"Alles\", times as ratios to the raw fetch of SELECT * FROM LOG (best of 3)\n");
    std::printf("%9s %9s | %7s %9s | %7s %9s %6s %8s | %9s | %9s %9s %7s\n", "calls", "raw ms", "first", "first ms",
                "pdf", "pdf ms", "pages", "PDF MiB", "RSS+ MiB", "raw cpu", "pdf cpu", "pdf");
    const QDate lastDay = QDate::currentDate();
    for (const qint64 calls : {qint64(10'000), qint64(100'000), qint64(1'000'000)}) {
        if (calls > options->maxCalls)
            break;
        const QString path = temp->filePath(QStringLiteral("log%1.fdb").arg(calls));
        try {
            prepareDatabase(path,
                            [calls, &lastDay](FbAttachment& db) { demo::generateCalls(db, calls, 4711, lastDay); });
            TDM2 dm;
            if (!dataModuleConnected(dm, path))
                return 1;
            const qint64 raw = bestRawFetch(dm.IBDatabase1, dm.logts);
            const qint64 rawCpu = bestRawCpu(dm.IBDatabase1, dm.logts);

            QElapsedTimer t;
            qint64 first = 0;
            setReportPreviewHook([&](ReportLayout& layout, const QString& title) {
                TRavePreviewF preview(layout, title);
                preview.show();
                preview.findChild<QWidget*>(QStringLiteral("PageView"))->grab();
                first = t.nsecsElapsed();
            });
            ReportOutcome outcome;
            t.start();
            if (!LogPrint(&dm.rave_ibsql, 0, outcome, QDate(), QDate()))
                throw std::runtime_error(qPrintable(outcome.message));

            const QString pdf = temp->filePath(QStringLiteral("log.pdf"));
            int pages = 0;
            setReportPreviewHook([&](ReportLayout& layout, const QString&) {
                ReportRenderer::writePdf(pdf, layout);
                pages = layout.pageCount();
            });
            const qint64 rssBefore = residentKiB();
            const qint64 cpuBefore = cpuNs();
            t.restart();
            if (!LogPrint(&dm.rave_ibsql, 0, outcome, QDate(), QDate()))
                throw std::runtime_error(qPrintable(outcome.message));
            const qint64 whole = t.nsecsElapsed();
            const qint64 wholeCpu = cpuNs() - cpuBefore;
            const qint64 rssAfter = residentKiB();
            setReportPreviewHook({});

            std::printf("%9lld %9.1f | %6.2fx %9.1f | %6.2fx %9.1f %6d %8.1f | %9.1f | %9.1f %9.1f %6.2fx\n",
                        qlonglong(calls), ms(raw), double(first) / double(raw), ms(first), double(whole) / double(raw),
                        ms(whole), pages, double(QFileInfo(pdf).size()) / (1024.0 * 1024.0),
                        double(rssAfter - rssBefore) / 1024.0, ms(rawCpu), ms(wholeCpu),
                        double(wholeCpu) / double(rawCpu));
            std::fflush(stdout);
            QFile::remove(pdf);
        } catch (const std::exception& e) {
            std::fprintf(stderr, "%lld calls: %s\n", qlonglong(calls), e.what());
            return 1;
        }
        QFile::remove(path);
    }
    std::printf("targets: first page <= 1 s at 1 000 000 calls; PDF of 100 000 calls <= 5x the raw fetch\n");
    return 0;
}
