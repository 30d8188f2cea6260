#include "phone/PhoneNumbers.h"
#include "tests/support/TestRegistry.h"

#include <QTest>

using namespace orvanta;

class TestPhoneNumbers : public QObject {
    Q_OBJECT

private Q_SLOTS:
    void normalizes_data()
    {
        QTest::addColumn<QString>("input");
        QTest::addColumn<QString>("expected");
        QTest::newRow("inner zeros stay") << "0049 (0)30 1234" << "490301234";
        QTest::newRow("separators dropped") << "+49-30/12 34" << "49301234";
        QTest::newRow("zeros only") << "0 0 0" << QString();
        QTest::newRow("empty") << QString() << QString();
        QTest::newRow("no digits") << "Telefon" << QString();
        QTest::newRow("trailing zeros stay") << "0100" << "100";
        // Only ASCII digits count: an Arabic-Indic digit is not a dialled digit.
        QTest::newRow("non-ASCII digit") << QString::fromUtf8("1\u0663 2") << "12";
    }

    void normalizes()
    {
        QFETCH(QString, input);
        QFETCH(QString, expected);
        QCOMPARE(NormalizeNumber(input), expected);
        QString out = QStringLiteral("stale");
        NormalizeNumber(input, out);
        QCOMPARE(out, expected);
    }

    void namesServiceCodes()
    {
        QCOMPARE(ServiceName(0), QStringLiteral("Service unbekannt"));
        QCOMPARE(ServiceName(3), QString::fromUtf8("Datenanruf (beschränkt)"));
        QCOMPARE(ServiceName(4), QStringLiteral("Fax- oder Telefonanruf (analog)"));
        QCOMPARE(ServiceName(5), ServiceName(4));
        QCOMPARE(ServiceName(22), QStringLiteral("Videotelefonat (2ND)"));
        QString text = QStringLiteral("stale");
        ServiceName(23, text);
        QVERIFY(text.isEmpty());
        QVERIFY(ServiceName(-1).isEmpty());
        QVERIFY(ServiceName(std::numeric_limits<int>::min()).isEmpty());
        for (int code = 0; code <= 22; ++code)
            QVERIFY2(!ServiceName(code).isEmpty(), qPrintable(QString::number(code)));
    }
};

ORVANTA_TEST(TestPhoneNumbers)
#include "tst_phonenumbers.moc"
