#include "ui/rtf/RtfTokenizer.h"

#include <limits>

namespace orvanta {
namespace {

bool isLetter(char c)
{
    return (c >= 'a' && c <= 'z') || (c >= 'A' && c <= 'Z');
}

bool isDigit(char c)
{
    return c >= '0' && c <= '9';
}

int hexValue(char c)
{
    if (c >= '0' && c <= '9')
        return c - '0';
    if (c >= 'a' && c <= 'f')
        return c - 'a' + 10;
    if (c >= 'A' && c <= 'F')
        return c - 'A' + 10;
    return -1;
}

} // namespace

RtfToken RtfTokenizer::next()
{
    RtfToken token;
    const qsizetype size = m_data.size();
    while (m_pos < size) {
        const char c = m_data[m_pos];
        if (c == '\r' || c == '\n') {
            ++m_pos;
            continue;
        }
        if (c == '{') {
            ++m_pos;
            token.kind = RtfToken::Kind::GroupOpen;
            return token;
        }
        if (c == '}') {
            ++m_pos;
            token.kind = RtfToken::Kind::GroupClose;
            return token;
        }
        if (c == '\\') {
            if (m_pos + 1 >= size) {
                m_pos = size;
                return token; // a lone backslash at the end: nothing more to read
            }
            const char s = m_data[m_pos + 1];
            if (isLetter(s))
                return controlWord();
            m_pos += 2;
            if (s == '\'') {
                int value = 0;
                int digits = 0;
                while (digits < 2 && m_pos < size) {
                    const int h = hexValue(m_data[m_pos]);
                    if (h < 0)
                        break;
                    value = value * 16 + h;
                    ++digits;
                    ++m_pos;
                }
                if (digits == 0) {
                    token.kind = RtfToken::Kind::ControlSymbol;
                    token.symbol = '\'';
                    return token;
                }
                token.kind = RtfToken::Kind::HexByte;
                token.byte = static_cast<unsigned char>(value);
                return token;
            }
            token.kind = RtfToken::Kind::ControlSymbol;
            token.symbol = s == '\r' ? '\n' : s; // backslash + line end means \par
            return token;
        }
        const qsizetype start = m_pos;
        while (m_pos < size) {
            const char t = m_data[m_pos];
            if (t == '\\' || t == '{' || t == '}' || t == '\r' || t == '\n')
                break;
            ++m_pos;
        }
        token.kind = RtfToken::Kind::Text;
        token.text = m_data.sliced(start, m_pos - start);
        return token;
    }
    return token;
}

RtfToken RtfTokenizer::controlWord()
{
    RtfToken token;
    token.kind = RtfToken::Kind::ControlWord;
    const qsizetype size = m_data.size();
    const qsizetype start = ++m_pos;
    while (m_pos < size && isLetter(m_data[m_pos]))
        ++m_pos;
    token.name = m_data.sliced(start, m_pos - start);

    bool negative = false;
    if (m_pos + 1 < size && m_data[m_pos] == '-' && isDigit(m_data[m_pos + 1])) {
        negative = true;
        ++m_pos;
    }
    if (m_pos < size && isDigit(m_data[m_pos])) {
        token.hasParam = true;
        constexpr qint64 limit = std::numeric_limits<int>::max();
        qint64 value = 0;
        while (m_pos < size && isDigit(m_data[m_pos])) {
            value = std::min(limit, value * 10 + (m_data[m_pos] - '0'));
            ++m_pos;
        }
        token.param = static_cast<int>(negative ? -value : value);
    }
    if (m_pos < size && m_data[m_pos] == ' ')
        ++m_pos; // the delimiting space belongs to the word

    if (token.name == "bin") {
        const qint64 length = token.hasParam ? std::max(0, token.param) : 0;
        m_pos += std::min<qint64>(length, size - m_pos);
        token.kind = RtfToken::Kind::Binary;
    }
    return token;
}

} // namespace orvanta
