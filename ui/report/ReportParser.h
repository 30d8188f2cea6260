#pragma once
// Reads the report file (see README.md for the format). Damaged input of any kind gives an error
// naming the line and nothing else: a file is used whole or not at all.

#include "ui/report/ReportDefinition.h"

#include <QByteArrayView>

namespace orvanta {

struct ReportParseResult {
    ReportProject project;
    QString error; // empty on success; otherwise "Zeile n: …"

    [[nodiscard]] bool ok() const { return error.isEmpty(); }
};

class ReportParser final {
public:
    [[nodiscard]] static ReportParseResult parse(QByteArrayView data);

    // Bounds that keep a hostile file from costing more than its size: beyond them the file is
    // refused, not cut.
    static constexpr qsizetype kMaxFileSize = 4 * 1024 * 1024;
    static constexpr int kMaxReports = 256;
    static constexpr int kMaxBandsPerReport = 32;
    static constexpr int kMaxItemsPerBand = 2000;
    static constexpr int kMaxTextLength = 4000;
    static constexpr double kMaxPaper = 2000; // millimetres
};

} // namespace orvanta
