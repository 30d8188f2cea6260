#pragma once
// Runs an SQL script the way isql does: statements end at the current terminator ("SET TERM ^ ;"
// changes it, so procedure bodies can contain ";"), comments and empty statements are skipped,
// each DDL statement is committed at once so later statements see its objects, COMMIT and
// ROLLBACK end the running transaction. A failure names the statement and its line.

#include <QString>
#include <QStringList>

namespace orvanta {

class FbAttachment;

class SqlScript final {
public:
    struct Statement {
        QString text; // without terminator, trimmed
        int line = 0; // 1-based line where the statement starts
    };

    // Splits a script into executable statements; SET TERM lines are consumed here.
    [[nodiscard]] static QList<Statement> split(QStringView script);

    // Runs every statement in its own transaction chain. Throws DatabaseError, whose message starts
    // with the failing statement's number, line and beginning; work before it stays committed
    // where the script committed it.
    static void run(FbAttachment& db, QStringView script);
    static void runFile(FbAttachment& db, const QString& path);
};

} // namespace orvanta
