#include "ui/grid/GridFormat.h"

#include <QLocale>

namespace orvanta::gridformat {

QString formatNumber(double value, const QString& format)
{
    QLocale locale = QLocale::system();
    if (format.isEmpty()) {
        locale.setNumberOptions(QLocale::OmitGroupSeparator);
        return locale.toString(value, 'g', 15);
    }
    const auto isNumberChar = [](QChar c) {
        return c == QLatin1Char('0') || c == QLatin1Char('#') || c == QLatin1Char('.') || c == QLatin1Char(',');
    };
    qsizetype start = 0;
    while (start < format.size() && format[start] != QLatin1Char('0') && format[start] != QLatin1Char('#'))
        ++start;
    if (start == format.size())
        return format;
    qsizetype end = start;
    while (end < format.size() && isNumberChar(format[end]))
        ++end;
    const QStringView number = QStringView(format).mid(start, end - start);
    const qsizetype point = number.indexOf(QLatin1Char('.'));
    int decimals = 0;
    if (point >= 0) {
        for (qsizetype i = point + 1; i < number.size(); ++i) {
            if (number[i] == QLatin1Char('0') || number[i] == QLatin1Char('#'))
                ++decimals;
        }
    }
    const bool grouping = number.left(point < 0 ? number.size() : point).contains(QLatin1Char(','));
    if (!grouping)
        locale.setNumberOptions(QLocale::OmitGroupSeparator);
    return format.left(start) + locale.toString(value, 'f', decimals) + format.mid(end);
}

QString formatValue(const GridSource& source, quint32 row, int field, const QString& numberFormat)
{
    if (source.isNull(row, field))
        return {};
    switch (source.fieldType(field)) {
    case GridFieldType::Text:
        return source.text(row, field);
    case GridFieldType::Integer:
        if (!numberFormat.isEmpty())
            return formatNumber(static_cast<double>(source.intValue(row, field)), numberFormat);
        return QString::number(source.intValue(row, field));
    case GridFieldType::Date:
        return gridvalue::toDate(source.intValue(row, field)).toString(QStringLiteral("dd.MM.yyyy"));
    case GridFieldType::Time:
        return gridvalue::toTime(source.intValue(row, field)).toString(QStringLiteral("hh:mm:ss"));
    case GridFieldType::DateTime:
        return gridvalue::toDateTime(source.intValue(row, field)).toString(QStringLiteral("dd.MM.yyyy hh:mm:ss"));
    case GridFieldType::Money:
        return formatNumber(static_cast<double>(source.intValue(row, field)) / 100.0,
                            numberFormat.isEmpty() ? QStringLiteral("0.00") : numberFormat);
    case GridFieldType::Double:
        return formatNumber(source.doubleValue(row, field), numberFormat);
    }
    return {};
}

} // namespace orvanta::gridformat
