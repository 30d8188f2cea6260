// Report files of any shape: the reader must accept or refuse them with a line number, never
// crash or hang, and what it accepts must hold only layouts inside the paper.

#include "ui/report/ReportParser.h"

#include <cstddef>
#include <cstdint>

using namespace orvanta;

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size)
{
    const QByteArrayView bytes(reinterpret_cast<const char*>(data), static_cast<qsizetype>(size));
    const ReportParseResult result = ReportParser::parse(bytes);
    if (!result.ok()) {
        if (!result.error.startsWith(QLatin1String("Zeile ")) && !result.error.startsWith(QLatin1String("die Datei")))
            __builtin_trap(); // a refusal must say where
        if (!result.project.reports.isEmpty())
            __builtin_trap(); // a damaged file is used whole or not at all
        return 0;
    }
    for (const ReportDefinition& report : result.project.reports) {
        const QSizeF area = report.printable();
        if (area.width() <= 0 || area.height() <= 0)
            __builtin_trap();
        for (const ReportBand& band : report.bands) {
            if (band.height < 0 || band.height > area.height())
                __builtin_trap();
            for (const ReportItem& item : band.items) {
                const QRectF r = item.rect.normalized();
                if (r.left() < 0 || r.right() > area.width() + 1e-6 || r.top() < 0 || r.bottom() > band.height + 1e-6)
                    __builtin_trap();
            }
        }
    }
    return 0;
}
