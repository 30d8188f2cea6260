#include "phone/RouterCallMonitor.h"
#include "tests/support/TestRegistry.h"

#include <QTest>

using namespace orvanta;

namespace {

RouterEvent routerEvent(const char* line)
{
    QString reason;
    const std::optional<RouterEvent> e = parseRouterLine(line, &reason);
    if (!e)
        qFatal("not an event: %s (%s)", line, qPrintable(reason));
    return *e;
}

// Feeds lines to a tracker and collects what ends and what it notes.
struct Session {
    RouterCallTracker tracker;
    QList<RouterCall> ended;
    QStringList notes;

    void operator()(const char* line) { ended += tracker.handle(routerEvent(line), &notes); }
};

} // namespace

class TestRouterCallMonitor : public QObject {
    Q_OBJECT

private Q_SLOTS:
    void readsTheFourEvents()
    {
        const RouterEvent ring = routerEvent("07.12.26 10:15:02;RING;0;030123456;3012345670;SIP0;");
        QCOMPARE(ring.kind, RouterEvent::Kind::Ring);
        QCOMPARE(ring.time, QDateTime(QDate(2026, 12, 7), QTime(10, 15, 2)));
        QCOMPARE(ring.remoteNumber, QStringLiteral("030123456"));
        QCOMPARE(ring.ownNumber, QStringLiteral("3012345670"));
        QCOMPARE(ring.line, QStringLiteral("SIP0"));

        const RouterEvent call = routerEvent("31.01.27 23:59:59;CALL;3;4;3012345671;+4930999;SIP1;\r");
        QCOMPARE(call.kind, RouterEvent::Kind::Call);
        QCOMPARE(call.id, 3);
        QCOMPARE(call.extension, QStringLiteral("4"));
        QCOMPARE(call.ownNumber, QStringLiteral("3012345671"));
        QCOMPARE(call.remoteNumber, QStringLiteral("+4930999"));

        const RouterEvent connect = routerEvent("31.01.27 23:59:59;CONNECT;3;4;+4930999;");
        QCOMPARE(connect.kind, RouterEvent::Kind::Connect);
        const RouterEvent end = routerEvent("01.02.27 00:10:00;DISCONNECT;3;601;");
        QCOMPARE(end.kind, RouterEvent::Kind::Disconnect);
        QCOMPARE(end.seconds, 601);

        // A withheld caller is an empty field, not a bad line.
        QVERIFY(routerEvent("07.12.26 10:15:02;RING;1;;3012345670;SIP0;").remoteNumber.isEmpty());
    }

    void junkIsRefusedWithAReason_data()
    {
        QTest::addColumn<QByteArray>("line");
        QTest::newRow("empty") << QByteArray();
        QTest::newRow("text") << QByteArray("hello router");
        QTest::newRow("no time") << QByteArray(";RING;0;1;2;SIP0;");
        QTest::newRow("day 32") << QByteArray("32.12.26 10:00:00;RING;0;1;2;SIP0;");
        QTest::newRow("hour 24") << QByteArray("07.12.26 24:00:00;RING;0;1;2;SIP0;");
        QTest::newRow("unknown event") << QByteArray("07.12.26 10:00:00;HANGUP;0;1;");
        QTest::newRow("lower-case event") << QByteArray("07.12.26 10:00:00;ring;0;1;2;SIP0;");
        QTest::newRow("negative id") << QByteArray("07.12.26 10:00:00;RING;-1;1;2;SIP0;");
        QTest::newRow("huge id") << QByteArray("07.12.26 10:00:00;RING;99999999999;1;2;SIP0;");
        QTest::newRow("letters in number") << QByteArray("07.12.26 10:00:00;RING;0;0301x;2;SIP0;");
        QTest::newRow("number too long") << QByteArray("07.12.26 10:00:00;RING;0;03012345678901234567890123;2;");
        QTest::newRow("RING cut short") << QByteArray("07.12.26 10:00:00;RING;0;030;");
        QTest::newRow("CALL cut short") << QByteArray("07.12.26 10:00:00;CALL;0;1;301;");
        QTest::newRow("duration not a number") << QByteArray("07.12.26 10:00:00;DISCONNECT;0;12s;");
        QTest::newRow("NUL bytes") << QByteArray("07.12.26 10:00:00;RING;0;0\0" "30;301;", 30);
    }

    void junkIsRefusedWithAReason()
    {
        QFETCH(QByteArray, line);
        QString reason;
        QVERIFY(!parseRouterLine(line, &reason));
        QVERIFY(!reason.isEmpty());
    }

    void splitsTheStreamIntoLines()
    {
        RouterLineSplitter s(64);
        // Half lines wait for their rest; "\r\n" and "\n" both end a line.
        QVERIFY(s.feed("07.12.26 10:00:00;RI").isEmpty());
        QCOMPARE(s.pendingBytes(), 20);
        QCOMPARE(s.feed("NG;0;1;2;\r\nsecond\nthi"),
                 (QList<QByteArray>{"07.12.26 10:00:00;RING;0;1;2;", "second"}));
        QCOMPARE(s.feed("rd\n"), QList<QByteArray>{"third"});
        QCOMPARE(s.pendingBytes(), 0);

        // An over-long line is dropped as it arrives, however long it grows; the next one counts.
        const QByteArray megabyte(1 << 20, 'x');
        for (int i = 0; i < 8; ++i) {
            QVERIFY(s.feed(megabyte).isEmpty());
            QVERIFY(s.pendingBytes() <= 64);
        }
        QCOMPARE(s.feed("still the long one\nnext\n"), QList<QByteArray>{"next"});
        QCOMPARE(s.droppedLines(), 1);
        // Over the limit within one piece, end included.
        QCOMPARE(s.feed(megabyte + "\nafter\n"), QList<QByteArray>{"after"});
        QCOMPARE(s.droppedLines(), 2);

        // A connection that drops mid-line leaves nothing behind for the next one.
        QVERIFY(s.feed("half").isEmpty());
        s.clear();
        QCOMPARE(s.feed("whole\n"), QList<QByteArray>{"whole"});
    }

    void pairsEventsIntoCalls()
    {
        Session s;
        s("07.12.26 10:00:00;RING;0;030111;3012345670;SIP0;");
        s("07.12.26 10:00:05;CONNECT;0;1;030111;");
        s("07.12.26 10:00:00;CALL;1;2;3012345671;0891234;SIP1;"); // overlapping, other id
        s("07.12.26 10:02:05;DISCONNECT;0;120;");
        s("07.12.26 10:02:09;DISCONNECT;1;0;");
        s("07.12.26 10:03:00;RING;2;;3012345670;SIP0;");
        s("07.12.26 10:03:20;DISCONNECT;2;0;");
        QCOMPARE(s.ended.size(), 3);
        QVERIFY(s.notes.isEmpty());

        const RouterCall& answered = s.ended[0];
        QCOMPARE(answered.direction, RouterCall::Direction::Incoming);
        QCOMPARE(answered.remoteNumber, QStringLiteral("030111"));
        QCOMPARE(answered.ownNumber, QStringLiteral("3012345670"));
        QVERIFY(answered.answered);
        QCOMPARE(answered.durationSeconds, 120);
        QCOMPARE(answered.start, QDateTime(QDate(2026, 12, 7), QTime(10, 0)));
        QCOMPARE(answered.extension, QStringLiteral("1"));

        const RouterCall& outgoing = s.ended[1];
        QCOMPARE(outgoing.direction, RouterCall::Direction::Outgoing);
        QCOMPARE(outgoing.remoteNumber, QStringLiteral("0891234"));
        QCOMPARE(outgoing.ownNumber, QStringLiteral("3012345671"));
        QVERIFY(!outgoing.answered);

        QVERIFY(s.ended[2].remoteNumber.isEmpty());
        QVERIFY(!s.ended[2].answered);
        QCOMPARE(s.tracker.openCalls(), 0);
    }

    void oddSequencesLoseNoCall()
    {
        Session s;
        // An end and a connect without a beginning are passed over, with a note each.
        s("07.12.26 09:00:00;DISCONNECT;7;30;");
        s("07.12.26 09:00:00;CONNECT;7;1;030;");
        QVERIFY(s.ended.isEmpty());
        QCOMPARE(s.notes.size(), 2);
        QVERIFY(s.notes[0].contains(QStringLiteral("DISCONNECT ohne RING")));

        // An id reused before its DISCONNECT arrived: the first call is ended, not overwritten.
        s("07.12.26 09:10:00;RING;4;030222;301;SIP0;");
        s("07.12.26 09:10:03;CONNECT;4;1;030222;");
        s("07.12.26 09:30:00;RING;4;030333;301;SIP0;");
        QCOMPARE(s.ended.size(), 1);
        QCOMPARE(s.ended[0].remoteNumber, QStringLiteral("030222"));
        QVERIFY(s.ended[0].answered);
        QCOMPARE(s.ended[0].durationSeconds, 0);
        QCOMPARE(s.notes.size(), 3);

        // The clock set back mid-call: the start is the ring's, the length the router's count.
        s("07.12.26 08:00:00;CONNECT;4;2;030333;");
        s("07.12.26 08:01:00;DISCONNECT;4;75;");
        QCOMPARE(s.ended.size(), 2);
        QCOMPARE(s.ended[1].start, QDateTime(QDate(2026, 12, 7), QTime(9, 30)));
        QCOMPARE(s.ended[1].durationSeconds, 75);
        // A duration for a call never connected is no talk time.
        s("07.12.26 08:02:00;RING;5;030444;301;SIP0;");
        s("07.12.26 08:02:30;DISCONNECT;5;30;");
        QCOMPARE(s.ended[2].durationSeconds, 0);

        // Rings that never end (a router sending junk ids) cannot pile up without bound.
        for (int i = 0; i < RouterCallTracker::MaxOpenCalls + 10; ++i)
            s.tracker.handle(routerEvent(qPrintable(QStringLiteral("07.12.26 12:00:00;RING;%1;0301;301;").arg(1000 + i))),
                             &s.notes);
        QCOMPARE(s.tracker.openCalls(), RouterCallTracker::MaxOpenCalls);
    }
};

ORVANTA_TEST(TestRouterCallMonitor)
#include "tst_routercallmonitor.moc"
