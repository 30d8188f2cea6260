#pragma once
// Number forms shared by the log, the contacts and the monitor's service codes.

#include <QString>
#include <QStringView>

namespace orvanta {

// The digit form used to match numbers against each other: only the decimal digits, without the
// zeros in front of the first non-zero digit ("0049 (0)30 1234" gives "490301234").
[[nodiscard]] QString NormalizeNumber(QStringView input);
void NormalizeNumber(QStringView input, QString& result);

// German name of an ISDN service code as the monitor stores it; empty for unknown codes.
[[nodiscard]] QString ServiceName(int code);
void ServiceName(int code, QString& text);

} // namespace orvanta
