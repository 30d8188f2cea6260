#pragma once
// The two modal notices of the contact windows: advice on the contact's display name
// (THinweisForm) and the warning about rejecting a number automatically (THinwAutoAblehnForm).
// Each shows a heading and a mark-up text and closes with "Schließen"; the caller creates one,
// runs exec() and frees it.

#include <QDialog>

class QLabel;
class QPushButton;

namespace orvanta {

class MarkupPanel;

class NoticeForm : public QDialog {
    Q_OBJECT
    Q_DISABLE_COPY_MOVE(NoticeForm)

public:
    [[nodiscard]] QString heading() const;
    [[nodiscard]] MarkupPanel* textPanel() const { return m_text; }

protected:
    NoticeForm(const QString& heading, const QString& markup, QWidget* parent);
    void showEvent(QShowEvent* event) override;

private:
    void ApplyColorScheme();

    QLabel* m_heading;
    MarkupPanel* m_text;
    QPushButton* m_close;
};

class THinweisForm final : public NoticeForm {
    Q_OBJECT
    Q_DISABLE_COPY_MOVE(THinweisForm)

public:
    explicit THinweisForm(QWidget* parent = nullptr);
    static const QString& markupText();
};

class THinwAutoAblehnForm final : public NoticeForm {
    Q_OBJECT
    Q_DISABLE_COPY_MOVE(THinwAutoAblehnForm)

public:
    explicit THinwAutoAblehnForm(QWidget* parent = nullptr);
    static const QString& markupText();
};

} // namespace orvanta
