// Command texts can be replaced by users and scripts come from files: the named-parameter
// rewriter and the script splitter must cope with any text, and database text must survive the
// round trip through its 8-bit form.

#include "db/DbText.h"
#include "db/SqlParams.h"
#include "db/SqlScript.h"

#include <cstdint>
#include <cstdlib>

extern "C" int LLVMFuzzerTestOneInput(const uint8_t* data, size_t size)
{
    const QByteArray bytes(reinterpret_cast<const char*>(data), qsizetype(size));

    // Every byte string decodes to text that encodes back to the same bytes.
    if (orvanta::encodeDbText(orvanta::decodeDbText(bytes)) != bytes)
        std::abort();

    const QString text = QString::fromLatin1(bytes);
    const orvanta::ParsedSql parsed = orvanta::parseNamedParameters(text);
    // Each marker becomes one "?" and takes at least two characters (":X"), so the text never grows.
    if (parsed.sql.size() > text.size() || parsed.sql.count(QLatin1Char('?')) < parsed.names.size())
        std::abort();
    for (const QString& name : parsed.names)
        if (!name.isEmpty() && name != name.toUpper())
            std::abort();

    const auto statements = orvanta::SqlScript::split(text);
    for (const auto& s : statements)
        if (s.text.isEmpty() || s.line < 1)
            std::abort();
    return 0;
}
