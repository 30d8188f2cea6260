#include "tests/support/TempDatabase.h"

#include "db/DatabaseError.h"
#include "db/FbStatement.h"
#include "db/FbTransaction.h"
#include "db/Schema.h"
#include "db/SqlScript.h"
#include "tests/TestPaths.h"

#include <QCryptographicHash>
#include <QFile>
#include <QHash>

namespace orvanta::test {
namespace {

struct Templates {
    QTemporaryDir dir;
    QHash<QByteArray, QString> byScript; // script hash -> template file
};

Templates& templates()
{
    static Templates t;
    return t;
}

QString makeTemplate(TempDatabase::Schema schema)
{
    const QString script = schema == TempDatabase::Schema::Full ? schemaScript() : QString();
    const QByteArray key = QCryptographicHash::hash(script.toUtf8(), QCryptographicHash::Sha1);
    Templates& t = templates();
    if (const auto it = t.byScript.constFind(key); it != t.byScript.constEnd())
        return *it;
    const QString path = t.dir.filePath(QStringLiteral("template-%1.fdb").arg(QString::fromLatin1(key.toHex().left(12))));
    FbAttachment::createDatabase(path, QString::fromLatin1(TempDatabase::User),
                                 QString::fromLatin1(TempDatabase::Password), 8192, false);
    if (!script.isEmpty()) {
        FbAttachment db;
        db.attach(path, QString::fromLatin1(TempDatabase::User), QString::fromLatin1(TempDatabase::Password));
        SqlScript::run(db, script);
        db.disconnect();
    }
    t.byScript.insert(key, path);
    return path;
}

} // namespace

TempDatabase::TempDatabase(Schema schema)
{
    if (!m_dir.isValid())
        throw DatabaseError(QStringLiteral("Cannot create a temporary folder"));
    m_path = m_dir.filePath(QStringLiteral("test.fdb"));
    copySchemaTo(m_path, schema);
}

void TempDatabase::copySchemaTo(const QString& path, Schema schema)
{
    const QString source = makeTemplate(schema);
    if (!QFile::copy(source, path))
        throw DatabaseError(QStringLiteral("Cannot copy %1 to %2").arg(source, path));
    QFile::setPermissions(path, QFile::ReadOwner | QFile::WriteOwner);
}

TempDatabase::~TempDatabase()
{
    m_attachment.reset();
}

QString TempDatabase::path() const { return m_path; }
QString TempDatabase::directory() const { return m_dir.path(); }

FbAttachment& TempDatabase::attachment()
{
    if (!m_attachment)
        m_attachment = newAttachment();
    return *m_attachment;
}

std::unique_ptr<FbAttachment> TempDatabase::newAttachment() const
{
    auto db = std::make_unique<FbAttachment>();
    db->attach(m_path, QString::fromLatin1(User), QString::fromLatin1(Password));
    return db;
}

void TempDatabase::exec(const QString& script)
{
    SqlScript::run(attachment(), script);
}

QVariant TempDatabase::scalar(const QString& sql)
{
    FbTransaction tx(attachment());
    tx.start();
    FbStatement st(attachment(), &tx, sql);
    st.execute();
    QVariant v;
    if (st.isSelect() ? st.next() : st.hasRow())
        v = st.value(0);
    st.close();
    tx.commit();
    return v;
}

QString TempDatabase::schemaPath()
{
    return QStringLiteral(ORVANTA_SOURCE_DIR "/db/schema.sql");
}

} // namespace orvanta::test
