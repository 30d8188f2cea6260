#pragma once
// A failure reported by the database: the server's message and its error codes, which the
// reports and the callers' handlers need (for example a lock conflict versus a missing table).

#include "platform/AppException.h"

#include <QList>

namespace orvanta {

class DatabaseError : public AppException {
public:
    // codes: the engine's error codes in the order reported (first = primary); sqlCode: the SQL code.
    DatabaseError(QString message, QList<qint64> codes = {}, int sqlCode = 0, QString statement = {});

    [[nodiscard]] QString className() const override { return QStringLiteral("EIBInterBaseError"); }

    // The primary engine error code (e.g. 335544345 for a lock conflict), 0 when none.
    [[nodiscard]] qint64 ibErrorCode() const { return m_codes.isEmpty() ? 0 : m_codes.first(); }
    [[nodiscard]] const QList<qint64>& errorCodes() const { return m_codes; }
    [[nodiscard]] bool hasCode(qint64 code) const { return m_codes.contains(code); }
    [[nodiscard]] int sqlCode() const { return m_sqlCode; }
    // A write that met another transaction's uncommitted change (reported at once under "nowait").
    [[nodiscard]] bool isLockConflict() const
    {
        return hasCode(LockConflict) || hasCode(Deadlock) || hasCode(UpdateConflict);
    }
    // The statement that failed, when known.
    [[nodiscard]] const QString& statement() const { return m_statement; }

    // Engine codes callers test for.
    static constexpr qint64 Deadlock = 335544336;       // also reported for update conflicts
    static constexpr qint64 IoError = 335544344;        // e.g. the database file does not exist
    static constexpr qint64 LockConflict = 335544345;   // lock conflict on no wait transaction
    static constexpr qint64 UniqueKeyViolation = 335544349;
    static constexpr qint64 UpdateConflict = 335544451;
    static constexpr qint64 ForeignKeyViolation = 335544466;
    static constexpr qint64 DsqlError = 335544569;
    static constexpr qint64 TableUnknown = 335544580;
    static constexpr qint64 PrimaryOrUniqueViolation = 335544665;

private:
    QList<qint64> m_codes;
    int m_sqlCode;
    QString m_statement;
};

} // namespace orvanta
