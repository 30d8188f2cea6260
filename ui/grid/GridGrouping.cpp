#include "ui/grid/GridGrouping.h"

#include <algorithm>

namespace orvanta {
namespace {

constexpr quint32 kGroupBit = 0x8000'0000u;

} // namespace

GridGrouping::GridGrouping(const std::vector<quint32>& order, CellText cellText)
    : m_order(order)
    , m_cellText(std::move(cellText))
{
}

int GridGrouping::indexOf(int column) const
{
    const auto it = std::find(m_columns.begin(), m_columns.end(), column);
    return it == m_columns.end() ? -1 : static_cast<int>(it - m_columns.begin());
}

void GridGrouping::insert(int column, int level)
{
    remove(column);
    if (level < 0 || level > static_cast<int>(m_columns.size()))
        level = static_cast<int>(m_columns.size());
    m_columns.insert(m_columns.begin() + level, column);
}

bool GridGrouping::remove(int column)
{
    const auto it = std::find(m_columns.begin(), m_columns.end(), column);
    if (it == m_columns.end())
        return false;
    m_columns.erase(it);
    return true;
}

bool GridGrouping::setGroupByBoxVisible(bool visible)
{
    if (m_groupByBox == visible)
        return false;
    m_groupByBox = visible;
    return true;
}

void GridGrouping::clear()
{
    m_nodes.clear();
    m_topGroups = 0;
    m_display.clear();
}

void GridGrouping::build(const RanksOf& ranksOf)
{
    m_nodes.clear();
    m_topGroups = 0;
    if (m_columns.empty() || m_order.empty())
        return;
    // Level by level, so the subgroups of one group lie next to each other.
    size_t levelBegin = 0;
    size_t levelEnd = 0;
    for (size_t level = 0; level < m_columns.size(); ++level) {
        const std::vector<quint32>& rank = ranksOf(m_columns[level]);
        const auto split = [&](quint32 first, quint32 count, qint32 parent) {
            quint32 start = first;
            for (quint32 p = first + 1; p <= first + count; ++p) {
                if (p == first + count || rank[m_order[p]] != rank[m_order[start]]) {
                    Node g;
                    g.first = start;
                    g.count = p - start;
                    g.parent = parent;
                    g.level = static_cast<quint16>(level);
                    m_nodes.push_back(g);
                    start = p;
                }
            }
        };
        if (level == 0) {
            split(0, static_cast<quint32>(m_order.size()), -1);
            m_topGroups = static_cast<quint32>(m_nodes.size());
            levelBegin = 0;
            levelEnd = m_nodes.size();
            continue;
        }
        for (size_t p = levelBegin; p < levelEnd; ++p) {
            const auto childBegin = static_cast<quint32>(m_nodes.size());
            split(m_nodes[p].first, m_nodes[p].count, static_cast<qint32>(p));
            m_nodes[p].childBegin = childBegin;
            m_nodes[p].childEnd = static_cast<quint32>(m_nodes.size());
        }
        levelBegin = levelEnd;
        levelEnd = m_nodes.size();
    }
    for (size_t g = 0; g < m_nodes.size(); ++g) {
        bool expanded = m_expandDefault;
        if (!m_expandExceptions.isEmpty() && m_expandExceptions.contains(keyOf(static_cast<quint32>(g))))
            expanded = !expanded;
        m_nodes[g].expanded = expanded;
    }
}

QString GridGrouping::keyOf(quint32 group) const
{
    QString key;
    for (qint32 g = static_cast<qint32>(group); g >= 0; g = m_nodes[static_cast<size_t>(g)].parent) {
        const Node& node = m_nodes[static_cast<size_t>(g)];
        key.prepend(m_cellText(m_order[node.first], m_columns[node.level]) + QChar(0x1F));
    }
    return key;
}

void GridGrouping::buildDisplay()
{
    m_display.clear();
    if (m_columns.empty())
        return;
    const std::function<void(quint32)> emitGroup = [&](quint32 g) {
        const Node& node = m_nodes[g];
        m_display.push_back(g | kGroupBit);
        if (!node.expanded)
            return;
        if (node.childBegin < node.childEnd) {
            for (quint32 c = node.childBegin; c < node.childEnd; ++c)
                emitGroup(c);
        } else {
            for (quint32 p = node.first; p < node.first + node.count; ++p)
                m_display.push_back(p);
        }
    };
    for (quint32 g = 0; g < m_topGroups; ++g)
        emitGroup(g);
}

int GridGrouping::groupIdAt(int row) const
{
    if (m_columns.empty() || row < 0 || static_cast<size_t>(row) >= m_display.size())
        return -1;
    const quint32 e = m_display[static_cast<size_t>(row)];
    return (e & kGroupBit) ? static_cast<int>(e & ~kGroupBit) : -1;
}

int GridGrouping::positionAt(int row) const
{
    if (row < 0 || static_cast<size_t>(row) >= m_display.size())
        return -1;
    const quint32 e = m_display[static_cast<size_t>(row)];
    return (e & kGroupBit) ? -1 : static_cast<int>(e);
}

int GridGrouping::rowOfPosition(quint32 position) const
{
    const auto at = std::find(m_display.begin(), m_display.end(), position);
    return at == m_display.end() ? -1 : static_cast<int>(at - m_display.begin());
}

int GridGrouping::rowOfGroup(quint32 group) const
{
    const auto at = std::find(m_display.begin(), m_display.end(), group | kGroupBit);
    return at == m_display.end() ? -1 : static_cast<int>(at - m_display.begin());
}

int GridGrouping::rowShowing(quint32 position, int groupLevel) const
{
    int row = -1;
    const auto contains = [&](quint32 g) {
        return position >= m_nodes[g].first && position < m_nodes[g].first + m_nodes[g].count;
    };
    quint32 begin = 0;
    quint32 end = m_topGroups;
    while (begin < end) {
        quint32 g = begin;
        while (g < end && !contains(g))
            ++g;
        if (g == end)
            break;
        const Node& node = m_nodes[g];
        row = rowOfGroup(g);
        if (node.level == groupLevel || !node.expanded)
            break;
        if (node.childBegin < node.childEnd) {
            begin = node.childBegin;
            end = node.childEnd;
        } else {
            if (groupLevel < 0) {
                const int at = rowOfPosition(position);
                if (at >= 0)
                    row = at;
            }
            break;
        }
    }
    return row;
}

void GridGrouping::expandAll(bool expand)
{
    m_expandDefault = expand;
    m_expandExceptions.clear();
    for (Node& g : m_nodes)
        g.expanded = expand;
    buildDisplay();
}

bool GridGrouping::setExpanded(quint32 group, bool expanded)
{
    if (m_nodes[group].expanded == expanded)
        return false;
    m_nodes[group].expanded = expanded;
    const QString k = keyOf(group);
    if (expanded != m_expandDefault)
        m_expandExceptions.insert(k);
    else
        m_expandExceptions.remove(k);
    buildDisplay();
    return true;
}

bool GridGrouping::expandAround(quint32 position)
{
    bool changed = false;
    for (quint32 g = 0; g < m_nodes.size(); ++g) {
        Node& node = m_nodes[g];
        if (position >= node.first && position < node.first + node.count && !node.expanded) {
            node.expanded = true;
            const QString k = keyOf(g);
            if (m_expandDefault)
                m_expandExceptions.remove(k);
            else
                m_expandExceptions.insert(k);
            changed = true;
        }
    }
    if (changed)
        buildDisplay();
    return changed;
}

} // namespace orvanta
