#pragma once
// The call log's reports: ten variants (simple or detailed, five groupings) over the log of all
// days, one day or a period, read through a statement of the data module into the report engine.

#include "dbgrid/StatementReportSource.h"
#include "ui/report/ReportResult.h"

#include <QDate>
#include <QVariant>

namespace orvanta {

class FbStatement;

struct LogReportVariant {
    const char* report;
    const char* connection;
    const char* order;
};

// Variant = 2 × grouping + detailed; null outside 0 to 9.
[[nodiscard]] const LogReportVariant* logReportVariant(int variant);
// The statement of a variant: select + where + order. `zeitraum` gets the period's text.
// An invalid start date prints every record; an invalid end date only the start's day.
struct LogReportQuery {
    QString sql;
    QList<std::pair<QString, QVariant>> params;
    QString zeitraum;
};
[[nodiscard]] LogReportQuery logReportQuery(int variant, QDate start, QDate end);

// The rows of one call-log report, formatted for printing.
class LogReportConnection final : public StatementReportSource {
public:
    LogReportConnection(FbStatement& statement, LogReportQuery query, int variant);

    [[nodiscard]] QList<ReportField> fields() const override;
    [[nodiscard]] QStringList row() const override;

    // "26:03:04" for 1 day 2 h 3 min 4 s; no leading zeros on the hours.
    [[nodiscard]] static QString durationText(qint64 seconds);

private:
    int m_variant;
};

// Prints one call-log report into the preview. False with the outcome filled when it failed;
// the caller reports it.
bool LogPrint(FbStatement* statement, int variant, ReportOutcome& outcome, QDate end, QDate start);

} // namespace orvanta
