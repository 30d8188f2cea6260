#pragma once
// The title band of a borderless window: a colour gradient with the window's caption and a close
// button; pressing the mouse on it drags the window.

#include <QColor>
#include <QFrame>

class QLabel;
class QToolButton;

namespace orvanta {

class TitleBand final : public QFrame {
    Q_OBJECT
    Q_DISABLE_COPY_MOVE(TitleBand)

public:
    TitleBand(const QString& caption, QWidget* parent);

    void setGradient(const QColor& from, const QColor& to);
    [[nodiscard]] QToolButton* closeButton() const { return m_close; }

protected:
    void paintEvent(QPaintEvent* event) override;
    void mousePressEvent(QMouseEvent* event) override;
    void mouseMoveEvent(QMouseEvent* event) override;

private:
    QLabel* m_caption;
    QToolButton* m_close;
    QColor m_from{Qt::white};
    QColor m_to{Qt::lightGray};
    QPoint m_grab;
};

} // namespace orvanta
