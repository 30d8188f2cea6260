#include "phone/AreaCodeTable.h"

#include "platform/Windows1252.h"

#include <QVarLengthArray>

#include <algorithm>
#include <stdexcept>

namespace orvanta {

namespace {

bool isDigit(char16_t c)
{
    return c >= u'0' && c <= u'9';
}

} // namespace

AreaCodeTable::AreaCodeTable(std::vector<int> prefixLengths)
    : m_prefixLengths(std::move(prefixLengths))
{
    std::sort(m_prefixLengths.begin(), m_prefixLengths.end());
    m_prefixLengths.erase(std::remove_if(m_prefixLengths.begin(), m_prefixLengths.end(),
                              [](int n) { return n < 1 || n > kMaxPrefixLength; }),
        m_prefixLengths.end());
    m_maxLength = m_prefixLengths.empty() ? 0 : m_prefixLengths.back();
    m_offsets.assign(static_cast<std::size_t>(m_maxLength) + 2, 0);
    std::size_t span = 1;
    for (int length = 1; length <= m_maxLength; ++length) {
        span *= 10;
        m_offsets[static_cast<std::size_t>(length) + 1] = m_offsets[static_cast<std::size_t>(length)] + span;
    }
}

void AreaCodeTable::clear()
{
    m_codes.clear();
    m_names.clear();
    m_index.clear();
    m_index.shrink_to_fit();
}

std::size_t AreaCodeTable::slot(const char16_t* digits, int length) const
{
    std::size_t value = 0;
    for (int i = 0; i < length; ++i)
        value = value * 10 + static_cast<std::size_t>(digits[i] - u'0');
    return m_offsets[static_cast<std::size_t>(length)] + value;
}

void AreaCodeTable::append(const QString& code, const QString& name)
{
    const auto entry = m_codes.size();
    if (entry >= std::numeric_limits<std::int32_t>::max())
        throw std::length_error("too many area codes");
    m_codes.append(code);
    m_names.append(name);

    const auto length = code.size();
    if (length < 1 || length > m_maxLength)
        return;
    const auto* digits = reinterpret_cast<const char16_t*>(code.constData());
    if (!std::all_of(digits, digits + length, isDigit))
        return;
    if (m_index.empty())
        m_index.assign(m_offsets.back(), -1);
    auto& first = m_index[slot(digits, static_cast<int>(length))];
    if (first < 0)
        first = static_cast<std::int32_t>(entry);
}

void AreaCodeTable::appendFileContents(QByteArrayView contents)
{
    const char* const end = contents.data() + contents.size();
    const char* line = contents.data();
    while (line < end) {
        // Line ends: LF, CR LF, or a lone CR.
        const char* lineEnd = line;
        while (lineEnd < end && *lineEnd != '\n' && *lineEnd != '\r')
            ++lineEnd;
        const char* next = lineEnd;
        if (next < end && *next++ == '\r' && next < end && *next == '\n')
            ++next;

        const char* comma = std::find(line, lineEnd, ',');
        if (comma != lineEnd) {
            const char* digitsEnd = line;
            while (digitsEnd < comma && *digitsEnd >= '0' && *digitsEnd <= '9')
                ++digitsEnd;
            if (digitsEnd != line) {
                append(QString::fromLatin1(line, digitsEnd - line),
                    fromWindows1252(QByteArrayView(comma + 1, lineEnd - comma - 1)));
            }
        }
        line = next;
    }
}

bool AreaCodeTable::lookup(QStringView number, QString& prefix, QString& rest, QString& region) const
{
    // truncate keeps the outputs' buffers, so a caller looking up many numbers allocates nothing.
    prefix.truncate(0);
    rest.truncate(0);
    region.clear();
    if (m_codes.isEmpty() || m_names.isEmpty())
        return false;

    QVarLengthArray<char16_t, 64> digits;
    for (const QChar c : number) {
        if (isDigit(c.unicode()))
            digits.append(c.unicode());
    }
    const auto digitCount = digits.size();
    qsizetype zeros = 0;
    while (zeros < digitCount && digits[zeros] == u'0')
        ++zeros;
    if (zeros == digitCount)
        zeros = 0; // only zeros: compared as they are
    const char16_t* significant = digits.constData() + zeros;
    const qsizetype significantCount = digitCount - zeros;

    std::int32_t hit = -1;
    qsizetype hitLength = 0;
    qsizetype restFrom = 0;
    if (!m_index.empty()) {
        for (const int n : m_prefixLengths) {
            const auto length = std::min<qsizetype>(n, significantCount);
            if (length == 0)
                continue;
            const auto entry = m_index[slot(significant, static_cast<int>(length))];
            if (entry >= 0) {
                hit = entry;
                hitLength = length;
                restFrom = std::min<qsizetype>(n, significantCount);
            }
        }
    }

    if (hit < 0) {
        rest.append(number);
        return true;
    }
    region = m_names.at(hit);
    // The match is the start of the significant digits, so its first occurrence in the dialled
    // digits ends right after them: the prefix keeps the zeros the caller dialled.
    prefix.append(reinterpret_cast<const QChar*>(digits.constData()), zeros + hitLength);
    rest.append(reinterpret_cast<const QChar*>(significant + restFrom), significantCount - restFrom);
    return true;
}

} // namespace orvanta
