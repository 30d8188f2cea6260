#include "db/FbApi_p.h"

#include <array>

namespace orvanta::fbapi {

using namespace Firebird;

IMaster* master()
{
    static IMaster* const m = fb_get_master_interface();
    return m;
}

IUtil* util()
{
    static IUtil* const u = master()->getUtilInterface();
    return u;
}

Status::Status()
    : m_status(master()->getStatus())
    , m_wrapper(m_status)
{
}

Status::~Status()
{
    m_status->dispose();
}

DatabaseError toError(const FbException& e, const QString& context)
{
    IStatus* status = e.getStatus();
    std::array<char, 4096> buffer{};
    util()->formatStatus(buffer.data(), unsigned(buffer.size() - 1), status);
    // The engine separates its message lines with "\n"; the program's texts use CR LF.
    QString message = decodeText(buffer.data(), qsizetype(qstrlen(buffer.data()))).trimmed();
    message.replace(QStringLiteral("\r\n"), QStringLiteral("\n"));
    message.replace(QLatin1Char('\n'), QStringLiteral("\r\n"));

    QList<qint64> codes;
    const ISC_STATUS* v = status->getErrors();
    const int sqlCode = int(isc_sqlcode(v));
    // Walk the status vector: (isc_arg_gds, code) pairs carry the codes, other arguments are skipped.
    while (v && *v != isc_arg_end) {
        const ISC_STATUS kind = *v++;
        const ISC_STATUS value = *v++;
        if (kind == isc_arg_gds && value != 0)
            codes.append(qint64(value));
        else if (kind == isc_arg_cstring)
            ++v; // length, then pointer
    }
    return DatabaseError(std::move(message), std::move(codes), sqlCode, context);
}

namespace {

// Windows-1252 characters of the bytes 0x80-0x9F (0 where Windows leaves the byte undefined).
constexpr std::array<char16_t, 32> kHigh = {
    0x20AC, 0,      0x201A, 0x0192, 0x201E, 0x2026, 0x2020, 0x2021, 0x02C6, 0x2030, 0x0160,
    0x2039, 0x0152, 0,      0x017D, 0,      0,      0x2018, 0x2019, 0x201C, 0x201D, 0x2022,
    0x2013, 0x2014, 0x02DC, 0x2122, 0x0161, 0x203A, 0x0153, 0,      0x017E, 0x0178};

} // namespace

QString decodeText(const char* data, qsizetype size)
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

QByteArray encodeText(QStringView text)
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

} // namespace orvanta::fbapi
