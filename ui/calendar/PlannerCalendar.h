#pragma once
// A month calendar with day marks: each marked day carries a hint text shown as its tool tip.
// The main window marks the days that have call-log entries and lets the user pick one.

#include <QColor>
#include <QDate>
#include <QMap>
#include <QWidget>

class QLabel;
class QToolButton;
class QPushButton;

namespace orvanta {

class PlannerCalendar final : public QWidget {
    Q_OBJECT
    Q_DISABLE_COPY_MOVE(PlannerCalendar)

public:
    explicit PlannerCalendar(QWidget* parent = nullptr);

    // The selected day; setting it also shows its month. Emits nothing.
    [[nodiscard]] QDate date() const { return m_date; }
    void setDate(QDate day);
    // First day of the month on screen.
    [[nodiscard]] QDate shownMonth() const { return m_month; }
    void showMonth(QDate anyDayOfMonth);

    // Day marks ("events").
    void clearEvents();
    void addEvent(QDate day, const QString& hint);
    [[nodiscard]] bool hasEvents() const { return !m_events.isEmpty(); }
    [[nodiscard]] int eventCount() const { return static_cast<int>(m_events.size()); }
    [[nodiscard]] bool hasEvent(QDate day) const { return m_events.contains(day); }
    [[nodiscard]] QString hintFor(QDate day) const { return m_events.value(day); }
    [[nodiscard]] QList<QDate> eventDays() const { return m_events.keys(); }
    // The latest marked day on or after `from`; invalid when there is none.
    [[nodiscard]] QDate latestEventDay(QDate from = QDate(1900, 1, 1)) const;

    // Freezes repainting while many marks change; calls nest.
    void beginUpdate();
    void endUpdate();

    void setColors(QColor gradientStart, QColor gradientEnd, QColor selection);
    [[nodiscard]] QColor gradientStart() const { return m_gradientStart; }
    [[nodiscard]] QColor gradientEnd() const { return m_gradientEnd; }
    [[nodiscard]] QColor selectionColor() const { return m_selection; }

    // The day under a point of the widget, invalid outside the day grid.
    [[nodiscard]] QDate dateAt(QPoint pos) const;
    // The rectangle of a day of the shown month grid (empty when not on screen).
    [[nodiscard]] QRect dayRect(QDate day) const;

    [[nodiscard]] QSize sizeHint() const override;
    [[nodiscard]] QSize minimumSizeHint() const override;

Q_SIGNALS:
    // The user picked a day (click, keyboard, the "Heute" button).
    void daySelected(QDate day);

protected:
    bool event(QEvent* e) override;
    void paintEvent(QPaintEvent* e) override;
    void mousePressEvent(QMouseEvent* e) override;
    void keyPressEvent(QKeyEvent* e) override;
    void resizeEvent(QResizeEvent* e) override;

private:
    void pick(QDate day);
    void updateTitle();
    [[nodiscard]] QRect gridRect() const;
    [[nodiscard]] QDate firstCellDate() const;

    QDate m_date;
    QDate m_month;
    QMap<QDate, QString> m_events;
    int m_frozen = 0;
    QColor m_gradientStart;
    QColor m_gradientEnd;
    QColor m_selection;
    QToolButton* m_prev = nullptr;
    QToolButton* m_next = nullptr;
    QLabel* m_title = nullptr;
    QPushButton* m_today = nullptr;
};

} // namespace orvanta
