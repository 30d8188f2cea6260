// Area-code lookups against the full German table: the indexed lookup against a plain scan of the
// code list (the baseline), both on the same numbers in the same run.
//
// bench_areacodes [folder]   (default: the program's own folder, where the build copies the tables)

#include "phone/AreaCodes.h"

#include <QCoreApplication>
#include <QElapsedTimer>
#include <QRandomGenerator>

#include <cstdio>

using namespace orvanta;

namespace {

// The lookup as a scan of the list: first equal entry, longest listed prefix.
bool scanLookup(const AreaCodeTable& table, QStringView number, QString& prefix, QString& rest, QString& region)
{
    prefix.clear();
    rest.clear();
    region.clear();
    if (table.isEmpty())
        return false;
    QString digits;
    for (const QChar c : number) {
        if (c >= u'0' && c <= u'9')
            digits.append(c);
    }
    qsizetype zeros = 0;
    while (zeros < digits.size() && digits[zeros] == u'0')
        ++zeros;
    if (zeros == digits.size())
        zeros = 0;
    const QString significant = digits.mid(zeros);
    qsizetype hit = -1;
    QString match;
    for (const int n : table.prefixLengths()) {
        const QString candidate = significant.left(n);
        const qsizetype i = table.codes().indexOf(candidate);
        if (i >= 0) {
            hit = i;
            match = candidate;
            rest = significant.mid(n);
        }
    }
    if (hit < 0) {
        rest = number.toString();
        return true;
    }
    region = table.names().at(hit);
    prefix = digits.left(digits.indexOf(match) + match.size());
    return true;
}

template<typename Lookup>
double lookupsPerSecond(const QStringList& numbers, double minSeconds, Lookup&& lookup, qsizetype& hits)
{
    QString prefix, rest, region;
    QElapsedTimer timer;
    timer.start();
    qint64 done = 0;
    hits = 0;
    do {
        for (const QString& number : numbers) {
            lookup(number, prefix, rest, region);
            hits += region.isEmpty() ? 0 : 1;
        }
        done += numbers.size();
    } while (timer.nsecsElapsed() < qint64(minSeconds * 1e9));
    return double(done) / (double(timer.nsecsElapsed()) / 1e9);
}

} // namespace

int main(int argc, char* argv[])
{
    QCoreApplication app(argc, argv);
    const QString folder = argc > 1 ? QString::fromLocal8Bit(argv[1]) : QCoreApplication::applicationDirPath();
    LoadGermanAereaCodes(folder);
    const AreaCodeTable& table = germanAreaCodes();
    if (table.isEmpty()) {
        std::fprintf(stderr, "no German area codes in %s\n", qPrintable(folder));
        return 1;
    }

    // Numbers as the log holds them: a listed code with its trunk zero and a local number, and
    // every tenth one without a known code.
    QRandomGenerator random(1234);
    QStringList numbers;
    for (int i = 0; i < 10000; ++i) {
        const QString local = QString::number(random.bounded(100000, 99999999));
        if (i % 10 == 9)
            numbers.append(QStringLiteral("0") + QString::number(random.bounded(10, 19)) + local);
        else
            numbers.append(QStringLiteral("0") + table.codes().at(random.bounded(table.size())) + QStringLiteral(" / ") + local);
    }

    qsizetype scanHits = 0;
    qsizetype indexHits = 0;
    const double scan = lookupsPerSecond(numbers, 1.0, [&](const QString& n, QString& p, QString& r, QString& g) {
        return scanLookup(table, n, p, r, g);
    }, scanHits);
    const double indexed = lookupsPerSecond(numbers, 2.0, [&](const QString& n, QString& p, QString& r, QString& g) {
        return table.lookup(n, p, r, g);
    }, indexHits);

    std::printf("German table: %lld codes, %lld numbers (90%% with a listed code)\n",
        static_cast<long long>(table.size()), static_cast<long long>(numbers.size()));
    std::printf("scan of the list (baseline): %12.0f lookups/s\n", scan);
    std::printf("indexed lookup:              %12.0f lookups/s  (%.1fx the baseline)\n", indexed, indexed / scan);
    std::printf("target 2000000 lookups/s: %s\n", indexed >= 2e6 ? "met" : "NOT met");
    if (scanHits == 0 || indexHits == 0)
        return 1;
    return indexed >= 2e6 ? 0 : 2;
}
