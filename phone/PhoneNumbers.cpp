#include "phone/PhoneNumbers.h"

#include <array>

namespace orvanta {

QString NormalizeNumber(QStringView input)
{
    QString result;
    result.reserve(input.size());
    for (const QChar c : input) {
        const char16_t u = c.unicode();
        if (u < u'0' || u > u'9')
            continue;
        if (u == u'0' && result.isEmpty())
            continue;
        result.append(c);
    }
    return result;
}

void NormalizeNumber(QStringView input, QString& result)
{
    result = NormalizeNumber(input);
}

QString ServiceName(int code)
{
    static const std::array<const char*, 23> names = {
        "Service unbekannt",
        "Sprachanruf",
        "Datenanruf",
        "Datenanruf (beschränkt)",
        "Fax- oder Telefonanruf (analog)",
        "Fax- oder Telefonanruf (analog)",
        "Videoanruf",
        "Datenanruf (PM)",
        "Datenanruf (56KBit)",
        "Datenanruf (TA)",
        "Telefonanruf",
        "Fax (2/3)",
        "Fax (4)",
        "Teletext (MM)",
        "Teletext (PM)",
        "Teletext (BM)",
        "Videotext",
        "Telex",
        "X400",
        "X200",
        "Videotelefonat (Audio)",
        "Videotelefonat (1ST)",
        "Videotelefonat (2ND)",
    };
    if (code < 0 || code >= static_cast<int>(names.size()))
        return {};
    return QString::fromUtf8(names[static_cast<size_t>(code)]);
}

void ServiceName(int code, QString& text)
{
    text = ServiceName(code);
}

} // namespace orvanta
