#include "dbgrid/StatementReportSource.h"

#include "db/DatabaseError.h"
#include "db/FbStatement.h"
#include "db/FbTransaction.h"

namespace orvanta {

StatementReportSource::StatementReportSource(FbStatement& statement, QString sql, Params params)
    : m_statement(statement)
    , m_sql(std::move(sql))
    , m_params(std::move(params))
{
}

ReportField StatementReportSource::field(const char* name, int width)
{
    const QString n = QLatin1String(name);
    return ReportField{n, width, QStringLiteral("Feld ") + n};
}

void StatementReportSource::open()
{
    m_statement.close();
    FbTransaction* transaction = m_statement.transaction();
    if (transaction->isActive())
        transaction->commit();
    m_statement.setSql(m_sql);
    m_counter = 0;
    if (!transaction->isActive())
        transaction->start();
    for (const auto& [name, value] : std::as_const(m_params))
        m_statement.setParam(name, value);
    m_statement.execute();
    m_hasRow = m_statement.next();
}

void StatementReportSource::next()
{
    ++m_counter;
    m_hasRow = m_statement.next();
}

void StatementReportSource::restore()
{
    FbTransaction* transaction = m_statement.transaction();
    if (transaction && transaction->isActive())
        transaction->commit();
    m_statement.close();
}

QString StatementReportSource::odd() const
{
    return m_counter % 2 == 0 ? QStringLiteral("T") : QStringLiteral("F");
}

void reportFailed(ReportOutcome& outcome, const std::exception& e)
{
    outcome.code = int(ReportResult::UNEXPECTED);
    if (const auto* db = dynamic_cast<const DatabaseError*>(&e)) {
        outcome.number = db->ibErrorCode();
        outcome.message = db->message();
    } else {
        outcome.message = QString::fromUtf8(e.what());
    }
}

bool reportStatementMissing(const FbStatement* statement, ReportOutcome& outcome)
{
    if (!statement)
        outcome.code = int(ReportResult::NO_QUERY_AVAILABLE);
    else if (!statement->transaction())
        outcome.code = int(ReportResult::NO_TRANSACTION_AVAILABLE);
    else
        return false;
    return true;
}

bool runStatementReport(FbStatement& statement, ReportOutcome& outcome, const std::function<void()>& run)
{
    try {
        run();
    } catch (const std::exception& e) {
        reportFailed(outcome, e);
        statement.close();
        statement.transaction()->rollbackQuietly();
        return false;
    }
    return true;
}

} // namespace orvanta
