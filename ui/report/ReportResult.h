#pragma once
// What a print operation hands back to its caller, and the error-log entry the caller makes of a
// failure.

#include <QString>

namespace orvanta {

enum class ReportResult : int {
    OK = 0,
    UNEXPECTED = 1, // an exception occurred
    NO_QUERY_AVAILABLE = 2,
    NO_TRANSACTION_AVAILABLE = 3,
    NO_SUCH_LID_AVAILABLE = 4,
    NO_REPORT_ASSIGNED = 5, // report variant outside 0 to 9
};

struct ReportOutcome {
    int code = 0;
    qint64 number = 0; // the database's error code, when a database error failed the run
    QString message;
};

[[nodiscard]] inline QString reportResultName(int code)
{
    switch (code) {
    case 0:
        return QStringLiteral("OK");
    case 2:
        return QStringLiteral("NO_QUERY_AVAILABLE");
    case 3:
        return QStringLiteral("NO_TRANSACTION_AVAILABLE");
    case 4:
        return QStringLiteral("NO_SUCH_LID_AVAILABLE");
    case 5:
        return QStringLiteral("NO_REPORT_ASSIGNED");
    default:
        return QStringLiteral("UNEXPECTED");
    }
}

[[nodiscard]] inline QString reportFailureEntry(const QString& method, const ReportOutcome& outcome)
{
    return QStringLiteral("Methode: ") + method + QStringLiteral("\r\nError: ") + reportResultName(outcome.code)
        + QStringLiteral("\r\nError-Number: ") + QString::number(outcome.number) + QStringLiteral("\r\n")
        + outcome.message;
}

} // namespace orvanta
