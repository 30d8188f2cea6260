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

// A text's hash and equality for the shaped-text cache, so that a cell's view of its row is
// looked up without becoming a string of its own.
struct TextHash {
    using is_transparent = void;
    size_t operator()(QStringView text) const noexcept { return qHash(text); }
};
struct TextEqual {
    using is_transparent = void;
    bool operator()(QStringView a, QStringView b) const noexcept { return a == b; }
};

// Fonts, their metrics, the compiled template and the glyphs of the texts already drawn, per
// item: shaping a cell's text is most of a long report's time, and most cells repeat (dates,
// times, directions).
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
        double ascent = 0;
        double lineHeight = 0;
        ReportLayout::Template templ;
        std::unordered_map<QString, Shaped, TextHash, TextEqual> texts;
    };

    Entry& of(const ReportLayout& layout, const ReportItem& item)
    {
        auto it = m_entries.find(&item);
        if (it == m_entries.end()) {
            const QFont font = fontOf(layout.definition(), item.font);
            const QFontMetricsF metrics(font);
            it = m_entries
                     .emplace(&item, Entry{font, metrics, QRawFont::fromFont(font), metrics.ascent(),
                                           metrics.ascent() + metrics.descent(), layout.compile(item.text), {}})
                     .first;
        }
        return it->second;
    }

    // Glyph positions are whole layout dots (1/1200 inch, far below what any printer shows):
    // a PDF then carries short whole numbers for every glyph, which makes it smaller and quicker
    // to write and compress.
    const Shaped& shape(Entry& entry, QStringView text)
    {
        if (auto found = entry.texts.find(text); found != entry.texts.end())
            return found->second;
        if (entry.texts.size() > kMaxTexts)
            entry.texts.clear();
        Shaped shaped;
        const QString string = text.toString();
        const QList<quint32> glyphs = entry.raw.isValid() ? entry.raw.glyphIndexesForString(string) : QList<quint32>();
        if (!glyphs.isEmpty() && !glyphs.contains(0u) && glyphs.size() == string.size()) {
            const QList<QPointF> advances = entry.raw.advancesForGlyphIndexes(glyphs, QRawFont::KernedAdvances);
            QList<QPointF> positions;
            positions.reserve(glyphs.size());
            double x = 0;
            for (const QPointF& advance : advances) {
                positions.append(QPointF(std::round(x), 0));
                x += advance.x();
            }
            shaped.run.setRawFont(entry.raw);
            shaped.run.setGlyphIndexes(glyphs);
            shaped.run.setPositions(positions);
            shaped.width = std::round(x);
        } else {
            shaped.width = entry.metrics.horizontalAdvance(string);
        }
        return entry.texts.emplace(string, std::move(shaped)).first->second;
    }

    // The glyphs of one page, gathered per font and colour and drawn in one run each: a PDF
    // writer's cost is mostly per call, not per glyph.
    void add(Entry& entry, const QColor& color, const Shaped& shaped, const QPointF& at)
    {
        Batch& batch = m_batches[{&entry, color.rgba()}];
        batch.glyphs += shaped.run.glyphIndexes();
        const QPointF origin(std::round(at.x()), std::round(at.y()));
        for (const QPointF& p : shaped.run.positions())
            batch.positions.append(p + origin);
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

    QString scratch; // a compound cell's text, reused from cell to cell

private:
    struct Batch {
        QList<quint32> glyphs;
        QList<QPointF> positions;
    };
    static constexpr size_t kMaxTexts = 20000;
    std::map<std::pair<Entry*, QRgb>, Batch> m_batches;
    std::unordered_map<const ReportItem*, Entry> m_entries;
};

void paintBand(QPainter& painter, const ReportLayout& layout, const ReportLayout::Placement& placement, int pageIndex,
               FontCache& fonts)
{
    const ReportBand& band = *placement.band;
    if (placement.continued) {
        paintRich(painter, layout, placement);
        return;
    }
    for (const ReportItem& item : band.items) {
        switch (item.kind) {
        case ReportItem::Kind::Text: {
            FontCache::Entry& font = fonts.of(layout, item);
            const QRectF box = dots(item.rect, placement.y);
            QStringView text = layout.expand(font.templ, placement.row, pageIndex, fonts.scratch);
            if (text.isEmpty())
                break;
            // Placed by hand rather than through drawText(rect, flags): the same result for one
            // line, without a text layout per cell.
            const FontCache::Shaped* shaped = &fonts.shape(font, text);
            QString elided;
            if (shaped->width > box.width()) {
                elided = font.metrics.elidedText(text.toString(), Qt::ElideRight, box.width());
                text = elided;
                shaped = &fonts.shape(font, text);
            }
            const double width = shaped->width;
            const Qt::Alignment h = item.align & Qt::AlignHorizontal_Mask;
            const double x = h == Qt::AlignRight ? box.right() - width
                : h == Qt::AlignHCenter          ? box.left() + (box.width() - width) / 2
                                                 : box.left();
            const Qt::Alignment v = item.align & Qt::AlignVertical_Mask;
            const double lineHeight = font.lineHeight;
            const double top = v == Qt::AlignTop ? box.top()
                : v == Qt::AlignBottom           ? box.bottom() - lineHeight
                                                 : box.top() + (box.height() - lineHeight) / 2;
            const QPointF baseline(x, top + font.ascent);
            if (!shaped->run.isEmpty()) {
                fonts.add(font, item.color, *shaped, baseline);
            } else {
                painter.setPen(item.color);
                painter.setFont(font.font);
                painter.drawText(baseline, text.toString());
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

// The shaded rows of a page, first and in one call per colour: bands do not overlap, so nothing
// a band draws lies under another band's shade.
void paintShading(QPainter& painter, const ReportLayout& layout, const QList<ReportLayout::Placement>& placements)
{
    std::map<QRgb, QList<QRectF>> shades;
    const double width = std::round(layout.definition().printable().width() * kDpm);
    for (const ReportLayout::Placement& placement : placements) {
        if (placement.continued || !layout.isShaded(*placement.band, placement.row))
            continue;
        // Whole dots, top and bottom rounded alike, so that neighbouring rows neither gap nor overlap.
        const double top = std::round(placement.y);
        const double bottom = std::round(placement.y + placement.band->height * kDpm);
        shades[placement.band->shade.rgba()].append(QRectF(0, top, width, bottom - top));
    }
    if (shades.empty())
        return;
    painter.save();
    painter.setPen(Qt::NoPen);
    for (const auto& [colour, rects] : shades) {
        painter.setBrush(QColor::fromRgba(colour));
        painter.drawRects(rects.constData(), int(rects.size()));
    }
    painter.restore();
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
    if (pageIndex >= 0 && pageIndex < layout.pageCount()) {
        const QList<ReportLayout::Placement>& placements = layout.page(pageIndex).placements;
        paintShading(painter, layout, placements);
        for (const ReportLayout::Placement& placement : placements)
            paintBand(painter, layout, placement, pageIndex, fonts);
    }
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
    if (!device)
        throw AppException(QStringLiteral("Es ist kein Drucker mehr verfügbar."));
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
    // A printer that failed while pages were painted says so only in its state.
    if (auto* printer = dynamic_cast<QPrinter*>(device);
        printer && (printer->printerState() == QPrinter::Error || printer->printerState() == QPrinter::Aborted))
        throw AppException(QStringLiteral("Der Drucker hat den Auftrag abgebrochen."));
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
