#include "platform/NamedMutex.h"
#include "tests/support/TestRegistry.h"

#include <QCoreApplication>
#include <QTemporaryDir>
#include <QDir>
#include <QFileInfo>
#include <QTest>

#include <sys/wait.h>
#include <unistd.h>

using namespace orvanta;

namespace {

// A second process that tries to take the mutex, reports 'H' (holds it) or 'E' (already
// exists), then waits for a byte from us and ends without running any destructor.
class OtherProcess final {
public:
    explicit OtherProcess(const QString& name)
    {
        if (::pipe(m_toChild) != 0 || ::pipe(m_toParent) != 0)
            qFatal("pipe failed");
        m_pid = ::fork();
        if (m_pid == 0) {
            char state = 'E';
            {
                // Never destroyed: the kernel must drop the lock when the process ends.
                auto* mutex = new NamedMutex(name);
                state = mutex->alreadyExists() ? 'E' : 'H';
            }
            (void)::write(m_toParent[1], &state, 1);
            char go = 0;
            (void)::read(m_toChild[0], &go, 1);
            ::_exit(0);
        }
    }
    ~OtherProcess() { finish(); }

    char state()
    {
        char state = 0;
        return ::read(m_toParent[0], &state, 1) == 1 ? state : '?';
    }
    void finish()
    {
        if (m_pid <= 0)
            return;
        const char go = 1;
        (void)::write(m_toChild[1], &go, 1);
        int status = 0;
        ::waitpid(m_pid, &status, 0);
        m_pid = -1;
        for (int fd : {m_toChild[0], m_toChild[1], m_toParent[0], m_toParent[1]})
            ::close(fd);
    }

private:
    pid_t m_pid = -1;
    int m_toChild[2] = {-1, -1};
    int m_toParent[2] = {-1, -1};
};

} // namespace

class TestNamedMutex : public QObject {
    Q_OBJECT

    QTemporaryDir m_runtime;
    QByteArray m_savedRuntime;

private Q_SLOTS:
    void initTestCase()
    {
        m_savedRuntime = qgetenv("XDG_RUNTIME_DIR");
        qputenv("XDG_RUNTIME_DIR", m_runtime.path().toUtf8());
    }
    void cleanupTestCase()
    {
        if (m_savedRuntime.isEmpty())
            qunsetenv("XDG_RUNTIME_DIR");
        else
            qputenv("XDG_RUNTIME_DIR", m_savedRuntime);
    }

    void anotherProcessHoldingItMeansAlreadyExists()
    {
        const QString name = QStringLiteral("Varnik Orvanta");
        QVERIFY(!NamedMutex::isHeld(name));
        OtherProcess other(name);
        QCOMPARE(other.state(), 'H');
        QVERIFY(NamedMutex::isHeld(name));
        {
            NamedMutex second(name);
            QVERIFY(second.alreadyExists());
            QVERIFY(!second.isOwned());
        }
        // The holder ends without releasing; its lock goes with it.
        other.finish();
        QVERIFY(!NamedMutex::isHeld(name));
        NamedMutex now(name);
        QVERIFY(now.isOwned());
        QVERIFY(!now.alreadyExists());
    }

    void heldHereBlocksAnotherProcessUntilReleased()
    {
        const QString name = QStringLiteral("Varnik Rufwarte Backup&Restore");
        auto mine = std::make_unique<NamedMutex>(name);
        QVERIFY(mine->isOwned());
        {
            OtherProcess other(name);
            QCOMPARE(other.state(), 'E');
        }
        mine.reset();
        OtherProcess other(name);
        QCOMPARE(other.state(), 'H');
    }

    void withoutARuntimeFolderTheLockIsInAPrivateOne()
    {
        // Another user's lock in a folder all users share would end this user's start silently.
        qunsetenv("XDG_RUNTIME_DIR");
        // A name of its own: the user's running program may hold "Varnik Orvanta" in that folder.
        const QString name = QStringLiteral("Varnik Orvanta Test %1").arg(QCoreApplication::applicationPid());
        const QFileInfo folder(QFileInfo(NamedMutex::lockFilePath(name)).path());
        {
            NamedMutex held(name);
            QVERIFY(held.isOwned());
        }
        qputenv("XDG_RUNTIME_DIR", m_runtime.path().toUtf8());
        QVERIFY(folder.isDir());
        QVERIFY(folder.absoluteFilePath() != QDir::tempPath());
        QCOMPARE(folder.ownerId(), ::getuid());
        const auto shared = QFile::ReadGroup | QFile::WriteGroup | QFile::ExeGroup | QFile::ReadOther
            | QFile::WriteOther | QFile::ExeOther;
        QCOMPARE(folder.permissions() & shared, QFileDevice::Permissions());
    }

    void namesAreKeptApartAndFileSafe()
    {
        const QString a = NamedMutex::lockFilePath(QStringLiteral("Varnik Rufwarte Backup&Restore"));
        QVERIFY(a.startsWith(m_runtime.path() + u'/'));
        QVERIFY(!a.mid(m_runtime.path().size() + 1).contains(u'/'));
        QVERIFY(!a.contains(u' ') && !a.contains(u'&'));
        QVERIFY(a != NamedMutex::lockFilePath(QStringLiteral("Varnik Rufwarte Backup_Restore")));
        QVERIFY(NamedMutex::lockFilePath(QStringLiteral("../../etc/x")).startsWith(m_runtime.path() + QStringLiteral("/orvanta-")));

        NamedMutex one(QStringLiteral("one"));
        NamedMutex two(QStringLiteral("two"));
        QVERIFY(one.isOwned() && two.isOwned());
        // A second holder in the same process is refused as well.
        NamedMutex again(QStringLiteral("one"));
        QVERIFY(again.alreadyExists());
    }
};

ORVANTA_TEST(TestNamedMutex)
#include "tst_namedmutex.moc"
