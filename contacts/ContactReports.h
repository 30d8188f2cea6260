#pragma once
// The address book's prints: the contact overview (one row per contact and category) and the
// note of one contact.

#include "ui/report/ReportDataSource.h"
#include "ui/report/ReportResult.h"

#include <QByteArray>

namespace orvanta {

class FbStatement;

class ContactOverviewConnection final : public ReportDataSource {
public:
    explicit ContactOverviewConnection(FbStatement& statement);

    [[nodiscard]] QList<ReportField> fields() const override;
    void open() override;
    [[nodiscard]] bool atEnd() const override;
    [[nodiscard]] QStringList row() const override;
    void next() override;
    void restore() override;

private:
    FbStatement& m_statement;
    qint64 m_counter = 0;
    bool m_hasRow = false;
};

// Each shows its report in the preview; false with the outcome filled when it failed.
bool DruckKontaktUebersicht(FbStatement* statement, ReportOutcome& outcome);
bool NotizDruck(const QString& designation, const QByteArray& noteRtf, ReportOutcome& outcome);

} // namespace orvanta
