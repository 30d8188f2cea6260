#pragma once
// Typed characters an edit field does not take are swallowed before they reach it; editing keys
// (backspace, arrows, shortcuts) pass, and pasted text is not filtered.

#include <QObject>

#include <functional>

class QLineEdit;

namespace orvanta {

class KeyFilter final : public QObject {
    Q_OBJECT
    Q_DISABLE_COPY_MOVE(KeyFilter)

public:
    // Whether the field takes the character c typed at its caret.
    using Accept = std::function<bool(const QLineEdit& edit, QChar c)>;
    // The filter lives as long as the field.
    static void install(QLineEdit* edit, Accept accept);

    // Country code: digits, and "+" only as the first character.
    [[nodiscard]] static bool countryCode(const QLineEdit& edit, QChar c);
    [[nodiscard]] static bool digits(const QLineEdit& edit, QChar c);
    // Subscriber number: digits, blank, "#", "+", "-", "/".
    [[nodiscard]] static bool phoneNumber(const QLineEdit& edit, QChar c);
    // Anything but a blank at the very start of the field.
    [[nodiscard]] static bool noLeadingBlank(const QLineEdit& edit, QChar c);

protected:
    bool eventFilter(QObject* watched, QEvent* event) override;

private:
    KeyFilter(QLineEdit* edit, Accept accept);
    Accept m_accept;
};

} // namespace orvanta
