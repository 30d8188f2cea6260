#include "ui/grid/GridRowFilter.h"

#include "platform/Clock.h"
#include "ui/grid/GridCollation.h"

#include <QStringList>
#include <numeric>

namespace orvanta {
namespace {

qint64 floorDiv(qint64 a, qint64 b)
{
    qint64 q = a / b;
    if ((a % b != 0) && ((a < 0) != (b < 0)))
        --q;
    return q;
}

struct CompiledFilter {
    bool isList = false;
    bool isOr = false;
    std::vector<CompiledFilter> items;
    int column = -1;
    int field = -1;
    GridFilterOperator op = GridFilterOperator::Equal;
    QByteArray latin1;
    QString value;
    qint64 lo = 0;
    qint64 hi = -1;
};

QString conditionText(const GridColumnStates& columns, const GridFilterItem& item)
{
    const int c = gridColumnByName(columns, item.column);
    QString name = item.column;
    if (c >= 0 && !columns[static_cast<size_t>(c)].def.fieldName.isEmpty())
        name = columns[static_cast<size_t>(c)].def.fieldName;
    QString text = name + QLatin1Char(' ') + gridFilterOperatorName(item.op);
    if (!isPeriodOperator(item.op))
        text += QStringLiteral(" '") + (item.displayText.isEmpty() ? item.value : item.displayText) + QLatin1Char('\'');
    return text;
}

QString itemText(const GridColumnStates& columns, const GridFilterItem& item, bool top)
{
    if (!item.isList)
        return conditionText(columns, item);
    QStringList parts;
    for (const GridFilterItem& sub : item.items) {
        const QString t = itemText(columns, sub, false);
        if (!t.isEmpty())
            parts << t;
    }
    if (parts.isEmpty())
        return {};
    const QString joined = parts.join(item.boolOp == GridFilterBoolOperator::Or ? QStringLiteral(" OR ") : QStringLiteral(" AND "));
    return (top || parts.size() == 1) ? joined : QLatin1Char('(') + joined + QLatin1Char(')');
}

} // namespace

GridRowFilter::GridRowFilter()
    : m_today([] { return Clock::today(); })
{
}

void GridRowFilter::setFilter(const GridFilter& filter)
{
    m_filter = filter;
    m_filter.root.isList = true;
}

bool GridRowFilter::setActive(bool active)
{
    if (m_filter.active == active)
        return false;
    m_filter.active = active;
    return true;
}

void GridRowFilter::addItem(GridFilterItem item)
{
    m_filter.root.items.push_back(std::move(item));
}

bool GridRowFilter::clearItems()
{
    if (m_filter.root.items.empty())
        return false;
    m_filter.root.items.clear();
    return true;
}

void GridRowFilter::setTodayProvider(std::function<QDate()> today)
{
    m_today = today ? std::move(today) : std::function<QDate()>([] { return Clock::today(); });
}

QString GridRowFilter::text(const GridColumnStates& columns) const
{
    return itemText(columns, m_filter.root, true);
}

bool GridRowFilter::setSearch(const GridSearch& search)
{
    if (m_search == search)
        return false;
    m_search = search;
    return true;
}

void GridRowFilter::apply(const GridSource& source, const GridColumnStates& columns, std::vector<quint32>& out,
                          quint32 from) const
{
    if (from == 0)
        out.clear();
    if (!m_search.isActive()) {
        applyFilter(source, columns, out, from);
        return;
    }
    const GridSearchMatcher matcher(m_search, source, columns);
    if (m_search.narrow) {
        const size_t before = out.size();
        applyFilter(source, columns, out, from);
        // Compacted in place: the rows stay ascending, nothing is copied.
        size_t kept = before;
        for (size_t i = before; i < out.size(); ++i) {
            if (matcher.matches(out[i]))
                out[kept++] = out[i];
        }
        out.resize(kept);
        return;
    }
    const quint32 n = source.rowCount();
    for (quint32 r = from; r < n; ++r) {
        if (matcher.matches(r))
            out.push_back(r);
    }
}

void GridRowFilter::applyFilter(const GridSource& source, const GridColumnStates& columns, std::vector<quint32>& out,
                                quint32 from) const
{
    const quint32 n = source.rowCount();
    if (!m_filter.active || m_filter.root.items.empty()) {
        const size_t before = out.size();
        out.resize(before + (n > from ? n - from : 0));
        std::iota(out.begin() + static_cast<std::ptrdiff_t>(before), out.end(), from);
        return;
    }
    const QDate today = m_today();
    const std::function<CompiledFilter(const GridFilterItem&)> compile = [&](const GridFilterItem& item) {
        CompiledFilter f;
        f.isList = item.isList;
        f.isOr = item.boolOp == GridFilterBoolOperator::Or;
        if (item.isList) {
            for (const GridFilterItem& sub : item.items)
                f.items.push_back(compile(sub));
            return f;
        }
        f.column = gridColumnByName(columns, item.column);
        f.field = f.column >= 0 ? columns[static_cast<size_t>(f.column)].field : -1;
        f.op = item.op;
        f.value = item.value;
        f.latin1 = item.value.toLatin1();
        const qint64 t = today.toJulianDay();
        switch (item.op) {
        case GridFilterOperator::Today:
            f.lo = f.hi = t;
            break;
        case GridFilterOperator::ThisWeek:
            f.lo = t - (today.dayOfWeek() - 1);
            f.hi = f.lo + 6;
            break;
        case GridFilterOperator::ThisMonth: {
            const QDate first(today.year(), today.month(), 1);
            f.lo = first.toJulianDay();
            f.hi = first.addMonths(1).toJulianDay() - 1;
            break;
        }
        default:
            break;
        }
        return f;
    };
    const CompiledFilter root = compile(m_filter.root);

    const std::function<bool(const CompiledFilter&, quint32)> eval = [&](const CompiledFilter& f, quint32 r) -> bool {
        if (f.isList) {
            if (f.items.empty())
                return true;
            for (const CompiledFilter& sub : f.items) {
                const bool hit = eval(sub, r);
                if (f.isOr && hit)
                    return true;
                if (!f.isOr && !hit)
                    return false;
            }
            return !f.isOr;
        }
        if (f.column < 0)
            return true; // a condition on a column this grid does not have restricts nothing
        const GridColumnState& s = columns[static_cast<size_t>(f.column)];
        if (isPeriodOperator(f.op)) {
            if (s.field < 0 || source.isNull(r, s.field))
                return false;
            const GridFieldType type = source.fieldType(s.field);
            qint64 day = 0;
            if (type == GridFieldType::Date)
                day = source.intValue(r, s.field);
            else if (type == GridFieldType::DateTime)
                day = floorDiv(source.intValue(r, s.field), gridvalue::msPerDay);
            else
                return false;
            return day >= f.lo && day <= f.hi;
        }
        switch (f.op) {
        case GridFilterOperator::Like:
        case GridFilterOperator::NotLike: {
            const bool hit = s.textKey ? gridcollation::like(s.keyText(source, r), f.latin1)
                                       : gridcollation::like(s.cellText(source, r).toLatin1(), f.latin1);
            return (f.op == GridFilterOperator::Like) == hit;
        }
        case GridFilterOperator::Equal:
        case GridFilterOperator::NotEqual: {
            const bool hit = s.textKey ? gridcollation::compare(s.keyText(source, r), f.latin1) == 0
                                       : s.cellText(source, r).compare(f.value, Qt::CaseInsensitive) == 0;
            return (f.op == GridFilterOperator::Equal) == hit;
        }
        default:
            return false;
        }
    };

    // The common case, one period condition, runs without the recursive evaluator.
    const CompiledFilter* single = &root;
    while (single->isList && single->items.size() == 1)
        single = &single->items.front();
    if (!single->isList && isPeriodOperator(single->op) && single->column >= 0 && single->field >= 0
        && source.fieldType(single->field) == GridFieldType::Date) {
        const int field = single->field;
        for (quint32 r = from; r < n; ++r) {
            if (source.isNull(r, field))
                continue;
            const qint64 day = source.intValue(r, field);
            if (day >= single->lo && day <= single->hi)
                out.push_back(r);
        }
        return;
    }
    for (quint32 r = from; r < n; ++r) {
        if (eval(root, r))
            out.push_back(r);
    }
}

} // namespace orvanta
