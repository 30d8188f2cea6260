#pragma once
// A read-only data set: runs its command text in its transaction and keeps the whole result in a
// RecordStore. Opening runs the before-open hook first (the data module rolls back a transaction
// found active and starts it again, so each opening reads a fresh snapshot); closing drops the
// rows and then runs the after-close hook (commit). Grids read store() directly.

#include "db/RecordStore.h"

#include <QObject>
#include <QVariant>

#include <exception>
#include <functional>
#include <memory>

namespace orvanta {

class BackgroundFetch;
class FbAttachment;
class FbTransaction;
class DataSet;

// One value of the current row, read the way the windows read fields by name.
class DataSetField final {
public:
    DataSetField(const RecordStore& store, int row, int column)
        : m_store(&store)
        , m_row(row)
        , m_column(column)
    {
    }
    [[nodiscard]] bool isNull() const { return m_row < 0 || m_store->isNull(m_row, m_column); }
    [[nodiscard]] QString asString() const { return m_row < 0 ? QString() : m_store->text(m_row, m_column); }
    [[nodiscard]] int asInteger() const { return int(asInt64()); }
    [[nodiscard]] qint64 asInt64() const { return m_row < 0 ? 0 : m_store->integer(m_row, m_column); }
    [[nodiscard]] double asFloat() const { return m_row < 0 ? 0.0 : m_store->number(m_row, m_column); }
    [[nodiscard]] qint64 asScaled(int scale) const { return m_row < 0 ? 0 : m_store->scaled(m_row, m_column, scale); }
    [[nodiscard]] QDate asDate() const { return m_row < 0 ? QDate() : m_store->date(m_row, m_column); }
    [[nodiscard]] QTime asTime() const { return m_row < 0 ? QTime() : m_store->time(m_row, m_column); }
    [[nodiscard]] QDateTime asDateTime() const { return m_row < 0 ? QDateTime() : m_store->timestamp(m_row, m_column); }
    [[nodiscard]] QVariant value() const;
    [[nodiscard]] const FbColumn& field() const { return m_store->field(m_column); }

private:
    const RecordStore* m_store;
    int m_row;
    int m_column;
};

class DataSet final : public QObject {
    Q_OBJECT
    Q_DISABLE_COPY_MOVE(DataSet)

public:
    using Hook = std::function<void(DataSet&)>;

    DataSet(FbAttachment& attachment, FbTransaction* transaction, const QString& name, const QString& commandText,
            QObject* parent = nullptr);
    ~DataSet() override;

    [[nodiscard]] QString name() const { return objectName(); }
    [[nodiscard]] FbAttachment& attachment() const { return *m_attachment; }
    [[nodiscard]] FbTransaction* transaction() const { return m_transaction; }
    void setTransaction(FbTransaction* transaction);

    [[nodiscard]] const QString& commandText() const { return m_commandText; }
    // Replacing the text closes an open data set; parameters of the same name keep their values.
    void setCommandText(const QString& text);

    // Parameters of the command text, bound by name (case-insensitive) at each opening.
    [[nodiscard]] QStringList paramNames() const;
    void setParam(const QString& name, const QVariant& value);
    [[nodiscard]] QVariant param(const QString& name) const;

    void setBeforeOpen(Hook hook) { m_beforeOpen = std::move(hook); }
    void setAfterClose(Hook hook) { m_afterClose = std::move(hook); }
    void setAfterPost(Hook hook) { m_afterPost = std::move(hook); }

    // Throws DatabaseError (the data set then stays closed and empty).
    void open();
    void close();
    // Opens with the rows the other (open) data set holds instead of reading them again, and
    // closes that one: for two command texts that read the same rows, such as two names of one
    // view. What can be checked without reading is: this text has no parameters and gives the
    // same columns (name, type, width, scale) as the other's rows. The before-open hook runs as
    // for open(), so a later refresh() reads a fresh snapshot. False, and nothing moved, when
    // the check fails or the other is not open (or this one is). Throws DatabaseError.
    bool openWithRowsOf(DataSet& other);
    // Close and open again: a new snapshot with the same text and parameters.
    void refresh();

    // Opens with the columns only and reads the rows on a thread of its own (its own
    // attachment, a read-only snapshot) in the order given ("TSDATE DESC, TSTIME DESC"),
    // appending them as they arrive (rowsArrived). loadFinished() ends the loading; the rows
    // that arrived stay when it failed. Throws DatabaseError when even the columns cannot be read.
    void openInBackground(const QString& order);
    // Reads the whole result again in the background while the rows held stay; when it is
    // complete they are replaced at once (rowsReplaced). Open data sets only.
    void reloadInBackground(const QString& order);
    [[nodiscard]] bool isLoading() const { return m_fetch != nullptr; }
    // Why the last loading failed, null when it did not.
    [[nodiscard]] std::exception_ptr loadError() const { return m_loadError; }
    // Runs a query of the same columns in the data set's transaction (started afresh, so it
    // sees what was committed since) and appends its rows; returns how many.
    int appendQuery(const QString& sql, const QHash<QString, QVariant>& params);
    // Rows read from the database by every data set of the process (test seam).
    [[nodiscard]] static qint64 rowsRead();
    // Runs the command text as a statement that returns no rows (DELETE, UPDATE …) in the data
    // set's transaction, without hooks; returns the rows changed. Throws DatabaseError.
    qint64 execSQL();
    // Reports a finished change of the underlying rows (runs the after-post hook).
    void post();
    [[nodiscard]] bool isActive() const { return m_active; }

    [[nodiscard]] int rowCount() const { return m_store.rowCount(); }
    [[nodiscard]] const RecordStore& store() const { return m_store; }
    [[nodiscard]] int fieldIndex(QStringView name) const { return m_store.fieldIndex(name); }

    // The current row, for readers of one record at a time. -1 when empty.
    [[nodiscard]] int recNo() const { return m_row; }
    void setRecNo(int row);
    void first() { setRecNo(0); }
    void next() { setRecNo(m_row + 1); }
    [[nodiscard]] bool eof() const { return m_row < 0 || m_row >= m_store.rowCount(); }
    // Moves to the first row whose field equals value (text compared case-sensitively); false if none.
    bool locate(QStringView field, const QVariant& value);
    // The field of the current row; unknown names throw DatabaseError.
    [[nodiscard]] DataSetField fieldByName(QStringView name) const;

Q_SIGNALS:
    void opened();
    void aboutToClose();
    void closed();
    // Rows from firstRow on were appended.
    void rowsArrived(int firstRow);
    void rowsReplaced();
    void loadFinished(bool complete);

private:
    void startFetch(const QString& order, bool replacing);
    void takeBatches();
    void fetchFinished(bool ok);
    void stopFetch() noexcept;

    // close(), handing the rows out instead of dropping them.
    RecordStore takeRowsAndClose();

    FbAttachment* m_attachment;
    FbTransaction* m_transaction;
    QString m_commandText;
    QHash<QString, QVariant> m_params;
    Hook m_beforeOpen;
    Hook m_afterClose;
    Hook m_afterPost;
    RecordStore m_store;
    RecordStore m_pending; // a reload's rows until they are complete
    std::unique_ptr<BackgroundFetch> m_fetch;
    bool m_replacing = false;
    std::exception_ptr m_loadError;
    bool m_active = false;
    int m_row = -1;
};

} // namespace orvanta
