#pragma once
// The grid's data controller: columns, a source, and the index vectors that filtering, sorting
// and grouping produce over it. No widgets: views (the table view now, a card view later) and
// the layout store work through it, and tests drive it directly. The work itself is done by its
// parts, GridRowFilter, GridSorter and GridGrouping; the controller keeps them in step, keeps
// the focus, and announces changes.
//
// Rows are "display rows": data rows and, when grouped, group rows, in the order shown.
// A "record" is a row index of the source.
//
// Changes inside beginUpdate()/endUpdate() are computed on demand but announced once, at the
// outermost endUpdate().

#include "ui/grid/GridColumnState.h"
#include "ui/grid/GridGrouping.h"
#include "ui/grid/GridRowFilter.h"
#include "ui/grid/GridSorter.h"

#include <QDate>
#include <QObject>
#include <functional>
#include <vector>

namespace orvanta {

class GridController final : public QObject {
    Q_OBJECT
    Q_DISABLE_COPY_MOVE(GridController)

public:
    explicit GridController(QObject* parent = nullptr);
    ~GridController() override;

    // --- columns ---------------------------------------------------------------------------
    int addColumn(GridColumn column);
    [[nodiscard]] int columnCount() const { return static_cast<int>(m_columns.size()); }
    [[nodiscard]] const GridColumn& column(int c) const { return m_columns.at(static_cast<size_t>(c)).def; }
    // The source field a column is bound to, -1 when none (or no source).
    [[nodiscard]] int columnField(int c) const { return m_columns.at(static_cast<size_t>(c)).field; }
    [[nodiscard]] int columnByName(QStringView name) const;   // case-insensitive
    [[nodiscard]] int columnByField(QStringView field) const; // first column bound to it
    [[nodiscard]] int columnByCaption(QStringView caption) const; // exact
    [[nodiscard]] int columnByTag(int tag) const;
    void setColumnVisible(int c, bool visible);
    [[nodiscard]] bool isColumnVisible(int c) const { return column(c).visible; }
    void setColumnWidth(int c, int width);
    void setColumnCaption(int c, const QString& caption);
    // Visual order: positions of all columns, hidden ones included.
    [[nodiscard]] const std::vector<int>& columnOrder() const { return m_visual; }
    [[nodiscard]] int visualIndex(int c) const;
    void moveColumn(int c, int toVisual);
    // Any permutation of the columns; anything else is ignored.
    void setColumnOrder(const std::vector<int>& order);
    [[nodiscard]] std::vector<int> visibleColumns() const;

    // --- source ----------------------------------------------------------------------------
    // Not owned; it must outlive the controller or be replaced first. nullptr closes.
    void setSource(const GridSource* source);
    [[nodiscard]] const GridSource* source() const { return m_source; }
    // Ready = bound to a source (the "data controller active" of the frames).
    [[nodiscard]] bool isActive() const { return m_source != nullptr; }
    // The source's content changed (re-read): recompute everything, keep the focused record
    // when a key field is set and the key still exists.
    void sourceChanged();
    // Rows were added at the end of the source (a log still arriving): only they are filtered,
    // sorted among themselves and merged into the order, so the rows shown keep their places
    // relative to each other and the focus stays on its record. Grouped, everything is
    // computed again.
    void sourceAppended();
    // While the change from sourceAppended() is announced: views keep their scroll position
    // then instead of moving to the focused row, so arriving rows never pull the view away.
    [[nodiscard]] bool isAnnouncingArrival() const { return m_announcingArrival; }
    // Source rows the computed order covers (rows beyond arrived and were not announced yet).
    [[nodiscard]] quint32 appliedRowCount() const { return m_appliedRows; }
    void setKeyField(const QString& field) { m_keyFieldName = field; }
    // Record with that key in the key field (or the given field), -1 when none.
    [[nodiscard]] int locate(qint64 key) const;
    [[nodiscard]] int locate(int field, qint64 key) const;

    // --- sorting ---------------------------------------------------------------------------
    // Adds the column as the last sort key, changes its order, or removes it (None).
    void setSortOrder(int c, GridSortOrder order);
    [[nodiscard]] GridSortOrder sortOrder(int c) const { return m_columns.at(static_cast<size_t>(c)).sortOrder; }
    [[nodiscard]] int sortIndex(int c) const { return m_sorter.sortIndex(c); } // -1 when not a sort key
    [[nodiscard]] const std::vector<int>& sortedColumns() const { return m_sorter.sortedColumns(); }
    void clearSorting();
    // A header click: alone it sorts by this column only (toggling when it already does), with
    // Shift it adds or toggles a key, with Ctrl it removes the key.
    void headerClicked(int c, Qt::KeyboardModifiers modifiers);
    // Contact-list behaviour: focus the first row after every sort change.
    void setFocusFirstAfterSort(bool on) { m_focusFirstAfterSort = on; }

    // --- grouping --------------------------------------------------------------------------
    // Groups by the column at the given level (appended when level < 0) and hides it.
    void groupBy(int c, int level = -1);
    // Removes the column from the grouping and shows it again.
    void ungroup(int c);
    void clearGrouping();
    [[nodiscard]] const std::vector<int>& groupedColumns() const { return m_grouping.columns(); }
    [[nodiscard]] int groupIndex(int c) const { return m_grouping.indexOf(c); }
    [[nodiscard]] bool isGrouped() const { return !m_grouping.isEmpty(); }
    // Direction of a grouped column's groups (ascending unless set).
    void setGroupSortOrder(int c, GridSortOrder order);
    void setGroupByBoxVisible(bool visible);
    [[nodiscard]] bool isGroupByBoxVisible() const { return m_grouping.isGroupByBoxVisible(); }
    void expandAll(bool expand);
    void setGroupExpanded(int row, bool expanded);
    [[nodiscard]] bool isGroupExpanded(int row) const;

    // --- filter ----------------------------------------------------------------------------
    [[nodiscard]] const GridFilter& filter() const { return m_rowFilter.filter(); }
    void setFilter(const GridFilter& filter);
    void setFilterActive(bool active);
    void addFilterItem(GridFilterItem item);
    // Removes every item of the root list (the active switch stays as it is).
    void clearFilterItems();
    // "TSDATE is this week", "(CONTBEZ LIKE 'A%' OR CONTBEZ LIKE 'a%')"; empty without items.
    [[nodiscard]] QString filterText() const;
    // Today for the period conditions (default: the program clock); read whenever the filter
    // is applied.
    void setTodayProvider(std::function<QDate()> today);
    [[nodiscard]] QDate today() const { return m_rowFilter.today(); }

    // --- search --------------------------------------------------------------------------
    // Rows where a chosen column holds the text, within or instead of the filter (GridSearch).
    [[nodiscard]] const GridSearch& search() const { return m_rowFilter.search(); }
    void setSearch(const GridSearch& search);
    void clearSearch() { setSearch(GridSearch()); }
    [[nodiscard]] bool isSearching() const { return m_rowFilter.search().isActive(); }

    // --- rows ------------------------------------------------------------------------------
    [[nodiscard]] int rowCount() const;
    // Data rows passing the filter, group rows not counted.
    [[nodiscard]] int recordCount() const;
    [[nodiscard]] bool isGroupRow(int row) const;
    // Source row of a data row, -1 for a group row or an invalid row.
    [[nodiscard]] int recordAt(int row) const;
    [[nodiscard]] int groupLevel(int row) const;   // -1 for a data row
    [[nodiscard]] int groupColumn(int row) const;  // grouped column of a group row, -1 otherwise
    [[nodiscard]] int groupRecordCount(int row) const;
    [[nodiscard]] QString groupValueText(int row) const;
    // "Anrufer: Meier (12)"
    [[nodiscard]] QString groupRowText(int row) const;
    // Every record passing the filter, in display order and regardless of expansion: for
    // exports and reports.
    [[nodiscard]] std::vector<quint32> recordsInOrder() const { return m_order; }
    // Display text of a data row's cell ("" for group rows), only ever formatted on request.
    [[nodiscard]] QString displayText(int row, int c) const;
    [[nodiscard]] QString cellText(quint32 record, int c) const;
    [[nodiscard]] QVariant cellValue(quint32 record, int c) const;
    // Display row of a record, -1 when filtered out or inside a collapsed group.
    [[nodiscard]] int rowOfRecord(quint32 record) const;

    // --- focus -----------------------------------------------------------------------------
    [[nodiscard]] int focusedRow() const { return m_focusRow; }
    void setFocusedRow(int row);
    // Record of the focused row, -1 when no row or a group row is focused.
    [[nodiscard]] int focusedRecord() const;
    // Focuses the record's row, expanding the groups that hold it. False when filtered out.
    bool focusRecord(quint32 record);

    // --- misc ------------------------------------------------------------------------------
    void beginUpdate();
    void endUpdate();
    [[nodiscard]] bool isLocked() const { return m_lock > 0; }
    // Free integer of the view (stored with the layout): the log's filter kind, the contact
    // list's letter index.
    [[nodiscard]] int tag() const { return m_tag; }
    void setTag(int tag) { m_tag = tag; }
    // Applies the filter, sort and grouping again over the unchanged source.
    void reapply();

    // The sort ranks computed so far for columns that read a field as it is (no sortText), by
    // field name; handed out, so this controller computes them again when it needs them.
    using FieldRanks = std::vector<std::pair<QString, GridRanks>>;
    [[nodiscard]] FieldRanks takeFieldRanks();
    // Takes such ranks over for its own plain columns of the same fields. Only right after
    // setSource() with a source that holds the very rows, in the very order, of the source the
    // ranks were computed on: another view over the same fetched rows.
    void adoptFieldRanks(FieldRanks ranks);

Q_SIGNALS:
    // Rows changed: order, filter, grouping, expansion or source content.
    void layoutChanged();
    // Column state changed: visibility, order, width, caption, sort keys, grouping.
    void columnsChanged();
    void columnVisibilityChanged(int column, bool visible);
    void focusChanged(int previousRow, int currentRow);
    // The focused record or group row changed (also to or from none).
    void focusedRecordChanged();

private:
    enum Dirty : unsigned { DirtyFilter = 1, DirtySort = 2, DirtyGroups = 4, DirtyDisplay = 8 };

    struct FocusKey {
        int record = -1;
        int groupLevel = -1;
        bool operator==(const FocusKey&) const = default;
    };

    void invalidate(unsigned dirty);
    void ensureApplied() const;
    void apply();
    [[nodiscard]] int groupIdAt(int row) const;
    [[nodiscard]] FocusKey focusKey() const;
    void restoreFocus(const FocusKey& key, bool focusFirst);
    void changeFocus(int row);
    void updateFocusKey();
    void announce();
    void announceColumns();
    void resolveFields();
    // Order of two records by the column's sort key (< 0, 0, > 0), ascending.
    [[nodiscard]] int compareRecords(int c, quint32 a, quint32 b) const;

    GridColumnStates m_columns;
    std::vector<int> m_visual;
    GridRowFilter m_rowFilter;
    GridSorter m_sorter;
    const GridSource* m_source = nullptr;
    QString m_keyFieldName;
    int m_tag = 0;
    bool m_focusFirstAfterSort = false;

    int m_lock = 0;
    unsigned m_dirty = 0;
    bool m_pendingLayout = false;
    bool m_pendingColumns = false;
    bool m_pendingFocusFirst = false;
    int m_announcedRow = -1;
    FocusKey m_announcedKey;

    // Computed (queries apply pending work on demand).
    std::vector<quint32> m_filtered;
    quint32 m_appliedRows = 0;
    bool m_announcingArrival = false;
    std::vector<quint32> m_order;
    GridGrouping m_grouping;
    int m_focusRow = -1;
    FocusKey m_focusKey;
    bool m_focusedKeyValid = false;
    qint64 m_focusedKeyValue = 0;
};

} // namespace orvanta
