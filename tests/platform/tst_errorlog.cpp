#include "platform/AppException.h"
#include "platform/BusyReset.h"
#include "platform/Clock.h"
#include "platform/ErrorLog.h"
#include "tests/support/ScriptedDialogService.h"
#include "tests/support/TestRegistry.h"

#include <QTemporaryDir>
#include <QTest>

using namespace orvanta;
using orvanta::test::ScopedScriptedDialogs;

namespace {

class DatabaseFailure final : public AppException {
public:
    using AppException::AppException;
    QString className() const override { return QStringLiteral("EIBInterBaseError"); }
};

QByteArray readAll(const QString& path)
{
    QFile f(path);
    return f.open(QIODevice::ReadOnly) ? f.readAll() : QByteArray();
}

void writeAll(const QString& path, const QByteArray& bytes)
{
    QFile f(path);
    QVERIFY(f.open(QIODevice::WriteOnly));
    f.write(bytes);
}

QByteArray header(const char* time)
{
    return QByteArray("\r\n\r\n***### - Session - ") + time + "\r\n\r\n";
}

const QString kCannotLog = QString::fromUtf8("Die Fehlerprotokollierung kann nicht durchgeführt werden.");

} // namespace

class TestErrorLog : public QObject {
    Q_OBJECT

    std::unique_ptr<QTemporaryDir> m_dir;
    std::unique_ptr<ScopedFixedClock> m_clock;
    std::unique_ptr<ScopedScriptedDialogs> m_dialogs;

    QString logPath() const { return m_dir->filePath(QStringLiteral("OXError.log")); }
    std::unique_ptr<TvkErrorLog> makeLog(int sessions = 20)
    {
        return std::make_unique<TvkErrorLog>(m_dir->path(), sessions, QStringLiteral("OXError.log"));
    }

private Q_SLOTS:
    void init()
    {
        m_dir = std::make_unique<QTemporaryDir>();
        m_clock = std::make_unique<ScopedFixedClock>(QDateTime(QDate(2024, 3, 5), QTime(7, 8, 9)));
        m_dialogs = std::make_unique<ScopedScriptedDialogs>();
    }
    void cleanup()
    {
        m_dialogs.reset();
        m_clock.reset();
        m_dir.reset();
        setErrorLog(nullptr);
    }

    void recordsAreWrittenByteForByte()
    {
        auto log = makeLog();
        QVERIFY(log->enabled());
        QCOMPARE(log->folder(), m_dir->path() + u'/');
        QCOMPARE(readAll(logPath()), header("05.03.2024 - 07:08:09"));

        Clock::setFixed(QDateTime(QDate(2024, 3, 5), QTime(17, 0, 1)));
        const DatabaseFailure failure(QString::fromUtf8("Verbindung verloren – Größe"));
        log->LogError(QString::fromUtf8("# Logframe - OpenDBonDay\r\nDas Öffnen schlug fehl."), &failure);
        log->ShowWarning(QStringLiteral("# Orvanta - ContDel"));
        const std::runtime_error plain("boom");
        log->LogError(QStringLiteral("# DM2 - GetDBData"), &plain);

        QCOMPARE(readAll(logPath()),
                 header("05.03.2024 - 07:08:09")
                     + "Error: 05.03.2024 - 17:00:01\r\n# Logframe - OpenDBonDay\r\nDas \xD6" "ffnen schlug fehl.\r\n"
                       "EIBInterBaseError / Verbindung verloren \x96 Gr\xF6\xDF" "e\r\n\r\n"
                       "Warning: 05.03.2024 - 17:00:01\r\n# Orvanta - ContDel\r\n\r\n"
                       "Error: 05.03.2024 - 17:00:01\r\n# DM2 - GetDBData\r\nException / boom\r\n\r\n");
        QCOMPARE(m_dialogs->service().count(), 1);
        QCOMPARE(m_dialogs->service().last().kind, DialogKind::Warning);
        QCOMPARE(m_dialogs->service().last().buttons, DialogButtons(DialogButton::Ok));
    }

    void showErrorShowsMessageWithExceptionAndResetsCursor()
    {
        auto log = makeLog();
        static int resets = 0;
        resets = 0;
        setBusyResetHandler([] { ++resets; });
        const DatabaseFailure failure(QStringLiteral("lock conflict"));
        log->ShowError(QStringLiteral("# DM2 - DBConnect\r\nKeine Verbindung zur Datenbank!"), &failure);
        setBusyResetHandler(nullptr);
        QCOMPARE(resets, 1);
        QCOMPARE(m_dialogs->service().texts(DialogKind::Error),
                 QStringList{QStringLiteral("# DM2 - DBConnect\r\nKeine Verbindung zur Datenbank!\r\n"
                                            "EIBInterBaseError / lock conflict")});
        QVERIFY(readAll(logPath()).endsWith("Keine Verbindung zur Datenbank!\r\nEIBInterBaseError / lock conflict\r\n\r\n"));
    }

    void emptyMessageWritesNothingButStillShows()
    {
        auto log = makeLog();
        const QByteArray before = readAll(logPath());
        log->LogError(QString());
        log->ShowError(QString());
        QCOMPARE(readAll(logPath()), before);
        QCOMPARE(m_dialogs->service().texts(), QStringList{QString()});
    }

    void keepsTheNewestSessions()
    {
        QByteArray old;
        for (int i = 1; i <= 25; ++i) {
            old += header(QStringLiteral("%1.01.2024 - 10:00:00").arg(i, 2, 10, QLatin1Char('0')).toLatin1().constData());
            old += "Error: x\r\nrun " + QByteArray::number(i) + "\r\n\r\n";
        }
        writeAll(logPath(), old);
        auto log = makeLog(20);
        QVERIFY(log->enabled());

        const QByteArray now = readAll(logPath());
        QCOMPARE(now.count("***### - Session - "), 20);
        QVERIFY(!now.contains("run 6\r\n"));
        QVERIFY(now.startsWith(header("07.01.2024 - 10:00:00") + "Error: x\r\nrun 7\r\n\r\n"));
        QVERIFY(now.endsWith("run 25\r\n\r\n" + header("05.03.2024 - 07:08:09")));
        QCOMPARE(m_dialogs->service().count(), 0);
    }

    void aRunThatLoggedNothingIsDroppedAtTheNextStart()
    {
        makeLog();
        Clock::setFixed(QDateTime(QDate(2024, 3, 6), QTime(8, 0, 0)));
        {
            auto log = makeLog();
            log->LogError(QStringLiteral("second run"));
        }
        Clock::setFixed(QDateTime(QDate(2024, 3, 7), QTime(9, 0, 0)));
        makeLog();
        QCOMPARE(readAll(logPath()),
                 header("06.03.2024 - 08:00:00") + "Error: 06.03.2024 - 08:00:00\r\nsecond run\r\n\r\n"
                     + header("07.03.2024 - 09:00:00"));

        // With one session kept, only the new header remains.
        makeLog(1);
        QCOMPARE(readAll(logPath()), header("07.03.2024 - 09:00:00"));
    }

    void textBeforeTheFirstSeparatorStaysWithTheFirstSession()
    {
        writeAll(logPath(), "stray\r\n" + header("01.01.2024 - 00:00:00") + "Error: a\r\nb\r\n\r\n");
        makeLog();
        QCOMPARE(readAll(logPath()), QByteArray("\r\n\r\n***### - Session - stray\r\n01.01.2024 - 00:00:00\r\n\r\n"
                                                "Error: a\r\nb\r\n\r\n")
                                         + header("05.03.2024 - 07:08:09"));
    }

    void missingFolderDisablesLoggingAfterOneDialog()
    {
        const QString missing = m_dir->filePath(QStringLiteral("gone"));
        TvkErrorLog log(missing, 20, QStringLiteral("OXError.log"));
        QVERIFY(!log.enabled());
        QCOMPARE(m_dialogs->service().texts(),
                 QStringList{QStringLiteral("vkErrorLog - InitialLogFile\r\nVerzeichnis der Fehlerprotokolldatei "
                                            "konnte nicht gefunden werden.\r\n") + kCannotLog});
        QDir().mkpath(missing);
        log.LogError(QStringLiteral("after"));
        log.ShowError(QStringLiteral("shown anyway"));
        QVERIFY(!QFile::exists(missing + QStringLiteral("/OXError.log")));
        QCOMPARE(m_dialogs->service().count(), 2);
        QCOMPARE(m_dialogs->service().last().text, QStringLiteral("shown anyway"));
    }

    void badParametersShowTheCreateDialog_data()
    {
        QTest::addColumn<QString>("folder");
        QTest::addColumn<int>("sessions");
        QTest::addColumn<QString>("file");
        QTest::newRow("no folder") << QString() << 20 << QStringLiteral("OXError.log");
        QTest::newRow("no file") << QStringLiteral("/tmp") << 20 << QString();
        QTest::newRow("no sessions") << QStringLiteral("/tmp") << 0 << QStringLiteral("OXError.log");
    }
    void badParametersShowTheCreateDialog()
    {
        QFETCH(QString, folder);
        QFETCH(int, sessions);
        QFETCH(QString, file);
        TvkErrorLog log(folder, sessions, file);
        QVERIFY(!log.enabled());
        QCOMPARE(m_dialogs->service().texts(),
                 QStringList{QStringLiteral("vkErrorLog - Create\r\nParameter sind nicht korrekt!\r\n") + kCannotLog});
    }

    void unwritableFileFailsPreparation()
    {
        // A directory in the file's place can be neither read nor rewritten.
        QDir().mkpath(logPath());
        auto log = makeLog();
        QVERIFY(!log->enabled());
        QCOMPARE(m_dialogs->service().count(), 1);
        QVERIFY(m_dialogs->service().last().text.startsWith(QStringLiteral("vkErrorLog - InitialLogFile\r\nFehlerprotokolldatei")));
        log->LogError(QStringLiteral("x"));
        QCOMPARE(m_dialogs->service().count(), 1);
    }

    void appendFailuresAreSilent()
    {
        auto log = makeLog();
        QFile::remove(logPath());
        log->LogError(QStringLiteral("lost"));
        QVERIFY(!QFile::exists(logPath()));
        QDir(m_dir->path()).removeRecursively();
        log->LogWarning(QStringLiteral("lost too"));
        QVERIFY(log->enabled());
        QCOMPARE(m_dialogs->service().count(), 0);
    }

    void sharedInstanceMayBeEmpty()
    {
        QVERIFY(errorLog() == nullptr);
        reportError(QStringLiteral("nobody listens"));
        logError(QStringLiteral("nobody listens"));
        QCOMPARE(m_dialogs->service().count(), 0);
        {
            auto log = makeLog();
            setErrorLog(log.get());
            reportWarning(QStringLiteral("# Orvanta - x"));
            QCOMPARE(m_dialogs->service().count(DialogKind::Warning), 1);
            QVERIFY(readAll(logPath()).endsWith("Warning: 05.03.2024 - 07:08:09\r\n# Orvanta - x\r\n\r\n"));
        }
        QVERIFY(errorLog() == nullptr);
    }
};

ORVANTA_TEST(TestErrorLog)
#include "tst_errorlog.moc"
