#pragma once
// The data module: the one connection of the program, every shared transaction, statement, query
// and read-only data set, and the fields that carry the focused records between windows. Created
// first at start-up and destroyed last. Start-up hands it to the main window, which hands it to
// every frame and window it makes; there is no global one to reach for.

#include "db/DataSet.h"
#include "db/FbAttachment.h"
#include "db/FbStatement.h"
#include "db/FbTransaction.h"
#include "db/StoredConnection.h"

#include <QObject>

namespace orvanta {

class TDM2 final : public QObject {
    Q_OBJECT
    Q_DISABLE_COPY_MOVE(TDM2)

public:
    // Reads the connection data and connects; a failure leaves the module unconnected (reported
    // through the error log when it exists).
    explicit TDM2(QObject* parent = nullptr);
    // Closes the data sets and disconnects.
    ~TDM2() override;

    // Reads database name and credentials from HKEY_LOCAL_MACHINE "software\Varnik\rufwarte"
    // into the connection; reports "# DM2 - GetDBData" on failure and returns false.
    bool GetDBData(FbAttachment& connection);
    // Whether the connection is up and the server answers on it; if not, reports that there is
    // none and returns false. A broken connection is let go and stays so (no reconnect).
    bool DBConnect();

    // Registry key and values of the connection data.
    static constexpr const char* kRegistryKey = StoredConnection::kRegistryKey;

    FbAttachment IBDatabase1;

    FbTransaction IBTransaction1;
    FbTransaction ibta2;
    FbTransaction ibta3;
    FbTransaction DetailTS;
    FbTransaction KontaktTS;
    FbTransaction BlobTS;
    FbTransaction katlist_ts;
    FbTransaction katdetail_ts;
    FbTransaction logts;
    FbTransaction GetFromTS;
    FbTransaction LogAllgemeinTS;
    FbTransaction LogDetailTS;
    FbTransaction IBSQLTS;
    FbTransaction NumCheck_SQLTS;
    FbTransaction rave_ibsql_ts;
    FbTransaction numbers_ts;

    // Statements: text set per call by their users.
    FbStatement IBSQL1;
    FbStatement NumCheck_SQL;
    FbStatement rave_ibsql;

    // Queries (text set per call unless given).
    DataSet GetDetailQuery;
    DataSet GetKontakt;
    DataSet GetBlob;
    DataSet GetFromNr;
    DataSet LogAllgemeinQuery;
    DataSet LogDetailQuery;

    // Read-only cached data sets of the lists.
    DataSet ibcds_list;
    DataSet ibcds_card;
    DataSet kat_list;
    DataSet katdetail;
    DataSet ibcds_log;
    DataSet ibcds_numbers;

    // The focused log record (written by the log list), the focused contact (contact list), and
    // the summary delay counter.
    int CurLogLID = -1;
    int CurLogCID = -1;
    int CurLogABID = -1;
    int CurLogCType = -1;
    QString CurLogFromPhone;
    int SelectedLID = -1;
    int SummaryDelay = 10;

    // Every data set and query, for lookups by name and for closing them all.
    [[nodiscard]] QList<DataSet*> dataSets();
    [[nodiscard]] DataSet* dataSet(const QString& name);
    [[nodiscard]] FbTransaction* transaction(const QString& name);

    // The two transaction patterns the data sets use; public for statement users.
    static void restart(FbTransaction& transaction); // roll back when active, then start
    static void commitIfActive(FbTransaction& transaction);

private:
    void closeDataSets() noexcept;
};

} // namespace orvanta
