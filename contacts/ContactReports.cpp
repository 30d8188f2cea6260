#include "contacts/ContactReports.h"

#include "db/FbStatement.h"
#include "ui/report/ReportRun.h"

namespace orvanta {

namespace {

const char* const kOverviewSql =
    "select C.CONTBEZ,K.KATBEZ,A.STR,A.PLZ,A.ORT from CONTACT C left outer join CONKAT V on C.LID = V.CID left outer "
    "join KAT K ON V.KID = K.LID left outer join ADDR A ON C.LID = A.CID";

} // namespace

ContactOverviewConnection::ContactOverviewConnection(FbStatement& statement)
    : StatementReportSource(statement, QLatin1String(kOverviewSql))
{
}

QList<ReportField> ContactOverviewConnection::fields() const
{
    return {field("Kontakt", 80), field("Kategorie", 30), field("Strasse", 40),
            field("PLZ", 10),     field("Ort", 35),       field("Odd", 1)};
}

QStringList ContactOverviewConnection::row() const
{
    QStringList values;
    for (int i = 0; i < 5; ++i)
        values << statement().asString(i);
    values << odd();
    return values;
}

bool DruckKontaktUebersicht(FbStatement* statement, ReportOutcome& outcome)
{
    outcome = ReportOutcome{};
    if (reportStatementMissing(statement, outcome))
        return false;
    return runStatementReport(*statement, outcome, [statement] {
        ContactOverviewConnection connection(*statement);
        runReport(QStringLiteral("KontaktUebersicht"), {}, &connection, QStringLiteral("Vorschau Kontaktübersicht"));
    });
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
        reportFailed(outcome, e);
        return false;
    }
    return true;
}

} // namespace orvanta
