#include "platform/ProgramFolder.h"
#include "platform/Registry.h"
#include "tests/support/TestRegistry.h"

#include <QFile>
#include <QTemporaryDir>
#include <QTest>

using namespace orvanta;

namespace {

void writeFile(const QString& path, const QByteArray& bytes)
{
    QFile f(path);
    QVERIFY(f.open(QIODevice::WriteOnly));
    f.write(bytes);
}

} // namespace

class TestRegistry : public QObject {
    Q_OBJECT

    QTemporaryDir m_dir;

private Q_SLOTS:
    void init()
    {
        qputenv("VARNIK_HKLM", m_dir.filePath(QStringLiteral("hklm/registry.ini")).toUtf8());
        qputenv("VARNIK_HKCU", m_dir.filePath(QStringLiteral("hkcu/registry.ini")).toUtf8());
        qputenv("XDG_CONFIG_HOME", m_dir.filePath(QStringLiteral("config")).toUtf8());
        QDir(m_dir.path()).removeRecursively();
        QDir().mkpath(m_dir.path());
    }
    void cleanupTestCase()
    {
        qunsetenv("VARNIK_HKLM");
        qunsetenv("VARNIK_HKCU");
        qunsetenv("XDG_CONFIG_HOME");
    }

    void readsKeyCaseInsensitively()
    {
        QDir().mkpath(m_dir.filePath(QStringLiteral("hklm")));
        writeFile(Registry::filePath(RegistryRoot::LocalMachine),
                  "[SOFTWARE\\Varnik\\Rufwarte]\r\nDatabase=/var/lib/calls.fdb\r\nUsername=Y1d0SVh0ZlM=\r\n");
        Registry reg(RegistryRoot::LocalMachine);
        QVERIFY(reg.openKeyReadOnly(QStringLiteral("software\\Varnik\\rufwarte")));
        QCOMPARE(reg.readString(QStringLiteral("database")), QStringLiteral("/var/lib/calls.fdb"));
        QCOMPARE(reg.readString(QStringLiteral("Username")), QStringLiteral("Y1d0SVh0ZlM="));
        QCOMPARE(reg.readString(QStringLiteral("Password")), QString());
        QVERIFY(!reg.valueExists(QStringLiteral("Password")));
        QVERIFY(reg.openKeyReadOnly(QStringLiteral("\\software\\varnik\\RUFWARTE\\")));
        QVERIFY(!reg.openKeyReadOnly(QStringLiteral("software\\Varnik")));
        QCOMPARE(reg.readString(QStringLiteral("Database")), QString());
        QVERIFY(!reg.writeString(QStringLiteral("x"), QStringLiteral("y")));
    }

    void missingOrCorruptFileReadsEmpty()
    {
        Registry missing(RegistryRoot::LocalMachine);
        QVERIFY(!missing.openKeyReadOnly(QStringLiteral("software\\Varnik\\rufwarte")));
        QCOMPARE(missing.readString(QStringLiteral("Database")), QString());

        QDir().mkpath(m_dir.filePath(QStringLiteral("hklm")));
        writeFile(Registry::filePath(RegistryRoot::LocalMachine), QByteArray("\x00\xFF\xFE[\x01\x02\n=\n\x80\x81", 12));
        Registry corrupt(RegistryRoot::LocalMachine);
        QVERIFY(!corrupt.openKeyReadOnly(QStringLiteral("software\\Varnik\\rufwarte")));

        // A directory in place of the file is unreadable, not fatal.
        QDir().mkpath(Registry::filePath(RegistryRoot::CurrentUser));
        Registry dirInstead(RegistryRoot::CurrentUser);
        QVERIFY(!dirInstead.openKeyReadOnly(QStringLiteral("x")));
        QVERIFY(dirInstead.openKey(QStringLiteral("x"), true));
        QVERIFY(!dirInstead.writeString(QStringLiteral("a"), QStringLiteral("b")));
    }

    void writesCreateKeyAndFile()
    {
        {
            Registry reg(RegistryRoot::CurrentUser);
            QVERIFY(!reg.openKey(QStringLiteral("Software\\Varnik\\rufwarte"), false));
            QVERIFY(reg.openKey(QStringLiteral("Software\\Varnik\\rufwarte"), true));
            QVERIFY(reg.writeString(QStringLiteral("Password"), QStringLiteral("VDhaMFZIdzBBY1Vm")));
            QVERIFY(reg.writeString(QStringLiteral("Name"), QString::fromUtf8("Müller")));
        }
        Registry reader(RegistryRoot::CurrentUser);
        QVERIFY(reader.keyExists(QStringLiteral("software\\varnik\\rufwarte")));
        QVERIFY(reader.openKeyReadOnly(QStringLiteral("software\\varnik\\rufwarte")));
        QCOMPARE(reader.readString(QStringLiteral("password")), QStringLiteral("VDhaMFZIdzBBY1Vm"));
        QCOMPARE(reader.readString(QStringLiteral("name")), QString::fromUtf8("Müller"));
        // The other root is a different file.
        Registry machine(RegistryRoot::LocalMachine);
        QVERIFY(!machine.keyExists(QStringLiteral("software\\varnik\\rufwarte")));
    }

    void defaultPaths()
    {
        qunsetenv("VARNIK_HKLM");
        qunsetenv("VARNIK_HKCU");
        QCOMPARE(Registry::filePath(RegistryRoot::LocalMachine), QStringLiteral("/etc/xdg/Varnik/registry.ini"));
        QCOMPARE(Registry::filePath(RegistryRoot::CurrentUser), m_dir.filePath(QStringLiteral("config/Varnik/registry.ini")));
        // An installation folder holding the machine key: it is used.
        setProgramFolder(m_dir.path());
        writeFile(m_dir.filePath(QStringLiteral("registry.ini")), "[Software]\r\n");
        QCOMPARE(Registry::filePath(RegistryRoot::LocalMachine), m_dir.filePath(QStringLiteral("registry.ini")));
        setProgramFolder({});
    }

    void autostartEntry()
    {
        QVERIFY(!autostartEntryExists(QStringLiteral("rufwarte.exe")));
        QDir().mkpath(m_dir.filePath(QStringLiteral("config/autostart")));
        writeFile(m_dir.filePath(QStringLiteral("config/autostart/rufwarte.desktop")), "[Desktop Entry]\n");
        QVERIFY(autostartEntryExists(QStringLiteral("rufwarte.exe")));
        QVERIFY(autostartEntryExists(QStringLiteral("rufwarte")));
        QVERIFY(!autostartEntryExists(QString()));
        QVERIFY(!autostartEntryExists(QStringLiteral(".exe")));

        // Enabling keeps an entry that exists as it is; disabling removes it.
        QVERIFY(setAutostartEntry(QStringLiteral("rufwarte.exe"), true, QStringLiteral("Rufwarte"), QStringLiteral("x")));
        QFile kept(autostartEntryPath(QStringLiteral("rufwarte.exe")));
        QVERIFY(kept.open(QIODevice::ReadOnly));
        QCOMPARE(kept.readAll(), QByteArray("[Desktop Entry]\n"));
        kept.close();
        QVERIFY(setAutostartEntry(QStringLiteral("rufwarte.exe"), false, {}, {}));
        QVERIFY(!autostartEntryExists(QStringLiteral("rufwarte.exe")));
        QVERIFY(setAutostartEntry(QStringLiteral("rufwarte.exe"), false, {}, {}));

        QVERIFY(setAutostartEntry(QStringLiteral("rufwarte.exe"), true, QStringLiteral("Rufwarte"),
                                  QStringLiteral("\"/opt/o/rufwarte\" run")));
        QFile made(m_dir.filePath(QStringLiteral("config/autostart/rufwarte.desktop")));
        QVERIFY(made.open(QIODevice::ReadOnly));
        QCOMPARE(made.readAll(), QByteArray("[Desktop Entry]\nType=Application\nName=Rufwarte\nExec=\"/opt/o/rufwarte\" run\n"
                                            "X-GNOME-Autostart-enabled=true\n"));
        QVERIFY(!setAutostartEntry(QString(), true, {}, {}));
    }

    void severalValuesAreWrittenTogether()
    {
        QDir().mkpath(m_dir.filePath(QStringLiteral("hklm")));
        writeFile(m_dir.filePath(QStringLiteral("hklm/registry.ini")),
                  "; von Hand\r\n[software\\Varnik\\rufwarte]\r\nDatabase = /alt.fdb\r\nEigenes=1\r\n");
        Registry r(RegistryRoot::LocalMachine);
        QVERIFY(!r.writeStrings({{QStringLiteral("Database"), QStringLiteral("x")}}));
        QVERIFY(r.openKey(QStringLiteral("Software/Varnik/Rufwarte"), false));
        QVERIFY(r.writeStrings({{QStringLiteral("database"), QStringLiteral("/neu.fdb")},
                                {QStringLiteral("Username"), QStringLiteral("U")}}));
        QFile f(Registry::filePath(RegistryRoot::LocalMachine));
        QVERIFY(f.open(QIODevice::ReadOnly));
        QCOMPARE(f.readAll(), QByteArray("; von Hand\r\n[software\\Varnik\\rufwarte]\r\nDatabase=/neu.fdb\r\nEigenes=1\r\n"
                                         "Username=U\r\n"));
    }
};

ORVANTA_TEST(TestRegistry)
#include "tst_registry.moc"
