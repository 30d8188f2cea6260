#pragma once
// The navigation bar on the left of the main window: panels stacked like the pages of a
// notebook, one button per panel at the bottom, the caption of the shown panel on top.
// A panel's index is its tab index, in the order the panels were added.

#include <QWidget>
#include <vector>

class QLabel;
class QStackedWidget;
class QToolButton;
class QVBoxLayout;

namespace orvanta {

class AdvNavBarPanel final : public QWidget {
    Q_OBJECT
    Q_DISABLE_COPY_MOVE(AdvNavBarPanel)

public:
    explicit AdvNavBarPanel(const QString& caption, QWidget* parent = nullptr);
    [[nodiscard]] QString caption() const { return m_caption; }

private:
    QString m_caption;
};

class AdvNavBar final : public QWidget {
    Q_OBJECT
    Q_DISABLE_COPY_MOVE(AdvNavBar)

public:
    explicit AdvNavBar(QWidget* parent = nullptr);

    // Takes ownership; returns the panel's tab index.
    int addPanel(AdvNavBarPanel* panel);
    [[nodiscard]] int panelCount() const { return static_cast<int>(m_panels.size()); }
    [[nodiscard]] AdvNavBarPanel* panel(int index) const;
    [[nodiscard]] AdvNavBarPanel* activePanel() const;
    [[nodiscard]] int activeTabIndex() const { return m_active; }
    // Shows a panel without emitting changed(); an index out of range is ignored.
    void setActivePanel(AdvNavBarPanel* panel);
    void setActiveTabIndex(int index);
    [[nodiscard]] QToolButton* panelButton(int index) const;

    // 0 blue, 1 silver, 2 olive; anything else is taken as 1.
    void setStyleIndex(int style);
    [[nodiscard]] int styleIndex() const { return m_style; }

Q_SIGNALS:
    // The user chose another panel through its button.
    void changed(int tabIndex);

protected:
    void paintEvent(QPaintEvent* e) override;

private:
    void applyStyle();

    std::vector<AdvNavBarPanel*> m_panels;
    std::vector<QToolButton*> m_buttons;
    QLabel* m_caption = nullptr;
    QStackedWidget* m_stack = nullptr;
    QVBoxLayout* m_buttonBox = nullptr;
    int m_active = -1;
    int m_style = 1;
};

} // namespace orvanta
