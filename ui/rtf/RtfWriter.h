#pragma once
// Writes a QTextDocument as RTF that WordPad, rich-edit controls and LibreOffice open with the
// same text, bold, italic, underline, strike-out, font name and size, colour, alignment and
// lists. 8-bit text goes out as Windows-1252 escapes, everything else as \uN with a "?" fallback.

#include <QByteArray>

class QTextDocument;

namespace orvanta {

class RtfWriter final {
public:
    [[nodiscard]] static QByteArray write(const QTextDocument& doc);
};

} // namespace orvanta
