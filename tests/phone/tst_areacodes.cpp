#include "phone/AreaCodes.h"
#include "tests/TestPaths.h"
#include "tests/phone/ErrorLogFixture.h"
#include "tests/support/TestRegistry.h"

#include <QFile>
#include <QTemporaryDir>
#include <QTest>

using namespace orvanta;

namespace {

struct Split {
    bool found = false;
    QString prefix;
    QString rest;
    QString region;
};

Split lookup(const AreaCodeTable& table, const QString& number)
{
    Split s;
    s.found = table.lookup(number, s.prefix, s.rest, s.region);
    return s;
}

AreaCodeTable tableOf(std::vector<int> lengths, const QByteArray& contents)
{
    AreaCodeTable table(std::move(lengths));
    table.appendFileContents(contents);
    return table;
}

void writeFile(const QString& path, const QByteArray& contents)
{
    QFile file(path);
    QVERIFY(file.open(QIODevice::WriteOnly));
    QCOMPARE(file.write(contents), contents.size());
}

} // namespace

class TestAreaCodes : public QObject {
    Q_OBJECT

private Q_SLOTS:
    void splitsDialledNumber_data()
    {
        QTest::addColumn<QByteArray>("file");
        QTest::addColumn<QString>("number");
        QTest::addColumn<QString>("prefix");
        QTest::addColumn<QString>("rest");
        QTest::addColumn<QString>("region");

        const QByteArray berlin = "30,Berlin\r\n";
        QTest::newRow("worked example") << berlin << "030 / 1234-56" << "030" << "123456" << "Berlin";
        QTest::newRow("without trunk zero") << berlin << "30123" << "30" << "123" << "Berlin";
        QTest::newRow("extra zeros stay in prefix") << berlin << "00030 99" << "00030" << "99" << "Berlin";
        QTest::newRow("no known prefix keeps the input")
            << berlin << "0711 / 12-3" << QString() << "0711 / 12-3" << QString();
        QTest::newRow("zeros only") << berlin << "0 00" << QString() << "0 00" << QString();
        QTest::newRow("empty number") << berlin << QString() << QString() << QString() << QString();
        QTest::newRow("prefix only") << berlin << "030" << "030" << QString() << "Berlin";
        QTest::newRow("longest listed prefix wins")
            << QByteArray("30,Berlin\n3301,Oranienburg\n330,none\n") << "03301 555" << "03301" << "555"
            << "Oranienburg";
        QTest::newRow("listed code with zero never matches")
            << QByteArray("0221,K\xf6ln\r\n") << "0221 12345" << QString() << "0221 12345" << QString();
        QTest::newRow("code without zero matches") << QByteArray("221,K\xf6ln\r\n") << "0221 12345" << "0221"
                                                   << "12345" << QString::fromUtf8("Köln");
        QTest::newRow("code reading stops at blank")
            << QByteArray("89 ,M\xfcnchen\r\n") << "089-1" << "089" << "1" << QString::fromUtf8("München");
        QTest::newRow("first equal entry wins")
            << QByteArray("40,Hamburg\n40,Altona\n") << "040 1" << "040" << "1" << "Hamburg";
        QTest::newRow("name keeps commas and blanks")
            << QByteArray("91,Bellinzona, Lugano \n") << "091" << "091" << QString() << "Bellinzona, Lugano ";
        QTest::newRow("short number against 5-digit code")
            << QByteArray("6221,Heidelberg\n") << "06221" << "06221" << QString() << "Heidelberg";
    }

    void splitsDialledNumber()
    {
        QFETCH(QByteArray, file);
        QFETCH(QString, number);
        const Split s = lookup(tableOf({2, 3, 4, 5}, file), number);
        QVERIFY(s.found);
        QTEST(s.prefix, "prefix");
        QTEST(s.rest, "rest");
        QTEST(s.region, "region");
    }

    void austrianShortAndLongCodes()
    {
        // Vienna is 1; with both 3 and 30 listed the longer one wins.
        const auto table = tableOf({1, 2, 3, 4}, "1,Wien\r\n3,Drei\r\n30,Dreissig\r\n");
        Split s = lookup(table, "0301234");
        QCOMPARE(s.prefix, QStringLiteral("030"));
        QCOMPARE(s.rest, QStringLiteral("1234"));
        QCOMPARE(s.region, QStringLiteral("Dreissig"));
        s = lookup(table, "03 9");
        QCOMPARE(s.prefix, QStringLiteral("03"));
        QCOMPARE(s.rest, QStringLiteral("9"));
        QCOMPARE(s.region, QStringLiteral("Drei"));
        s = lookup(table, "01/5880");
        QCOMPARE(s.prefix, QStringLiteral("01"));
        QCOMPARE(s.rest, QStringLiteral("5880"));
    }

    void skipsLinesThatAreNoEntries()
    {
        QByteArray junk("x89,M\xfcnchen\r\n"
                        "\r\n"
                        "no comma here\n"
                        ",empty code\n"
                        " 40,leading blank\r"
                        "7,\n"); // a valid entry with an empty name
        junk.append("\0\n", 2);
        junk.append("5,nul\0name\n", 11);
        junk.append(QByteArray(1 << 20, '9'));
        junk.append(",mega\n");
        junk.append("6,no line end");
        const auto table = tableOf({1, 2}, junk);
        QCOMPARE(table.codes(), (QStringList {"7", "5", QString(1 << 20, u'9'), "6"}));
        QCOMPARE(table.names().at(0), QString());
        QCOMPARE(table.names().at(1), QString::fromUtf8("nul\0name", 8));
        QCOMPARE(table.names().at(3), QStringLiteral("no line end"));
        QCOMPARE(lookup(table, "06 1").region, QStringLiteral("no line end"));
        QCOMPARE(lookup(table, "0891").region, QString());
    }

    void emptyTableFindsNothing()
    {
        AreaCodeTable table({2, 3, 4, 5});
        table.appendFileContents("no entries\r\n\r\n");
        QVERIFY(table.isEmpty());
        QVERIFY(!lookup(table, "030 1").found);
        QString prefix = "old", rest = "old", region = "old";
        QVERIFY(!table.lookup(u"030", prefix, rest, region));
        QVERIFY(prefix.isEmpty() && rest.isEmpty() && region.isEmpty());
    }

    void loadsTheInstalledTables()
    {
        const QString folder = QStringLiteral(ORVANTA_SOURCE_DIR "/data");
        LoadGermanAereaCodes(folder);
        LoadAustriaAereaCodes(folder);
        LoadSwissAereaCodes(folder);
        QCOMPARE(germanAreaCodes().size(), 5200);
        QVERIFY(austrianAreaCodes().size() > 0);
        QVERIFY(swissAreaCodes().size() > 0);

        QString prefix, rest, region;
        QVERIFY(GetGermanAereaCodes(u"089 / 12 34 56", prefix, rest, region));
        QCOMPARE(prefix, QStringLiteral("089"));
        QCOMPARE(rest, QStringLiteral("123456"));
        QCOMPARE(region, QString::fromUtf8("München"));
        QVERIFY(GetGermanAereaCodes(u"033814711", prefix, rest, region));
        QCOMPARE(region, QStringLiteral("Brandenburg an der Havel"));
        QCOMPARE(prefix, QStringLiteral("03381")); // outputs of the previous lookup are replaced
        QCOMPARE(rest, QStringLiteral("4711"));
        QVERIFY(GetGermanAereaCodes(u"0190 12", prefix, rest, region));
        QCOMPARE(prefix, QString());
        QCOMPARE(rest, QStringLiteral("0190 12"));
        QVERIFY(GetAustriaAereaCodes(u"0316 123", prefix, rest, region));
        QCOMPARE(region, QStringLiteral("Graz"));
        QVERIFY(GetSwissAereaCodes(u"044 1234567", prefix, rest, region));
        QCOMPARE(prefix, QStringLiteral("044"));
        QCOMPARE(region, QString::fromUtf8("Zürich"));
    }

    void loadReplacesAndMissingFileEmpties()
    {
        test::ErrorLogFixture log;
        QTemporaryDir dir;
        writeFile(dir.filePath("AreaCodes_CH"), "1,Eins\n");
        LoadSwissAereaCodes(dir.path());
        QCOMPARE(swissAreaCodes().codes(), QStringList {"1"});
        writeFile(dir.filePath("AreaCodes_CH"), "2,Zwei\n");
        LoadSwissAereaCodes(dir.path() + '/');
        QCOMPARE(swissAreaCodes().codes(), QStringList {"2"});

        QString prefix, rest, region;
        QVERIFY(GetSwissAereaCodes(u"02", prefix, rest, region));
        QVERIFY(QFile::remove(dir.filePath("AreaCodes_CH")));
        LoadSwissAereaCodes(dir.path());
        QVERIFY(swissAreaCodes().isEmpty());
        QVERIFY(!GetSwissAereaCodes(u"02", prefix, rest, region));
        // A missing file is only written to the log, never shown.
        QVERIFY(log.logged().contains("\r\n# Orvex - LoadSwissAereaCodes\r\nDatei nicht gefunden!\r\n\r\n"));
        QCOMPARE(log.dialogs().count(), 0);
    }

    void unreadableFileIsShown()
    {
        test::ErrorLogFixture log;
        QTemporaryDir dir;
        const QString path = dir.filePath("AreaCodes_A");
        writeFile(path, "1,Wien\n");
        QVERIFY(QFile::setPermissions(path, QFileDevice::Permissions()));
        if (QFile file(path); file.open(QIODevice::ReadOnly))
            QSKIP("permissions do not apply to this user");
        LoadAustriaAereaCodes(dir.path());
        QVERIFY(austrianAreaCodes().isEmpty());
        QCOMPARE(log.dialogs().count(DialogKind::Error), 1);
        QVERIFY(log.dialogs().last().text.startsWith(QStringLiteral("# Orvex - LoadAustriaAereaCodes\r\n")));
        QVERIFY(log.logged().contains("# Orvex - LoadAustriaAereaCodes\r\n"));
    }
};

ORVANTA_TEST(TestAreaCodes)
#include "tst_areacodes.moc"
