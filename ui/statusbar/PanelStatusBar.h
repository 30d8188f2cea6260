#pragma once
// A status bar divided into a fixed number of text panels, addressed by index.

#include <QStatusBar>
#include <vector>

class QLabel;

namespace orvanta {

class PanelStatusBar final : public QStatusBar {
    Q_OBJECT
    Q_DISABLE_COPY_MOVE(PanelStatusBar)

public:
    // widths: one entry per panel; 0 makes the panel take the remaining room.
    PanelStatusBar(const std::vector<int>& widths, QWidget* parent = nullptr);

    [[nodiscard]] int panelCount() const { return static_cast<int>(m_panels.size()); }
    // An index out of range is ignored (read: empty text).
    void setPanelText(int index, const QString& text);
    [[nodiscard]] QString panelText(int index) const;
    [[nodiscard]] QLabel* panel(int index) const;

private:
    std::vector<QLabel*> m_panels;
};

} // namespace orvanta
