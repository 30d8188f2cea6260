#include "db/B64Decoder.h"

#include "platform/ConvertError.h"

namespace orvanta {
namespace {

int sextet(char c)
{
    if (c >= 'A' && c <= 'Z')
        return c - 'A';
    if (c >= 'a' && c <= 'z')
        return c - 'a' + 26;
    if (c >= '0' && c <= '9')
        return c - '0' + 52;
    if (c == '+')
        return 62;
    if (c == '/')
        return 63;
    return -1;
}

bool kept(char16_t c)
{
    return (c >= u'A' && c <= u'Z') || (c >= u'a' && c <= u'z') || (c >= u'0' && c <= u'9') || c == u'+'
        || c == u'/' || c == u'=';
}

QByteArray decodeFiltered(const QByteArray& filtered)
{
    const qsizetype end = filtered.indexOf('=');
    const QByteArray text = end < 0 ? filtered : filtered.left(end);
    if (text.size() % 4 == 1)
        throw ConvertError(QString::fromUtf8("BASE64-Daten unvollständig."));

    QByteArray out;
    out.reserve(text.size() / 4 * 3 + 2);
    for (qsizetype at = 0; at < text.size(); at += 4) {
        const qsizetype n = std::min<qsizetype>(4, text.size() - at);
        quint32 bits = 0;
        for (qsizetype i = 0; i < 4; ++i) {
            int value = 0;
            if (i < n) {
                value = sextet(text[at + i]);
                if (value < 0) {
                    throw ConvertError(QStringLiteral("Das Zeichen ") + QChar::fromLatin1(text[at + i])
                                       + QString::fromUtf8(" ist kein gültiges BASE64-Zeichen"));
                }
            }
            bits = (bits << 6) | static_cast<quint32>(value);
        }
        out.append(static_cast<char>(bits >> 16));
        if (n > 2)
            out.append(static_cast<char>((bits >> 8) & 0xFF));
        if (n > 3)
            out.append(static_cast<char>(bits & 0xFF));
    }
    return out;
}

} // namespace

QByteArray TB64Decoder::Decode(QStringView text) const
{
    QByteArray filtered;
    filtered.reserve(text.size());
    for (const QChar c : text) {
        if (kept(c.unicode()))
            filtered.append(static_cast<char>(c.unicode()));
    }
    return decodeFiltered(filtered);
}

QByteArray TB64Decoder::Decode(QByteArrayView text) const
{
    QByteArray filtered;
    filtered.reserve(text.size());
    for (const char c : text) {
        if (kept(static_cast<unsigned char>(c)))
            filtered.append(c);
    }
    return decodeFiltered(filtered);
}

} // namespace orvanta
