#include "ui/grid/GridColumnState.h"

#include "ui/grid/GridFormat.h"

namespace orvanta {

QByteArrayView GridColumnState::keyText(const GridSource& source, quint32 record) const
{
    if (def.sortText)
        return def.sortText(source, record);
    if (field >= 0)
        return source.textValue(record, field);
    return {};
}

QString GridColumnState::cellText(const GridSource& source, quint32 record) const
{
    if (def.displayText)
        return def.displayText(source, record);
    if (def.sortText)
        return QString::fromLatin1(def.sortText(source, record));
    if (field < 0 || source.isNull(record, field))
        return {};
    return gridformat::formatValue(source, record, field, def.numberFormat);
}

int gridColumnByName(const GridColumnStates& columns, QStringView name)
{
    for (size_t c = 0; c < columns.size(); ++c) {
        if (name.compare(columns[c].def.name, Qt::CaseInsensitive) == 0)
            return static_cast<int>(c);
    }
    return -1;
}

} // namespace orvanta
