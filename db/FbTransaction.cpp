#include "db/FbTransaction.h"

#include "db/FbPrivate_p.h"

#include <algorithm>

namespace orvanta {

using namespace Firebird;

QByteArray FbTransaction::Private::buildTpb() const
{
    if (params.isEmpty())
        return {};
    QByteArray tpb;
    tpb.append(char(isc_tpb_version3));
    for (const QString& raw : params) {
        const QString word = raw.trimmed().toLower();
        if (word.isEmpty())
            continue;
        if (word == QLatin1String("concurrency"))
            tpb.append(char(isc_tpb_concurrency));
        else if (word == QLatin1String("consistency"))
            tpb.append(char(isc_tpb_consistency));
        else if (word == QLatin1String("read_committed"))
            tpb.append(char(isc_tpb_read_committed));
        else if (word == QLatin1String("rec_version"))
            tpb.append(char(isc_tpb_rec_version));
        else if (word == QLatin1String("no_rec_version"))
            tpb.append(char(isc_tpb_no_rec_version));
        else if (word == QLatin1String("wait"))
            tpb.append(char(isc_tpb_wait));
        else if (word == QLatin1String("nowait"))
            tpb.append(char(isc_tpb_nowait));
        else if (word == QLatin1String("read"))
            tpb.append(char(isc_tpb_read));
        else if (word == QLatin1String("write"))
            tpb.append(char(isc_tpb_write));
        else if (word.startsWith(QLatin1String("lock_timeout="))) {
            bool ok = false;
            const uint seconds = word.mid(13).toUInt(&ok);
            if (!ok)
                throw DatabaseError(QStringLiteral("Invalid transaction parameter \"%1\"").arg(raw));
            tpb.append(char(isc_tpb_lock_timeout));
            tpb.append(char(4));
            for (int i = 0; i < 4; ++i)
                tpb.append(char((seconds >> (8 * i)) & 0xFF));
        } else {
            throw DatabaseError(QStringLiteral("Invalid transaction parameter \"%1\"").arg(raw));
        }
    }
    return tpb;
}

void FbTransaction::Private::closeCursors()
{
    if (!attachment)
        return;
    for (FbStatement* s : attachment->d_func()->statements) {
        if (s->transaction() == nullptr || s->transaction()->d_func() != this)
            continue;
        s->close();
    }
}

void detachTransaction(FbTransaction& transaction) noexcept
{
    auto* d = transaction.d_func();
    if (d->handle) {
        d->handle->release();
        d->handle = nullptr;
    }
    d->attachment = nullptr;
}

FbTransaction::FbTransaction(FbAttachment& attachment, QStringList params, EndAction endAction, QString name)
    : d(std::make_unique<Private>())
{
    d->attachment = &attachment;
    d->params = std::move(params);
    d->endAction = endAction;
    d->name = std::move(name);
    attachment.d_func()->transactions.push_back(this);
}

FbTransaction::~FbTransaction()
{
    rollbackQuietly();
    if (d->attachment) {
        auto& list = d->attachment->d_func()->transactions;
        list.erase(std::remove(list.begin(), list.end(), this), list.end());
    }
}

const QString& FbTransaction::name() const { return d->name; }
const QStringList& FbTransaction::params() const { return d->params; }
void FbTransaction::setParams(QStringList params) { d->params = std::move(params); }
FbTransaction::EndAction FbTransaction::endAction() const { return d->endAction; }
FbAttachment* FbTransaction::attachment() const { return d->attachment; }
bool FbTransaction::isActive() const { return d->handle != nullptr; }

void FbTransaction::start()
{
    if (d->handle)
        throw DatabaseError(QStringLiteral("Transaction is already active"));
    if (!d->attachment)
        throw DatabaseError(QStringLiteral("Database not connected"));
    IAttachment* att = d->attachment->d_func()->require();
    const QByteArray tpb = d->buildTpb();
    fbapi::Status st;
    d->handle = fbapi::guard([&] {
        return att->startTransaction(&st, unsigned(tpb.size()),
                                     reinterpret_cast<const unsigned char*>(tpb.constData()));
    });
}

void FbTransaction::commit()
{
    if (!d->handle)
        throw DatabaseError(QStringLiteral("Transaction is not active"));
    d->closeCursors();
    fbapi::Status st;
    fbapi::guard([&] { d->handle->commit(&st); }); // releases the handle on success
    d->handle = nullptr;
}

void FbTransaction::commitRetaining()
{
    if (!d->handle)
        throw DatabaseError(QStringLiteral("Transaction is not active"));
    fbapi::Status st;
    fbapi::guard([&] { d->handle->commitRetaining(&st); });
}

void FbTransaction::rollback()
{
    if (!d->handle)
        throw DatabaseError(QStringLiteral("Transaction is not active"));
    d->closeCursors();
    fbapi::Status st;
    // A rollback that fails leaves nothing to keep: the server ends the transaction anyway when
    // the connection goes.
    fbapi::guard([&] { d->handle->rollback(&st); }, {}, [this] {
        d->handle->release();
        d->handle = nullptr;
    });
    d->handle = nullptr; // released by the rollback
}

void FbTransaction::rollbackQuietly() noexcept
{
    if (!d->handle)
        return;
    try {
        rollback();
    } catch (...) {
        // Cleanup path: the handle has been released by rollback().
    }
}

} // namespace orvanta
