#pragma once
// What the database benchmarks share: a database in a temporary folder that the data module
// finds through the registry as at a real start, and the baseline every ratio is measured
// against, a raw fetch of one statement ("SELECT * FROM LOG" unless told otherwise).

#include "db/CredentialCipher.h"
#include "db/FbAttachment.h"
#include "db/FbStatement.h"
#include "db/FbTransaction.h"
#include "db/Schema.h"
#include "db/SqlScript.h"
#include "db/TDM2.h"
#include "platform/ProgramFolder.h"
#include "platform/Registry.h"

#include <QDir>
#include <QElapsedTimer>
#include <QTemporaryDir>
#include <QFile>
#include <QStringList>
#include <QString>

#include <cstdio>
#include <cstring>
#include <limits>
#include <memory>
#include <optional>
#include <utility>

namespace orvanta::bench {

// The resident memory of this process in KiB; -1 when unknown.
inline qint64 residentKiB()
{
    QFile f(QStringLiteral("/proc/self/status"));
    if (!f.open(QIODevice::ReadOnly))
        return -1;
    for (const QByteArray& line : f.readAll().split('\n')) {
        if (line.startsWith("VmRSS:"))
            return line.mid(6).trimmed().split(' ').first().toLongLong();
    }
    return -1;
}

// "--max N --dir FOLDER": the largest log size and where the run's databases go. Bad
// arguments print the usage and give nothing.
struct RunOptions {
    qint64 maxCalls = 1'000'000;
    QString folder;
};

inline std::optional<RunOptions> runOptions(const QStringList& args, const char* program)
{
    RunOptions o;
    for (qsizetype i = 1; i < args.size(); ++i) {
        if (args[i] == QLatin1String("--max") && i + 1 < args.size()) {
            bool ok = false;
            o.maxCalls = args[++i].toLongLong(&ok);
            if (!ok || o.maxCalls < 1)
                o.maxCalls = 0;
        } else if (args[i] == QLatin1String("--dir") && i + 1 < args.size()) {
            o.folder = args[++i];
        } else {
            o.maxCalls = 0;
        }
        if (o.maxCalls == 0) {
            std::fprintf(stderr, "usage: %s [--max N] [--dir FOLDER]\n", program);
            return std::nullopt;
        }
    }
    return o;
}

// The name pattern of the run's temporary folder, under 'folder' or the system's.
inline QString tempFolderPattern(const QString& folder, const char* program)
{
    return (folder.isEmpty() ? QDir::tempPath() : folder) + QLatin1Char('/') + QLatin1String(program)
        + QStringLiteral("-XXXXXX");
}

// The run's temporary folder, made the program folder with a registry stand-in of its own, so
// that no settings or layout file of an earlier run changes what is measured. Null (and said
// why) when it cannot be made.
inline std::unique_ptr<QTemporaryDir> benchProgramFolder(const QString& folder, const char* program)
{
    auto temp = std::make_unique<QTemporaryDir>(tempFolderPattern(folder, program));
    if (!temp->isValid()) {
        std::fprintf(stderr, "no temporary folder\n");
        return nullptr;
    }
    qputenv("VARNIK_HKLM", temp->filePath(QStringLiteral("hklm.ini")).toLocal8Bit());
    setProgramFolder(temp->path());
    return temp;
}

// A new database with the program's schema, filled by 'fill' and closed again.
template <typename Fill>
void createLogDatabase(const QString& path, Fill&& fill)
{
    FbAttachment::createDatabase(path, QStringLiteral("SYSDBA"), QStringLiteral("masterkey"), 8192, false);
    FbAttachment db;
    db.attach(path, QStringLiteral("SYSDBA"), QStringLiteral("masterkey"));
    SqlScript::run(db, schemaScript());
    fill(db);
    db.disconnect();
}

// Points the registry (VARNIK_HKLM must be set) at the database the next data module opens.
inline void pointDataModuleAt(const QString& path)
{
    Registry registry(RegistryRoot::LocalMachine);
    registry.openKey(QString::fromLatin1(TDM2::kRegistryKey), true);
    registry.writeString(QStringLiteral("Database"), path);
    registry.writeString(QStringLiteral("Username"), CredentialCipher::encrypt(QStringLiteral("SYSDBA")));
    registry.writeString(QStringLiteral("Password"), CredentialCipher::encrypt(QStringLiteral("masterkey")));
}

// One size's database: made and filled, and the registry pointed at it for the next data module.
template <typename Fill>
void prepareDatabase(const QString& path, Fill&& fill)
{
    createLogDatabase(path, std::forward<Fill>(fill));
    pointDataModuleAt(path);
}

// Whether the data module connected; says which database it could not open when not.
inline bool dataModuleConnected(const TDM2& dm, const QString& path)
{
    if (dm.IBDatabase1.isConnected())
        return true;
    std::fprintf(stderr, "cannot connect to %s\n", qPrintable(path));
    return false;
}

struct RawResult {
    qint64 rows = 0;
    qint64 valueBytes = 0;
    quint64 checksum = 0;
};

// Reads every value of every row of the statement (by default the whole log) from the fetch
// buffer: fixed values by their width, text by all of its bytes. Nothing is kept.
inline RawResult rawFetch(FbAttachment& db, FbTransaction& tx, const QString& sql = QStringLiteral("SELECT * FROM LOG"))
{
    RawResult r;
    TDM2::restart(tx);
    FbStatement st(db, &tx, sql);
    st.execute();
    const int n = st.columnCount();
    while (st.next()) {
        const unsigned char* row = st.rowData();
        for (int i = 0; i < n; ++i) {
            const FbSlot& s = st.slot(i);
            short null;
            std::memcpy(&null, row + s.nullOffset, sizeof null);
            if (null)
                continue;
            const unsigned char* v = row + s.offset;
            switch (s.storage) {
            case FbSlot::Storage::VarText: {
                quint16 len;
                std::memcpy(&len, v, 2);
                for (quint16 k = 0; k < len; ++k)
                    r.checksum = r.checksum * 31 + v[2 + k];
                r.valueBytes += len;
                break;
            }
            case FbSlot::Storage::Text: {
                int len = s.length;
                while (len > 0 && v[len - 1] == ' ')
                    --len;
                for (int k = 0; k < len; ++k)
                    r.checksum = r.checksum * 31 + v[k];
                r.valueBytes += len;
                break;
            }
            case FbSlot::Storage::I16: {
                qint16 x;
                std::memcpy(&x, v, 2);
                r.checksum += quint64(x);
                r.valueBytes += 2;
                break;
            }
            case FbSlot::Storage::I64:
            case FbSlot::Storage::F64:
            case FbSlot::Storage::Timestamp: {
                quint64 x;
                std::memcpy(&x, v, 8);
                r.checksum += x;
                r.valueBytes += 8;
                break;
            }
            default: {
                quint32 x;
                std::memcpy(&x, v, 4);
                r.checksum += x;
                r.valueBytes += 4;
                break;
            }
            }
        }
        ++r.rows;
    }
    tx.commit();
    return r;
}

// The baseline: the best of three raw fetches after one that warms the page cache, in ns.
inline qint64 bestRawFetch(FbAttachment& db, FbTransaction& tx, const QString& sql = QStringLiteral("SELECT * FROM LOG"))
{
    rawFetch(db, tx, sql);
    qint64 best = std::numeric_limits<qint64>::max();
    for (int run = 0; run < 3; ++run) {
        QElapsedTimer t;
        t.start();
        rawFetch(db, tx, sql);
        best = std::min(best, t.nsecsElapsed());
    }
    return best;
}

} // namespace orvanta::bench
