#pragma once
// Paints laid-out pages: the one drawing routine behind the preview, the printer and PDF files.

#include <QString>

class QPainter;
class QPagedPaintDevice;
class QRectF;

namespace orvanta {

class ReportLayout;

class ReportRenderer final {
public:
    // Paints one page (white paper included) scaled into the target rectangle.
    static void paintPage(QPainter& painter, const ReportLayout& layout, int pageIndex, const QRectF& target);

    // Pages from..to (1-based, inclusive) `copies` times onto a printer or PDF writer, laying the
    // report out further as needed. Throws AppException when the device refuses to paint.
    static void print(QPagedPaintDevice* device, ReportLayout& layout, int from, int to, int copies = 1);
    // The whole report as a PDF file; throws AppException when the file cannot be written.
    static void writePdf(const QString& path, ReportLayout& layout);
};

} // namespace orvanta
