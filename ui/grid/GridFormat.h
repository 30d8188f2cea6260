#pragma once
// Default display texts of typed grid values.

#include "ui/grid/GridSource.h"

namespace orvanta::gridformat {

// Date "dd.MM.yyyy", time "hh:mm:ss", money with two decimals, or by numberFormat.
[[nodiscard]] QString formatValue(const GridSource& source, quint32 row, int field, const QString& numberFormat = {});

// A Delphi-style number format: "0.00 €", "#,##0.00", "0". The point stands for the decimal
// separator and the comma for grouping, both of the system locale; text around the number is
// kept. An empty format gives the shortest plain number.
[[nodiscard]] QString formatNumber(double value, const QString& format);

} // namespace orvanta::gridformat
