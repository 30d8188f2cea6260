#include "ui/report/ReportRenderer.h"

#include "platform/AppException.h"
#include "ui/report/ReportLayout.h"

#include <QAbstractTextDocumentLayout>
#include <QFile>
#include <QFontMetricsF>
#include <QPainter>
#include <QPdfWriter>
#include <QPrinter>
#include <QGlyphRun>
#include <QRawFont>
#include <QTextDocument>

#include <map>
#include <unordered_map>

namespace orvanta {

namespace {

constexpr double kDpm = ReportLayout::kDotsPerMm;

QRectF dots(const QRectF& mm, double y)
{
    return QRectF(mm.x() * kDpm, y + mm.y() * kDpm, mm.width() * kDpm, mm.height() * kDpm);
}

QFont fontOf(const ReportDefinition& definition, const ReportFont& own)
{
    QFont font(own.family.isEmpty() ? definition.font.family : own.family);
    const double points = own.size > 0 ? own.size : definition.font.size;
    // Pixel sizes in layout dots keep text the same size on every device the painter is scaled to.
    font.setPixelSize(std::max(1, qRound(points * ReportLayout::kDotsPerInch / 72)));
    font.setBold(own.bold);
    font.setItalic(own.italic);
    return font;
}

void paintRich(QPainter& painter, const ReportLayout& layout, const ReportLayout::Placement& placement)
{
    QTextDocument* doc = layout.richDocument(placement.rich);
    if (!doc)
        return;
    const ReportItem& item = *placement.rich;
    const double top = placement.continued ? placement.y : placement.y + item.rect.y() * kDpm;
    painter.save();
    painter.translate(item.rect.x() * kDpm, top - placement.richFrom);
    const QRectF slice(0, placement.richFrom, doc->textWidth(), placement.richTo - placement.richFrom);
    painter.setClipRect(slice, Qt::IntersectClip);
    QAbstractTextDocumentLayout::PaintContext context;
    // Lines touching the slice's edges belong to the neighbouring page: without the inset they
    // would be written there too, invisible but found by search and copy.
    context.clip = slice.adjusted(0, 1, 0, -1);
    context.palette.setColor(QPalette::Text, item.color);
    doc->documentLayout()->draw(&painter, context);
    painter.restore();
}

// Fonts, their metrics and the glyphs of the texts already drawn, per item: shaping a cell's
// text is most of a long report's time, and most cells repeat (dates, times, directions).
class FontCache {
public:
    struct Shaped {
        QGlyphRun run; // empty when the font lacks a glyph: then drawText finds a fallback
        double width = 0;
    };
    struct Entry {
        QFont font;
        QFontMetricsF metrics;
        QRawFont raw;
        QHash<QString, Shaped> texts;
    };

    Entry& of(const ReportDefinition& definition, const ReportItem& item)
    {
        auto it = m_entries.find(&item);
        if (it == m_entries.end()) {
            const QFont font = fontOf(definition, item.font);
            it = m_entries.emplace(&item, Entry{font, QFontMetricsF(font), QRawFont::fromFont(font), {}}).first;
        }
        return it->second;
    }

    const Shaped& shape(Entry& entry, const QString& text)
    {
        if (auto found = entry.texts.constFind(text); found != entry.texts.cend())
            return *found;
        if (entry.texts.size() > kMaxTexts)
            entry.texts.clear();
        Shaped shaped;
        const QList<quint32> glyphs = entry.raw.isValid() ? entry.raw.glyphIndexesForString(text) : QList<quint32>();
        if (!glyphs.isEmpty() && !glyphs.contains(0u) && glyphs.size() == text.size()) {
            const QList<QPointF> advances = entry.raw.advancesForGlyphIndexes(glyphs, QRawFont::KernedAdvances);
            QList<QPointF> positions;
            positions.reserve(glyphs.size());
            double x = 0;
            for (const QPointF& advance : advances) {
                positions.append(QPointF(x, 0));
                x += advance.x();
            }
            shaped.run.setRawFont(entry.raw);
            shaped.run.setGlyphIndexes(glyphs);
            shaped.run.setPositions(positions);
            shaped.width = x;
        } else {
            shaped.width = entry.metrics.horizontalAdvance(text);
        }
        return *entry.texts.insert(text, shaped);
    }

    // The glyphs of one page, gathered per font and colour and drawn in one run each: a PDF
    // writer's cost is mostly per call, not per glyph.
    void add(Entry& entry, const QColor& color, const Shaped& shaped, const QPointF& at)
    {
        Batch& batch = m_batches[{&entry, color.rgba()}];
        batch.glyphs += shaped.run.glyphIndexes();
        for (const QPointF& p : shaped.run.positions())
            batch.positions.append(p + at);
    }
    void flush(QPainter& painter)
    {
        for (auto& [key, batch] : m_batches) {
            if (batch.glyphs.isEmpty())
                continue;
            QGlyphRun run;
            run.setRawFont(key.first->raw);
            run.setGlyphIndexes(batch.glyphs);
            run.setPositions(batch.positions);
            painter.setPen(QColor::fromRgba(key.second));
            painter.drawGlyphRun(QPointF(0, 0), run);
            batch.glyphs.clear();
            batch.positions.clear();
        }
    }

private:
    struct Batch {
        QList<quint32> glyphs;
        QList<QPointF> positions;
    };
    static constexpr qsizetype kMaxTexts = 20000;
    std::map<std::pair<Entry*, QRgb>, Batch> m_batches;
    std::unordered_map<const ReportItem*, Entry> m_entries;
};

void paintBand(QPainter& painter, const ReportLayout& layout, const ReportLayout::Placement& placement, int pageIndex,
               FontCache& fonts)
{
    const ReportBand& band = *placement.band;
    const ReportDefinition& definition = layout.definition();
    if (placement.continued) {
        paintRich(painter, layout, placement);
        return;
    }
    if (layout.isShaded(band, placement.row))
        painter.fillRect(QRectF(0, placement.y, definition.printable().width() * kDpm, band.height * kDpm), band.shade);
    for (const ReportItem& item : band.items) {
        switch (item.kind) {
        case ReportItem::Kind::Text: {
            FontCache::Entry& font = fonts.of(definition, item);
            const QRectF box = dots(item.rect, placement.y);
            QString text = layout.expand(item.text, placement.row, pageIndex);
            if (text.isEmpty())
                break;
            // Placed by hand rather than through drawText(rect, flags): the same result for one
            // line, without a text layout per cell.
            const FontCache::Shaped* shaped = &fonts.shape(font, text);
            if (shaped->width > box.width()) {
                text = font.metrics.elidedText(text, Qt::ElideRight, box.width());
                shaped = &fonts.shape(font, text);
            }
            const double width = shaped->width;
            const Qt::Alignment h = item.align & Qt::AlignHorizontal_Mask;
            const double x = h == Qt::AlignRight ? box.right() - width
                : h == Qt::AlignHCenter          ? box.left() + (box.width() - width) / 2
                                                 : box.left();
            const Qt::Alignment v = item.align & Qt::AlignVertical_Mask;
            const double lineHeight = font.metrics.ascent() + font.metrics.descent();
            const double top = v == Qt::AlignTop ? box.top()
                : v == Qt::AlignBottom           ? box.bottom() - lineHeight
                                                 : box.top() + (box.height() - lineHeight) / 2;
            const QPointF baseline(x, top + font.metrics.ascent());
            if (!shaped->run.isEmpty()) {
                fonts.add(font, item.color, *shaped, baseline);
            } else {
                painter.setPen(item.color);
                painter.setFont(font.font);
                painter.drawText(baseline, text);
            }
            break;
        }
        case ReportItem::Kind::RichText:
            if (&item == placement.rich)
                paintRich(painter, layout, placement);
            break;
        case ReportItem::Kind::Line:
            painter.setPen(QPen(item.color, std::max(item.penWidth * kDpm, 1.0)));
            painter.drawLine(QLineF(item.rect.topLeft() * kDpm, item.rect.bottomRight() * kDpm).translated(0, placement.y));
            break;
        case ReportItem::Kind::Box: {
            const QRectF box = dots(item.rect, placement.y);
            if (item.fill.isValid())
                painter.fillRect(box, item.fill);
            if (item.penWidth > 0) {
                painter.setPen(QPen(item.color, item.penWidth * kDpm));
                painter.setBrush(Qt::NoBrush);
                painter.drawRect(box);
            }
            break;
        }
        }
    }
}

void paintPageWith(QPainter& painter, const ReportLayout& layout, int pageIndex, const QRectF& target, FontCache& fonts)
{
    const QSizeF paper = layout.paperDots();
    painter.save();
    painter.fillRect(target, Qt::white);
    painter.translate(target.topLeft());
    painter.scale(target.width() / paper.width(), target.height() / paper.height());
    painter.setClipRect(QRectF(QPointF(0, 0), paper), Qt::IntersectClip);
    painter.setRenderHint(QPainter::Antialiasing);
    painter.setRenderHint(QPainter::TextAntialiasing);
    const QMarginsF& margins = layout.definition().margins;
    painter.translate(margins.left() * kDpm, margins.top() * kDpm);
    if (pageIndex >= 0 && pageIndex < layout.pageCount())
        for (const ReportLayout::Placement& placement : layout.page(pageIndex).placements)
            paintBand(painter, layout, placement, pageIndex, fonts);
    fonts.flush(painter);
    painter.restore();
}

} // namespace

void ReportRenderer::paintPage(QPainter& painter, const ReportLayout& layout, int pageIndex, const QRectF& target)
{
    FontCache fonts;
    paintPageWith(painter, layout, pageIndex, target, fonts);
}

void ReportRenderer::print(QPagedPaintDevice* device, ReportLayout& layout, int from, int to, int copies)
{
    layout.layoutAll();
    from = std::max(from, 1);
    to = std::min(to, layout.pageCount());
    if (copies <= 0 || from > to)
        return;
    const QSizeF paper = layout.definition().paper;
    const bool landscape = paper.width() > paper.height();
    const QPageSize size(landscape ? paper.transposed() : paper, QPageSize::Millimeter);
    if (auto* printer = dynamic_cast<QPrinter*>(device))
        printer->setFullPage(true);
    device->setPageLayout(QPageLayout(size, landscape ? QPageLayout::Landscape : QPageLayout::Portrait, QMarginsF()));
    QPainter painter;
    if (!painter.begin(device))
        throw AppException(QStringLiteral("Der Drucker oder die Datei nimmt den Bericht nicht an."));
    const double dpi = device->logicalDpiX();
    const QRectF target(0, 0, paper.width() / 25.4 * dpi, paper.height() / 25.4 * device->logicalDpiY());
    FontCache fonts;
    bool first = true;
    for (int copy = 0; copy < copies; ++copy) {
        for (int page = from; page <= to; ++page) {
            if (!first && !device->newPage()) {
                painter.end();
                throw AppException(QStringLiteral("Der Drucker hat den Auftrag abgebrochen (Seite %1).").arg(page));
            }
            first = false;
            paintPageWith(painter, layout, page - 1, target, fonts);
        }
    }
    if (!painter.end())
        throw AppException(QStringLiteral("Der Bericht konnte nicht vollständig ausgegeben werden."));
}

void ReportRenderer::writePdf(const QString& path, ReportLayout& layout)
{
    QFile file(path);
    if (!file.open(QIODevice::WriteOnly))
        throw AppException(QStringLiteral("Die Datei „%1“ kann nicht geschrieben werden: %2").arg(path, file.errorString()));
    {
        QPdfWriter writer(&file);
        writer.setResolution(int(ReportLayout::kDotsPerInch));
        writer.setCreator(QStringLiteral("Orvanta"));
        writer.setTitle(layout.definition().title.isEmpty() ? layout.definition().name : layout.definition().title);
        print(&writer, layout, 1, std::numeric_limits<int>::max());
    }
    if (file.error() != QFileDevice::NoError)
        throw AppException(QStringLiteral("Die Datei „%1“ kann nicht geschrieben werden: %2").arg(path, file.errorString()));
}

} // namespace orvanta
