// The settings program: what it saves is what the program reads (credentials the data module
// decrypts and connects with, the monitor's country and MSNs, the autostart entry), every file
// keeps what the program does not know, and bad input is refused with nothing written.

#include "db/CredentialCipher.h"
#include "db/TDM2.h"
#include "platform/Registry.h"
#include "platform/RufwarteIni.h"
#include "tests/support/ProgramTestEnv.h"
#include "tests/support/TestRegistry.h"
#include "tools/appsetup/AppSetupDialog.h"

#include <QCheckBox>
#include <QComboBox>
#include <QLabel>
#include <QLineEdit>
#include <QPushButton>
#include <QRadioButton>
#include <QTableWidget>
#include <QTest>

using namespace orvanta;
using namespace orvanta::appsetup;
using orvanta::test::ProgramTestEnv;

namespace {

template <typename T>
T* child(QWidget& w, const char* name)
{
    T* found = w.findChild<T*>(QLatin1String(name));
    if (found == nullptr)
        qFatal("no child %s", name);
    return found;
}

void setText(QWidget& w, const char* name, const QString& text)
{
    child<QLineEdit>(w, name)->setText(text);
}

void click(QWidget& w, const char* name)
{
    child<QPushButton>(w, name)->click();
}

void setMsns(QWidget& w, const QList<MsnRecord>& msns)
{
    auto* table = child<QTableWidget>(w, "tblMsns");
    table->setRowCount(0);
    for (const MsnRecord& msn : msns) {
        click(w, "btnMsnAdd");
        const int row = table->rowCount() - 1;
        table->item(row, 0)->setText(msn.MSN);
        table->item(row, 1)->setText(msn.Bezeichnung);
    }
}

QByteArray fileBytes(const QString& path)
{
    QFile f(path);
    return f.open(QIODevice::ReadOnly) ? f.readAll() : QByteArray();
}

// The registry key as stored in the stand-in file, value by value.
QString storedValue(const QString& name)
{
    Registry r(RegistryRoot::LocalMachine);
    return r.openKeyReadOnly(QString::fromLatin1(StoredConnection::kRegistryKey)) ? r.readString(name) : QString();
}

} // namespace

class TestAppSetup : public QObject {
    Q_OBJECT

private:
    QTemporaryDir m_config;

private Q_SLOTS:
    void init()
    {
        // The autostart entry goes to a private configuration folder.
        qputenv("XDG_CONFIG_HOME", QFile::encodeName(m_config.path()));
        QDir(m_config.path() + QStringLiteral("/autostart")).removeRecursively();
    }

    void databaseNamesSplitIntoServerAndPath()
    {
        const struct {
            const char* name;
            const char* server;
            const char* path;
        } cases[] = {
            {"/var/lib/orvanta/orvanta.fdb", "", "/var/lib/orvanta/orvanta.fdb"},
            {"srv:/data/orvanta.fdb", "srv", "/data/orvanta.fdb"},
            {"srv/3051:/data/a:b.fdb", "srv/3051", "/data/a:b.fdb"},
            {"orvanta", "", "orvanta"},
        };
        for (const auto& c : cases) {
            const DatabaseLocation at = splitDatabaseName(QString::fromUtf8(c.name));
            QCOMPARE(at.server, QString::fromUtf8(c.server));
            QCOMPARE(at.path, QString::fromUtf8(c.path));
            QCOMPARE(joinDatabaseName(at), QString::fromUtf8(c.name));
        }
        QCOMPARE(monitorCommandLine(QStringLiteral("/opt/Mein \"Orvanta\"/")),
                 QStringLiteral("\"/opt/Mein \\\"Orvanta\\\"/rufwarte\" run"));
        QCOMPARE(monitorCommandLine(QStringLiteral("/opt/o"), QStringLiteral("/opt/o/$reg.ini")),
                 QStringLiteral("env \"VARNIK_HKLM=/opt/o/\\$reg.ini\" \"/opt/o/rufwarte\" run"));
    }

    void savedCredentialsAreDecodedByTheDataModuleAndConnect()
    {
        ProgramTestEnv e(QDateTime(QDate(2024, 5, 15), QTime(12, 0)), ProgramTestEnv::ErrorLogSetup::None);
        // A key written by hand, with values the settings program does not know and credentials
        // that do not decrypt: the window says so and starts with empty fields.
        {
            Registry r(RegistryRoot::LocalMachine);
            QVERIFY(r.openKey(QStringLiteral("software\\Varnik\\rufwarte"), true));
            QVERIFY(r.writeStrings({{QStringLiteral("Database"), QStringLiteral("/nirgends/alt.fdb")},
                                    {QStringLiteral("Username"), QStringLiteral("A")},
                                    {QStringLiteral("Password"), QStringLiteral("B")},
                                    {QStringLiteral("BackupPath"), QStringLiteral("/srv/backup")}}));
        }
        AppSetupDialog dialog;
        QCOMPARE(dialog.settings().problems().size(), 1);
        QVERIFY(dialog.settings().problems().first().contains(QStringLiteral("Bitte geben Sie beide neu ein.")));
        QCOMPARE(child<QLineEdit>(dialog, "edDatabase")->text(), QStringLiteral("/nirgends/alt.fdb"));
        QVERIFY(child<QLineEdit>(dialog, "edUser")->text().isEmpty());
        QVERIFY(child<QRadioButton>(dialog, "rbEmbedded")->isChecked());
        QVERIFY(!child<QLineEdit>(dialog, "edServer")->isEnabled());

        setText(dialog, "edDatabase", e.db().path());
        setText(dialog, "edUser", QStringLiteral("SYSDBA"));
        setText(dialog, "edPassword", QStringLiteral("masterkey"));
        click(dialog, "btnTest");
        QCOMPARE(e.dialogs().last().kind, DialogKind::Information);
        QCOMPARE(child<QLabel>(dialog, "lblTestResult")->text(), QStringLiteral("Verbindung erfolgreich hergestellt."));
        // A test saves nothing.
        QCOMPARE(storedValue(QStringLiteral("Database")), QStringLiteral("/nirgends/alt.fdb"));

        click(dialog, "btnOK");
        QCOMPARE(dialog.result(), int(QDialog::Accepted));
        QCOMPARE(e.dialogs().last().text,
                 QStringLiteral("Die neue Datenbankverbindung gilt ab dem nächsten Start von Orvanta und der Rufwarte."));
        QCOMPARE(storedValue(QStringLiteral("Database")), e.db().path());
        QVERIFY(storedValue(QStringLiteral("Password")) != QStringLiteral("masterkey"));
        QCOMPARE(CredentialCipher::decrypt(storedValue(QStringLiteral("Username"))), QStringLiteral("SYSDBA"));
        QCOMPARE(storedValue(QStringLiteral("BackupPath")), QStringLiteral("/srv/backup"));

        TDM2 dm;
        QVERIFY(dm.IBDatabase1.isConnected());
        QCOMPARE(dm.IBDatabase1.databaseName(), e.db().path());
    }

    void aFailedTestSaysWhyInGerman()
    {
        ProgramTestEnv e(QDateTime(QDate(2024, 5, 15), QTime(12, 0)), ProgramTestEnv::ErrorLogSetup::None);
        AppSetupDialog dialog;
        QVERIFY(dialog.settings().problems().isEmpty());
        QCOMPARE(child<QLineEdit>(dialog, "edPassword")->text(), QStringLiteral("masterkey"));
        QVERIFY(!child<QPushButton>(dialog, "btnApply")->isEnabled());

        // The embedded engine trusts the local user, so a file that is no database is what fails.
        QVERIFY(e.writeFile(QStringLiteral("kaputt.fdb"), QByteArray(8192, 'x')));
        setText(dialog, "edDatabase", e.file(QStringLiteral("kaputt.fdb")));
        QVERIFY(!dialog.testConnection());
        QCOMPARE(e.dialogs().last().kind, DialogKind::Error);
        QVERIFY2(e.dialogs().last().text.startsWith(QStringLiteral("Keine Verbindung zur Datenbank \"%1\" möglich:\n")
                                                        .arg(e.file(QStringLiteral("kaputt.fdb")))),
                 qPrintable(e.dialogs().last().text));
        QCOMPARE(child<QLabel>(dialog, "lblTestResult")->text(), QStringLiteral("Verbindung fehlgeschlagen."));

        setText(dialog, "edDatabase", e.folder() + QStringLiteral("/fehlt.fdb"));
        QVERIFY(!dialog.testConnection());
        QCOMPARE(e.dialogs().last().text, QStringLiteral("Die Datenbankdatei \"%1/fehlt.fdb\" gibt es nicht.").arg(e.folder()));

        child<QRadioButton>(dialog, "rbServer")->setChecked(true);
        QVERIFY(child<QLineEdit>(dialog, "edServer")->isEnabled());
        setText(dialog, "edServer", QStringLiteral("127.0.0.1/1"));
        setText(dialog, "edDatabase", QStringLiteral("/data/orvanta.fdb"));
        QCOMPARE(dialog.values().connection.database, QStringLiteral("127.0.0.1/1:/data/orvanta.fdb"));
        QVERIFY(!dialog.testConnection());
        QVERIFY(e.dialogs().last().text.startsWith(QStringLiteral("Keine Verbindung zur Datenbank \"127.0.0.1/1:")));

        // Nothing was saved: the data module still connects with the old values.
        TDM2 dm;
        QVERIFY(dm.IBDatabase1.isConnected());
    }

    void monitorFilesKeepWhatTheProgramDoesNotKnow()
    {
        ProgramTestEnv e(QDateTime(QDate(2024, 5, 15), QTime(12, 0)), ProgramTestEnv::ErrorLogSetup::None);
        // Written by the monitor: comments, blanks around "=", keys and sections of its own.
        const QByteArray isdnStore = "; Rufwarte\r\n[MoniOptions]\r\nINCOMING_MSN_ONLY = 1\r\nSOUND=C:\\Klang\\ring.wav\r\n"
                                     "AC=1\r\nGEB=0,12\r\nUNBEKANNT=\xE4\xF6\xFC\r\n\r\n[CAPI]\r\nController=2\r\n";
        QVERIFY(e.writeFile(QStringLiteral("ISDNStore"), isdnStore));
        const QByteArray registry = fileBytes(Registry::filePath(RegistryRoot::LocalMachine));
        QVERIFY(!registry.isEmpty());

        AppSetupDialog dialog;
        auto* country = child<QComboBox>(dialog, "cbCountry");
        QCOMPARE(country->currentText(), QStringLiteral("Deutschland"));
        country->setCurrentIndex(1);
        QVERIFY(child<QPushButton>(dialog, "btnApply")->isEnabled());
        QVERIFY(dialog.apply());
        QVERIFY(!child<QPushButton>(dialog, "btnApply")->isEnabled());

        QByteArray expected = isdnStore;
        expected.replace("AC=1\r\n", "AC=2\r\n");
        QCOMPARE(e.readFile(QStringLiteral("ISDNStore")), expected);
        // The connection did not change, so the registry file was not touched.
        QCOMPARE(fileBytes(Registry::filePath(RegistryRoot::LocalMachine)), registry);

        TRufwarteIni read;
        read.SetProgramFolderFiles();
        QVERIFY(read.ReadFromIni());
        QCOMPARE(read.AC(), 2);
        QVERIFY(read.INCOMING_MSN_ONLY());
    }

    void aCountryItDoesNotOfferIsKept()
    {
        ProgramTestEnv e(QDateTime(QDate(2024, 5, 15), QTime(12, 0)), ProgramTestEnv::ErrorLogSetup::None);
        // Without "AC" the monitor settings read 0, which the country box does not offer.
        const QByteArray isdnStore = "[MoniOptions]\r\nDBL=4\r\n";
        QVERIFY(e.writeFile(QStringLiteral("ISDNStore"), isdnStore));
        AppSetupDialog dialog;
        QCOMPARE(child<QComboBox>(dialog, "cbCountry")->currentIndex(), -1);
        setMsns(dialog, {{QStringLiteral("301"), QStringLiteral("Büro")}});
        QVERIFY(dialog.apply());
        QCOMPARE(e.readFile(QStringLiteral("ISDNStore")), isdnStore);
        child<QComboBox>(dialog, "cbCountry")->setCurrentIndex(0);
        QVERIFY(dialog.apply());
        QCOMPARE(e.readFile(QStringLiteral("ISDNStore")), QByteArray("[MoniOptions]\r\nDBL=4\r\nAC=1\r\n"));
    }

    void msnsAndAutostartAreWhatTheMonitorReads()
    {
        ProgramTestEnv e(QDateTime(QDate(2024, 5, 15), QTime(12, 0)), ProgramTestEnv::ErrorLogSetup::None);
        AppSetupDialog dialog;
        QVERIFY(dialog.values().msns.isEmpty());
        QVERIFY(!child<QCheckBox>(dialog, "cbAutostart")->isChecked());

        const QList<MsnRecord> msns{{QStringLiteral("301234567"), QStringLiteral("Büro Straße")},
                                    {QStringLiteral("12345678901234567890"), QStringLiteral("Bezeichnung mit 30 Zeichen ..")}};
        setMsns(dialog, msns);
        child<QCheckBox>(dialog, "cbAutostart")->setChecked(true);
        QVERIFY(dialog.apply());
        // No settings file before, and the country did not change: none is made.
        QVERIFY(!QFile::exists(e.file(QStringLiteral("ISDNStore"))));
        QCOMPARE(e.readFile(QStringLiteral("msns")).size(), 2 * TRufwarteIni::kMsnRecordSize);

        TRufwarteIni read;
        read.SetProgramFolderFiles();
        QCOMPARE(read.MSNs(), msns);
        QVERIFY(read.IsAppInRun());
        QVERIFY(fileBytes(autostartEntryPath(QStringLiteral("rufwarte.exe")))
                    .contains("\nExec=env \"VARNIK_HKLM=" + QFile::encodeName(Registry::filePath(RegistryRoot::LocalMachine))
                              + "\" \"" + QFile::encodeName(e.folder()) + "/rufwarte\" run\n"));

        // Reopened, the window shows what was saved; removing a row and the autostart sticks.
        AppSetupDialog again;
        QCOMPARE(again.values().msns, msns);
        QVERIFY(child<QCheckBox>(again, "cbAutostart")->isChecked());
        auto* table = child<QTableWidget>(again, "tblMsns");
        table->setCurrentCell(0, 0);
        click(again, "btnMsnDelete");
        child<QCheckBox>(again, "cbAutostart")->setChecked(false);
        click(again, "btnOK");
        QCOMPARE(again.result(), int(QDialog::Accepted));
        read.ReadMSNSFromFile();
        QCOMPARE(read.MSNs(), msns.mid(1));
        QVERIFY(!read.IsAppInRun());
    }

    void badInputIsRefusedAndNothingIsWritten()
    {
        ProgramTestEnv e(QDateTime(QDate(2024, 5, 15), QTime(12, 0)), ProgramTestEnv::ErrorLogSetup::None);
        const QByteArray msnFile = encodeMsnFile({{QStringLiteral("301"), QStringLiteral("Alt")}});
        QVERIFY(e.writeFile(QStringLiteral("msns"), msnFile));
        const struct {
            const char* msn;
            const char* name;
            const char* message;
        } cases[] = {
            {"30-12", "Büro", "Die MSN \"30-12\" darf nur aus Ziffern bestehen, höchstens 20."},
            {"123456789012345678901", "Büro", "Die MSN \"123456789012345678901\" darf nur aus Ziffern bestehen, höchstens 20."},
            {"", "Fax", "Zur Bezeichnung \"Fax\" fehlt die MSN."},
            {"302", "Eine Bezeichnung mit 31 Zeichen.", "Die Bezeichnung \"Eine Bezeichnung mit 31 Zeichen.\" ist länger als 30 Zeichen."},
            {"302", "Büro ☎", "Die Bezeichnung \"Büro ☎\" enthält Zeichen, die nicht gespeichert werden können."},
        };
        for (const auto& c : cases) {
            AppSetupDialog dialog;
            setMsns(dialog, {{QString::fromUtf8(c.msn), QString::fromUtf8(c.name)}});
            click(dialog, "btnOK");
            QVERIFY(dialog.result() != QDialog::Accepted);
            QCOMPARE(e.dialogs().last().kind, DialogKind::Error);
            QCOMPARE(e.dialogs().last().text,
                     QStringLiteral("Die Einstellungen konnten nicht gespeichert werden.\n\n") + QString::fromUtf8(c.message));
            QCOMPARE(e.readFile(QStringLiteral("msns")), msnFile);
        }

        AppSetupDialog dialog;
        setMsns(dialog, {{QStringLiteral("301"), QStringLiteral("A")}, {QStringLiteral("301"), QStringLiteral("B")}});
        QVERIFY(!dialog.apply());
        QVERIFY(e.dialogs().last().text.endsWith(QStringLiteral("Die MSN \"301\" ist doppelt eingetragen.")));
        setMsns(dialog, {});
        setText(dialog, "edDatabase", QStringLiteral("relativ.fdb"));
        QVERIFY(!dialog.apply());
        QVERIFY(e.dialogs().last().text.endsWith(QStringLiteral("(er beginnt mit \"/\").")));
        setText(dialog, "edDatabase", e.db().path());
        setText(dialog, "edUser", QStringLiteral("  "));
        QVERIFY(!dialog.apply());
        QVERIFY(e.dialogs().last().text.endsWith(QStringLiteral("Bitte geben Sie den Benutzernamen an.")));
        QCOMPARE(e.readFile(QStringLiteral("msns")), msnFile);
        QCOMPARE(CredentialCipher::decrypt(storedValue(QStringLiteral("Username"))), QStringLiteral("SYSDBA"));
    }

    void filesThatCannotBeReadOrWrittenAreReported()
    {
        ProgramTestEnv e(QDateTime(QDate(2024, 5, 15), QTime(12, 0)), ProgramTestEnv::ErrorLogSetup::None);
        // A settings "file" that cannot be read is never replaced by one holding a single key.
        QVERIFY(QDir(e.folder()).mkdir(QStringLiteral("ISDNStore")));
        {
            AppSetupDialog dialog;
            child<QComboBox>(dialog, "cbCountry")->setCurrentIndex(2);
            QVERIFY(!dialog.apply());
            QCOMPARE(e.dialogs().last().text,
                     QStringLiteral("Die Einstellungen konnten nicht gespeichert werden.\n\nDie Datei \"%1\" kann nicht "
                                    "gelesen werden.")
                         .arg(e.file(QStringLiteral("ISDNStore"))));
            QVERIFY(QFileInfo(e.file(QStringLiteral("ISDNStore"))).isDir());
        }

        // A registry file whose folder cannot be made.
        QVERIFY(e.writeFile(QStringLiteral("datei"), "x"));
        const QString registry = e.file(QStringLiteral("datei/registry.ini"));
        qputenv("VARNIK_HKLM", QFile::encodeName(registry));
        AppSetupDialog dialog;
        setText(dialog, "edDatabase", e.db().path());
        setText(dialog, "edUser", QStringLiteral("SYSDBA"));
        setText(dialog, "edPassword", QStringLiteral("masterkey"));
        QVERIFY(!dialog.apply());
        QCOMPARE(e.dialogs().last().text,
                 QStringLiteral("Die Einstellungen konnten nicht gespeichert werden.\n\nDie Registrierungsdatei \"%1\" "
                                "kann nicht geschrieben werden.")
                     .arg(registry));
    }
};

ORVANTA_TEST(TestAppSetup)
#include "tst_appsetup.moc"
