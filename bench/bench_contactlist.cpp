// The contact list on large address books: a database with N generated contacts (address,
// category, half of them with a number and an e-mail address), the list frame built offscreen
// over the data module as in the program, and each step timed (until painted) against the raw
// fetch of the table's statement on V_SELECT_LIST (every value read, nothing kept) in the same
// run (and, for comparison, of the same rows without ORDER BY):
//
//   open     DBConnect on the table view, first start (no layout files)
//   cards    ChangeView to the cards (closes the list, opens the cards' data set)
//   table    ChangeView back to the table
//   M        the letter filter "M"
//   Ort      grouping by "Ort" (with "M" still set)
//   summary  one summary of the focused contact (mean of five contacts, clicked, not deferred)
//
//   bench_contactlist [--max N] [--dir FOLDER]      sizes 1 000, 10 000 and 100 000 up to N

#include "bench/BenchSupport.h"
#include "contacts/Tcontactlistframe.h"
#include "db/TDM2Statements.h"
#include "platform/ProgramFolder.h"
#include "ui/grid/GridCardView.h"
#include "ui/grid/GridController.h"
#include "ui/grid/GridView.h"
#include "ui/markup/MarkupPanel.h"

#include <QApplication>
#include <QElapsedTimer>
#include <QRandomGenerator>
#include <QTemporaryDir>

#include <cstdio>

using namespace orvanta;
using namespace orvanta::bench;

namespace {

double ms(qint64 ns)
{
    return double(ns) / 1e6;
}

// Contacts with the spread of a real address book: surnames repeat, towns and post codes come
// from a few hundred places, every contact has one of eight categories.
void generateContacts(FbAttachment& db, int count, quint32 seed)
{
    static const char* const surnames[] = {"Müller", "Schmidt", "Schneider", "Fischer", "Weber", "Meyer", "Wagner",
                                           "Becker", "Schulz", "Hoffmann", "Schäfer", "Koch", "Bauer", "Richter",
                                           "Klein", "Wolf", "Neumann", "Schwarz", "Zimmermann", "Braun", "Krüger",
                                           "Hofmann", "Hartmann", "Lange", "Schmitt", "Werner", "Krause", "Meier",
                                           "Lehmann", "Schmid", "Öztürk", "Ähren", "Ulrich", "Vogel", "Jäger"};
    static const char* const firstNames[] = {"Anna", "Bernd", "Claudia", "Dieter", "Eva", "Frank", "Gabi", "Hans",
                                             "Inge", "Jürgen", "Karin", "Lutz", "Monika", "Norbert", "Olga", "Petra"};
    static const char* const categories[] = {"Familie", "Freunde", "Kunden", "Lieferanten", "Verein", "Arzt",
                                             "Handwerker", "Behörde"};
    static const char* const towns[] = {"Berlin", "Hamburg", "München", "Köln", "Frankfurt", "Stuttgart",
                                        "Düsseldorf", "Leipzig", "Dortmund", "Essen", "Bremen", "Dresden",
                                        "Hannover", "Nürnberg", "Duisburg", "Bochum", "Wuppertal", "Bielefeld",
                                        "Bonn", "Münster", "Wien", "Graz", "Linz", "Zürich", "Basel", "Bern"};
    QRandomGenerator rng(seed);
    FbTransaction tx(db);
    tx.start();
    try {
        FbStatement kat(db, &tx, QStringLiteral("INSERT INTO KAT (LID, KATBEZ) VALUES (:LID, :KATBEZ)"));
        for (int k = 0; k < 8; ++k) {
            kat.setParam(u"LID", k + 1);
            kat.setParam(u"KATBEZ", QString::fromUtf8(categories[k]));
            kat.execute();
        }
        FbStatement contact(db, &tx,
                            QStringLiteral("INSERT INTO CONTACT (LID, ANREDE, NAME, VNAME, FIRMA, CONTBEZ, WEBSITE) "
                                           "VALUES (:LID, :ANREDE, :NAME, :VNAME, :FIRMA, :CONTBEZ, :WEBSITE)"));
        FbStatement addr(db, &tx,
                         QStringLiteral("INSERT INTO ADDR (LID, CID, STR, PLZ, ORT, LAND) VALUES (:LID, :LID, :STR, "
                                        ":PLZ, :ORT, :LAND)"));
        FbStatement conkat(db, &tx, QStringLiteral("INSERT INTO CONKAT (LID, CID, KID) VALUES (:LID, :LID, :KID)"));
        FbStatement com(db, &tx,
                        QStringLiteral("INSERT INTO COM (LID, CID, KOMMBEZ, LC, VORW, NUMBER) VALUES (:LID, :LID, "
                                       "'Telefon', '49', :VORW, :NUMBER)"));
        FbStatement mail(db, &tx,
                         QStringLiteral("INSERT INTO E_MAIL (LID, CID, MAILADDR) VALUES (:LID, :LID, :MAILADDR)"));
        for (int lid = 1; lid <= count; ++lid) {
            const QString name = QString::fromUtf8(surnames[rng.bounded(int(std::size(surnames)))]);
            const QString first = QString::fromUtf8(firstNames[rng.bounded(int(std::size(firstNames)))]);
            const int place = rng.bounded(300);
            const bool company = lid % 7 == 0;
            contact.setParam(u"LID", lid);
            contact.setParam(u"ANREDE", company ? QStringLiteral("Firma") : QStringLiteral("Herr"));
            contact.setParam(u"NAME", name);
            contact.setParam(u"VNAME", first);
            contact.setParam(u"FIRMA", company ? name + QStringLiteral(" GmbH") : QVariant());
            contact.setParam(u"CONTBEZ", QStringLiteral("%1, %2 %3").arg(name, first).arg(lid));
            contact.setParam(u"WEBSITE", company ? QStringLiteral("www.firma%1.de").arg(lid) : QVariant());
            contact.execute();
            addr.setParam(u"LID", lid);
            addr.setParam(u"STR", QStringLiteral("Hauptstraße %1").arg(1 + rng.bounded(200)));
            addr.setParam(u"PLZ", QString::number(10000 + place * 283));
            addr.setParam(u"ORT", QString::fromUtf8(towns[place % int(std::size(towns))]) +
                                      (place < 26 ? QString() : QStringLiteral(" %1").arg(place / 26)));
            addr.setParam(u"LAND", QStringLiteral("Deutschland"));
            addr.execute();
            conkat.setParam(u"LID", lid);
            conkat.setParam(u"KID", 1 + rng.bounded(8));
            conkat.execute();
            if (lid % 2 == 0) {
                com.setParam(u"LID", lid);
                com.setParam(u"VORW", QStringLiteral("0%1").arg(30 + rng.bounded(900)));
                com.setParam(u"NUMBER", QString::number(100000 + rng.bounded(899999)));
                com.execute();
                mail.setParam(u"LID", lid);
                mail.setParam(u"MAILADDR", QStringLiteral("kontakt%1@example.de").arg(lid));
                mail.execute();
            }
        }
        tx.commit();
    } catch (...) {
        tx.rollbackQuietly();
        throw;
    }
}

// The frame's work is done when what it shows is on screen.
void paint(Tcontactlistframe& frame)
{
    frame.activeGrid()->viewport()->grab();
}

} // namespace

int main(int argc, char* argv[])
{
    if (qEnvironmentVariableIsEmpty("QT_QPA_PLATFORM"))
        qputenv("QT_QPA_PLATFORM", "offscreen");
    QApplication app(argc, argv);
    const std::optional<RunOptions> options = runOptions(app.arguments(), "bench_contactlist");
    if (!options)
        return 2;
    const std::unique_ptr<QTemporaryDir> temp = benchProgramFolder(options->folder, "bench_contactlist");
    if (!temp)
        return 1;
    const QString rawSql = QString::fromLatin1(dmsql::kSelectContactList);

    std::printf("Contact list, times as ratios to the raw fetch of \"%s\" (best of 3) in the same run\n",
                dmsql::kSelectContactList);
    std::printf("(\"unsort\": the same rows without ORDER BY, to show what the server's sort costs)\n");
    std::printf("%9s %8s %8s | %6s | %8s %8s %8s %8s %8s\n", "contacts", "raw ms", "unsort", "open", "cards ms",
                "table ms", "M ms", "Ort ms", "summ ms");
    bool missed = false;
    for (const int contacts : {1'000, 10'000, 100'000}) {
        if (contacts > options->maxCalls)
            break;
        const QString path = temp->filePath(QStringLiteral("contacts%1.fdb").arg(contacts));
        // Each size starts as a first start: no layout files of the size before.
        for (const char* f : {"VStore", "VStoreT", "VStoreC"})
            QFile::remove(temp->filePath(QLatin1String(f)));
        try {
            prepareDatabase(path, [contacts](FbAttachment& db) { generateContacts(db, contacts, 4711); });
            TDM2 dm;
            if (!dataModuleConnected(dm, path))
                return 1;
            const qint64 raw = bestRawFetch(dm.IBDatabase1, dm.ibta2, rawSql);
            const qint64 unsorted = bestRawFetch(dm.IBDatabase1, dm.ibta2, QStringLiteral("SELECT * FROM V_SELECT_LIST"));

            QObject host;
            Tcontactlistframe frame(&dm);
            frame.resize(1200, 800);
            frame.show();
            QElapsedTimer t;
            t.start();
            frame.DBConnect(&host);
            paint(frame);
            const qint64 open = t.nsecsElapsed();
            if (frame.controller()->recordCount() != contacts)
                std::fprintf(stderr, "warning: %d rows, expected %d\n", frame.controller()->recordCount(), contacts);

            t.restart();
            frame.ChangeView(Tcontactlistframe::CardView);
            paint(frame);
            const qint64 cards = t.nsecsElapsed();

            t.restart();
            frame.ChangeView(Tcontactlistframe::TableView);
            paint(frame);
            const qint64 table = t.nsecsElapsed();

            frame.controller()->reapply();
            t.restart();
            frame.SetNewFilter(13);
            paint(frame);
            const qint64 letter = t.nsecsElapsed();

            frame.controller()->reapply();
            t.restart();
            frame.ToGroup(Tcontactlistframe::ByTown);
            paint(frame);
            const qint64 group = t.nsecsElapsed();

            frame.ToGroup(Tcontactlistframe::NoGrouping);
            GridController* g = frame.controller();
            qint64 summary = 0;
            const int rows = g->rowCount();
            for (int k = 0; k < 5; ++k) {
                t.restart();
                g->setFocusedRow((k * 7919 + 1) % rows);
                frame.summaryPanel()->grab();
                summary += t.nsecsElapsed();
            }
            summary /= 5;
            frame.DBDisconnect();

            std::printf("%9d %8.1f %8.1f | %5.2fx | %8.1f %8.1f %8.1f %8.1f %8.2f\n", contacts, ms(raw), ms(unsorted),
                        double(open) / double(raw), ms(cards), ms(table), ms(letter), ms(group), ms(summary));
            std::fflush(stdout);
            if (contacts == 100'000)
                missed = double(open) > 1.5 * double(raw) || ms(cards) > 200 || ms(table) > 200 ||
                         ms(letter) > 200 || ms(group) > 200 || ms(summary) > 20;
        } catch (const std::exception& e) {
            std::fprintf(stderr, "%d contacts: %s\n", contacts, e.what());
            return 1;
        }
        QFile::remove(path);
    }
    std::printf("targets at 100 000 contacts: open <= 1.50x; cards, table, M, Ort <= 200 ms each; summary <= 20 ms%s\n",
                missed ? " -- MISSED" : "");
    return 0;
}
