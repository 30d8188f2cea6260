#pragma once
// One column of a grid: what it shows and how it behaves. A frame fills these once and hands
// them to the grid; the grid keeps the state the user changes (visibility, width, order, sort,
// grouping) beside them.

#include "ui/grid/GridSource.h"

#include <QString>
#include <functional>

namespace orvanta {

enum class GridSortOrder : quint8 { None, Ascending, Descending };

struct GridColumn {
    GridColumn() = default;
    GridColumn(QString name, QString fieldName, QString caption = {}, int tag = 0, int width = 64)
        : name(std::move(name))
        , fieldName(std::move(fieldName))
        , caption(std::move(caption))
        , tag(tag)
        , width(width)
    {
    }

    // Unique name (the column's objectName); the layout store keys on it.
    QString name;
    // Source field by name; resolved when the source is set. Empty for a column without field.
    QString fieldName;
    QString caption;
    int tag = 0;
    int width = 64;
    // When the view fits its columns to its width: never narrower than minWidth (content that
    // must not be cut, such as a date; 0 = the header's minimum), and only a column that
    // stretches takes a share of the free space; the others keep their own width.
    int minWidth = 0;
    bool stretches = true;
    bool visible = true;
    Qt::Alignment alignment = Qt::AlignLeft | Qt::AlignVCenter;
    bool sortable = true;
    bool groupable = true;
    bool movable = true;
    // Offered in the header's column menu (the key column usually is not).
    bool showInColumnMenu = true;

    // Display text of a cell; default: the field formatted by its type.
    std::function<QString(const GridSource&, quint32 row)> displayText;
    // When set, the column sorts, groups and filters by this text (ISO 8859-1 bytes that stay
    // valid while the source is unchanged: source bytes or static literals) instead of the
    // field's value; it is also the display text unless displayText is set.
    std::function<QByteArrayView(const GridSource&, quint32 row)> sortText;
    // Index into the view's image list drawn before the text, -1 for none.
    std::function<int(const GridSource&, quint32 row)> imageIndex;
    // Number format of Money and Double fields, e.g. "0.00 €": digits before the point as in the
    // value, the given number of decimals, the rest kept as text. Empty: plain number.
    QString numberFormat;
};

} // namespace orvanta
