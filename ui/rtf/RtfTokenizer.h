#pragma once
// Splits RTF into groups, control words, control symbols, hex escapes and text runs. Works on a
// borrowed view of the input and never reads past it; \binN data is skipped here, clamped to
// what is left, so binary payloads can never be mistaken for markup.

#include <QByteArrayView>

namespace orvanta {

struct RtfToken {
    enum class Kind {
        End,
        GroupOpen,
        GroupClose,
        ControlWord, // name + optional parameter
        ControlSymbol, // backslash + one non-letter; symbol holds it
        HexByte, // \'hh; byte holds the value
        Text, // a run of literal bytes (without CR and LF)
        Binary, // \binN payload, already skipped
    };
    Kind kind = Kind::End;
    QByteArrayView name; // control word
    QByteArrayView text; // text run
    bool hasParam = false;
    int param = 0; // saturated to the int range
    char symbol = 0;
    unsigned char byte = 0;

    [[nodiscard]] bool is(const char* word) const { return kind == Kind::ControlWord && name == word; }
};

class RtfTokenizer final {
public:
    explicit RtfTokenizer(QByteArrayView data)
        : m_data(data)
    {
    }

    RtfToken next();

private:
    RtfToken controlWord();

    QByteArrayView m_data;
    qsizetype m_pos = 0;
};

} // namespace orvanta
