#include "db/FbAttachment.h"

#include "db/FbPrivate_p.h"

#include <QRegularExpression>


namespace orvanta {

using namespace Firebird;
using fbapi::guard;

namespace {

constexpr int kConnectTimeoutSeconds = 15;

// With isc_dpb_utf8_filename the engine takes the database name and every text of the parameter
// block as UTF-8, whatever the process locale, so names and passwords with umlauts survive.
QByteArray dbName(const QString& name)
{
    return name.toUtf8();
}

void fillDpb(IXpbBuilder* dpb, ThrowStatusWrapper* st, const QStringList& params)
{
    dpb->insertTag(st, isc_dpb_utf8_filename);
    for (const QString& line : params) {
        const qsizetype eq = line.indexOf(QLatin1Char('='));
        const QString key = (eq < 0 ? line : line.left(eq)).trimmed().toLower();
        const QByteArray value = (eq < 0 ? QString() : line.mid(eq + 1)).toUtf8();
        if (key.isEmpty())
            continue;
        if (key == QLatin1String("user_name"))
            dpb->insertString(st, isc_dpb_user_name, value.constData());
        else if (key == QLatin1String("password"))
            dpb->insertString(st, isc_dpb_password, value.constData());
        else if (key == QLatin1String("lc_ctype"))
            dpb->insertString(st, isc_dpb_lc_ctype, value.constData());
        else if (key == QLatin1String("sql_role_name"))
            dpb->insertString(st, isc_dpb_sql_role_name, value.constData());
        else if (key == QLatin1String("connect_timeout"))
            dpb->insertInt(st, isc_dpb_connect_timeout, value.toInt());
        else
            throw DatabaseError(QStringLiteral("Unknown connection parameter \"%1\"").arg(key));
    }
}

} // namespace

IAttachment* FbAttachment::Private::require() const
{
    if (!handle)
        throw DatabaseError(QStringLiteral("Database not connected"));
    return handle;
}

void FbAttachment::Private::releaseDependents()
{
    for (FbStatement* s : statements)
        releaseStatementHandle(*s);
    for (FbTransaction* t : transactions) {
        if (!t->isActive())
            continue;
        try {
            if (t->endAction() == FbTransaction::EndAction::Commit)
                t->commit();
            else
                t->rollback();
        } catch (const DatabaseError&) {
            t->rollbackQuietly();
        }
    }
}

FbAttachment::FbAttachment()
    : d(std::make_unique<Private>())
{
}

FbAttachment::FbAttachment(QString databaseName, QStringList params)
    : FbAttachment()
{
    d->databaseName = std::move(databaseName);
    d->params = std::move(params);
}

FbAttachment::~FbAttachment()
{
    try {
        disconnect();
    } catch (const DatabaseError&) {
        // The handle is gone either way; nothing useful to report from a destructor.
    }
    for (FbStatement* s : d->statements)
        detachStatement(*s);
    for (FbTransaction* t : d->transactions)
        detachTransaction(*t);
}

const QString& FbAttachment::databaseName() const { return d->databaseName; }
void FbAttachment::setDatabaseName(const QString& name) { d->databaseName = name; }
const QStringList& FbAttachment::params() const { return d->params; }
QStringList& FbAttachment::params() { return d->params; }
void FbAttachment::setParams(QStringList params) { d->params = std::move(params); }
bool FbAttachment::isConnected() const { return d->handle != nullptr; }
void FbAttachment::setBeforeDisconnect(std::function<void()> hook) { d->beforeDisconnect = std::move(hook); }

void FbAttachment::attach(const QString& databaseName, const QString& user, const QString& password)
{
    d->databaseName = databaseName;
    d->params = {QStringLiteral("user_name=") + user, QStringLiteral("password=") + password,
                 QStringLiteral("lc_ctype=ISO8859_1")};
    connect();
}

void FbAttachment::connect()
{
    if (d->handle)
        return;
    if (d->databaseName.trimmed().isEmpty())
        throw DatabaseError(QStringLiteral("Database name is empty"));
    fbapi::Status st;
    IXpbBuilder* dpb = nullptr;
    IProvider* provider = nullptr;
    guard(
        [&] {
            dpb = fbapi::util()->getXpbBuilder(&st, IXpbBuilder::DPB, nullptr, 0);
            fillDpb(dpb, &st, d->params);
            // A server that does not answer must not hold the program for the client's default
            // three minutes.
            if (!dpb->findFirst(&st, isc_dpb_connect_timeout))
                dpb->insertInt(&st, isc_dpb_connect_timeout, kConnectTimeoutSeconds);
            provider = fbapi::master()->getDispatcher();
            d->handle = provider->attachDatabase(&st, dbName(d->databaseName).constData(), dpb->getBufferLength(&st),
                                                 dpb->getBuffer(&st));
        },
        {}, [&] {
            if (provider)
                provider->release();
            if (dpb)
                dpb->dispose();
        });
    provider->release();
    dpb->dispose();
}

void FbAttachment::disconnect()
{
    if (!d->handle)
        return;
    if (d->beforeDisconnect)
        d->beforeDisconnect();
    d->releaseDependents();
    IAttachment* handle = d->handle;
    d->handle = nullptr;
    fbapi::Status st;
    guard([&] { handle->detach(&st); }, {}, [handle] { handle->release(); });
}

bool FbAttachment::ping()
{
    if (!d->handle)
        return false;
    try {
        fbapi::Status st;
        guard([&] { d->handle->ping(&st); });
        return true;
    } catch (const DatabaseError&) {
    }
    if (d->beforeDisconnect) {
        try {
            d->beforeDisconnect();
        } catch (const std::exception&) {
            // Whatever the hook wanted to end ended with the connection.
        }
    }
    d->releaseDependents();
    IAttachment* handle = d->handle;
    d->handle = nullptr;
    handle->release();
    return false;
}

void FbAttachment::executeImmediate(const QString& sql, FbTransaction& transaction)
{
    IAttachment* att = d->require();
    ITransaction* tra = transaction.d_func()->handle;
    if (!tra)
        throw DatabaseError(QStringLiteral("Transaction is not active"), {}, 0, sql);
    const QByteArray text = fbapi::encodeText(sql);
    fbapi::Status st;
    guard([&] { att->execute(&st, tra, 0, text.constData(), SQL_DIALECT_V6, nullptr, nullptr, nullptr, nullptr); },
          sql);
}

void FbAttachment::createDatabase(const QString& databaseName, const QString& user, const QString& password,
                                  int pageSize, bool forcedWrites)
{
    fbapi::Status st;
    IXpbBuilder* dpb = nullptr;
    IProvider* provider = fbapi::master()->getDispatcher();
    guard(
        [&] {
            dpb = fbapi::util()->getXpbBuilder(&st, IXpbBuilder::DPB, nullptr, 0);
            fillDpb(dpb, &st,
                    {QStringLiteral("user_name=") + user, QStringLiteral("password=") + password,
                     QStringLiteral("lc_ctype=ISO8859_1")});
            dpb->insertInt(&st, isc_dpb_page_size, pageSize);
            dpb->insertInt(&st, isc_dpb_sql_dialect, 3);
            dpb->insertString(&st, isc_dpb_set_db_charset, "ISO8859_1");
            dpb->insertInt(&st, isc_dpb_force_write, forcedWrites ? 1 : 0);
            IAttachment* att = provider->createDatabase(&st, dbName(databaseName).constData(),
                                                        dpb->getBufferLength(&st), dpb->getBuffer(&st));
            att->detach(&st);
        },
        {}, [&] {
            if (dpb)
                dpb->dispose();
            provider->release();
        });
    dpb->dispose();
    provider->release();
}

QString FbAttachment::clientVersion()
{
    // The object API knows major and minor; the legacy text ("LI-V6.3.11.33637 Firebird 3.0")
    // adds patch level and build behind an InterBase-style version of its own.
    char buffer[256] = {};
    isc_get_client_version(buffer);
    const QString text = QString::fromLatin1(buffer);
    const unsigned version = fbapi::util()->getClientVersion();
    const QString majorMinor = QStringLiteral("%1.%2").arg(version >> 8).arg(version & 0xFFu);
    const QRegularExpressionMatch build = QRegularExpression(QStringLiteral("V\\d+\\.\\d+\\.(\\d+)\\.(\\d+)")).match(text);
    return build.hasMatch() ? majorMinor + u'.' + build.captured(1) + u'.' + build.captured(2) : majorMinor;
}

void FbAttachment::dropDatabase()
{
    IAttachment* att = d->require();
    if (d->beforeDisconnect)
        d->beforeDisconnect();
    d->releaseDependents();
    fbapi::Status st;
    d->handle = nullptr;
    guard([&] { att->dropDatabase(&st); }, {}, [att] { att->release(); });
}

} // namespace orvanta
