#include "ui/grid/GridModel.h"

#include "ui/grid/GridController.h"

namespace orvanta {

GridModel::GridModel(GridController* controller, QObject* parent)
    : QAbstractTableModel(parent)
    , m_controller(controller)
    , m_columns(controller->columnCount())
{
    connect(controller, &GridController::layoutChanged, this, &GridModel::reset);
    connect(controller, &GridController::columnsChanged, this, [this] {
        if (m_controller->columnCount() != m_columns)
            reset();
        else if (m_columns > 0)
            Q_EMIT headerDataChanged(Qt::Horizontal, 0, m_columns - 1);
    });
}

void GridModel::reset()
{
    beginResetModel();
    m_columns = m_controller->columnCount();
    endResetModel();
}

int GridModel::rowCount(const QModelIndex& parent) const
{
    return parent.isValid() ? 0 : m_controller->rowCount();
}

int GridModel::columnCount(const QModelIndex& parent) const
{
    return parent.isValid() ? 0 : m_columns;
}

QVariant GridModel::data(const QModelIndex& index, int role) const
{
    if (!checkIndex(index, CheckIndexOption::IndexIsValid | CheckIndexOption::ParentIsInvalid))
        return {};
    const int row = index.row();
    const int c = index.column();
    const bool group = m_controller->isGroupRow(row);
    switch (role) {
    case Qt::DisplayRole:
        if (group)
            return c == 0 ? QVariant(m_controller->groupRowText(row)) : QVariant();
        return m_controller->displayText(row, c);
    case Qt::TextAlignmentRole:
        return group ? QVariant() : QVariant(static_cast<int>(m_controller->column(c).alignment));
    case RawValueRole: {
        const int record = m_controller->recordAt(row);
        return record < 0 ? QVariant() : m_controller->cellValue(static_cast<quint32>(record), c);
    }
    case RecordRole:
        return m_controller->recordAt(row);
    case GroupRowRole:
        return group;
    case GroupLevelRole:
        return m_controller->groupLevel(row);
    default:
        return {};
    }
}

QVariant GridModel::headerData(int section, Qt::Orientation orientation, int role) const
{
    if (orientation != Qt::Horizontal || section < 0 || section >= m_columns)
        return QAbstractTableModel::headerData(section, orientation, role);
    if (role == Qt::DisplayRole)
        return m_controller->column(section).caption;
    return {};
}

Qt::ItemFlags GridModel::flags(const QModelIndex& index) const
{
    if (!index.isValid())
        return Qt::NoItemFlags;
    return Qt::ItemIsEnabled | Qt::ItemIsSelectable | Qt::ItemNeverHasChildren;
}

GridHeaderModel::GridHeaderModel(GridController* controller, QObject* parent)
    : QAbstractTableModel(parent)
    , m_controller(controller)
    , m_columns(controller->columnCount())
{
}

int GridHeaderModel::rowCount(const QModelIndex&) const
{
    return 0;
}

int GridHeaderModel::columnCount(const QModelIndex& parent) const
{
    return parent.isValid() ? 0 : m_columns;
}

QVariant GridHeaderModel::data(const QModelIndex&, int) const
{
    return {};
}

QVariant GridHeaderModel::headerData(int section, Qt::Orientation orientation, int role) const
{
    if (orientation != Qt::Horizontal || section < 0 || section >= m_columns)
        return {};
    const GridColumn& c = m_controller->column(section);
    if (role == Qt::DisplayRole)
        return c.caption;
    if (role == Qt::TextAlignmentRole)
        return static_cast<int>(Qt::AlignLeft | Qt::AlignVCenter);
    return {};
}

void GridHeaderModel::syncColumnCount()
{
    const int n = m_controller->columnCount();
    if (n > m_columns) {
        beginInsertColumns({}, m_columns, n - 1);
        m_columns = n;
        endInsertColumns();
    }
}

void GridHeaderModel::captionsChanged()
{
    if (m_columns > 0)
        Q_EMIT headerDataChanged(Qt::Horizontal, 0, m_columns - 1);
}

} // namespace orvanta
