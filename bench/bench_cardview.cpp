// Card view against table view over the same 100 000 address records in one run: binding and
// sorting, the first paint, and scrolling page by page through the whole list (each step
// painted). The table view's times are the baseline of each ratio.

#include "ui/grid/GridCardView.h"
#include "ui/grid/GridController.h"
#include "ui/grid/GridView.h"
#include "ui/grid/MemoryGridSource.h"

#include <QApplication>
#include <QElapsedTimer>
#include <QKeyEvent>
#include <QRandomGenerator>
#include <cstdio>
#include <functional>
#include <memory>
#include <type_traits>

using namespace orvanta;

namespace {

enum Field { LID, CONTBEZ, NAME, VNAME, FIRMA, STR, PLZ, ORT };

std::unique_ptr<MemoryGridSource> generate(quint32 rows)
{
    auto src = std::make_unique<MemoryGridSource>(std::vector<MemoryGridSource::Field>{
        {QStringLiteral("LID"), GridFieldType::Integer},
        {QStringLiteral("CONTBEZ"), GridFieldType::Text},
        {QStringLiteral("NAME"), GridFieldType::Text},
        {QStringLiteral("VNAME"), GridFieldType::Text},
        {QStringLiteral("FIRMA"), GridFieldType::Text},
        {QStringLiteral("STR"), GridFieldType::Text},
        {QStringLiteral("PLZ"), GridFieldType::Text},
        {QStringLiteral("ORT"), GridFieldType::Text},
    });
    const QStringList last = {"Müller", "Schmidt", "Schneider", "Fischer", "Weber", "Meyer", "Wagner", "Becker",
                              "Schulz", "Hoffmann", "Schäfer", "Koch", "Bauer", "Richter", "Klein", "Wolf"};
    const QStringList first = {"Anna", "Bernd", "Claudia", "Dieter", "Eva", "Frank", "Gabi", "Hans", "Inge", "Jürgen"};
    const QStringList towns = {"Berlin", "Hamburg", "München", "Köln", "Leipzig", "Dresden", "Bremen", "Essen"};
    QRandomGenerator rng(11);
    src->reserve(rows, 80);
    for (quint32 i = 0; i < rows; ++i) {
        const quint32 r = src->appendRow();
        const QString& l = last[static_cast<int>(rng.bounded(static_cast<quint32>(last.size())))];
        const QString& f = first[static_cast<int>(rng.bounded(static_cast<quint32>(first.size())))];
        src->setInt(r, LID, i + 1);
        src->setText(r, CONTBEZ, QStringLiteral("%1, %2 %3").arg(l, f).arg(i));
        src->setText(r, NAME, l);
        src->setText(r, VNAME, f);
        if (i % 4 == 0)
            src->setText(r, FIRMA, QStringLiteral("%1 GmbH").arg(l));
        src->setText(r, STR, QStringLiteral("Hauptstraße %1").arg(rng.bounded(200)));
        src->setText(r, PLZ, QString::number(10000 + rng.bounded(89999)));
        src->setText(r, ORT, towns[static_cast<int>(rng.bounded(static_cast<quint32>(towns.size())))]);
    }
    return src;
}

template <typename View>
void defineColumns(View& v)
{
    GridColumn key(QStringLiteral("cLID"), QStringLiteral("LID"));
    key.visible = false;
    v.addColumn(key);
    v.addColumn(GridColumn(QStringLiteral("cCONTBEZ"), QStringLiteral("CONTBEZ"), QStringLiteral("Kontaktbezeichnung"), 15, 200));
    v.addColumn(GridColumn(QStringLiteral("cNAME"), QStringLiteral("NAME"), QStringLiteral("Nachname"), 16, 120));
    v.addColumn(GridColumn(QStringLiteral("cVNAME"), QStringLiteral("VNAME"), QStringLiteral("Vorname"), 17, 120));
    v.addColumn(GridColumn(QStringLiteral("cFIRMA"), QStringLiteral("FIRMA"), QStringLiteral("Firma"), 4, 150));
    v.addColumn(GridColumn(QStringLiteral("cSTR"), QStringLiteral("STR"), QStringLiteral("Straße"), 6, 150));
    v.addColumn(GridColumn(QStringLiteral("cPLZ"), QStringLiteral("PLZ"), QStringLiteral("PLZ"), 18, 60));
    v.addColumn(GridColumn(QStringLiteral("cORT"), QStringLiteral("ORT"), QStringLiteral("Ort"), 19, 120));
}

double timeMs(const std::function<void()>& f)
{
    QElapsedTimer t;
    t.start();
    f();
    return static_cast<double>(t.nsecsElapsed()) / 1e6;
}

template <typename View>
void open(View& v, const GridSource* src)
{
    v.beginUpdate();
    v.setSource(src);
    v.controller()->setSortOrder(1, GridSortOrder::Ascending);
    v.endUpdate();
}

// Page Down until the focus stops moving, painting after every step; returns the steps.
int pageThrough(QAbstractScrollArea& v, GridController* g)
{
    int steps = 0;
    for (;;) {
        const int before = g->focusedRow();
        QKeyEvent press(QEvent::KeyPress, Qt::Key_PageDown, Qt::NoModifier);
        QApplication::sendEvent(&v, &press);
        v.viewport()->repaint();
        if (g->focusedRow() == before)
            return steps;
        ++steps;
    }
}

struct Result {
    double open = 0;
    double paint = 0;
    double scroll = 0;
    int steps = 0;
};

template <typename View>
Result measure(const GridSource* src)
{
    Result r;
    View v;
    defineColumns(v);
    if constexpr (std::is_same_v<View, GridCardView>)
        v.setCaptionColumn(1);
    v.resize(1000, 700);
    v.show();
    QApplication::processEvents();
    r.open = timeMs([&] { open(v, src); });
    r.paint = timeMs([&] { v.viewport()->repaint(); });
    v.controller()->setFocusedRow(0);
    r.scroll = timeMs([&] { r.steps = pageThrough(v, v.controller()); });
    return r;
}

} // namespace

int main(int argc, char* argv[])
{
    qputenv("QT_QPA_PLATFORM", qgetenv("QT_QPA_PLATFORM").isEmpty() ? QByteArray("offscreen") : qgetenv("QT_QPA_PLATFORM"));
    QApplication app(argc, argv);
    quint32 rows = 100'000;
    if (argc > 1)
        rows = static_cast<quint32>(std::max(1000, atoi(argv[1])));
    const auto src = generate(rows);
    std::printf("records: %u\n", rows);

    const Result table = measure<GridView>(src.get());
    const Result cards = measure<GridCardView>(src.get());
    const auto line = [](const char* what, double base, double ms) {
        std::printf("%-44s table %9.1f ms   cards %9.1f ms   %6.2fx table\n", what, base, ms, ms / base);
    };
    line("open: bind source, sort by caption", table.open, cards.open);
    line("first paint", table.paint, cards.paint);
    line("page through everything (each step painted)", table.scroll, cards.scroll);
    std::printf("%-44s table %9d      cards %9d\n", "  page steps", table.steps, cards.steps);
    std::printf("%-44s table %9.3f ms   cards %9.3f ms\n", "  per painted page", table.scroll / std::max(1, table.steps),
                cards.scroll / std::max(1, cards.steps));
    return 0;
}
