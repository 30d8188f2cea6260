#pragma once
// One report run: the report file beside the program, the chosen report, its parameters and rows,
// shown in the preview. The preview is a seam: tests write the pages to a PDF file instead.

#include "ui/report/ReportLayout.h"

#include <functional>

namespace orvanta {

inline constexpr const char* kReportFile = "Orvex.rav";

// Shows a laid-out report (layout has been started, not necessarily laid out further); returns
// when the user is done with it.
using ReportPreviewHook = std::function<void(ReportLayout& layout, const QString& previewTitle)>;
// An empty hook restores the preview window.
void setReportPreviewHook(ReportPreviewHook hook);

// Reads the report file; throws AppException ("Orvex.rav: Zeile n: …") when it is missing or damaged.
[[nodiscard]] ReportProject loadReportProject(const QString& path);

// Loads programFile("Orvex.rav"), selects the report and shows it. The source (may be null) is
// opened by the run and restored after it. Throws AppException on any failure; nothing is shown then.
void runReport(const QString& reportName, ReportParameters parameters, ReportDataSource* source,
               const QString& previewTitle);

} // namespace orvanta
