// Reading the whole call log: "SELECT * FROM LOG" into the ibcds_log data set of the data module,
// against a raw fetch of the same statement through the Firebird layer that reads every value and
// keeps nothing. Prints the time ratio (best of several runs) and the memory ratio (bytes the
// store holds against the bytes of the column values themselves).
//
//   bench_dataset [--max ROWS] [--runs N] [--dir FOLDER]

#include "bench/BenchSupport.h"

#include <QCoreApplication>
#include <QElapsedTimer>
#include <QTemporaryDir>

#include <cstdio>
#include <cstring>
#include <random>

using namespace orvanta;
using namespace orvanta::bench;

namespace {

const char* const kFirst[] = {"Jürgen", "Anna", "Björn", "Sabine", "Günther", "Maria", "Lukas", "Sophie", "Özlem",
                              "Thomas", "Claudia", "René", "Heike", "Stefan", "Zoë", "Klaus"};
const char* const kLast[] = {"Müller", "Schmidt", "Schneider", "Fischer", "Weber", "Meyer", "Wagner", "Becker",
                             "Schulz", "Hoffmann", "Schäfer", "Koch", "Bauer", "Richter", "Klein", "Wolf", "Schröder",
                             "Neumann", "Schwarz", "Zimmermann", "Braun", "Krüger", "Hofmann", "Hartmann"};
const char* const kCompanies[] = {"Autohaus Süd GmbH", "Praxis Dr. Lange", "Stadtwerke", "Bäckerei Kühn",
                                  "Versicherungsbüro Groß & Partner", "Kanzlei Brandt"};
const char* const kRegions[] = {"Berlin", "München", "Köln", "Frankfurt am Main", "Düsseldorf", "Stuttgart",
                                "Nürnberg", "Wien", "Zürich", "Mobilfunk (D1)", "Mobilfunk (D2)", "Graz",
                                "Garmisch-Partenkirchen", "Mönchengladbach"};
const char* const kStatus[] = {"angenommen", "nicht angenommen", "besetzt", "Anrufbeantworter", "abgewiesen"};
const char* const kOwn[] = {"Büro", "Privat", "Fax", "Praxis"};
const char* const kRemarks[] = {"Rückruf erbeten", "wegen Termin am Montag", "Angebot schicken", "erledigt",
                                "bitte zurückrufen, dringend"};

template <size_t N>
QString pick(std::mt19937& rng, const char* const (&list)[N])
{
    return QString::fromUtf8(list[rng() % N]);
}

QString digits(std::mt19937& rng, int n)
{
    QString s;
    s.reserve(n);
    for (int i = 0; i < n; ++i)
        s.append(QLatin1Char(char('0' + rng() % 10)));
    return s;
}

void fill(FbAttachment& db, int rows)
{
    std::mt19937 rng(4711);
    FbTransaction tx(db);
    tx.start();
    FbStatement ins(db, &tx,
                    QStringLiteral("INSERT INTO LOG (LID, SERVICE, FROMPHONE, FROMBEZ, FROMSUBB, ONMSN, ONBEZ, STATUS, "
                                   "TSDATE, TSTIME, TS, CID, BEMERK, CTYPE, CTIME, CCHARGE, ABID, REGION, FROM2, "
                                   "FROMANSCHLUSS, NTYPE, NPLAN, PRESENT, B1, B2, B3) VALUES (:LID, :SERVICE, :FP, :FB, "
                                   ":FS, :MSN, :OB, :ST, :D, :T, :TS, :CID, :BEM, :CT, :CTIME, :CC, :ABID, :REG, :F2, "
                                   ":FA, :NT, :NP, :PR, :B1, :B2, :B3)"));
    const QDate first(2019, 1, 1);
    for (int i = 1; i <= rows; ++i) {
        const bool known = rng() % 3 != 0;
        const QString phone = QStringLiteral("0") + digits(rng, 2 + int(rng() % 4)) + digits(rng, 5 + int(rng() % 4));
        const QDate day = first.addDays(qint64(rng() % 1900));
        const QTime time = QTime::fromMSecsSinceStartOfDay(int(rng() % 86400) * 1000);
        ins.setParam(u"LID", i);
        ins.setParam(u"SERVICE", int(rng() % 3 == 0 ? 7 : 1));
        ins.setParam(u"FP", phone);
        ins.setParam(u"FB", known ? (rng() % 5 == 0 ? pick(rng, kCompanies)
                                                    : pick(rng, kLast) + QStringLiteral(", ") + pick(rng, kFirst))
                                  : QStringLiteral("Unbekannt"));
        ins.setParam(u"FS", rng() % 4 == 0 ? QVariant(phone) : QVariant());
        const int own = int(rng() % 4);
        ins.setParam(u"MSN", QStringLiteral("0301234567%1").arg(own));
        ins.setParam(u"OB", QString::fromUtf8(kOwn[own]));
        ins.setParam(u"ST", pick(rng, kStatus));
        ins.setParam(u"D", day);
        ins.setParam(u"T", time);
        ins.setParam(u"TS", QDateTime(day, time));
        ins.setParam(u"CID", known ? int(rng() % 5000) + 1 : 0);
        ins.setParam(u"BEM", rng() % 10 == 0 ? QVariant(pick(rng, kRemarks)) : QVariant());
        ins.setParam(u"CT", int(rng() % 4));
        ins.setParam(u"CTIME", QTime::fromMSecsSinceStartOfDay(int(rng() % 3600) * 1000));
        ins.setParamScaled(u"CC", qint64(rng() % 500), 2);
        ins.setParam(u"ABID", rng() % 20 == 0 ? int(rng() % 1000) : 0);
        ins.setParam(u"REG", pick(rng, kRegions));
        ins.setParam(u"F2", QVariant());
        ins.setParam(u"FA", known ? QVariant(QString::fromUtf8(rng() % 2 ? "Mobil" : "Geschäftlich")) : QVariant());
        ins.setParam(u"NT", int(rng() % 3));
        ins.setParam(u"NP", 1);
        ins.setParam(u"PR", int(rng() % 2));
        ins.setParam(u"B1", 0);
        ins.setParam(u"B2", 0);
        ins.setParam(u"B3", QVariant());
        ins.execute();
    }
    tx.commit();
}

int usage()
{
    std::fprintf(stderr, "usage: bench_dataset [--max ROWS] [--runs N] [--dir FOLDER]\n");
    return 2;
}

} // namespace

int main(int argc, char* argv[])
{
    QCoreApplication app(argc, argv);
    qint64 maxRows = 1000000;
    int runs = 3;
    QString folder;
    const QStringList args = app.arguments();
    for (qsizetype i = 1; i < args.size(); ++i) {
        bool ok = true;
        if (args[i] == QLatin1String("--max") && i + 1 < args.size())
            maxRows = args[++i].toLongLong(&ok);
        else if (args[i] == QLatin1String("--runs") && i + 1 < args.size())
            runs = args[++i].toInt(&ok);
        else if (args[i] == QLatin1String("--dir") && i + 1 < args.size())
            folder = args[++i];
        else
            return usage();
        if (!ok || runs < 1)
            return usage();
    }

    QTemporaryDir tmp(tempFolderPattern(folder, "bench_dataset"));
    if (!tmp.isValid()) {
        std::fprintf(stderr, "cannot create a temporary folder\n");
        return 1;
    }
    qputenv("VARNIK_HKLM", tmp.filePath(QStringLiteral("hklm.ini")).toLocal8Bit());

    std::printf("%9s %10s %10s %7s %12s %12s %7s\n", "rows", "raw ms", "dataset ms", "time", "raw bytes",
                "store bytes", "memory");
    bool withinTargets = true;
    for (const int rows : {10000, 100000, 1000000}) {
        if (rows > maxRows)
            break;
        const QString path = tmp.filePath(QStringLiteral("log-%1.fdb").arg(rows));
        try {
            createLogDatabase(path, [rows](FbAttachment& db) {
                QElapsedTimer fillTimer;
                fillTimer.start();
                fill(db, rows);
                std::fprintf(stderr, "filled %d rows in %.1f s\n", rows, double(fillTimer.elapsed()) / 1000.0);
            });
            pointDataModuleAt(path);

            TDM2 dm;
            if (!dm.IBDatabase1.isConnected()) {
                std::fprintf(stderr, "the data module did not connect to %s\n", qPrintable(path));
                return 1;
            }
            // Warm the page cache once, then alternate the two readers and keep the best of each.
            RawResult raw = rawFetch(dm.IBDatabase1, dm.logts);
            qint64 bestRaw = std::numeric_limits<qint64>::max();
            qint64 bestSet = std::numeric_limits<qint64>::max();
            qint64 storeBytes = 0;
            for (int run = 0; run < runs; ++run) {
                QElapsedTimer t;
                t.start();
                raw = rawFetch(dm.IBDatabase1, dm.logts);
                bestRaw = std::min(bestRaw, t.nsecsElapsed());

                t.restart();
                dm.ibcds_log.open();
                bestSet = std::min(bestSet, t.nsecsElapsed());
                if (dm.ibcds_log.rowCount() != raw.rows) {
                    std::fprintf(stderr, "row counts differ: %d / %lld\n", dm.ibcds_log.rowCount(), raw.rows);
                    return 1;
                }
                storeBytes = dm.ibcds_log.store().byteSize();
                dm.ibcds_log.close();
            }
            const double timeRatio = double(bestSet) / double(bestRaw);
            const double memoryRatio = double(storeBytes) / double(raw.valueBytes);
            withinTargets = withinTargets && timeRatio <= 1.3 && memoryRatio <= 2.0;
            std::printf("%9d %10.1f %10.1f %6.2fx %12lld %12lld %6.2fx\n", rows, double(bestRaw) / 1e6,
                        double(bestSet) / 1e6, timeRatio, raw.valueBytes, storeBytes, memoryRatio);
            std::fflush(stdout);
        } catch (const std::exception& e) {
            std::fprintf(stderr, "failed at %d rows: %s\n", rows, e.what());
            return 1;
        }
        QFile::remove(path);
    }
    std::printf("targets (time <= 1.30x, memory <= 2.00x): %s\n", withinTargets ? "met" : "NOT met");
    return 0;
}
