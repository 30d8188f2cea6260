#pragma once
// A label that, when it does not size itself to its text, paints a text too wide for it
// shortened with "...": the last character goes and "..." is appended until the result fits or
// is down to three characters. text() keeps the full caption.

#include <QLabel>

namespace orvanta {

class TVKCutLabel final : public QLabel {
    Q_OBJECT
    Q_DISABLE_COPY_MOVE(TVKCutLabel)

public:
    explicit TVKCutLabel(QWidget* parent = nullptr);
    explicit TVKCutLabel(const QString& text, QWidget* parent = nullptr);

    // On (the default): the label grows with its text and never shortens it.
    void setAutoSize(bool on);
    [[nodiscard]] bool autoSize() const { return m_autoSize; }

    // The text as painted at the current width.
    [[nodiscard]] QString displayedText() const;
    // The shortening rule for any text, font and width.
    [[nodiscard]] static QString shortened(const QString& text, const QFontMetrics& metrics, int width);

    [[nodiscard]] QSize minimumSizeHint() const override;

protected:
    void paintEvent(QPaintEvent* event) override;

private:
    bool m_autoSize = true;
};

} // namespace orvanta
