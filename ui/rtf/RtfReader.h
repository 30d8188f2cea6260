#pragma once
// Reads RTF as Windows rich-edit controls, WordPad and LibreOffice write it into a QTextDocument:
// text in the document's or the font's code page, \u escapes, fonts, sizes, colours, bold,
// italic, underline, strike-out, paragraph alignment and bullet or numbered lists. Anything else
// is skipped. Input that does not start with "{\rtf" is loaded as plain text.
//
// The parser is iterative with a bounded group stack, so hostile input (deep nesting, absurd
// numbers, truncation, binary junk) costs at most time and memory in proportion to its size.

#include <QByteArray>

class QTextDocument;

namespace orvanta {

class RtfReader final {
public:
    // Replaces the document's content. Returns false when the input was damaged (truncated,
    // unbalanced braces, nested too deep); the document then holds everything that could be read.
    // The load itself is not undoable.
    static bool read(const QByteArray& data, QTextDocument* doc);

    [[nodiscard]] static bool isRtf(const QByteArray& data);

    // Groups nested deeper than this are read as part of their parent.
    static constexpr int kMaxDepth = 512;
    // Entries beyond these are ignored.
    static constexpr int kMaxFonts = 4096;
    static constexpr int kMaxColors = 4096;
};

} // namespace orvanta
