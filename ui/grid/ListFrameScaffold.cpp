#include "ui/grid/ListFrameScaffold.h"

#include "ui/grid/GridCardView.h"
#include "ui/grid/GridView.h"
#include "ui/label/TVKCutLabel.h"
#include "ui/scheme/ColorScheme.h"

#include <QFrame>
#include <QHBoxLayout>
#include <QVBoxLayout>

namespace orvanta {
namespace {

const QColor kGridLines(0xC0, 0xC0, 0xC0);

void setBackground(QWidget* w, const QColor& color)
{
    QPalette pal = w->palette();
    pal.setColor(QPalette::Window, color);
    w->setPalette(pal);
    w->setAutoFillBackground(true);
}

} // namespace

ListFrameScaffold::ListFrameScaffold(QWidget* frame)
{
    auto* outer = new QVBoxLayout(frame);
    outer->setContentsMargins(0, 0, 0, 0);
    m_fp3 = new QFrame(frame);
    m_fp3->setObjectName(QStringLiteral("FP3"));
    m_fp3->setFrameShape(QFrame::Box);
    outer->addWidget(m_fp3);
    m_box = new QVBoxLayout(m_fp3);
    m_box->setContentsMargins(1, 1, 1, 1);
    m_box->setSpacing(0);

    m_captionBar = new QFrame(m_fp3);
    m_captionBar->setObjectName(QStringLiteral("RzSeparator2"));
    auto* barLayout = new QHBoxLayout(m_captionBar);
    barLayout->setContentsMargins(6, 2, 6, 2);
    m_caption = new TVKCutLabel(m_captionBar);
    m_caption->setObjectName(QStringLiteral("CL1"));
    // Shortened rather than grown: a long caption must not widen the frame.
    m_caption->setAutoSize(false);
    QFont f(QStringLiteral("Verdana"));
    f.setBold(true);
    f.setPointSize(10);
    m_caption->setFont(f);
    QPalette lp = m_caption->palette();
    lp.setColor(QPalette::WindowText, Qt::white);
    m_caption->setPalette(lp);
    m_caption->setFixedHeight(QFontMetrics(f).height() + 4);
    barLayout->addWidget(m_caption);
    m_box->addWidget(m_captionBar);
}

void ListFrameScaffold::addPanel(QFrame* panel)
{
    // Panels come before the grid host, whenever they are added.
    const int at = m_gridHost ? m_box->indexOf(m_gridHost) : m_box->count();
    m_box->insertWidget(at, panel);
    m_panels.append(panel);
}

void ListFrameScaffold::ensureGridHost()
{
    if (m_gridHost)
        return;
    m_gridHost = new QWidget(m_fp3);
    m_gridHost->setObjectName(QStringLiteral("cxGrid1"));
    auto* gl = new QVBoxLayout(m_gridHost);
    gl->setContentsMargins(0, 0, 0, 0);
    m_box->addWidget(m_gridHost, 1);
}

GridView* ListFrameScaffold::addTableView(const QString& objectName)
{
    ensureGridHost();
    auto* view = new GridView(m_gridHost);
    view->setObjectName(objectName);
    view->setGridLineColor(kGridLines);
    m_gridHost->layout()->addWidget(view);
    m_views.append(view);
    return view;
}

GridCardView* ListFrameScaffold::addCardView(const QString& objectName)
{
    ensureGridHost();
    auto* view = new GridCardView(m_gridHost);
    view->setObjectName(objectName);
    m_gridHost->layout()->addWidget(view);
    m_cardViews.append(view);
    return view;
}

void ListFrameScaffold::applyColorScheme(int scheme)
{
    const ListFrameColors& c = listFrameColors(scheme);
    setBackground(m_fp3, c.panel);
    QPalette fp = m_fp3->palette();
    fp.setColor(QPalette::WindowText, c.panelBorder);
    fp.setColor(QPalette::Light, c.panelBorder);
    fp.setColor(QPalette::Dark, c.panelBorder);
    m_fp3->setPalette(fp);
    setBackground(m_captionBar, c.captionBar);
    QPalette sp = m_captionBar->palette();
    sp.setColor(QPalette::Light, c.captionBarHighlight);
    m_captionBar->setPalette(sp);
    for (QFrame* panel : m_panels)
        setBackground(panel, c.search);
    for (GridView* view : m_views) {
        view->setGroupRowColor(c.panel);
        view->setGridLineColor(kGridLines);
    }
    // Titles of cards without focus: the footer's gradient with the scheme's text colour; the
    // focused card keeps the view's own colours.
    for (GridCardView* view : m_cardViews) {
        view->setCaptionColors(c.footerStart, c.footerEnd, c.cardTitleText);
        view->setBorderColor(c.footerBorder);
    }
}

} // namespace orvanta
