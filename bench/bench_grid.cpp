// Grid speed at a million calls: sort, group and filter over index vectors, against a plain
// std::sort of a million integers measured in the same run.

#include "ui/grid/GridController.h"
#include "ui/grid/GridView.h"
#include "ui/grid/MemoryGridSource.h"

#include <QApplication>
#include <QElapsedTimer>
#include <QFile>
#include <QRandomGenerator>
#include <algorithm>
#include <ctime>
#include <cstdio>
#include <vector>

using namespace orvanta;

namespace {

enum Field { LID, FROMBEZ, FROMPHONE, TSDATE, TSTIME, CTYPE, REGION };

std::unique_ptr<MemoryGridSource> generate(quint32 rows, QDate today)
{
    auto src = std::make_unique<MemoryGridSource>(std::vector<MemoryGridSource::Field>{
        {QStringLiteral("LID"), GridFieldType::Integer},
        {QStringLiteral("FROMBEZ"), GridFieldType::Text},
        {QStringLiteral("FROMPHONE"), GridFieldType::Text},
        {QStringLiteral("TSDATE"), GridFieldType::Date},
        {QStringLiteral("TSTIME"), GridFieldType::Time},
        {QStringLiteral("CTYPE"), GridFieldType::Integer},
        {QStringLiteral("REGION"), GridFieldType::Text},
    });
    const QStringList last = {"Müller", "Schmidt", "Schneider", "Fischer", "Weber", "Meyer", "Wagner", "Becker", "Schulz",
                              "Hoffmann", "Schäfer", "Koch", "Bauer", "Richter", "Klein", "Wolf", "Schröder", "Neumann",
                              "Schwarz", "Zimmermann", "Braun", "Krüger", "Hofmann", "Hartmann", "Lange", "Schmitt",
                              "Werner", "Schmitz", "Krause", "Meier", "Lehmann", "Schmid", "Schulze", "Maier", "Köhler",
                              "Herrmann", "König", "Walter", "Mayer", "Huber", "Kaiser", "Fuchs", "Peters", "Lang",
                              "Scholz", "Möller", "Weiß", "Jung", "Hahn", "Schubert"};
    const QStringList first = {"Anna", "Bernd", "Claudia", "Dieter", "Eva", "Frank", "Gabi", "Hans", "Inge", "Jürgen",
                               "Karin", "Lutz", "Monika", "Norbert", "Olga", "Peter", "Renate", "Stefan", "Tanja", "Uwe",
                               "Vera", "Werner", "Yvonne", "Zoe", "Ömer", "Ärzte GmbH", "Sabine", "Thomas", "Ute", "Klaus"};
    const QStringList regions = {"Berlin", "Hamburg", "München", "Köln", "Frankfurt am Main", "Stuttgart", "Düsseldorf",
                                 "Leipzig", "Dortmund", "Essen", "Bremen", "Dresden", "Hannover", "Nürnberg", "Mobilfunk"};
    std::vector<QByteArray> names;
    for (const QString& l : last)
        for (const QString& f : first)
            for (int k = 0; k < 12; ++k) // 18 000 distinct callers, some only in case apart
                names.push_back((k == 0 ? QString() : QStringLiteral("%1 ").arg(k)).toLatin1() + (l + QStringLiteral(", ") + f).toLatin1());
    QRandomGenerator rng(42);
    src->reserve(rows, 48);
    const qint64 todayJd = today.toJulianDay();
    for (quint32 i = 0; i < rows; ++i) {
        const quint32 r = src->appendRow();
        src->setInt(r, LID, i + 1);
        const quint32 pick = rng.bounded(static_cast<quint32>(names.size() + names.size() / 10));
        if (pick < names.size())
            src->setLatin1(r, FROMBEZ, names[pick]);
        src->setLatin1(r, FROMPHONE, QByteArray::number(30'000'000 + rng.bounded(9'000'000)).prepend("0"));
        src->setInt(r, TSDATE, todayJd - rng.bounded(3 * 365));
        src->setInt(r, TSTIME, static_cast<qint64>(rng.bounded(86'400)) * 1000);
        src->setInt(r, CTYPE, rng.bounded(3));
        src->setLatin1(r, REGION, regions[static_cast<int>(rng.bounded(static_cast<quint32>(regions.size())))].toLatin1());
    }
    return src;
}

void defineColumns(GridController& g)
{
    g.addColumn(GridColumn(QStringLiteral("cLID"), QStringLiteral("LID")));
    g.addColumn(GridColumn(QStringLiteral("cTSDATE"), QStringLiteral("TSDATE"), QStringLiteral("Datum"), 1, 70));
    g.addColumn(GridColumn(QStringLiteral("cTSTIME"), QStringLiteral("TSTIME"), QStringLiteral("Zeit"), 2, 51));
    GridColumn direction(QStringLiteral("cCTYPE"), QStringLiteral("CTYPE"), QStringLiteral("Verbindung"), 8);
    direction.sortText = [](const GridSource& s, quint32 r) -> QByteArrayView {
        switch (s.intValue(r, CTYPE)) {
        case 0:
            return "Eingang";
        case 1:
            return "Ausgang";
        default:
            return "Unbekannt";
        }
    };
    g.addColumn(direction);
    // The caller column sorts by its display text: the name, else the number, else "Unbekannt".
    GridColumn caller(QStringLiteral("cFROMBEZ"), QStringLiteral("FROMBEZ"), QStringLiteral("Anrufer"), 3, 153);
    caller.sortText = [](const GridSource& s, quint32 r) -> QByteArrayView {
        QByteArrayView v = s.textValue(r, FROMBEZ);
        if (v.isEmpty())
            v = s.textValue(r, FROMPHONE);
        return v.isEmpty() ? QByteArrayView("Unbekannt") : v;
    };
    g.addColumn(caller);
    g.addColumn(GridColumn(QStringLiteral("cREGION"), QStringLiteral("REGION"), QStringLiteral("Region"), 12, 153));
}

long peakKb()
{
    QFile f(QStringLiteral("/proc/self/status"));
    if (!f.open(QIODevice::ReadOnly))
        return -1;
    for (const QByteArray& line : f.readAll().split('\n')) {
        if (line.startsWith("VmHWM:"))
            return line.mid(6).trimmed().split(' ').first().toLong();
    }
    return -1;
}


double threadCpuMs()
{
    timespec ts{};
    clock_gettime(CLOCK_THREAD_CPUTIME_ID, &ts);
    return static_cast<double>(ts.tv_sec) * 1e3 + static_cast<double>(ts.tv_nsec) / 1e6;
}

// Wall time; the CPU time of this thread goes to lastCpuMs, so a loaded machine shows.
double lastCpuMs = 0;

template <typename F>
double timeMs(F&& f)
{
    QElapsedTimer t;
    const double cpu = threadCpuMs();
    t.start();
    f();
    lastCpuMs = threadCpuMs() - cpu;
    return static_cast<double>(t.nsecsElapsed()) / 1e6;
}

struct Report {
    double baselineMs = 0;
    void line(const char* what, double ms, double targetMs = 0) const
    {
        std::printf("%-52s %9.1f ms (cpu %7.1f)  %6.2fx baseline", what, ms, lastCpuMs, ms / baselineMs);
        if (targetMs > 0)
            std::printf("  (target <= %.0f ms: %s)", targetMs, ms <= targetMs ? "ok" : "MISSED");
        std::printf("\n");
    }
};

} // namespace

int main(int argc, char* argv[])
{
    qputenv("QT_QPA_PLATFORM", qgetenv("QT_QPA_PLATFORM").isEmpty() ? QByteArray("offscreen") : qgetenv("QT_QPA_PLATFORM"));
    QApplication app(argc, argv);
    quint32 rows = 1'000'000;
    if (argc > 1)
        rows = static_cast<quint32>(std::max(1000, atoi(argv[1])));
    const QDate today(2024, 3, 6);

    QElapsedTimer gen;
    gen.start();
    auto src = generate(rows, today);
    std::printf("rows: %u (generated in %.0f ms)\n", rows, static_cast<double>(gen.elapsed()));

    Report rep;
    {
        std::vector<quint32> ints(rows);
        QRandomGenerator rng(7);
        for (quint32& v : ints)
            v = rng.generate();
        rep.baselineMs = timeMs([&] { std::sort(ints.begin(), ints.end()); });
    }
    std::printf("%-52s %9.1f ms (cpu %7.1f)\n", "baseline: std::sort of the same number of ints", rep.baselineMs, lastCpuMs);

    GridController g;
    defineColumns(g);
    g.setTodayProvider([today] { return today; });
    const int date = g.columnByName(u"cTSDATE");
    const int time = g.columnByName(u"cTSTIME");
    const int caller = g.columnByName(u"cFROMBEZ");

    rep.line("open: bind source, sort date desc + time desc", timeMs([&] {
                 g.beginUpdate();
                 g.setSource(src.get());
                 g.setSortOrder(date, GridSortOrder::Descending);
                 g.setSortOrder(time, GridSortOrder::Descending);
                 g.endUpdate();
             }));

    rep.line("sort by \"Anrufer\" (first time: collation ranks)", timeMs([&] {
                 g.beginUpdate();
                 g.clearSorting();
                 g.setSortOrder(caller, GridSortOrder::Ascending);
                 g.endUpdate();
             }), 300);
    rep.line("sort by \"Anrufer\" descending (ranks cached)",
             timeMs([&] { g.setSortOrder(caller, GridSortOrder::Descending); }), 300);

    g.beginUpdate();
    g.clearSorting();
    g.setSortOrder(date, GridSortOrder::Descending);
    g.setSortOrder(time, GridSortOrder::Descending);
    g.endUpdate();
    g.reapply(); // drop cached ranks: the grouping below starts cold
    rep.line("group by \"Anrufer\" (cold ranks, date/time sort kept)", timeMs([&] { g.groupBy(caller); }), 300);
    std::printf("    %d groups\n", g.rowCount());
    rep.line("expand all groups", timeMs([&] { g.expandAll(true); }));
    rep.line("collapse all, focus the last record", timeMs([&] {
                 g.expandAll(false);
                 g.focusRecord(rows - 1);
             }));
    rep.line("ungroup (\"ohne Gruppierung\")", timeMs([&] { g.clearGrouping(); }));

    rep.line("filter \"diese Woche\" (with date/time sort)", timeMs([&] {
                 g.beginUpdate();
                 g.clearFilterItems();
                 g.addFilterItem(GridFilterItem::condition(QStringLiteral("cTSDATE"), GridFilterOperator::ThisWeek, {},
                                                           QStringLiteral("diese Woche")));
                 g.setFilterActive(true);
                 g.endUpdate();
             }), 300);
    std::printf("    %d calls this week\n", g.rowCount());
    rep.line("filter off again", timeMs([&] { g.clearFilterItems(); }));

    rep.line("full re-apply after a re-read (ranks dropped)", timeMs([&] { g.sourceChanged(); }));

    // Scrolling and focus: only the rows on screen are formatted and painted.
    GridView view;
    defineColumns(*view.controller());
    view.resize(1000, 700);
    view.controller()->setTodayProvider([today] { return today; });
    view.beginUpdate();
    view.setSource(src.get());
    view.controller()->setSortOrder(view.controller()->columnByName(u"cTSDATE"), GridSortOrder::Descending);
    view.endUpdate();
    view.show();
    QImage img(view.viewport()->size(), QImage::Format_ARGB32);
    rep.line("paint one screen of rows", timeMs([&] { view.viewport()->render(&img); }));
    const double moves = timeMs([&] {
        for (int i = 0; i < 100; ++i) {
            view.controller()->setFocusedRow(static_cast<int>(rows / 2 + static_cast<quint32>(i) * 37));
            view.viewport()->render(&img);
        }
    });
    lastCpuMs /= 100.0;
    rep.line("one focus move + repaint (mean of 100)", moves / 100.0);
    std::printf("peak memory: %.1f MB\n", static_cast<double>(peakKb()) / 1024.0);
    return 0;
}
