#pragma once
// The one error convention: database and file failures throw an AppException (or a subclass);
// each operation catches at its own boundary and reports through the error log, which shows
// "class name / message" the way the user and the error-log file expect.

#include <QString>
#include <exception>

namespace orvanta {

class AppException : public std::exception {
public:
    explicit AppException(QString message)
        : m_message(std::move(message))
        , m_utf8(m_message.toUtf8())
    {
    }

    // The class name written to the error log, e.g. "EIBInterBaseError" for database errors.
    [[nodiscard]] virtual QString className() const { return QStringLiteral("Exception"); }
    [[nodiscard]] const QString& message() const noexcept { return m_message; }
    [[nodiscard]] const char* what() const noexcept override { return m_utf8.constData(); }

private:
    QString m_message;
    QByteArray m_utf8;
};

} // namespace orvanta
