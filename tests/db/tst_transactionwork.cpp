// Units of work on a real embedded database: committed whole, or rolled back whole and reported
// under the caller's label.

#include "db/DatabaseError.h"
#include "db/FbAttachment.h"
#include "db/FbStatement.h"
#include "db/FbTransaction.h"
#include "db/TransactionWork.h"
#include "platform/AppException.h"
#include "tests/support/ProgramTestEnv.h"
#include "tests/support/TestRegistry.h"

#include <QElapsedTimer>
#include <QFile>
#include <QTest>

#include <atomic>
#include <thread>

using namespace orvanta;
using orvanta::test::ProgramTestEnv;

namespace {

const QString kLabel = QStringLiteral("# Test - Kategorie speichern");

class Env final {
public:
    Env()
        : m_env(QDateTime(QDate(2024, 5, 15), QTime(12, 0)), ProgramTestEnv::ErrorLogSetup::Create)
    {
    }

    FbAttachment& db() { return m_env.db().attachment(); }
    test::ScriptedDialogService& dialogs() { return m_env.dialogs(); }

    void insert(FbTransaction& tx, int lid, const QString& name)
    {
        FbStatement st(db(), &tx, QStringLiteral("INSERT INTO KAT (LID, KATBEZ) VALUES (:LID, :NAME)"));
        st.setParam(u"LID", lid);
        st.setParam(u"NAME", name);
        st.execute();
    }
    // The categories as another connection sees them: only what was committed.
    QString committed()
    {
        auto other = m_env.db().newAttachment();
        FbTransaction tx(*other);
        tx.start();
        FbStatement st(*other, &tx,
                       QStringLiteral("SELECT LIST(KATBEZ, ',') FROM (SELECT KATBEZ FROM KAT ORDER BY LID)"));
        st.execute();
        const QString names = st.next() ? st.asString(0) : QStringLiteral("(no row)");
        tx.commit();
        return names;
    }
    QString errorLogText() const
    {
        QFile f(m_env.errorLog()->filePath());
        return f.open(QIODevice::ReadOnly) ? QString::fromLatin1(f.readAll()) : QString();
    }
    void exec(const QString& script) { m_env.db().exec(script); }
    std::unique_ptr<FbAttachment> otherAttachment() { return m_env.db().newAttachment(); }

private:
    ProgramTestEnv m_env;
};

} // namespace

class TstTransactionWork final : public QObject {
    Q_OBJECT

private Q_SLOTS:
    void commitsTheWholeUnit();
    void databaseErrorsRollBackAndAreReported();
    void thrownExceptionsRollBackAndAreReported();
    void declinedUnitIsRolledBackWithoutReport();
    void failedStartRunsNothing();
    void lockConflictsAreRunAgain_data();
    void lockConflictsAreRunAgain();
    void lastingLockConflictIsReportedOnce();
};

void TstTransactionWork::commitsTheWholeUnit()
{
    Env env;
    FbTransaction tx(env.db());
    // A change left over in the transaction is not carried into the unit.
    tx.start();
    env.insert(tx, 9, QStringLiteral("Liegengeblieben"));

    QVERIFY(runInTransaction(tx, kLabel, [&] {
        env.insert(tx, 1, QStringLiteral("Familie"));
        env.insert(tx, 2, QStringLiteral("Büro"));
    }));
    QVERIFY(!tx.isActive());
    QCOMPARE(env.committed(), QStringLiteral("Familie,Büro"));
    QCOMPARE(env.dialogs().count(), 0);
    QVERIFY(!env.errorLogText().contains(kLabel));

    // A unit that says it succeeded commits as well.
    QVERIFY(runInTransaction(tx, kLabel, [&] {
        env.insert(tx, 3, QStringLiteral("Sport"));
        return true;
    }));
    QCOMPARE(env.committed(), QStringLiteral("Familie,Büro,Sport"));
}

void TstTransactionWork::databaseErrorsRollBackAndAreReported()
{
    Env env;
    FbTransaction tx(env.db());

    // The second row breaks the key: the first one must not stay either.
    QVERIFY(!runInTransaction(tx, kLabel, [&] {
        env.insert(tx, 1, QStringLiteral("Familie"));
        env.insert(tx, 1, QStringLiteral("Doppelt"));
    }));
    QVERIFY(!tx.isActive());
    QCOMPARE(env.committed(), QString());
    QCOMPARE(env.dialogs().count(), 1);
    QCOMPARE(env.dialogs().last().kind, DialogKind::Error);
    QVERIFY2(env.dialogs().last().text.startsWith(kLabel + QStringLiteral("\r\nEIBInterBaseError / ")),
             qPrintable(env.dialogs().last().text));
    QVERIFY(env.errorLogText().contains(kLabel));

    // A commit the server refuses is rolled back the same way.
    env.exec(QStringLiteral("CREATE EXCEPTION E_REFUSED 'Kategorie abgelehnt'"));
    env.exec(QStringLiteral("SET TERM ^ ;\nCREATE TRIGGER KAT_REFUSE ON TRANSACTION COMMIT AS BEGIN "
                            "IF (EXISTS(SELECT * FROM KAT WHERE KATBEZ = 'Verboten')) THEN EXCEPTION E_REFUSED; "
                            "END^\nSET TERM ; ^"));
    QVERIFY(!runInTransaction(tx, kLabel, [&] {
        env.insert(tx, 1, QStringLiteral("Familie"));
        env.insert(tx, 2, QStringLiteral("Verboten"));
    }));
    QVERIFY(!tx.isActive());
    QCOMPARE(env.committed(), QString());
    QCOMPARE(env.dialogs().count(), 2);
    QVERIFY(env.dialogs().last().text.startsWith(kLabel + QStringLiteral("\r\n")));
    QVERIFY(env.dialogs().last().text.contains(QStringLiteral("Kategorie abgelehnt")));

    // Reported to the error log only: no dialog.
    const QString quiet = QStringLiteral("# Test - leise");
    QVERIFY(!runInTransaction(
        tx, quiet, [&] { env.insert(tx, 1, QStringLiteral("Verboten")); }, ErrorReport::Log));
    QVERIFY(!tx.isActive());
    QCOMPARE(env.dialogs().count(), 2);
    QVERIFY(env.errorLogText().contains(quiet));
    QCOMPARE(env.committed(), QString());
}

void TstTransactionWork::thrownExceptionsRollBackAndAreReported()
{
    Env env;
    FbTransaction tx(env.db());
    QVERIFY(!runInTransaction(tx, kLabel, [&] {
        env.insert(tx, 1, QStringLiteral("Familie"));
        throw AppException(QStringLiteral("Eingabe unvollständig"));
    }));
    QVERIFY(!tx.isActive());
    QCOMPARE(env.committed(), QString());
    QCOMPARE(env.dialogs().count(), 1);
    QCOMPARE(env.dialogs().last().text, kLabel + QStringLiteral("\r\nException / Eingabe unvollständig"));

    // Anything that is no std::exception is rolled back and passed on, unreported.
    try {
        runInTransaction(tx, kLabel, [&] {
            env.insert(tx, 1, QStringLiteral("Familie"));
            throw 42;
        });
        QFAIL("the exception was swallowed");
    } catch (int) {
    }
    QVERIFY(!tx.isActive());
    QCOMPARE(env.committed(), QString());
    QCOMPARE(env.dialogs().count(), 1);
}

void TstTransactionWork::declinedUnitIsRolledBackWithoutReport()
{
    Env env;
    FbTransaction tx(env.db());
    QVERIFY(!runInTransaction(tx, kLabel, [&] {
        env.insert(tx, 1, QStringLiteral("Familie"));
        return false;
    }));
    QVERIFY(!tx.isActive());
    QCOMPARE(env.committed(), QString());
    QCOMPARE(env.dialogs().count(), 0);
    QVERIFY(!env.errorLogText().contains(kLabel));
}

void TstTransactionWork::failedStartRunsNothing()
{
    Env env;
    FbTransaction tx(env.db());
    env.db().disconnect();
    bool ran = false;
    QVERIFY(!runInTransaction(tx, kLabel, [&] { ran = true; }));
    QVERIFY(!ran);
    QVERIFY(!tx.isActive());
    QCOMPARE(env.dialogs().last().text, kLabel + QStringLiteral("\r\nEIBInterBaseError / Database not connected"));

    // The failure half alone, for a transaction that may not exist.
    rollbackAndReport(nullptr, kLabel, DatabaseError(QStringLiteral("weg")));
    QCOMPARE(env.dialogs().last().text, kLabel + QStringLiteral("\r\nEIBInterBaseError / weg"));
}

void TstTransactionWork::lockConflictsAreRunAgain_data()
{
    QTest::addColumn<QStringList>("params");
    QTest::newRow("nowait: refused at once") << QStringList{QStringLiteral("concurrency"), QStringLiteral("nowait")};
    QTest::newRow("wait: update conflict when the other commits") << QStringList();
}

void TstTransactionWork::lockConflictsAreRunAgain()
{
    QFETCH(QStringList, params);
    Env env;
    env.exec(QStringLiteral("INSERT INTO KAT (LID, KATBEZ) VALUES (1, 'Familie');"));

    // The other writer (the monitor, a second desk) changes the row and commits a moment later.
    auto other = env.otherAttachment();
    std::atomic<bool> holding = false;
    std::thread writer([&] {
        FbTransaction tx(*other);
        tx.start();
        FbStatement st(*other, &tx, QStringLiteral("UPDATE KAT SET KATBEZ = 'Monitor' WHERE LID = 1"));
        st.execute();
        holding = true;
        std::this_thread::sleep_for(std::chrono::milliseconds(300));
        tx.commit();
    });
    while (!holding)
        std::this_thread::yield();

    FbTransaction tx(env.db(), params);
    int runs = 0;
    const bool saved = runInTransaction(tx, kLabel, [&] {
        ++runs;
        FbStatement st(env.db(), &tx, QStringLiteral("UPDATE KAT SET KATBEZ = KATBEZ || '+Programm' WHERE LID = 1"));
        st.execute();
    });
    writer.join();
    QVERIFY(saved);
    QVERIFY(runs >= 2);
    // Run again from a fresh snapshot: the other writer's change is kept, not overwritten.
    QCOMPARE(env.committed(), QStringLiteral("Monitor+Programm"));
    QCOMPARE(env.dialogs().count(), 0);
    QVERIFY(!env.errorLogText().contains(kLabel));
}

void TstTransactionWork::lastingLockConflictIsReportedOnce()
{
    Env env;
    env.exec(QStringLiteral("INSERT INTO KAT (LID, KATBEZ) VALUES (1, 'Familie');"));
    auto other = env.otherAttachment();
    FbTransaction otherTx(*other);
    otherTx.start();
    FbStatement hold(*other, &otherTx, QStringLiteral("DELETE FROM KAT WHERE LID = 1"));
    hold.execute();

    FbTransaction tx(env.db(), {QStringLiteral("concurrency"), QStringLiteral("nowait")});
    int runs = 0;
    QElapsedTimer timer;
    timer.start();
    QVERIFY(!runInTransaction(tx, kLabel, [&] {
        ++runs;
        FbStatement st(env.db(), &tx, QStringLiteral("UPDATE KAT SET KATBEZ = 'Programm' WHERE LID = 1"));
        st.execute();
    }));
    QCOMPARE(runs, detail::kLockConflictAttempts);
    QVERIFY2(timer.elapsed() >= 2000 && timer.elapsed() < 6000, qPrintable(QString::number(timer.elapsed())));
    QVERIFY(!tx.isActive());
    QCOMPARE(env.dialogs().count(), 1);
    QVERIFY2(env.dialogs().last().text.startsWith(kLabel + QStringLiteral("\r\nEIBInterBaseError / ")),
             qPrintable(env.dialogs().last().text));
    otherTx.rollback();

    // Any other failure is not run again.
    runs = 0;
    QVERIFY(!runInTransaction(tx, kLabel, [&] {
        ++runs;
        env.insert(tx, 1, QStringLiteral("Doppelt"));
    }));
    QCOMPARE(runs, 1);
    QCOMPARE(env.dialogs().count(), 2);
}

ORVANTA_TEST(TstTransactionWork)
#include "tst_transactionwork.moc"
