#include "platform/WindowMessages.h"
#include "tests/support/MessageReceiver.h"
#include "tests/support/TestRegistry.h"

#include <QTest>

using namespace orvanta;

using Receiver = orvanta::test::MessageReceiver;

class TestWindowMessages : public QObject {
    Q_OBJECT

private Q_SLOTS:
    void numbersMatchTheWindowsValues()
    {
        QCOMPARE(WMCLOSECONTACTFORM, 0x722);
        QCOMPARE(WMSAVECONDATA, 0x723);
        QCOMPARE(WMLOGINFOCHANGE, 0x725);
        QCOMPARE(WMSEARCHUNCHECKED, 0x72C);
        QCOMPARE(WMCONTACTDATAFROMSCREEN, 0x72D);
        QCOMPARE(WMUPDATEVOICEBOXGRID, 0x734);
        QCOMPARE(WMMONITOR_LOGCHANGED_SEND, 1729);
        QCOMPARE(WMMONITOR_LOGCHANGED_POST, 1733);
        QCOMPARE(WMMONITOR_IGNORED, 1736);
        QCOMPARE(WMMONITOR_CONTACTFROMLOG, 1744);
        QCOMPARE(WMMONITOR_QUIT, 1735);
        QCOMPARE(WMMONITOR_PAUSERESUME, 1740);
    }

    void postIsQueuedAndKeepsOrder()
    {
        Receiver receiver;
        postMessage(&receiver, WMSTATUSPANEL, -3, 0);
        postMessage(&receiver, WMLOGINFOCHANGE, 7, 1);
        QVERIFY(receiver.got.isEmpty());
        QTRY_COMPARE(receiver.got.size(), 2);
        QCOMPARE(receiver.got[0].message, WMSTATUSPANEL);
        QCOMPARE(receiver.got[0].wParam, qintptr(-3));
        QCOMPARE(receiver.got[1].message, WMLOGINFOCHANGE);
        QCOMPARE(receiver.got[1].lParam, qintptr(1));
    }

    void sendIsImmediateAndReturnsTheResult()
    {
        Receiver receiver;
        receiver.answer = [](const WindowMessageEvent& m) -> qintptr {
            return m.message() == WMSAVECONDATA ? m.wParam() * 10 + m.lParam() : 0;
        };
        QCOMPARE(sendMessage(&receiver, WMSAVECONDATA, 4, 2), qintptr(42));
        QCOMPARE(receiver.got.size(), 1);
        QCOMPARE(sendMessage(&receiver, WMNEWCONTACT), qintptr(0));
        QCOMPARE(sendMessage(nullptr, WMNEWCONTACT), qintptr(0));
    }

    void messagesToAVanishedReceiverAreDropped()
    {
        auto* receiver = new Receiver;
        postMessage(receiver, WMDELETELOGITEM);
        delete receiver;
        postMessage(nullptr, WMDELETELOGITEM);
        QCoreApplication::sendPostedEvents();
        QEvent other(QEvent::User);
        QVERIFY(asWindowMessage(&other) == nullptr);
    }
};

ORVANTA_TEST(TestWindowMessages)
#include "tst_windowmessages.moc"
