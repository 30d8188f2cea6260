#include "ui/statusbar/PanelStatusBar.h"

#include <QLabel>

namespace orvanta {

PanelStatusBar::PanelStatusBar(const std::vector<int>& widths, QWidget* parent)
    : QStatusBar(parent)
{
    setSizeGripEnabled(true);
    for (std::size_t i = 0; i < widths.size(); ++i) {
        auto* label = new QLabel(this);
        label->setObjectName(QStringLiteral("statusPanel%1").arg(i));
        label->setFrameShape(QFrame::Panel);
        label->setFrameShadow(QFrame::Sunken);
        label->setContentsMargins(4, 0, 4, 0);
        if (widths[i] > 0)
            label->setMinimumWidth(widths[i]);
        addPermanentWidget(label, widths[i] > 0 ? 0 : 1);
        m_panels.push_back(label);
    }
}

QLabel* PanelStatusBar::panel(int index) const
{
    return (index >= 0 && index < panelCount()) ? m_panels[static_cast<std::size_t>(index)] : nullptr;
}

void PanelStatusBar::setPanelText(int index, const QString& text)
{
    if (QLabel* label = panel(index))
        label->setText(text);
}

QString PanelStatusBar::panelText(int index) const
{
    const QLabel* label = panel(index);
    return label ? label->text() : QString();
}

} // namespace orvanta
