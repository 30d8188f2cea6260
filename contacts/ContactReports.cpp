#include "contacts/ContactReports.h"

#include "db/DatabaseError.h"
#include "db/FbStatement.h"
#include "db/FbTransaction.h"
#include "ui/report/ReportRun.h"

namespace orvanta {

namespace {

const char* const kOverviewSql =
    "select C.CONTBEZ,K.KATBEZ,A.STR,A.PLZ,A.ORT from CONTACT C left outer join CONKAT V on C.LID = V.CID left outer "
    "join KAT K ON V.KID = K.LID left outer join ADDR A ON C.LID = A.CID";

void failedWith(ReportOutcome& outcome, const std::exception& e)
{
    outcome.code = int(ReportResult::UNEXPECTED);
    if (const auto* db = dynamic_cast<const DatabaseError*>(&e)) {
        outcome.number = db->ibErrorCode();
        outcome.message = db->message();
    } else {
        outcome.message = QString::fromUtf8(e.what());
    }
}

} // namespace

ContactOverviewConnection::ContactOverviewConnection(FbStatement& statement)
    : m_statement(statement)
{
}

QList<ReportField> ContactOverviewConnection::fields() const
{
    auto field = [](const char* name, int width) {
        const QString n = QLatin1String(name);
        return ReportField{n, width, QStringLiteral("Feld ") + n};
    };
    return {field("Kontakt", 80), field("Kategorie", 30), field("Strasse", 40),
            field("PLZ", 10),     field("Ort", 35),       field("Odd", 1)};
}

void ContactOverviewConnection::open()
{
    m_statement.close();
    FbTransaction* transaction = m_statement.transaction();
    if (transaction->isActive())
        transaction->commit();
    m_statement.setSql(QLatin1String(kOverviewSql));
    m_counter = 0;
    if (!transaction->isActive())
        transaction->start();
    m_statement.execute();
    m_hasRow = m_statement.next();
}

bool ContactOverviewConnection::atEnd() const
{
    return !m_hasRow;
}

QStringList ContactOverviewConnection::row() const
{
    QStringList values;
    for (int i = 0; i < 5; ++i)
        values << m_statement.asString(i);
    values << (m_counter % 2 == 0 ? QStringLiteral("T") : QStringLiteral("F"));
    return values;
}

void ContactOverviewConnection::next()
{
    ++m_counter;
    m_hasRow = m_statement.next();
}

void ContactOverviewConnection::restore()
{
    FbTransaction* transaction = m_statement.transaction();
    if (transaction && transaction->isActive())
        transaction->commit();
    m_statement.close();
}

bool DruckKontaktUebersicht(FbStatement* statement, ReportOutcome& outcome)
{
    outcome = ReportOutcome{};
    if (!statement) {
        outcome.code = int(ReportResult::NO_QUERY_AVAILABLE);
        return false;
    }
    if (!statement->transaction()) {
        outcome.code = int(ReportResult::NO_TRANSACTION_AVAILABLE);
        return false;
    }
    try {
        ContactOverviewConnection connection(*statement);
        runReport(QStringLiteral("KontaktUebersicht"), {}, &connection, QStringLiteral("Vorschau Kontaktübersicht"));
    } catch (const std::exception& e) {
        failedWith(outcome, e);
        statement->close();
        statement->transaction()->rollbackQuietly();
        return false;
    }
    return true;
}

bool NotizDruck(const QString& designation, const QByteArray& noteRtf, ReportOutcome& outcome)
{
    outcome = ReportOutcome{};
    try {
        ReportParameters parameters;
        parameters.text.insert(QStringLiteral("KontaktBezeichnung"), designation);
        parameters.rich.insert(QStringLiteral("NotizText"), noteRtf);
        runReport(QStringLiteral("NotizDruck"), std::move(parameters), nullptr, QStringLiteral("Vorschau Notiz"));
    } catch (const std::exception& e) {
        failedWith(outcome, e);
        return false;
    }
    return true;
}

} // namespace orvanta
