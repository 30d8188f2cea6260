#include "db/SchemaUpgrade.h"

#include "db/FbAttachment.h"
#include "db/FbStatement.h"
#include "db/FbTransaction.h"
#include "db/Schema.h"
#include "db/SqlScript.h"
#include "db/TransactionWork.h"

#include <QRegularExpression>

namespace orvanta {

namespace {

struct LogObject {
    const char* name;
    const char* catalogue; // the system query that finds it by name
};

// In the order they must exist: the triggers count into the generators.
constexpr LogObject kLogObjects[] = {
    {"IX_LOG_TSDATE_TSTIME", "SELECT COUNT(*) FROM RDB$INDICES WHERE RDB$INDEX_NAME = :N"},
    {"IX_LOG_TSDATE_TSTIME_DESC", "SELECT COUNT(*) FROM RDB$INDICES WHERE RDB$INDEX_NAME = :N"},
    {"GEN_LOG_INSERTS", "SELECT COUNT(*) FROM RDB$GENERATORS WHERE RDB$GENERATOR_NAME = :N"},
    {"GEN_LOG_CHANGES", "SELECT COUNT(*) FROM RDB$GENERATORS WHERE RDB$GENERATOR_NAME = :N"},
    {"LOG_AI", "SELECT COUNT(*) FROM RDB$TRIGGERS WHERE RDB$TRIGGER_NAME = :N"},
    {"LOG_AUD", "SELECT COUNT(*) FROM RDB$TRIGGERS WHERE RDB$TRIGGER_NAME = :N"},
};

// The schema script's statement that creates the object of this name.
QString creatingStatement(const QList<SqlScript::Statement>& script, const QString& name)
{
    const QRegularExpression creates(QStringLiteral("^CREATE\\s+(DESCENDING\\s+)?(INDEX|GENERATOR|TRIGGER)\\s+%1\\b")
                                         .arg(QRegularExpression::escape(name)),
                                     QRegularExpression::CaseInsensitiveOption);
    for (const SqlScript::Statement& s : script)
        if (creates.match(s.text).hasMatch())
            return s.text;
    return {};
}

} // namespace

int addMissingLogObjects(FbAttachment& db)
{
    // Nowait: another attachment using LOG must not hold up the program's start.
    FbTransaction transaction(db, {QStringLiteral("read_committed"), QStringLiteral("rec_version"),
                                   QStringLiteral("nowait")});
    const QList<SqlScript::Statement> script = SqlScript::split(schemaScript());
    int made = 0;
    for (const LogObject& object : kLogObjects) {
        const QString name = QString::fromLatin1(object.name);
        bool present = true;
        // A catalogue that cannot be read is no reason to change anything.
        if (!runInTransaction(
                transaction, QStringLiteral("# DM2 - Schema"),
                [&] {
                    FbStatement query(db, &transaction, QString::fromLatin1(object.catalogue));
                    query.setParam(u"N", name);
                    query.execute();
                    present = query.next() && query.asInt(0) > 0;
                },
                ErrorReport::Log))
            continue;
        if (present)
            continue;
        const QString ddl = creatingStatement(script, name);
        if (ddl.isEmpty())
            continue;
        if (runInTransaction(
                transaction, QStringLiteral("# DM2 - Schema\r\n") + name,
                [&] { db.executeImmediate(ddl, transaction); }, ErrorReport::Log))
            ++made;
    }
    return made;
}

} // namespace orvanta
