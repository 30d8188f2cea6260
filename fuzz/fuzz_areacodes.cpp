// Area-code file contents of any shape, then lookups of numbers made from the same bytes.

#include "phone/AreaCodeTable.h"

#include <cstddef>
#include <cstdint>

using namespace orvanta;

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size)
{
    const QByteArrayView bytes(reinterpret_cast<const char*>(data), static_cast<qsizetype>(size));
    static const std::vector<int> lengths[] = {{2, 3, 4, 5}, {1, 2, 3, 4}, {1, 2}};
    const auto& chosen = lengths[size % 3];
    AreaCodeTable table(chosen);
    table.appendFileContents(bytes);

    QString prefix, rest, region;
    // Every line start is also tried as a dialled number, so hits are common.
    qsizetype from = 0;
    for (int tries = 0; tries < 64 && from <= bytes.size(); ++tries) {
        qsizetype to = bytes.indexOf('\n', from);
        if (to < 0)
            to = bytes.size();
        const QString number = QString::fromLatin1(bytes.sliced(from, std::min<qsizetype>(to - from, 4096)));
        if (table.lookup(number, prefix, rest, region)) {
            if (!region.isEmpty() && prefix.isEmpty())
                __builtin_trap();
            if (prefix.size() > number.size())
                __builtin_trap();
        } else if (!table.isEmpty()) {
            __builtin_trap();
        }
        from = to + 1;
    }
    return 0;
}
