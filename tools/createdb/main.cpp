// orvanta-createdb <database> [--user U] [--password P] [--demo] [--calls N [--seed S]]
//
// Creates a call database (a plain path: embedded engine; "host:path": through a server) and
// builds the tables, views and procedures in it. --demo adds contacts and calls to try things
// out; --calls adds N generated calls (large logs for measurements). Exit code 0 on success;
// otherwise a message on stderr and a non-zero code.

#include "db/DatabaseError.h"
#include "db/FbAttachment.h"
#include "db/Schema.h"
#include "db/SqlScript.h"
#include "tools/demo/DemoData.h"

#include <QCommandLineParser>
#include <QCoreApplication>
#include <QElapsedTimer>
#include <QFileInfo>

#include <cstdio>

namespace {

void print(FILE* to, const QString& text)
{
    std::fputs(text.toLocal8Bit().constData(), to);
    std::fputc('\n', to);
}

// "host:path" or "host/port:path" names a server; a Windows-style "C:\..." does not.
bool isServerName(const QString& name)
{
    if (name.startsWith(u'/') || name.startsWith(u'.'))
        return false;
    return name.indexOf(u':') > 1;
}

} // namespace

int main(int argc, char* argv[])
{
    QCoreApplication app(argc, argv);
    QCoreApplication::setApplicationName(QStringLiteral("orvanta-createdb"));
    QCoreApplication::setApplicationVersion(QStringLiteral(ORVANTA_VERSION));

    QCommandLineParser parser;
    parser.setApplicationDescription(
        QStringLiteral("Legt eine neue Orvanta-Datenbank an (Pfad: eingebettet, Server:Pfad: über einen Server)."));
    parser.addHelpOption();
    parser.addVersionOption();
    parser.addPositionalArgument(QStringLiteral("database"), QStringLiteral("Datenbankdatei oder Server:Pfad"));
    const QCommandLineOption userOpt(QStringLiteral("user"), QStringLiteral("Benutzername (Vorgabe SYSDBA)"),
                                     QStringLiteral("name"), QStringLiteral("SYSDBA"));
    const QCommandLineOption passwordOpt(QStringLiteral("password"), QStringLiteral("Kennwort (Vorgabe masterkey)"),
                                         QStringLiteral("password"), QStringLiteral("masterkey"));
    const QCommandLineOption demoOpt(QStringLiteral("demo"), QStringLiteral("Beispielkontakte und -anrufe eintragen"));
    parser.addOption(userOpt);
    parser.addOption(passwordOpt);
    const QCommandLineOption callsOpt(QStringLiteral("calls"), QStringLiteral("so viele erzeugte Anrufe eintragen"),
                                      QStringLiteral("n"));
    const QCommandLineOption seedOpt(QStringLiteral("seed"), QStringLiteral("Startwert der erzeugten Anrufe (Vorgabe 1)"),
                                     QStringLiteral("s"), QStringLiteral("1"));
    parser.addOption(demoOpt);
    parser.addOption(callsOpt);
    parser.addOption(seedOpt);
    parser.process(app);

    const QStringList args = parser.positionalArguments();
    if (args.size() != 1) {
        print(stderr, QStringLiteral("Bitte genau eine Datenbank angeben.\n") + parser.helpText());
        return 2;
    }
    const QString database = args.first();
    bool numbersOk = true;
    qint64 calls = 0;
    quint32 seed = 1;
    if (parser.isSet(callsOpt)) {
        bool ok = false;
        calls = parser.value(callsOpt).toLongLong(&ok);
        numbersOk = ok && calls >= 0;
    }
    {
        bool ok = false;
        seed = parser.value(seedOpt).toUInt(&ok);
        numbersOk = numbersOk && ok;
    }
    if (!numbersOk) {
        print(stderr, QStringLiteral("--calls und --seed erwarten eine nicht negative ganze Zahl."));
        return 2;
    }
    const QString user = parser.value(userOpt);
    const QString password = parser.value(passwordOpt);

    // The engine refuses an existing file too, but with a less helpful message.
    if (!isServerName(database) && QFileInfo::exists(database)) {
        print(stderr, QStringLiteral("Die Datei \"%1\" existiert bereits; sie wird nicht überschrieben.").arg(database));
        return 1;
    }

    try {
        orvanta::FbAttachment::createDatabase(database, user, password);
    } catch (const orvanta::AppException& e) {
        print(stderr, QStringLiteral("Die Datenbank \"%1\" konnte nicht angelegt werden:\n%2").arg(database, e.message()));
        return 1;
    }

    orvanta::FbAttachment db;
    try {
        db.attach(database, user, password);
        orvanta::SqlScript::run(db, orvanta::schemaScript());
    } catch (const orvanta::AppException& e) {
        print(stderr, QStringLiteral("Das Schema konnte nicht angelegt werden:\n%1").arg(e.message()));
        // A half-built database is of no use; remove it so the command can simply be repeated.
        try {
            if (db.isConnected())
                db.dropDatabase();
        } catch (const orvanta::AppException& dropError) {
            print(stderr, QStringLiteral("Die unvollständige Datenbank konnte nicht entfernt werden: %1")
                              .arg(dropError.message()));
        }
        return 1;
    }

    if (parser.isSet(demoOpt)) {
        try {
            const orvanta::demo::DemoStats s = orvanta::demo::fillDemo(db);
            print(stdout, QStringLiteral("Beispieldaten: %1 Kategorien, %2 Kontakte, %3 Rufnummern, %4 E-Mail-Adressen, "
                                         "%5 Anrufe (%6 mit Kontakt verknüpft).")
                              .arg(s.categories)
                              .arg(s.contacts)
                              .arg(s.numbers)
                              .arg(s.mails)
                              .arg(s.calls)
                              .arg(s.linkedCalls));
        } catch (const orvanta::AppException& e) {
            print(stderr, QStringLiteral("Die Beispieldaten konnten nicht eingetragen werden:\n%1").arg(e.message()));
            return 1;
        }
    }
    if (calls > 0) {
        try {
            QElapsedTimer timer;
            timer.start();
            const qint64 n = orvanta::demo::generateCalls(db, calls, seed);
            print(stdout, QStringLiteral("%1 Anrufe erzeugt in %2 s.").arg(n).arg(double(timer.elapsed()) / 1000.0, 0, 'f', 1));
        } catch (const orvanta::AppException& e) {
            print(stderr, QStringLiteral("Die Anrufe konnten nicht erzeugt werden:\n%1").arg(e.message()));
            return 1;
        }
    }
    try {
        db.disconnect();
    } catch (const orvanta::AppException& e) {
        print(stderr, QStringLiteral("Fehler beim Schließen der Datenbank: %1").arg(e.message()));
        return 1;
    }
    print(stdout, QStringLiteral("Datenbank \"%1\" wurde angelegt.").arg(database));
    return 0;
}
