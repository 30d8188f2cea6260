#include "calllog/Tlogframe.h"
#include "db/BackgroundFetch.h"
#include "tests/calllog/LogTestEnv.h"
#include "tests/support/TestRegistry.h"
#include "ui/grid/GridCollation.h"
#include "ui/grid/GridController.h"
#include "ui/grid/GridView.h"

#include <QElapsedTimer>
#include <QSet>
#include <QTest>

using namespace orvanta;
using orvanta::test::LogTestEnv;
using orvanta::test::waitForLog;

namespace {

constexpr int kCalls = 3000;

// Calls 1..count, fifty a day back from today, the latest with the highest key; callers repeat.
void fillLog(LogTestEnv& env, int count)
{
    env.db().exec(QStringLiteral(
                      "SET TERM ^ ;\nEXECUTE BLOCK AS DECLARE I INTEGER = 1; BEGIN WHILE (I <= %1) DO BEGIN "
                      "INSERT INTO LOG (LID, TSDATE, TSTIME, FROMBEZ, FROMPHONE, CTYPE, SERVICE, ONBEZ, STATUS) "
                      "VALUES (:I, DATEADD(-((%1 - :I) / 50) DAY TO DATE '2024-05-15'), "
                      "DATEADD(MOD(:I - 1, 50) * 10 MINUTE TO TIME '08:00:00'), 'Anrufer ' || MOD(:I * 7919, 97), "
                      "'030' || :I, MOD(:I, 2), 1, 'Büro', 'angenommen'); I = I + 1; END END^\nSET TERM ; ^")
                      .arg(count));
}

// The pause after each batch, for one test.
class BatchDelay final {
public:
    explicit BatchDelay(int ms) { BackgroundFetch::setBatchDelayForTests(ms); }
    ~BatchDelay() { BackgroundFetch::setBatchDelayForTests(0); }
    BatchDelay(const BatchDelay&) = delete;
    BatchDelay& operator=(const BatchDelay&) = delete;
};

int column(const Tlogframe& f, const char* field)
{
    return f.controller()->columnByName(QStringLiteral("cxGrid1DBTableView1") + QLatin1String(field));
}

int lidAt(const Tlogframe& f, int row)
{
    const GridController* g = f.controller();
    const int record = g->recordAt(row);
    return record < 0 ? -1
                      : static_cast<int>(g->source()->intValue(static_cast<quint32>(record),
                                                              g->source()->fieldIndex(u"LID")));
}

QList<int> lids(const Tlogframe& f)
{
    QList<int> out;
    for (int r = 0; r < f.controller()->rowCount(); ++r)
        out << lidAt(f, r);
    return out;
}

test::MessageRecorder::Message lastStatus(LogTestEnv& env)
{
    env.host().flush();
    const auto status = env.host().of(WMSTATUSPANEL);
    return status.isEmpty() ? test::MessageRecorder::Message{0, -1, -1} : status.last();
}

bool waitForRows(const Tlogframe& f)
{
    QElapsedTimer t;
    t.start();
    while (f.controller()->rowCount() == 0 && t.elapsed() < 20000)
        QCoreApplication::processEvents(QEventLoop::AllEvents, 10);
    return f.controller()->rowCount() > 0;
}

} // namespace

class TstLogLoading final : public QObject {
    Q_OBJECT

private Q_SLOTS:
    void firstRowsShowWhileTheRestArrivesAndASortHolds();
    void callsInsertedWhileLoadingAppearOnce();
    void dayDeletedWhileLoadingGoesAfterIt();
    void refreshReadsOnlyWhatChanged();
    void closingMidFetchStopsTheReadAtOnce();
    void databaseGoneMidFetchKeepsTheRowsThatArrived();
};

void TstLogLoading::firstRowsShowWhileTheRestArrivesAndASortHolds()
{
    LogTestEnv env;
    fillLog(env, kCalls);
    BatchDelay delay(150);
    Tlogframe f(&env.dm());
    f.resize(900, 600);
    f.show();
    QVERIFY(f.Firstep(&env.host()));
    QVERIFY(f.isLoading());
    QVERIFY(waitForRows(f));
    QVERIFY(f.isLoading());
    // The newest calls come first: the screen a user looks at is complete already.
    const int shown = f.controller()->rowCount();
    QVERIFY(shown < kCalls);
    QCOMPARE(lids(f).mid(0, 5), (QList<int>{3000, 2999, 2998, 2997, 2996}));
    QCOMPARE(env.dm().CurLogLID, 3000);
    QVERIFY(!f.view()->viewport()->grab().isNull());
    QCOMPARE(lastStatus(env).lParam, kStatusLogLoading);
    QCOMPARE(lastStatus(env).wParam, shown);

    // A sort clicked while loading holds for the rows that arrive later.
    GridController* g = f.controller();
    const int caller = column(f, "FROMBEZ");
    g->headerClicked(caller, Qt::NoModifier);
    QVERIFY(f.isLoading());
    QVERIFY(waitForLog(env.dm()));
    QCOMPARE(g->sortedColumns(), std::vector<int>{caller});
    const QList<int> merged = lids(f);
    QCOMPARE(merged.size(), kCalls);
    QCOMPARE(QSet<int>(merged.begin(), merged.end()).size(), kCalls);
    for (int r = 1; r < g->rowCount(); ++r)
        QVERIFY(gridcollation::compare(g->displayText(r - 1, caller).toLatin1(), g->displayText(r, caller).toLatin1())
                <= 0);
    // Ties among the callers stand as a fresh sort of the whole log puts them.
    g->reapply();
    QCOMPARE(lids(f), merged);
    QCOMPARE(lastStatus(env).wParam, kCalls);
    QCOMPARE(lastStatus(env).lParam, 0);
    QVERIFY(!f.isIncomplete());
}

void TstLogLoading::callsInsertedWhileLoadingAppearOnce()
{
    LogTestEnv env;
    fillLog(env, kCalls);
    BatchDelay delay(150);
    Tlogframe f(&env.dm());
    QVERIFY(f.Firstep(&env.host()));
    QVERIFY(waitForRows(f));
    // The monitor logs a call and says so while the log still arrives.
    env.addCall(kCalls + 1, "'2024-05-15'", "'23:00:00'", "'Neu'", "'0301'");
    f.Refresh_View(kCalls + 1);
    QVERIFY(f.isLoading());
    QVERIFY(waitForLog(env.dm()));
    const QList<int> all = lids(f);
    QCOMPARE(all.size(), kCalls + 1);
    QCOMPARE(all.count(kCalls + 1), 1);
    QCOMPARE(all.first(), kCalls + 1);
    QCOMPARE(env.dm().CurLogLID, kCalls + 1);
    QCOMPARE(lastStatus(env).wParam, kCalls + 1);
    QCOMPARE(lastStatus(env).lParam, 0);
}

void TstLogLoading::dayDeletedWhileLoadingGoesAfterIt()
{
    LogTestEnv env;
    fillLog(env, kCalls);
    BatchDelay delay(150);
    Tlogframe f(&env.dm());
    QVERIFY(f.Firstep(&env.host()));
    QVERIFY(waitForRows(f));
    // The newest day, on screen already, is deleted while older days still arrive.
    env.db().exec(QStringLiteral("DELETE FROM LOG WHERE TSDATE = '2024-05-15'"));
    f.Refresh_View(0);
    QVERIFY(waitForLog(env.dm()));
    QVERIFY(waitForLog(env.dm())); // the log is read again once the first reading is through
    const QList<int> all = lids(f);
    QCOMPARE(all.size(), kCalls - 50);
    QCOMPARE(all.first(), kCalls - 50);
    QCOMPARE(QSet<int>(all.begin(), all.end()).size(), kCalls - 50);
    QCOMPARE(lastStatus(env).wParam, kCalls - 50);
    QCOMPARE(lastStatus(env).lParam, 0);
}

void TstLogLoading::refreshReadsOnlyWhatChanged()
{
    LogTestEnv env;
    fillLog(env, 500);
    Tlogframe f(&env.dm());
    QVERIFY(test::firstep(f, env));
    GridController* g = f.controller();
    g->setFocusedRow(10);
    const int focused = env.dm().CurLogLID;
    QCOMPARE(focused, 490);

    // One new call: one row read, the focus stays on its call.
    qint64 before = DataSet::rowsRead();
    env.addCall(501, "'2024-05-15'", "'23:00:00'", "'Neu'", "'0301'");
    f.Refresh_View(0);
    QVERIFY(!f.isLoading());
    QCOMPARE(DataSet::rowsRead() - before, 1);
    QCOMPARE(g->rowCount(), 501);
    QCOMPARE(env.dm().CurLogLID, focused);
    QCOMPARE(lidAt(f, 0), 501);
    // Nothing new: nothing read.
    before = DataSet::rowsRead();
    f.Refresh_View(0);
    QCOMPARE(DataSet::rowsRead() - before, 0);

    // Another program changes a call: the log is read again, the rows held stay meanwhile.
    env.db().exec(QStringLiteral("UPDATE LOG SET BEMERK = 'geändert' WHERE LID = 7"));
    before = DataSet::rowsRead();
    f.Refresh_View(0);
    QCOMPARE(g->rowCount(), 501);
    QVERIFY(waitForLog(env.dm()));
    QCOMPARE(DataSet::rowsRead() - before, 501);
    const int bemerk = column(f, "BEMERK");
    QCOMPARE(g->cellText(static_cast<quint32>(g->locate(7)), bemerk), QStringLiteral("geändert"));
    QCOMPARE(env.dm().CurLogLID, focused);

    // A call deleted elsewhere goes; a new one after it is read alone again.
    env.db().exec(QStringLiteral("DELETE FROM LOG WHERE LID = 8"));
    f.Refresh_View(0);
    QVERIFY(waitForLog(env.dm()));
    QCOMPARE(g->rowCount(), 500);
    QCOMPARE(g->locate(8), -1);
    env.addCall(502, "'2024-05-15'", "'23:30:00'", "'Neuer'", "'0302'");
    before = DataSet::rowsRead();
    f.Refresh_View(502);
    QCOMPARE(DataSet::rowsRead() - before, 1);
    QCOMPARE(env.dm().CurLogLID, 502);
    QCOMPARE(lastStatus(env).wParam, 501);
    QCOMPARE(lastStatus(env).lParam, 0);
}

void TstLogLoading::closingMidFetchStopsTheReadAtOnce()
{
    QElapsedTimer t;
    {
        LogTestEnv env;
        fillLog(env, kCalls);
        BatchDelay delay(10000);
        {
            // Leaving the view (the contacts, or closing the window) stores it and closes the log.
            Tlogframe f(&env.dm());
            QVERIFY(f.Firstep(&env.host()));
            QVERIFY(waitForRows(f));
            t.start();
            QVERIFY(f.StoreLogView());
            QVERIFY(t.elapsed() < 2000);
            QVERIFY(!f.isLoading());
            QVERIFY(!env.dm().ibcds_log.isActive());
        }
        // The data module going down while a read runs ends it too.
        Tlogframe f(&env.dm());
        QVERIFY(f.Firstep(&env.host()));
        QVERIFY(waitForRows(f));
        t.start();
    }
    QVERIFY(t.elapsed() < 2000);
}

void TstLogLoading::databaseGoneMidFetchKeepsTheRowsThatArrived()
{
    LogTestEnv env;
    fillLog(env, kCalls);
    BatchDelay delay(300);
    Tlogframe f(&env.dm());
    QVERIFY(f.Firstep(&env.host()));
    QVERIFY(waitForRows(f));
    // Every other connection is cut, the reading one among them.
    env.db().exec(QStringLiteral("DELETE FROM MON$ATTACHMENTS WHERE MON$ATTACHMENT_ID <> CURRENT_CONNECTION"));
    QVERIFY(waitForLog(env.dm()));
    const int kept = f.controller()->rowCount();
    QVERIFY(kept > 0);
    QVERIFY(kept < kCalls);
    QVERIFY(f.isIncomplete());
    QCOMPARE(lastStatus(env).wParam, kept);
    QCOMPARE(lastStatus(env).lParam, kStatusLogIncomplete);
    QCOMPARE(env.dialogs().count(), 1);
    QVERIFY(env.dialogs().last().text.startsWith(QStringLiteral("# Logframe - Firstep")));
    QVERIFY(env.errorLogText().contains(QStringLiteral("# Logframe - Firstep")));
    // The frame stays usable on what it holds.
    f.SetNewFilter(2);
    f.SetNewFilter(0);
    QCOMPARE(f.controller()->rowCount(), kept);
}

ORVANTA_TEST(TstLogLoading)
#include "tst_logloading.moc"
