#pragma once
// Settings and log files are 8-bit text in the Windows code page 1252. Qt has no converter for
// it without ICU, so the file readers and writers convert through these two functions.

#include <QByteArray>
#include <QString>

namespace orvanta {

// Every byte maps to one character; the five bytes Windows leaves undefined map to the control
// characters of the same value, as Windows itself does.
[[nodiscard]] QString fromWindows1252(QByteArrayView bytes);

// Characters without a Windows-1252 byte become '?'.
[[nodiscard]] QByteArray toWindows1252(QStringView text);

} // namespace orvanta
