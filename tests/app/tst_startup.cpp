#include "app/Startup.h"
#include "platform/NamedMutex.h"
#include "tests/TestPaths.h"
#include "tests/support/TestRegistry.h"

#include <QElapsedTimer>
#include <QProcess>
#include <QTemporaryDir>
#include <QTest>

using namespace orvanta;

class TestStartup final : public QObject {
    Q_OBJECT

private Q_SLOTS:
    void init()
    {
        m_runtime = std::make_unique<QTemporaryDir>();
        qputenv("XDG_RUNTIME_DIR", m_runtime->path().toLocal8Bit());
    }

    void oneInstanceOnly()
    {
        std::unique_ptr<NamedMutex> first;
        QVERIFY(Startup::mayStart(first));
        QVERIFY(first && first->isOwned());
        std::unique_ptr<NamedMutex> second;
        QVERIFY(!Startup::mayStart(second));
        QVERIFY(!second);
        QVERIFY(first->isOwned()); // the first stays untouched
        first.reset();
        QVERIFY(Startup::mayStart(second));
    }

    void notWhileTheBackupToolRuns()
    {
        NamedMutex backup(QString::fromLatin1(Startup::BackupMutexName));
        QVERIFY(backup.isOwned());
        std::unique_ptr<NamedMutex> instance;
        QVERIFY(!Startup::mayStart(instance));
        QVERIFY(!NamedMutex::isHeld(QString::fromLatin1(Startup::InstanceMutexName)));
    }

    void aSecondProgramEndsAtOnceAndSilently()
    {
        const QString built = QStringLiteral(ORVANTA_BIN_DIR "/orvanta");
        QVERIFY2(QFileInfo::exists(built), "the orvanta program is missing from the build");
        // A copy, so that the program folder (its settings and error log) is a temporary one.
        QTemporaryDir folder;
        const QString program = folder.filePath(QStringLiteral("orvanta"));
        QVERIFY(QFile::copy(built, program));
        QProcessEnvironment env = QProcessEnvironment::systemEnvironment();
        env.insert(QStringLiteral("QT_QPA_PLATFORM"), QStringLiteral("offscreen"));
        env.insert(QStringLiteral("VARNIK_HKLM"), folder.filePath(QStringLiteral("none.ini")));
        QProcess first;
        first.setProcessEnvironment(env);
        first.start(program, {});
        QVERIFY(first.waitForStarted());
        QTRY_VERIFY_WITH_TIMEOUT(NamedMutex::isHeld(QString::fromLatin1(Startup::InstanceMutexName)), 10000);

        QProcess second;
        second.setProcessEnvironment(env);
        QElapsedTimer t;
        t.start();
        second.start(program, {QStringLiteral("/co-17")});
        QVERIFY(second.waitForFinished(5000));
        QCOMPARE(second.exitStatus(), QProcess::NormalExit);
        QCOMPARE(second.exitCode(), 0);
        QVERIFY(second.readAll().isEmpty());
        QVERIFY(t.elapsed() < 5000);

        QCOMPARE(first.state(), QProcess::Running);
        first.kill();
        first.waitForFinished(5000);
    }

private:
    std::unique_ptr<QTemporaryDir> m_runtime;
};

ORVANTA_TEST(TestStartup)
#include "tst_startup.moc"
