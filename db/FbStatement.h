#pragma once
// A prepared statement with named parameters (":ID", ":TSD"; a name may appear several times and
// is bound once). Markers inside string literals, quoted names and comments are left alone.
//
//   FbStatement st(db, &tx);
//   st.setSql("SELECT * FROM LOG WHERE TSDATE = :TSD");
//   st.setParam("TSD", QDate(2024, 5, 1));
//   st.execute();
//   while (st.next()) { st.asString("FROMBEZ"); … }
//
// "EXECUTE PROCEDURE P(:A, :B)" returns its outputs as the current row right after execute().

#include "db/FbColumn.h"

#include <QDate>
#include <QDateTime>
#include <QList>
#include <QString>
#include <QTime>
#include <QVariant>

#include <memory>

namespace orvanta {

class FbAttachment;
class FbTransaction;

// How a column's value lies in the fetched row buffer, for readers that copy rows in bulk.
struct FbSlot {
    enum class Storage : quint8 { I16, I32, I64, F32, F64, Text, VarText, Date, Time, Timestamp, BlobId, Bool };
    Storage storage = Storage::I32;
    FbType type = FbType::Integer;
    int offset = 0;     // value
    int nullOffset = 0; // 16-bit null indicator (non-zero = null)
    int length = 0;     // bytes of Text, maximum bytes of VarText (after the 16-bit length)
    int scale = 0;      // decimal places of Numeric
};

class FbStatement final {
public:
    explicit FbStatement(FbAttachment& attachment, FbTransaction* transaction = nullptr, QString sql = {});
    ~FbStatement();
    FbStatement(const FbStatement&) = delete;
    FbStatement& operator=(const FbStatement&) = delete;

    [[nodiscard]] FbTransaction* transaction() const;
    void setTransaction(FbTransaction* transaction);
    [[nodiscard]] FbAttachment& attachment() const;

    [[nodiscard]] const QString& sql() const;
    void setSql(const QString& sql); // unprepares; bound values are dropped
    void prepare();                  // optional: execute() prepares when needed
    [[nodiscard]] bool isPrepared() const;

    // Parameter names in order of first appearance, upper case.
    [[nodiscard]] QStringList paramNames() const;
    [[nodiscard]] bool hasParam(QStringView name) const;
    // Binds every occurrence of the name (case-insensitive). A null QVariant binds NULL.
    // QString, integers, double, bool, QDate, QTime, QDateTime and QByteArray are accepted; a
    // double bound to a NUMERIC is rounded to its places. Unknown names throw DatabaseError.
    void setParam(QStringView name, const QVariant& value);
    void setNull(QStringView name) { setParam(name, QVariant()); }
    // Binds a fixed-point value given as scaled integer (cents for scale 2).
    void setParamScaled(QStringView name, qint64 scaled, int scale);
    void clearParams(); // every parameter NULL

    // Runs the statement: a select opens its cursor (fetch with next()), a procedure call makes
    // its outputs the current row, anything else just runs. Throws DatabaseError.
    void execute();
    // Fetches the next row of an open cursor; false at the end (the cursor is then closed).
    bool next();
    // Closes an open cursor; harmless when none is open.
    void close();
    [[nodiscard]] bool isOpen() const;
    [[nodiscard]] bool hasRow() const;
    // Rows changed by the last insert, update or delete.
    [[nodiscard]] qint64 rowsAffected() const;
    [[nodiscard]] bool isSelect() const;

    // Result columns; indexes are 0-based.
    [[nodiscard]] int columnCount() const;
    [[nodiscard]] const FbColumn& column(int index) const;
    [[nodiscard]] int columnIndex(QStringView name) const; // case-insensitive, -1 when absent

    [[nodiscard]] bool isNull(int index) const;
    [[nodiscard]] qint64 asInt64(int index) const; // numerics rounded to whole numbers
    [[nodiscard]] int asInt(int index) const { return int(asInt64(index)); }
    [[nodiscard]] qint64 asScaled(int index, int scale) const; // fixed point (cents for 2)
    [[nodiscard]] double asDouble(int index) const;
    [[nodiscard]] QString asString(int index) const; // CHAR padding removed; blobs read whole
    [[nodiscard]] QByteArray asBytes(int index) const; // raw database bytes of text and blobs
    [[nodiscard]] QDate asDate(int index) const;
    [[nodiscard]] QTime asTime(int index) const;
    [[nodiscard]] QDateTime asDateTime(int index) const;
    [[nodiscard]] QVariant value(int index) const; // null QVariant for NULL

    // The same by column name; an unknown name throws DatabaseError.
    [[nodiscard]] bool isNull(QStringView name) const { return isNull(requireColumn(name)); }
    [[nodiscard]] qint64 asInt64(QStringView name) const { return asInt64(requireColumn(name)); }
    [[nodiscard]] int asInt(QStringView name) const { return asInt(requireColumn(name)); }
    [[nodiscard]] double asDouble(QStringView name) const { return asDouble(requireColumn(name)); }
    [[nodiscard]] QString asString(QStringView name) const { return asString(requireColumn(name)); }
    [[nodiscard]] QDate asDate(QStringView name) const { return asDate(requireColumn(name)); }
    [[nodiscard]] QTime asTime(QStringView name) const { return asTime(requireColumn(name)); }
    [[nodiscard]] QDateTime asDateTime(QStringView name) const { return asDateTime(requireColumn(name)); }
    [[nodiscard]] QVariant value(QStringView name) const { return value(requireColumn(name)); }
    [[nodiscard]] int requireColumn(QStringView name) const;

    // Bulk access to the current row for compact stores.
    [[nodiscard]] const FbSlot& slot(int index) const;
    [[nodiscard]] const unsigned char* rowData() const;
    [[nodiscard]] QByteArray readBlob(int index) const;

    struct Private;
    [[nodiscard]] Private* d_func() const { return d.get(); }

private:
    std::unique_ptr<Private> d;
};

} // namespace orvanta
