#include "db/DbText.h"

#include <array>

namespace orvanta {

namespace {

// Windows-1252 characters of the bytes 0x80-0x9F (0 where Windows leaves the byte undefined).
constexpr std::array<char16_t, 32> kHigh = {
    0x20AC, 0,      0x201A, 0x0192, 0x201E, 0x2026, 0x2020, 0x2021, 0x02C6, 0x2030, 0x0160,
    0x2039, 0x0152, 0,      0x017D, 0,      0,      0x2018, 0x2019, 0x201C, 0x201D, 0x2022,
    0x2013, 0x2014, 0x02DC, 0x2122, 0x0161, 0x203A, 0x0153, 0,      0x017E, 0x0178};

} // namespace

QString decodeDbText(const char* data, qsizetype size)
{
    QString s = QString::fromLatin1(data, size);
    char16_t* p = reinterpret_cast<char16_t*>(s.data());
    for (qsizetype i = 0; i < size; ++i) {
        const char16_t c = p[i];
        if (c >= 0x80 && c <= 0x9F && kHigh[c - 0x80] != 0)
            p[i] = kHigh[c - 0x80];
    }
    return s;
}

QByteArray encodeDbText(QStringView text)
{
    QByteArray out(text.size(), Qt::Uninitialized);
    char* o = out.data();
    for (qsizetype i = 0; i < text.size(); ++i) {
        const char16_t c = text[i].unicode();
        if (c < 0x80 || (c >= 0xA0 && c <= 0xFF) || (c <= 0x9F && kHigh[c - 0x80] == 0)) {
            o[i] = char(c);
            continue;
        }
        char b = '?';
        for (int k = 0; k < 32; ++k) {
            if (kHigh[k] == c) {
                b = char(0x80 + k);
                break;
            }
        }
        o[i] = b;
    }
    return out;
}

} // namespace orvanta
