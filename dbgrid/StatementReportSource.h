#pragma once
// A report's rows read straight from a statement of the data module: the cursor that every report
// over the database shares (run the statement afresh, step, commit and close after the report).
// Subclasses announce their fields and turn the current row into text.

#include "ui/report/ReportDataSource.h"
#include "ui/report/ReportResult.h"

#include <QList>
#include <QVariant>

#include <exception>
#include <functional>
#include <utility>

namespace orvanta {

class FbStatement;

class StatementReportSource : public ReportDataSource {
public:
    using Params = QList<std::pair<QString, QVariant>>;

    StatementReportSource(FbStatement& statement, QString sql, Params params = {});

    // Commits what the statement's transaction held, then runs the statement in it afresh.
    void open() override;
    [[nodiscard]] bool atEnd() const override { return !m_hasRow; }
    void next() override;
    // Commits the read and closes the statement.
    void restore() override;

    // A field as the reports announce it: "Feld " + name is its full name.
    [[nodiscard]] static ReportField field(const char* name, int width);

protected:
    [[nodiscard]] const FbStatement& statement() const { return m_statement; }
    // The `Odd` field: "T" on the first row after every open, then alternating with "F".
    [[nodiscard]] QString odd() const;

private:
    FbStatement& m_statement;
    QString m_sql;
    Params m_params;
    qint64 m_counter = 0;
    bool m_hasRow = false;
};

// True with the outcome's code filled when there is no statement or it has no transaction.
bool reportStatementMissing(const FbStatement* statement, ReportOutcome& outcome);
// Runs a report whose rows come from `statement` (`run` builds the source and calls runReport).
// False with the outcome filled when `run` threw; the statement is closed and its transaction
// rolled back then.
bool runStatementReport(FbStatement& statement, ReportOutcome& outcome, const std::function<void()>& run);

// The outcome of a report that threw: the database's error number and message when it was the
// database, else the exception's text.
void reportFailed(ReportOutcome& outcome, const std::exception& e);

} // namespace orvanta
