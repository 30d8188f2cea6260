#include "ui/markup/MarkupPanel.h"

#include "ui/markup/MarkupDocument.h"

#include <QAbstractTextDocumentLayout>
#include <QMouseEvent>
#include <QPainter>
#include <QTextDocument>

namespace orvanta {

MarkupPanel::MarkupPanel(QWidget* parent)
    : QWidget(parent)
    , m_document(new QTextDocument(this))
{
    setMouseTracking(true);
    QTextOption option = m_document->defaultTextOption();
    option.setWrapMode(QTextOption::NoWrap);
    m_document->setDefaultTextOption(option);
    m_document->setDocumentMargin(2);
    m_document->setDefaultFont(font());
}

MarkupPanel::~MarkupPanel() = default;

void MarkupPanel::setText(const QString& markup)
{
    m_text = markup;
    rebuild();
}

void MarkupPanel::setLines(const QStringList& lines)
{
    setText(lines.join(QString()));
}

void MarkupPanel::setImages(QList<QPixmap> images)
{
    m_images = std::move(images);
    rebuild();
}

void MarkupPanel::rebuild()
{
    m_document->setDefaultFont(font());
    buildMarkupDocument(*m_document, m_text, m_images, palette());
    updateGeometry();
    update();
}

QString MarkupPanel::anchorAt(const QPoint& pos) const
{
    return m_document->documentLayout()->anchorAt(pos);
}

QSize MarkupPanel::sizeHint() const
{
    return m_document->size().toSize();
}

QSize MarkupPanel::minimumSizeHint() const
{
    return sizeHint();
}

void MarkupPanel::paintEvent(QPaintEvent* event)
{
    QPainter p(this);
    QAbstractTextDocumentLayout::PaintContext ctx;
    ctx.palette = palette();
    ctx.clip = event->rect();
    p.setClipRect(event->rect());
    m_document->documentLayout()->draw(&p, ctx);
}

void MarkupPanel::mouseMoveEvent(QMouseEvent* event)
{
    const bool onAnchor = !anchorAt(event->position().toPoint()).isEmpty();
    setCursor(onAnchor ? Qt::PointingHandCursor : Qt::ArrowCursor);
}

void MarkupPanel::mousePressEvent(QMouseEvent* event)
{
    m_pressedAnchor = event->button() == Qt::LeftButton ? anchorAt(event->position().toPoint()) : QString();
}

void MarkupPanel::mouseReleaseEvent(QMouseEvent* event)
{
    const QString pressed = std::exchange(m_pressedAnchor, QString());
    if (event->button() != Qt::LeftButton || pressed.isEmpty())
        return;
    if (anchorAt(event->position().toPoint()) == pressed)
        Q_EMIT anchorClicked(pressed);
}

void MarkupPanel::changeEvent(QEvent* event)
{
    QWidget::changeEvent(event);
    if (event->type() == QEvent::FontChange || event->type() == QEvent::PaletteChange)
        rebuild();
}

} // namespace orvanta
