#include "ui/report/ReportLayout.h"

#include "platform/AppException.h"
#include "ui/rtf/RtfReader.h"

#include <QAbstractTextDocumentLayout>
#include <QImage>
#include <QTextBlock>
#include <QTextDocument>
#include <QTextLayout>

namespace orvanta {

namespace {

// Rich text is laid out at the layout's own resolution, whatever device shows it later.
QPaintDevice* layoutDevice()
{
    static QImage device = [] {
        QImage image(1, 1, QImage::Format_RGB32);
        const int dotsPerMetre = qRound(ReportLayout::kDotsPerInch / 0.0254);
        image.setDotsPerMeterX(dotsPerMetre);
        image.setDotsPerMeterY(dotsPerMetre);
        return image;
    }();
    return &device;
}

constexpr QChar kUnit(0x1F); // the unit separator between a row's values

const QString kPage = QStringLiteral("Seite");
const QString kPages = QStringLiteral("Seiten");
const QString kDate = QStringLiteral("Druckdatum");
const QString kTime = QStringLiteral("Druckzeit");

template <typename F> void forEachName(const QString& templ, F&& f)
{
    for (qsizetype i = 0; i < templ.size(); ++i) {
        if (templ[i] != u'{')
            continue;
        if (i + 1 < templ.size() && templ[i + 1] == u'{') {
            ++i;
            continue;
        }
        const qsizetype close = templ.indexOf(u'}', i + 1);
        if (close < 0)
            return;
        f(i, close, templ.mid(i + 1, close - i - 1).trimmed());
        i = close;
    }
}

} // namespace

ReportLayout::ReportLayout(ReportDefinition definition, ReportParameters parameters, ReportDataSource* source,
                           QDateTime printedAt)
    : m_definition(std::move(definition))
    , m_parameters(std::move(parameters))
    , m_source(source)
    , m_printedAt(std::move(printedAt))
{
    for (const ReportBand& band : std::as_const(m_definition.bands)) {
        switch (band.kind) {
        case ReportBand::Kind::Title:
            m_title = &band;
            break;
        case ReportBand::Kind::PageHeader:
            m_pageHeader = &band;
            break;
        case ReportBand::Kind::Detail:
            m_detail = &band;
            break;
        case ReportBand::Kind::PageFooter:
            m_pageFooter = &band;
            break;
        case ReportBand::Kind::Summary:
            m_summary = &band;
            break;
        case ReportBand::Kind::GroupHeader:
            m_levels.append(Level{&band, nullptr, -1});
            break;
        case ReportBand::Kind::GroupFooter:
            break;
        }
    }
    for (const ReportBand& band : std::as_const(m_definition.bands))
        if (band.kind == ReportBand::Kind::GroupFooter)
            for (Level& level : m_levels)
                if (level.header->groupBy == band.groupBy)
                    level.footer = &band;
}

ReportLayout::~ReportLayout()
{
    if (m_started && !m_finished && m_source)
        m_source->restore();
}

void ReportLayout::checkName(const QString& name, int line) const
{
    if (m_fieldIndex.contains(name) || m_parameters.text.contains(name) || name == kPage || name == kPages
        || name == kDate || name == kTime)
        return;
    throw AppException(QStringLiteral("Bericht „%1“, Zeile %2: unbekanntes Feld oder unbekannter Parameter „%3“")
                           .arg(m_definition.name)
                           .arg(line)
                           .arg(name));
}

void ReportLayout::checkNames() const
{
    for (const ReportBand& band : m_definition.bands) {
        if (!band.groupBy.isEmpty() && !m_fieldIndex.contains(band.groupBy))
            checkName(band.groupBy, band.line);
        if (!band.shadeField.isEmpty() && !m_fieldIndex.contains(band.shadeField))
            checkName(band.shadeField, band.line);
        for (const ReportItem& item : band.items) {
            if (item.kind == ReportItem::Kind::Text)
                forEachName(item.text, [&](qsizetype, qsizetype, const QString& name) { checkName(name, item.line); });
            else if (item.kind == ReportItem::Kind::RichText && !m_parameters.rich.contains(item.text))
                throw AppException(QStringLiteral("Bericht „%1“, Zeile %2: unbekannter Parameter „%3“")
                                       .arg(m_definition.name)
                                       .arg(item.line)
                                       .arg(item.text));
        }
    }
}

void ReportLayout::start()
{
    if (m_source) {
        const QList<ReportField> fields = m_source->fields();
        for (int i = 0; i < fields.size(); ++i)
            m_fieldIndex.insert(fields[i].name, i);
    }
    for (Level& level : m_levels)
        level.field = m_fieldIndex.value(level.header->groupBy, -1);
    m_shadeField.clear();
    for (const ReportBand& band : std::as_const(m_definition.bands))
        m_shadeField.append(band.shadeField.isEmpty() ? -1 : m_fieldIndex.value(band.shadeField, -1));
    checkNames();
    for (const ReportBand& band : std::as_const(m_definition.bands)) {
        for (const ReportItem& item : band.items) {
            if (item.kind != ReportItem::Kind::RichText)
                continue;
            auto doc = std::make_shared<QTextDocument>();
            doc->documentLayout()->setPaintDevice(layoutDevice());
            QFont font(m_definition.font.family);
            font.setPointSizeF(m_definition.font.size);
            doc->setDefaultFont(font);
            doc->setDocumentMargin(0);
            RtfReader::read(m_parameters.rich.value(item.text), doc.get());
            doc->setTextWidth(item.rect.width() * kDotsPerMm);
            m_rich.insert(&item, std::move(doc));
        }
    }
    m_started = true;
    if (m_source)
        m_source->open();
}

QTextDocument* ReportLayout::richDocument(const ReportItem* item) const
{
    return m_rich.value(item).get();
}

bool ReportLayout::isShaded(const ReportBand& band, int row) const
{
    const qsizetype index = &band - m_definition.bands.constData();
    if (index < 0 || index >= m_shadeField.size() || row < 0 || row >= m_rows.size())
        return false;
    const int field = m_shadeField[index];
    return field >= 0 && value(row, field) == u"T";
}

ReportLayout::Template ReportLayout::compile(const QString& templ) const
{
    Template parts;
    qsizetype copied = 0;
    auto literal = [&](qsizetype to) {
        // "{{" and "}}" outside placeholders are single braces.
        QString part = templ.mid(copied, to - copied);
        part.replace(QLatin1String("{{"), QLatin1String("{")).replace(QLatin1String("}}"), QLatin1String("}"));
        if (!part.isEmpty())
            parts.append(TemplatePart{TemplatePart::Kind::Literal, part, -1});
    };
    forEachName(templ, [&](qsizetype open, qsizetype close, const QString& name) {
        literal(open);
        copied = close + 1;
        using Kind = TemplatePart::Kind;
        if (const auto field = m_fieldIndex.constFind(name); field != m_fieldIndex.cend())
            parts.append(TemplatePart{Kind::Field, {}, *field});
        else if (const auto param = m_parameters.text.constFind(name); param != m_parameters.text.cend())
            parts.append(TemplatePart{Kind::Parameter, *param, -1});
        else if (name == kPage)
            parts.append(TemplatePart{Kind::Page, {}, -1});
        else if (name == kPages)
            parts.append(TemplatePart{Kind::Pages, {}, -1});
        else if (name == kDate)
            parts.append(TemplatePart{Kind::Date, {}, -1});
        else if (name == kTime)
            parts.append(TemplatePart{Kind::Time, {}, -1});
    });
    literal(templ.size());
    return parts;
}

QString ReportLayout::expand(const QString& templ, int row, int pageIndex) const
{
    QString out;
    const QStringView text = expand(compile(templ), row, pageIndex, out);
    return text.data() == out.constData() ? out : text.toString();
}

QStringView ReportLayout::expand(const Template& templ, int row, int pageIndex, QString& out) const
{
    using Kind = TemplatePart::Kind;
    if (templ.size() == 1 && templ.front().kind == Kind::Field)
        return value(row, templ.front().field);
    out.clear();
    for (const TemplatePart& part : templ) {
        switch (part.kind) {
        case Kind::Literal:
        case Kind::Parameter:
            out += part.text;
            break;
        case Kind::Field:
            out += value(row, part.field);
            break;
        case Kind::Page:
            out += QString::number(pageIndex + 1);
            break;
        case Kind::Pages:
            out += QString::number(pageCount());
            break;
        case Kind::Date:
            out += m_printedAt.date().toString(QStringLiteral("dd.MM.yyyy"));
            break;
        case Kind::Time:
            out += m_printedAt.time().toString(QStringLiteral("hh:mm"));
            break;
        }
    }
    return out;
}

QStringView ReportLayout::value(int row, int field) const
{
    if (row < 0 || row >= m_rows.size() || field < 0)
        return {};
    const QString& all = m_rows[row];
    qsizetype from = 0;
    for (int i = 0; i < field; ++i) {
        from = all.indexOf(kUnit, from);
        if (from < 0)
            return {};
        ++from;
    }
    qsizetype to = all.indexOf(kUnit, from);
    if (to < 0)
        to = all.size();
    return QStringView(all).sliced(from, to - from);
}

double ReportLayout::bottom() const
{
    return m_definition.printable().height() * kDotsPerMm - bandHeight(m_pageFooter);
}

void ReportLayout::newPage()
{
    m_pages.append(Page{});
    m_pageOpen = true;
    m_y = 0;
    m_contentTop = 0;
    if (m_pages.size() == 1 && m_title)
        placeFlowing(m_title, -1);
    if (m_pageHeader) {
        m_pages.last().placements.append(Placement{m_pageHeader, m_y, -1});
        m_y += bandHeight(m_pageHeader);
    }
    m_contentTop = m_y;
}

void ReportLayout::closePage()
{
    if (m_pageFooter)
        m_pages.last().placements.append(Placement{m_pageFooter, bottom(), m_lastRow});
    m_pageOpen = false;
}

void ReportLayout::place(const ReportBand* band, int row)
{
    if (!band)
        return;
    const double height = bandHeight(band);
    if (m_y + height > bottom() + 1e-6 && m_y > m_contentTop) {
        closePage();
        newPage();
    }
    m_pages.last().placements.append(Placement{band, m_y, row});
    m_y += height;
}

double ReportLayout::breakBefore(QTextDocument* doc, double from, double limit) const
{
    QAbstractTextDocumentLayout* layout = doc->documentLayout();
    double best = from;
    int& startBlock = m_richBlock;
    QTextBlock block = doc->findBlockByNumber(startBlock);
    if (!block.isValid())
        block = doc->begin();
    for (; block.isValid(); block = block.next()) {
        const QRectF box = layout->blockBoundingRect(block);
        if (box.bottom() <= from)
            continue;
        if (box.top() >= limit)
            break;
        const QTextLayout* lines = block.layout();
        for (int i = 0; i < lines->lineCount(); ++i) {
            const QTextLine line = lines->lineAt(i);
            const double lineBottom = box.top() + line.rect().bottom();
            if (lineBottom > limit)
                break;
            if (lineBottom > best) {
                best = lineBottom;
                startBlock = block.blockNumber();
            }
        }
        // The whole block fits: its bottom (with paragraph spacing) is a break as good as any.
        if (box.bottom() <= limit && box.bottom() > best) {
            best = box.bottom();
            startBlock = block.blockNumber();
        }
    }
    // A single line taller than the page is cut rather than looping forever.
    return best > from + 1e-6 ? best : limit;
}

void ReportLayout::placeFlowing(const ReportBand* band, int row)
{
    const ReportItem* rich = nullptr;
    for (const ReportItem& item : band->items)
        if (item.kind == ReportItem::Kind::RichText)
            rich = &item;
    if (!rich) {
        place(band, row);
        return;
    }
    QTextDocument* doc = richDocument(rich);
    const double total = doc->size().height();
    const double offset = rich->rect.top() * kDotsPerMm;
    if (m_y + offset + std::min(total, 20 * kDotsPerMm) > bottom() && m_y > m_contentTop) {
        closePage();
        newPage();
    }
    m_richBlock = 0;
    double from = 0;
    bool continued = false;
    for (;;) {
        const double top = continued ? m_y : m_y + offset;
        const double room = bottom() - top;
        const double to = from + room >= total ? total : breakBefore(doc, from, from + std::max(room, 1.0));
        m_pages.last().placements.append(Placement{band, m_y, row, rich, from, to, continued});
        if (to >= total) {
            m_y = std::max(m_y + bandHeight(band), top + (to - from));
            return;
        }
        from = to;
        continued = true;
        closePage();
        newPage();
    }
}

void ReportLayout::step()
{
    if (!m_pageOpen)
        newPage();
    if (!m_rowsDone) {
        if (!m_source || m_source->atEnd()) {
            m_rowsDone = true;
            if (m_lastRow >= 0)
                for (qsizetype i = m_levels.size() - 1; i >= 0; --i)
                    place(m_levels[i].footer, m_lastRow);
            return;
        }
        const int index = int(m_rows.size());
        QStringList values = m_source->row();
        for (QString& v : values)
            v.replace(kUnit, u' ');
        m_rows.append(values.join(kUnit));
        m_source->next();
        qsizetype changed = m_lastRow < 0 ? 0 : m_levels.size();
        if (m_lastRow >= 0) {
            for (qsizetype i = 0; i < m_levels.size(); ++i) {
                if (value(m_lastRow, m_levels[i].field) != value(index, m_levels[i].field)) {
                    changed = i;
                    break;
                }
            }
            for (qsizetype i = m_levels.size() - 1; i >= changed; --i)
                place(m_levels[i].footer, m_lastRow);
        }
        for (qsizetype i = changed; i < m_levels.size(); ++i) {
            // A group head never ends a page on its own.
            if (m_y + bandHeight(m_levels[i].header) + bandHeight(m_detail) > bottom() + 1e-6 && m_y > m_contentTop) {
                closePage();
                newPage();
            }
            place(m_levels[i].header, index);
        }
        place(m_detail, index);
        m_lastRow = index;
        return;
    }
    if (m_summary)
        placeFlowing(m_summary, m_lastRow);
    closePage();
    m_finished = true;
    if (m_source)
        m_source->restore();
}

bool ReportLayout::layoutMore(int pages)
{
    if (!m_started)
        start();
    const int wanted = pageCount() + pages;
    while (!m_finished && (pageCount() < wanted || (m_pageOpen && pageCount() == wanted)))
        step();
    return m_finished;
}

void ReportLayout::layoutAll()
{
    if (!m_started)
        start();
    while (!m_finished)
        step();
}

} // namespace orvanta
