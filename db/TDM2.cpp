#include "db/TDM2.h"

#include "db/SchemaUpgrade.h"

#include "db/DatabaseError.h"
#include "db/StoredConnection.h"
#include "db/TDM2Statements.h"
#include "platform/ErrorLog.h"

namespace orvanta {

namespace {

const QStringList kConcurrencyNowait = {QStringLiteral("concurrency"), QStringLiteral("nowait")};

using End = FbTransaction::EndAction;

// Removes earlier lines of the same parameter so that reading the data again does not stack them.
void putFirst(QStringList& params, const QString& key, const QString& value)
{
    params.removeIf([&key](const QString& line) { return line.startsWith(key, Qt::CaseInsensitive); });
    params.prepend(key + value);
}

} // namespace

void TDM2::restart(FbTransaction& transaction)
{
    if (transaction.isActive())
        transaction.rollback();
    transaction.start();
}

void TDM2::commitIfActive(FbTransaction& transaction)
{
    if (transaction.isActive())
        transaction.commit();
}

TDM2::TDM2(QObject* parent)
    : QObject(parent)
    , IBDatabase1(QString(), {QStringLiteral("lc_ctype=ISO8859_1")})
    , IBTransaction1(IBDatabase1, {}, End::Commit, QStringLiteral("IBTransaction1"))
    , ibta2(IBDatabase1, kConcurrencyNowait, End::Commit, QStringLiteral("ibta2"))
    , ibta3(IBDatabase1, {}, End::Commit, QStringLiteral("ibta3"))
    , DetailTS(IBDatabase1, {}, End::Commit, QStringLiteral("DetailTS"))
    , KontaktTS(IBDatabase1, {}, End::Commit, QStringLiteral("KontaktTS"))
    , BlobTS(IBDatabase1, {}, End::Commit, QStringLiteral("BlobTS"))
    , katlist_ts(IBDatabase1, {}, End::Commit, QStringLiteral("katlist_ts"))
    , katdetail_ts(IBDatabase1, {}, End::Commit, QStringLiteral("katdetail_ts"))
    , logts(IBDatabase1, kConcurrencyNowait, End::Commit, QStringLiteral("logts"))
    , GetFromTS(IBDatabase1, {}, End::Commit, QStringLiteral("GetFromTS"))
    , LogAllgemeinTS(IBDatabase1, {}, End::Commit, QStringLiteral("LogAllgemeinTS"))
    , LogDetailTS(IBDatabase1, {}, End::None, QStringLiteral("LogDetailTS"))
    , IBSQLTS(IBDatabase1, {}, End::Commit, QStringLiteral("IBSQLTS"))
    , NumCheck_SQLTS(IBDatabase1, {}, End::Commit, QStringLiteral("NumCheck_SQLTS"))
    , rave_ibsql_ts(IBDatabase1, {}, End::Commit, QStringLiteral("rave_ibsql_ts"))
    , numbers_ts(IBDatabase1, {}, End::Commit, QStringLiteral("numbers_ts"))
    , IBSQL1(IBDatabase1, &IBSQLTS)
    , NumCheck_SQL(IBDatabase1, &NumCheck_SQLTS)
    , rave_ibsql(IBDatabase1, &rave_ibsql_ts)
    , GetDetailQuery(IBDatabase1, &DetailTS, QStringLiteral("GetDetailQuery"), {}, this)
    , GetKontakt(IBDatabase1, &KontaktTS, QStringLiteral("GetKontakt"), {}, this)
    , GetBlob(IBDatabase1, &BlobTS, QStringLiteral("GetBlob"), {}, this)
    , GetFromNr(IBDatabase1, &GetFromTS, QStringLiteral("GetFromNr"),
                QString::fromLatin1(dmsql::kSelectFromPhone), this)
    , LogAllgemeinQuery(IBDatabase1, &LogAllgemeinTS, QStringLiteral("LogAllgemeinQuery"), {}, this)
    , LogDetailQuery(IBDatabase1, &LogDetailTS, QStringLiteral("LogDetailQuery"), {}, this)
    , ibcds_list(IBDatabase1, &ibta2, QStringLiteral("ibcds_list"),
                 QString::fromLatin1(dmsql::kSelectContactList), this)
    , ibcds_card(IBDatabase1, &ibta3, QStringLiteral("ibcds_card"),
                 QString::fromLatin1(dmsql::kSelectContactCards), this)
    , kat_list(IBDatabase1, &katlist_ts, QStringLiteral("kat_list"), QString::fromLatin1(dmsql::kSelectCategories),
               this)
    , katdetail(IBDatabase1, &katdetail_ts, QStringLiteral("katdetail"),
                QString::fromLatin1(dmsql::kSelectCategoryContacts), this)
    , ibcds_log(IBDatabase1, &logts, QStringLiteral("ibcds_log"), QString::fromLatin1(dmsql::kSelectLog), this)
    , ibcds_numbers(IBDatabase1, &numbers_ts, QStringLiteral("ibcds_numbers"),
                    QString::fromLatin1(dmsql::kSelectContactNumbers), this)
{
    setObjectName(QStringLiteral("DM2"));

    const auto restartHook = [](DataSet& ds) { restart(*ds.transaction()); };
    const auto commitHook = [](DataSet& ds) { commitIfActive(*ds.transaction()); };
    for (DataSet* ds : {&ibcds_list, &ibcds_card, &GetDetailQuery, &GetBlob, &kat_list, &katdetail, &ibcds_log,
                        &ibcds_numbers})
        ds->setBeforeOpen(restartHook);
    for (DataSet* ds : {&ibcds_list, &ibcds_card, &kat_list, &katdetail, &ibcds_log, &ibcds_numbers})
        ds->setAfterClose(commitHook);
    for (DataSet* ds : {&ibcds_list, &ibcds_card, &GetDetailQuery, &GetBlob, &ibcds_numbers})
        ds->setAfterPost(commitHook);
    IBDatabase1.setBeforeDisconnect([this] { closeDataSets(); });

    if (GetDBData(IBDatabase1)) {
        try {
            IBDatabase1.connect();
            addMissingLogObjects(IBDatabase1);
        } catch (const std::exception& e) {
            reportError(QStringLiteral("# DM2 - DataModuleCreate"), &e);
        }
    }
    CurLogLID = -1;
    CurLogCID = -1;
    CurLogABID = -1;
    CurLogCType = -1;
    CurLogFromPhone.clear();
    SelectedLID = -1;
    SummaryDelay = 10;
}

TDM2::~TDM2()
{
    closeDataSets();
    try {
        IBDatabase1.disconnect();
    } catch (const std::exception&) {
        // Shutting down: a failed detach leaves nothing to save.
    }
}

bool TDM2::GetDBData(FbAttachment& connection)
{
    try {
        const StoredConnection stored = StoredConnection::read();
        connection.setDatabaseName(stored.database);
        putFirst(connection.params(), QStringLiteral("password="), stored.password);
        putFirst(connection.params(), QStringLiteral("user_name="), stored.user);
        return true;
    } catch (const std::exception& e) {
        reportError(QStringLiteral("# DM2 - GetDBData"), &e);
        return false;
    }
}

bool TDM2::DBConnect()
{
    // A connection the server has dropped counts as none, so every operation says so instead of
    // failing on its first statement.
    if (IBDatabase1.ping())
        return true;
    reportError(QStringLiteral("# DM2 - DBConnect\r\nKeine Verbindung zur Datenbank!"));
    return false;
}

QList<DataSet*> TDM2::dataSets()
{
    return {&GetDetailQuery, &GetKontakt, &GetBlob, &GetFromNr, &LogAllgemeinQuery, &LogDetailQuery,
            &ibcds_list, &ibcds_card, &kat_list, &katdetail, &ibcds_log, &ibcds_numbers};
}

DataSet* TDM2::dataSet(const QString& name)
{
    for (DataSet* ds : dataSets())
        if (ds->name().compare(name, Qt::CaseInsensitive) == 0)
            return ds;
    return nullptr;
}

FbTransaction* TDM2::transaction(const QString& name)
{
    for (FbTransaction* t : {&IBTransaction1, &ibta2, &ibta3, &DetailTS, &KontaktTS, &BlobTS, &katlist_ts,
                             &katdetail_ts, &logts, &GetFromTS, &LogAllgemeinTS, &LogDetailTS, &IBSQLTS,
                             &NumCheck_SQLTS, &rave_ibsql_ts, &numbers_ts})
        if (t->name().compare(name, Qt::CaseInsensitive) == 0)
            return t;
    return nullptr;
}

void TDM2::closeDataSets() noexcept
{
    for (DataSet* ds : dataSets()) {
        try {
            ds->close();
        } catch (const std::exception&) {
            // The after-close commit failed; the disconnect ends the transaction.
        }
    }
}

} // namespace orvanta
