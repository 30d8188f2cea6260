#pragma once
// The address book's prints: the contact overview (one row per contact and category) and the
// note of one contact.

#include "dbgrid/StatementReportSource.h"
#include "ui/report/ReportResult.h"

#include <QByteArray>

namespace orvanta {

class FbStatement;

class ContactOverviewConnection final : public StatementReportSource {
public:
    explicit ContactOverviewConnection(FbStatement& statement);

    [[nodiscard]] QList<ReportField> fields() const override;
    [[nodiscard]] QStringList row() const override;
};

// Each shows its report in the preview; false with the outcome filled when it failed.
bool DruckKontaktUebersicht(FbStatement* statement, ReportOutcome& outcome);
bool NotizDruck(const QString& designation, const QByteArray& noteRtf, ReportOutcome& outcome);

} // namespace orvanta
