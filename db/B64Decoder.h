#pragma once
// The Base64 decoder of the stored credentials. It is deliberately lenient about noise: every
// character outside the Base64 alphabet is dropped first and decoding stops at the first "=",
// so a value with blanks or line breaks inside decodes the same.

#include <QByteArray>
#include <QString>

namespace orvanta {

class TB64Decoder final {
public:
    // The decoded bytes as an 8-bit string. Throws ConvertError "BASE64-Daten unvollständig."
    // when one character is left over after the groups of four.
    [[nodiscard]] QByteArray Decode(QStringView text) const;
    [[nodiscard]] QByteArray Decode(QByteArrayView text) const;
};

} // namespace orvanta
