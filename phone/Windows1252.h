#pragma once
// The monitor's and the installation's files are 8-bit text in the Windows code page.

#include <QByteArrayView>
#include <QString>

namespace orvanta {

// Bytes 0x80..0x9F follow Windows-1252; its five unassigned bytes map to the C1 controls, as
// Windows itself does, so every byte sequence decodes.
[[nodiscard]] QString decodeWindows1252(QByteArrayView bytes);
// Characters without a Windows-1252 byte become '?'.
[[nodiscard]] QByteArray encodeWindows1252(QStringView text);

} // namespace orvanta
