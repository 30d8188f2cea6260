#pragma once
// The grouping part of the grid: the grouped columns, the group tree over the sorted order
// (a group is a run of equal ranks, level by level) and the display rows it yields, group rows
// and the data rows of expanded groups. Expansion survives rebuilds: groups are remembered by
// their values as exceptions to the expand-all default.

#include <QSet>
#include <QString>
#include <functional>
#include <vector>

namespace orvanta {

class GridGrouping final {
public:
    struct Node {
        quint32 first = 0;      // position in the order
        quint32 count = 0;
        qint32 parent = -1;
        quint32 childBegin = 0; // subgroups (next level), empty on the last level
        quint32 childEnd = 0;
        quint16 level = 0;
        bool expanded = false;
    };
    // The display text of a record's cell, which names a group.
    using CellText = std::function<QString(quint32 record, int column)>;
    // The rank per source row of a grouped column.
    using RanksOf = std::function<const std::vector<quint32>&(int column)>;

    // order: the sorted records the groups cut into runs; it belongs to the owner.
    GridGrouping(const std::vector<quint32>& order, CellText cellText);

    // --- grouped columns -------------------------------------------------------------------
    [[nodiscard]] const std::vector<int>& columns() const { return m_columns; }
    [[nodiscard]] bool isEmpty() const { return m_columns.empty(); }
    [[nodiscard]] int indexOf(int column) const; // -1 when not grouped
    // At the level (appended when out of range); a grouped column moves.
    void insert(int column, int level);
    bool remove(int column);
    [[nodiscard]] bool isGroupByBoxVisible() const { return m_groupByBox; }
    bool setGroupByBoxVisible(bool visible);

    // --- the tree and the display rows ----------------------------------------------------
    void build(const RanksOf& ranksOf);
    void buildDisplay();
    void clear();
    [[nodiscard]] const Node& node(quint32 group) const { return m_nodes[group]; }
    [[nodiscard]] int displayRowCount() const { return static_cast<int>(m_display.size()); }
    // Group id of a display row, -1 for a data row or an invalid row.
    [[nodiscard]] int groupIdAt(int row) const;
    // Position in the order of a data row, -1 for a group row or an invalid row.
    [[nodiscard]] int positionAt(int row) const;
    [[nodiscard]] int rowOfPosition(quint32 position) const;
    [[nodiscard]] int rowOfGroup(quint32 group) const;
    // The row showing the position: the group at the wanted level that holds it (any level:
    // -1), or the deepest visible group when the row is inside a collapsed one; -1 when none.
    [[nodiscard]] int rowShowing(quint32 position, int groupLevel) const;

    // --- expansion -------------------------------------------------------------------------
    void expandAll(bool expand);
    // Whether it changed.
    bool setExpanded(quint32 group, bool expanded);
    // Opens every group that holds the position; whether any was closed.
    bool expandAround(quint32 position);

private:
    [[nodiscard]] QString keyOf(quint32 group) const;

    const std::vector<quint32>& m_order;
    CellText m_cellText;
    std::vector<int> m_columns;
    bool m_groupByBox = false;
    std::vector<Node> m_nodes;
    quint32 m_topGroups = 0;
    std::vector<quint32> m_display; // group id | kGroupBit, or position in the order
    bool m_expandDefault = false;
    QSet<QString> m_expandExceptions;
};

} // namespace orvanta
