#include "ui/navbar/AdvNavBar.h"

#include <QLabel>
#include <QPainter>
#include <QStackedWidget>
#include <QToolButton>
#include <QVBoxLayout>

namespace orvanta {

namespace {

struct NavStyle {
    QColor light;
    QColor dark;
    QColor text;
};

NavStyle navStyle(int style)
{
    switch (style) {
    case 0: return {QColor(0xC3, 0xDA, 0xF9), QColor(0x59, 0x87, 0xD6), QColor(0x00, 0x2C, 0x98)};
    case 2: return {QColor(0xF2, 0xF0, 0xE4), QColor(0xB0, 0xC0, 0x80), QColor(0x68, 0x80, 0x48)};
    default: return {QColor(0xF3, 0xF3, 0xF7), QColor(0xA5, 0xA4, 0xBD), QColor(0x75, 0x74, 0x95)};
    }
}

} // namespace

AdvNavBarPanel::AdvNavBarPanel(const QString& caption, QWidget* parent)
    : QWidget(parent)
    , m_caption(caption)
{
}

AdvNavBar::AdvNavBar(QWidget* parent)
    : QWidget(parent)
{
    m_caption = new QLabel(this);
    m_caption->setObjectName(QStringLiteral("navCaption"));
    m_caption->setMinimumHeight(26);
    m_caption->setContentsMargins(6, 0, 6, 0);
    QFont f = m_caption->font();
    f.setBold(true);
    m_caption->setFont(f);
    m_stack = new QStackedWidget(this);
    m_buttonBox = new QVBoxLayout;
    m_buttonBox->setContentsMargins(0, 0, 0, 0);
    m_buttonBox->setSpacing(1);

    auto* layout = new QVBoxLayout(this);
    layout->setContentsMargins(1, 1, 1, 1);
    layout->setSpacing(1);
    layout->addWidget(m_caption);
    layout->addWidget(m_stack, 1);
    layout->addLayout(m_buttonBox);
    applyStyle();
}

int AdvNavBar::addPanel(AdvNavBarPanel* panel)
{
    const int index = static_cast<int>(m_panels.size());
    m_panels.push_back(panel);
    m_stack->addWidget(panel);
    auto* button = new QToolButton(this);
    button->setObjectName(panel->objectName() + QStringLiteral("_button"));
    button->setText(panel->caption());
    button->setCheckable(true);
    button->setAutoRaise(true);
    button->setToolButtonStyle(Qt::ToolButtonTextOnly);
    button->setSizePolicy(QSizePolicy::Expanding, QSizePolicy::Fixed);
    button->setMinimumHeight(28);
    m_buttonBox->addWidget(button);
    m_buttons.push_back(button);
    connect(button, &QToolButton::clicked, this, [this, index] {
        const bool differs = index != m_active;
        setActiveTabIndex(index);
        if (differs)
            Q_EMIT changed(index);
    });
    if (m_active < 0)
        setActiveTabIndex(index);
    applyStyle();
    return index;
}

AdvNavBarPanel* AdvNavBar::panel(int index) const
{
    return (index >= 0 && index < panelCount()) ? m_panels[static_cast<std::size_t>(index)] : nullptr;
}

AdvNavBarPanel* AdvNavBar::activePanel() const
{
    return panel(m_active);
}

QToolButton* AdvNavBar::panelButton(int index) const
{
    return (index >= 0 && index < panelCount()) ? m_buttons[static_cast<std::size_t>(index)] : nullptr;
}

void AdvNavBar::setActivePanel(AdvNavBarPanel* panel)
{
    const auto it = std::find(m_panels.begin(), m_panels.end(), panel);
    if (it != m_panels.end())
        setActiveTabIndex(static_cast<int>(it - m_panels.begin()));
}

void AdvNavBar::setActiveTabIndex(int index)
{
    if (index < 0 || index >= panelCount())
        return;
    m_active = index;
    m_stack->setCurrentIndex(index);
    m_caption->setText(m_panels[static_cast<std::size_t>(index)]->caption());
    for (int i = 0; i < panelCount(); ++i)
        m_buttons[static_cast<std::size_t>(i)]->setChecked(i == index);
}

void AdvNavBar::setStyleIndex(int style)
{
    m_style = (style >= 0 && style <= 2) ? style : 1;
    applyStyle();
}

void AdvNavBar::applyStyle()
{
    const NavStyle s = navStyle(m_style);
    m_caption->setStyleSheet(QStringLiteral("QLabel { color: white; background: qlineargradient(x1:0, y1:0, x2:0, y2:1, stop:0 %1, stop:1 %2); }")
                                 .arg(s.dark.lighter(115).name(), s.dark.name()));
    const QString buttons = QStringLiteral(
        "QToolButton { text-align: left; padding-left: 8px; font-weight: bold; color: %3; border: 1px solid %2;"
        " background: qlineargradient(x1:0, y1:0, x2:0, y2:1, stop:0 white, stop:1 %1); }"
        " QToolButton:checked { background: qlineargradient(x1:0, y1:0, x2:0, y2:1, stop:0 #FFE9A8, stop:1 #FFC860); }"
        " QToolButton:hover { background: #FFF2C8; }")
                                .arg(s.light.name(), s.dark.name(), s.text.name());
    for (QToolButton* b : m_buttons)
        b->setStyleSheet(buttons);
    QPalette pal = m_stack->palette();
    pal.setColor(QPalette::Window, s.light);
    m_stack->setAutoFillBackground(true);
    m_stack->setPalette(pal);
    update();
}

void AdvNavBar::paintEvent(QPaintEvent*)
{
    QPainter p(this);
    p.setPen(navStyle(m_style).dark);
    p.drawRect(rect().adjusted(0, 0, -1, -1));
}

} // namespace orvanta
