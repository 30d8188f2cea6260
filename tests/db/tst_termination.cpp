// SIGTERM in a program that ends through its own tear-down: the client library must leave the
// connections to that tear-down instead of cutting them from its own signal handler.

#include "db/SharedEngine.h"
#include "platform/TerminationSignals.h"
#include "tests/support/TempDatabase.h"
#include "tests/support/TestRegistry.h"

#include <QSignalSpy>
#include <QTest>

#include <csignal>

using namespace orvanta;

class TestTermination final : public QObject {
    Q_OBJECT

private Q_SLOTS:
    void theConnectionOutlivesTheSignal()
    {
        // The program's handler first, then the engine starts (it chains its own handler).
        TerminationSignals signals;
        QSignalSpy requested(&signals, &TerminationSignals::terminationRequested);
        keepConnectionsOnTerminationSignals();
        test::TempDatabase db;
        QCOMPARE(db.scalar(QStringLiteral("SELECT COUNT(*) FROM RDB$DATABASE")).toInt(), 1);

        std::raise(SIGTERM);
        QTRY_COMPARE(requested.count(), 1);
        QTest::qWait(1000); // time for the engine's shutdown thread, were it to run
        QCOMPARE(db.scalar(QStringLiteral("SELECT COUNT(*) FROM RDB$DATABASE")).toInt(), 1);
    }
};

ORVANTA_TEST(TestTermination)
#include "tst_termination.moc"
