#pragma once
// The rows a report prints: a single-pass cursor over fields it announces by name. Adapters over
// database statements live beside their features; the report engine sees only this.

#include <QList>
#include <QString>
#include <QStringList>

namespace orvanta {

struct ReportField {
    QString name;
    int width = 0; // characters
    QString fullName;

    [[nodiscard]] QString description() const { return name + QStringLiteral("/String/") + QString::number(width); }
};

class ReportDataSource {
public:
    virtual ~ReportDataSource() = default;

    [[nodiscard]] virtual QList<ReportField> fields() const = 0;
    // Starts at the first row again; failures throw AppException.
    virtual void open() = 0;
    [[nodiscard]] virtual bool atEnd() const = 0;
    // The current row's values, in field order, as text.
    [[nodiscard]] virtual QStringList row() const = 0;
    virtual void next() = 0;
    // After the report: release what open() took.
    virtual void restore() {}
};

} // namespace orvanta
