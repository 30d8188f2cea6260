#include "app/MainWindowFeatures.h"
#include "app/Startup.h"
#include "platform/NamedMutex.h"
#include "tests/app/AppTestEnv.h"
#include "tests/TestPaths.h"
#include "tests/support/TestRegistry.h"

#include <QElapsedTimer>
#include <QFile>
#include <QFileInfo>
#include <QProcess>
#include <QTemporaryDir>
#include <QTest>

#include <csignal>

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

    void aSecondStartBringsTheRunningWindowForwardWithItsSwitch()
    {
        const QString built = QStringLiteral(ORVANTA_BIN_DIR "/orvanta");
        QVERIFY2(QFileInfo::exists(built), "the orvanta program is missing from the build");
        // This process is the first instance: it holds the mutex and its main window listens.
        test::AppTestEnv env;
        env.addCall(17, QStringLiteral("2024-05-14"), QStringLiteral("0891234567"));
        std::unique_ptr<NamedMutex> instance;
        QVERIFY(Startup::mayStart(instance));
        std::vector<MainWindowFeature> f = defaultMainWindowFeatures();
        f.push_back(test::plainWindows());
        TLogform& w = env.window({}, f);
        w.show();
        w.showMinimized();
        QVERIFY(w.isMinimized());

        QProcessEnvironment penv = QProcessEnvironment::systemEnvironment();
        penv.insert(QStringLiteral("QT_QPA_PLATFORM"), QStringLiteral("offscreen"));
        const auto secondStart = [&](const QStringList& parameters) {
            QProcess second;
            second.setProcessEnvironment(penv);
            second.start(built, parameters);
            if (!second.waitForFinished(10000) || second.exitStatus() != QProcess::NormalExit)
                return -1;
            // No dialog and nothing said.
            return second.readAll().isEmpty() ? second.exitCode() : -2;
        };
        QCOMPARE(secondStart({QStringLiteral("/co-17")}), 0);
        QTRY_VERIFY(!w.isMinimized());
        QTRY_VERIFY(!w.editWindows().allFree());
        QCOMPARE(w.editWindows().at(0)->property("callerNumber").toString(), QStringLiteral("0891234567"));
        QVERIFY(env.dialogs().texts().isEmpty());

        // A bad switch or one with more parameters only brings the window forward.
        w.showMinimized();
        QCOMPARE(secondStart({QStringLiteral("/co-x")}), 0);
        QTRY_VERIFY(!w.isMinimized());
        w.showMinimized();
        QCOMPARE(secondStart({QStringLiteral("/co-17"), QStringLiteral("x")}), 0);
        QTRY_VERIFY(!w.isMinimized());
        QTest::qWait(200);
        QCOMPARE(w.editWindows().size(), 1); // no second contact window
        QVERIFY(env.dialogs().texts().isEmpty());
    }

    void terminationEndsTheRunEvenUnderAMessageBox()
    {
        const QString built = QStringLiteral(ORVANTA_BIN_DIR "/orvanta");
        QVERIFY2(QFileInfo::exists(built), "the orvanta program is missing from the build");
        QTemporaryDir folder;
        const QString program = folder.filePath(QStringLiteral("orvanta"));
        QVERIFY(QFile::copy(built, program));
        QProcessEnvironment env = QProcessEnvironment::systemEnvironment();
        env.insert(QStringLiteral("QT_QPA_PLATFORM"), QStringLiteral("offscreen"));
        env.insert(QStringLiteral("VARNIK_HKLM"), folder.filePath(QStringLiteral("none.ini")));

        for (const int signalNumber : {SIGTERM, SIGINT}) {
            // Without a database the run stops in its first error box; the missing database, the
            // missing area-code files and "/co-x" have more boxes queued behind it.
            QProcess run;
            run.setProcessEnvironment(env);
            run.start(program, {QStringLiteral("/co-x")});
            QVERIFY(run.waitForStarted());
            const QString log = folder.filePath(QStringLiteral("OXError.log"));
            QTRY_VERIFY_WITH_TIMEOUT(NamedMutex::isHeld(QString::fromLatin1(Startup::InstanceMutexName)), 15000);
            QTest::qWait(1500);
            QCOMPARE(run.state(), QProcess::Running);

            QElapsedTimer t;
            t.start();
            ::kill(static_cast<pid_t>(run.processId()), signalNumber);
            QVERIFY(run.waitForFinished(2000));
            QVERIFY(t.elapsed() < 2000);
            QCOMPARE(run.exitStatus(), QProcess::NormalExit);
            QCOMPARE(run.exitCode(), 0);
            // The run ended through its tear-down: every queued box was passed (the last one is
            // the parameter check's), and the instance lock is free again.
            QVERIFY(readFile(log).contains("Übergabeparameter ist nicht korrekt!"));
            QVERIFY(!NamedMutex::isHeld(QString::fromLatin1(Startup::InstanceMutexName)));
            QFile::remove(log);
        }
    }

private:
    static QByteArray readFile(const QString& path)
    {
        QFile f(path);
        return f.open(QIODevice::ReadOnly) ? QString::fromLatin1(f.readAll()).toUtf8() : QByteArray();
    }

    std::unique_ptr<QTemporaryDir> m_runtime;
};

ORVANTA_TEST(TestStartup)
#include "tst_startup.moc"
