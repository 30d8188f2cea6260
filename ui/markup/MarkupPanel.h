#pragma once
// A read-only panel that shows mark-up text (see MarkupDocument.h) and reports clicks on its
// anchors with the href exactly as written ("Notiz_12", "Mail_a@b.de", "Web_www.x.de").

#include <QWidget>

class QTextDocument;

namespace orvanta {

class MarkupPanel final : public QWidget {
    Q_OBJECT
    Q_DISABLE_COPY_MOVE(MarkupPanel)

public:
    explicit MarkupPanel(QWidget* parent = nullptr);
    ~MarkupPanel() override;

    void setText(const QString& markup);
    [[nodiscard]] const QString& text() const { return m_text; }
    // The panel's text list: the lines are joined into one mark-up text.
    void setLines(const QStringList& lines);
    void setImages(QList<QPixmap> images);
    [[nodiscard]] QTextDocument* document() const { return m_document; }
    // Href of the anchor at a point, null when there is none.
    [[nodiscard]] QString anchorAt(const QPoint& pos) const;

    [[nodiscard]] QSize sizeHint() const override;
    [[nodiscard]] QSize minimumSizeHint() const override;

Q_SIGNALS:
    void anchorClicked(const QString& href);

protected:
    void paintEvent(QPaintEvent* event) override;
    void mouseMoveEvent(QMouseEvent* event) override;
    void mousePressEvent(QMouseEvent* event) override;
    void mouseReleaseEvent(QMouseEvent* event) override;
    void changeEvent(QEvent* event) override;

private:
    void rebuild();

    QTextDocument* m_document;
    QString m_text;
    QList<QPixmap> m_images;
    QString m_pressedAnchor;
};

} // namespace orvanta
