#pragma once
// An item model over a grid's display rows, for exports, accessibility and Qt's model checks.
// One model row per display row (group rows included), one model column per grid column.
// The grid's own view paints from the controller and never needs this model.

#include <QAbstractTableModel>

namespace orvanta {

class GridController;

class GridModel final : public QAbstractTableModel {
    Q_OBJECT
    Q_DISABLE_COPY_MOVE(GridModel)

public:
    enum Role {
        RawValueRole = Qt::UserRole + 1, // typed value of the field (qint64, QDate, QTime, double, QString)
        RecordRole,                      // source row, -1 for group rows
        GroupRowRole,                    // true for group rows
        GroupLevelRole,                  // -1 for data rows
    };

    explicit GridModel(GridController* controller, QObject* parent = nullptr);

    [[nodiscard]] int rowCount(const QModelIndex& parent = {}) const override;
    [[nodiscard]] int columnCount(const QModelIndex& parent = {}) const override;
    [[nodiscard]] QVariant data(const QModelIndex& index, int role = Qt::DisplayRole) const override;
    [[nodiscard]] QVariant headerData(int section, Qt::Orientation orientation, int role = Qt::DisplayRole) const override;
    [[nodiscard]] Qt::ItemFlags flags(const QModelIndex& index) const override;

private:
    void reset();

    GridController* m_controller;
    int m_columns = 0;
};

// Header captions only: the header's sections must survive every row change, which a model
// reset would not allow.
class GridHeaderModel final : public QAbstractTableModel {
    Q_OBJECT
    Q_DISABLE_COPY_MOVE(GridHeaderModel)

public:
    explicit GridHeaderModel(GridController* controller, QObject* parent = nullptr);

    [[nodiscard]] int rowCount(const QModelIndex& parent = {}) const override;
    [[nodiscard]] int columnCount(const QModelIndex& parent = {}) const override;
    [[nodiscard]] QVariant data(const QModelIndex& index, int role = Qt::DisplayRole) const override;
    [[nodiscard]] QVariant headerData(int section, Qt::Orientation orientation, int role = Qt::DisplayRole) const override;
    // Columns were added since the last sync.
    void syncColumnCount();
    void captionsChanged();

private:
    GridController* m_controller;
    int m_columns = 0;
};

} // namespace orvanta
