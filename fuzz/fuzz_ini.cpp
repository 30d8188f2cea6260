// Feeds arbitrary bytes to the INI reader: it never fails, and what it read survives a write
// and a second read unchanged.

#include "platform/IniFile.h"

#include <QByteArray>
#include <cstdlib>

extern "C" int LLVMFuzzerTestOneInput(const uint8_t* data, size_t size)
{
    using namespace orvanta;
    const QByteArrayView input(reinterpret_cast<const char*>(data), static_cast<qsizetype>(size));

    IniFile first;
    first.parse(input);
    const QStringList sections = first.sections();
    for (const QString& section : sections) {
        for (const QString& key : first.keys(section)) {
            (void)first.readInteger(section, key, 0);
            (void)first.readFloat(section, key, 0.0);
        }
    }

    // Text from a UTF-8 file may hold characters the code page cannot write back.
    if (input.startsWith("\xEF\xBB\xBF"))
        return 0;

    IniFile second;
    second.parse(first.serialize());
    if (second.sections() != sections)
        std::abort();
    for (const QString& section : sections) {
        const QStringList keys = first.keys(section);
        if (second.keys(section) != keys)
            std::abort();
        for (const QString& key : keys) {
            if (second.readString(section, key) != first.readString(section, key))
                std::abort();
        }
    }
    return 0;
}
