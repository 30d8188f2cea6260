// The call-log list on large logs: a database with N generated calls, the list frame built
// offscreen over the data module as in the program, and each step timed against the raw fetch
// of "SELECT * FROM LOG" (every value read, nothing kept) measured in the same run:
//
//   first    Firstep until the first screen of rows is painted (the log still arriving), in ms
//   complete Firstep until the whole log has arrived, is painted and its count is posted
//   sort     a click on the "Anrufer" header
//   group    grouping by "Anrufer"
//   filter   the "diese Woche" period filter
//   search   "Jetzt suchen" for "münchen" in all seven columns the panel offers (case and ß
//            folded, no period filter), until the rows are painted
//   refresh  Refresh_View after one new call (the monitor's message), in ms
//
// The caches of sort keys are dropped before sort, group and filter, so each is timed cold.
// Memory: the record store, the process's resident size before and after opening, and their
// ratio.
//
//   bench_loglist [--max N] [--dir FOLDER]      sizes 10 000, 100 000 and 1 000 000 up to N

#include "bench/BenchSupport.h"
#include "calllog/Tlogframe.h"
#include "db/BackgroundFetch.h"
#include "db/FbAttachment.h"
#include "db/FbTransaction.h"
#include "platform/ProgramFolder.h"
#include "platform/WindowMessages.h"
#include "tools/demo/DemoData.h"
#include "ui/grid/GridController.h"
#include "ui/grid/GridSearchPanel.h"
#include "ui/grid/GridView.h"

#include <QApplication>
#include <QDir>
#include <QElapsedTimer>
#include <QEventLoop>
#include <QTimer>
#include <QFile>
#include <QTemporaryDir>

#include <cstdio>
#include <cstring>
#include <functional>

using namespace orvanta;
using namespace orvanta::bench;

namespace {

// Counts the status messages the frame posts.
class Host final : public QObject {
public:
    int statusMessages = 0;
    qintptr lastCount = -1;

protected:
    void customEvent(QEvent* event) override
    {
        if (WindowMessageEvent* m = asWindowMessage(event); m && m->message() == WMSTATUSPANEL) {
            ++statusMessages;
            lastCount = m->wParam();
        }
    }
};

double ms(qint64 ns)
{
    return double(ns) / 1e6;
}

// Waits, idle as the program's event loop is, until the condition holds; woken by every
// arrival of rows.
void waitUntil(DataSet& log, const std::function<bool()>& done)
{
    while (!done()) {
        QEventLoop loop;
        QObject::connect(&log, &DataSet::rowsArrived, &loop, &QEventLoop::quit);
        QObject::connect(&log, &DataSet::rowsReplaced, &loop, &QEventLoop::quit);
        QObject::connect(&log, &DataSet::loadFinished, &loop, &QEventLoop::quit);
        QTimer::singleShot(100, &loop, &QEventLoop::quit);
        loop.exec();
    }
}

// The frame's work is done when its rows are on screen: paint the viewport once.
void paint(Tlogframe& frame)
{
    frame.view()->viewport()->grab();
}


} // namespace

int main(int argc, char* argv[])
{
    if (qEnvironmentVariableIsEmpty("QT_QPA_PLATFORM"))
        qputenv("QT_QPA_PLATFORM", "offscreen");
    QApplication app(argc, argv);
    const std::optional<RunOptions> options = runOptions(app.arguments(), "bench_loglist");
    if (!options)
        return 2;
    const qint64 maxCalls = options->maxCalls;
    const QString folder = options->folder;
    const std::unique_ptr<QTemporaryDir> temp = benchProgramFolder(folder, "bench_loglist");
    if (!temp)
        return 1;

    std::printf("Log list, times as ratios to the raw fetch of SELECT * FROM LOG (best of 3) in the same run\n");
    std::printf("%9s %9s | %8s %8s %10s | %7s %7s %7s %7s | %8s %8s %8s %8s | %9s %9s %9s\n", "calls", "raw ms",
                "first ms", "complete", "refresh ms", "sort", "group", "filter", "search", "sort ms", "group ms",
                "filt ms", "srch ms", "store MiB", "RSS+ MiB", "RSS/store");
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

            if (qEnvironmentVariableIsSet("BENCH_LOGLIST_DETAIL")) {
                QElapsedTimer d;
                d.start();
                dm.ibcds_log.open();
                std::printf("data set open alone: %.2fx\n", double(d.nsecsElapsed()) / double(raw));
                dm.ibcds_log.close();
                const qint64 byKey = bestRawFetch(dm.IBDatabase1, dm.logts,
                                                  QStringLiteral("SELECT * FROM LOG ORDER BY TSDATE DESC, TSTIME DESC"));
                std::printf("raw fetch newest first: %.2fx\n", double(byKey) / double(raw));
                {
                    FbAttachment other(dm.IBDatabase1.databaseName(), dm.IBDatabase1.params());
                    d.restart();
                    other.connect();
                    const qint64 connect = d.nsecsElapsed();
                    FbTransaction tx(other, {QStringLiteral("read"), QStringLiteral("concurrency")});
                    d.restart();
                    rawFetch(other, tx);
                    const qint64 first = d.nsecsElapsed();
                    const qint64 best = bestRawFetch(other, tx);
                    std::printf("new attachment: connect %.1f ms, first fetch %.2fx, best of 3 %.2fx\n", ms(connect),
                                double(first) / double(raw), double(best) / double(raw));
                }
                for (const char* first : {"TSDATE DESC, TSTIME DESC", ""}) {
                    BackgroundFetch::Request request;
                    request.databaseName = dm.IBDatabase1.databaseName();
                    request.connectionParams = dm.IBDatabase1.params();
                    request.sql = QStringLiteral("SELECT * FROM LOG");
                    request.order = QString::fromLatin1(first);
                    d.restart();
                    BackgroundFetch fetch(request);
                    QEventLoop loop;
                    QObject::connect(&fetch, &BackgroundFetch::batchesReady, [&fetch] { (void)fetch.takeBatches(); });
                    QObject::connect(&fetch, &BackgroundFetch::finished, &loop, &QEventLoop::quit);
                    fetch.start();
                    loop.exec();
                    std::printf("background fetch alone (order \"%s\"): %.2fx\n", first,
                                double(d.nsecsElapsed()) / double(raw));
                }
            }
            Host host;
            Tlogframe frame(&dm);
            frame.resize(1000, 700);
            frame.show();
            const qint64 rssBefore = residentKiB();
            QElapsedTimer t;
            t.start();
            frame.Firstep(&host);
            // The first screen: as many rows as the viewport shows, painted.
            const int screenRows = frame.view()->viewport()->height() / std::max(1, frame.view()->fontMetrics().height());
            waitUntil(dm.ibcds_log, [&] {
                return frame.controller()->rowCount() >= std::min<qint64>(screenRows, calls) || !frame.isLoading();
            });
            paint(frame);
            const qint64 first = t.nsecsElapsed();
            waitUntil(dm.ibcds_log, [&] { return !frame.isLoading(); });
            QCoreApplication::sendPostedEvents(&host, WindowMessageEvent::eventType());
            paint(frame);
            const qint64 open = t.nsecsElapsed();
            const qint64 rssAfter = residentKiB();
            if (host.statusMessages == 0 || host.lastCount != calls)
                std::fprintf(stderr, "warning: status count %lld, expected %lld\n", qlonglong(host.lastCount),
                             qlonglong(calls));

            GridController* g = frame.controller();
            const int anrufer = g->columnByCaption(QStringLiteral("Anrufer"));

            g->reapply();
            t.restart();
            g->headerClicked(anrufer, Qt::NoModifier);
            paint(frame);
            const qint64 sort = t.nsecsElapsed();

            frame.ToGroup(LogGrouping::None);
            g->reapply();
            t.restart();
            frame.ToGroup(LogGrouping::Caller);
            paint(frame);
            const qint64 group = t.nsecsElapsed();

            frame.ToGroup(LogGrouping::None);
            g->reapply();
            t.restart();
            frame.SetNewFilter(2);
            paint(frame);
            const qint64 filter = t.nsecsElapsed();
            frame.SetNewFilter(0);

            // Every column the panel offers is searched: the slowest search there is.
            frame.OpenSearchPanel();
            frame.searchPanel()->setSearchText(QStringLiteral("münchen"));
            t.restart();
            frame.ADVSearchStartClick();
            paint(frame);
            const qint64 search = t.nsecsElapsed();
            const int found = g->recordCount();
            if (qEnvironmentVariableIsSet("BENCH_LOGLIST_DETAIL")) {
                const GridSearch applied = g->search();
                g->clearSearch();
                QElapsedTimer d;
                d.start();
                const GridSearchMatcher matcher(applied, *g->source(), {});
                (void)matcher;
                g->setSearch(applied);
                std::printf("search applied alone: %.1f ms\n", ms(d.nsecsElapsed()));
            }
            frame.AdvCloseSearchPanClick();
            if (found == 0 || found == int(calls))
                std::fprintf(stderr, "warning: the search found %d of %lld calls\n", found, qlonglong(calls));

            // The monitor logs one call and says so.
            {
                FbAttachment monitor(dm.IBDatabase1.databaseName(), dm.IBDatabase1.params());
                monitor.connect();
                FbTransaction tx(monitor);
                tx.start();
                monitor.executeImmediate(QStringLiteral("INSERT INTO LOG (TSDATE, TSTIME, FROMBEZ, FROMPHONE) VALUES "
                                                        "(CURRENT_DATE, CURRENT_TIME, 'Neu', '0301')"),
                                         tx);
                tx.commit();
                monitor.disconnect();
            }
            t.restart();
            frame.Refresh_View(dm.CurLogLID);
            waitUntil(dm.ibcds_log, [&] { return !frame.isLoading(); });
            paint(frame);
            const qint64 refresh = t.nsecsElapsed();
            if (frame.controller()->rowCount() != calls + 1)
                std::fprintf(stderr, "warning: %d rows after the refresh, expected %lld\n",
                             frame.controller()->rowCount(), qlonglong(calls + 1));

            const double storeMiB = double(dm.ibcds_log.store().byteSize()) / (1024.0 * 1024.0);
            const double rssMiB = rssBefore >= 0 && rssAfter >= 0 ? double(rssAfter - rssBefore) / 1024.0 : -1.0;
            std::printf("%9lld %9.1f | %8.1f %7.2fx %10.1f | %6.2fx %6.2fx %6.2fx %6.2fx | %8.1f %8.1f %8.1f %8.1f | "
                        "%9.1f %9.1f %8.2fx\n",
                        qlonglong(calls), ms(raw), ms(first), double(open) / double(raw), ms(refresh),
                        double(sort) / double(raw), double(group) / double(raw), double(filter) / double(raw),
                        double(search) / double(raw), ms(sort), ms(group), ms(filter), ms(search), storeMiB, rssMiB,
                        rssMiB / storeMiB);
            std::fflush(stdout);
        } catch (const std::exception& e) {
            std::fprintf(stderr, "%lld calls: %s\n", qlonglong(calls), e.what());
            return 1;
        }
        QFile::remove(path);
    }
    std::printf("targets at 1 000 000 calls: first screen <= 300 ms; complete <= 1.00x; refresh after one new call "
                "<= 50 ms; RSS <= 1.5x the store; sort, group, filter <= 300 ms each; search <= 200 ms\n");
    return 0;
}
