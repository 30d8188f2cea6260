#pragma once
// Database text is ISO 8859-1. Bytes 0x80-0x9F are read as the Windows characters the monitor's
// Windows clients stored there (the euro sign above all) and written back the same way, so such
// text survives a round trip instead of turning into control characters. Characters with no byte
// become '?'. Only the database layer and readers of its stored bytes use these.

#include <QByteArray>
#include <QByteArrayView>
#include <QString>

namespace orvanta {

[[nodiscard]] QString decodeDbText(const char* data, qsizetype size);
[[nodiscard]] inline QString decodeDbText(QByteArrayView bytes) { return decodeDbText(bytes.data(), bytes.size()); }
[[nodiscard]] QByteArray encodeDbText(QStringView text);

} // namespace orvanta
