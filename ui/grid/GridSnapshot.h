#pragma once
// What a grid shows, walked row by row for exports and printouts: the visible columns in their
// order with their captions, then every row with all groups expanded (the user's expansion
// state is not touched), group rows in place, cells as the grid formats them. Only the
// record order is held; each row is formatted when it is reached, so a writer streaming the
// rows keeps its memory flat whatever the row count.

#include "ui/grid/GridSource.h"

#include <QDate>
#include <QString>
#include <QStringList>
#include <vector>

namespace orvanta {

class GridController;

struct GridSnapshotColumn {
    int column = -1;   // column index in the controller
    QString name;
    QString caption;
};

enum class GridCellKind : quint8 { Text, Number, Date };

// A cell's display text, and its value when the text is exactly the default rendering of a
// whole number or a date (so a spreadsheet can hold the value without changing what is seen).
struct GridSnapshotCell {
    QString text;
    GridCellKind kind = GridCellKind::Text;
    double number = 0;
    QDate date;
};

class GridSnapshot {
public:
    // Columns named in excludedNames (case-insensitive) are left out even when visible.
    explicit GridSnapshot(const GridController& grid, const QStringList& excludedNames = {});

    [[nodiscard]] const std::vector<GridSnapshotColumn>& columns() const { return m_columns; }
    [[nodiscard]] int columnCount() const { return static_cast<int>(m_columns.size()); }
    [[nodiscard]] qint64 recordCount() const { return static_cast<qint64>(m_records.size()); }
    [[nodiscard]] int groupLevels() const { return static_cast<int>(m_groupColumns.size()); }

    // Steps to the next display row; false at the end. Starts before the first row.
    bool next();
    void rewind();
    [[nodiscard]] bool isGroupRow() const { return m_pendingLevel >= 0 && m_emitLevel < groupLevels(); }
    [[nodiscard]] int groupLevel() const { return isGroupRow() ? m_emitLevel : -1; }
    // "Anrufer: Meier (12)", as the grid's group row reads.
    [[nodiscard]] QString groupText() const;
    // Cell i of the current data row (i indexes columns()).
    [[nodiscard]] GridSnapshotCell cell(int i) const;
    [[nodiscard]] QString cellText(int i) const;

private:
    [[nodiscard]] QString keyText(size_t pos, int level) const;
    [[nodiscard]] qint64 groupSize(size_t pos, int level) const;

    const GridController& m_grid;
    std::vector<GridSnapshotColumn> m_columns;
    std::vector<int> m_groupColumns;
    std::vector<quint32> m_records;
    // Position in m_records of the current (or next) data row.
    size_t m_pos = 0;
    bool m_started = false;
    // Group rows still to be shown before the record at m_pos: levels m_emitLevel..end.
    int m_pendingLevel = -1;
    int m_emitLevel = 0;
};

} // namespace orvanta
