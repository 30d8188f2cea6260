// The programs the main window starts by their Windows names are found in a build's program
// folder and really run there.

#include "app/ProgramLauncher.h"
#include "tests/TestPaths.h"
#include "tests/support/ProgramTestEnv.h"
#include "tests/support/TestRegistry.h"

#include <QFileInfo>
#include <QProcess>
#include <QTest>

using namespace orvanta;

class TestCompanions : public QObject {
    Q_OBJECT

private Q_SLOTS:
    void companionProgramsAreFoundAndRun()
    {
        test::ProgramTestEnv env(QDateTime(QDate(2024, 5, 15), QTime(12, 0)), test::ProgramTestEnv::ErrorLogSetup::None);
        ProgramLauncher launcher;
        launcher.setStartFolder(QStringLiteral(ORVANTA_BIN_DIR "/"));
        for (const char* name : {"AppSetup", "About", "OEImp"}) {
            const QString program = launcher.resolve(QLatin1String(name) + QStringLiteral(".exe"));
            QCOMPARE(program, QStringLiteral(ORVANTA_BIN_DIR "/") + QLatin1String(name));
            QVERIFY(QFileInfo(program).isExecutable());

            // Started as the launcher starts it, it opens its window and waits for the user.
            QProcess process;
            QProcessEnvironment environment = QProcessEnvironment::systemEnvironment();
            environment.insert(QStringLiteral("QT_QPA_PLATFORM"), QStringLiteral("offscreen"));
            environment.insert(QStringLiteral("XDG_CONFIG_HOME"), env.file(QStringLiteral("config")));
            process.setProcessEnvironment(environment);
            process.setWorkingDirectory(launcher.startFolder());
            process.start(program, {});
            QVERIFY(process.waitForStarted());
            QVERIFY2(!process.waitForFinished(1500), process.readAllStandardError().constData());
            process.kill();
            process.waitForFinished();
        }
        QCOMPARE(env.dialogs().count(DialogKind::Error), 0);
    }
};

ORVANTA_TEST(TestCompanions)
#include "tst_companions.moc"
