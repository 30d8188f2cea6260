// Exporting the call-log list: a database with N generated calls opened in the list frame as in
// the program, then every row written in each format, timed against the raw fetch of
// "SELECT * FROM LOG" (every value read, nothing kept) measured in the same run. The resident
// size is taken before and after each export: the writers stream, so it should not grow with N.
//
//   bench_export [--max N] [--dir FOLDER]      sizes 10 000, 100 000 and 1 000 000 up to N

#include "bench/BenchSupport.h"
#include "calllog/Tlogframe.h"
#include "export/writers/ExportWriter.h"
#include "platform/ProgramFolder.h"
#include "tools/demo/DemoData.h"
#include "ui/grid/GridController.h"
#include "ui/grid/GridSnapshot.h"

#include <QApplication>
#include <QElapsedTimer>
#include <QFile>
#include <QFileInfo>
#include <QTemporaryDir>

#include <cstdio>

using namespace orvanta;
using namespace orvanta::bench;

int main(int argc, char* argv[])
{
    if (qEnvironmentVariableIsEmpty("QT_QPA_PLATFORM"))
        qputenv("QT_QPA_PLATFORM", "offscreen");
    QApplication app(argc, argv);
    const std::optional<RunOptions> options = runOptions(app.arguments(), "bench_export");
    if (!options)
        return 2;
    const qint64 maxCalls = options->maxCalls;
    const QString folder = options->folder;
    const std::unique_ptr<QTemporaryDir> temp = benchProgramFolder(folder, "bench_export");
    if (!temp)
        return 1;

    std::printf("Export of the log list, times as ratios to the raw fetch of SELECT * FROM LOG (best of 3) in the same run\n");
    std::printf("%9s %9s | %7s %7s %7s %7s | %9s %9s\n", "calls", "raw ms", "html", "xls", "xml", "txt", "file MiB",
                "RSS+ MiB");
    const QDate lastDay = QDate::currentDate();
    for (const qint64 calls : {qint64(10'000), qint64(100'000), qint64(1'000'000)}) {
        if (calls > maxCalls)
            break;
        const QString path = temp->filePath(QStringLiteral("log%1.fdb").arg(calls));
        try {
            prepareDatabase(path,
                            [calls, &lastDay](FbAttachment& db) { demo::generateCalls(db, calls, 4711, lastDay); });
            TDM2 dm;
            if (!dataModuleConnected(dm, path))
                return 1;
            const qint64 raw = bestRawFetch(dm.IBDatabase1, dm.logts);
            QObject host;
            Tlogframe frame(&dm);
            frame.Firstep(&host);
            while (frame.isLoading())
                QCoreApplication::processEvents(QEventLoop::WaitForMoreEvents, 5);
            GridController* g = frame.controller();
            const int abid = g->columnByField(u"ABID");
            const QStringList excluded = abid >= 0 ? QStringList{g->column(abid).name} : QStringList{};

            double ratio[4] = {};
            qint64 biggest = 0;
            qint64 rssGrowth = 0;
            int i = 0;
            for (const ExportFormat f : {ExportFormat::Html, ExportFormat::Excel, ExportFormat::Xml, ExportFormat::Text}) {
                const QString file = temp->filePath(QStringLiteral("out.") + exportExtension(f));
                const qint64 rssBefore = residentKiB();
                GridSnapshot snapshot(*g, excluded);
                QElapsedTimer t;
                t.start();
                const ExportResult r = exportGrid(snapshot, f, file);
                ratio[i++] = double(t.nsecsElapsed()) / double(raw);
                rssGrowth = std::max(rssGrowth, residentKiB() - rssBefore);
                if (!r.ok || r.rowsWritten != calls)
                    std::fprintf(stderr, "warning: %s wrote %lld rows: %s\n", qPrintable(exportExtension(f)),
                                 qlonglong(r.rowsWritten), qPrintable(r.error));
                biggest = std::max(biggest, QFileInfo(file).size());
                QFile::remove(file);
            }
            std::printf("%9lld %9.1f | %6.2fx %6.2fx %6.2fx %6.2fx | %9.1f %9.1f\n", qlonglong(calls), double(raw) / 1e6,
                        ratio[0], ratio[1], ratio[2], ratio[3], double(biggest) / 1048576.0, double(rssGrowth) / 1024.0);
            std::fflush(stdout);
        } catch (const std::exception& e) {
            std::fprintf(stderr, "%s\n", e.what());
            return 1;
        }
    }
    return 0;
}
