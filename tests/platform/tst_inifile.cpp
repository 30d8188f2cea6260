#include "platform/IniFile.h"
#include "platform/Windows1252.h"
#include "tests/support/TestRegistry.h"

#include <QTemporaryDir>
#include <QTest>

using namespace orvanta;

class TestIniFile : public QObject {
    Q_OBJECT

private Q_SLOTS:
    void namesAreCaseInsensitiveAndFirstDuplicateWins()
    {
        IniFile ini;
        ini.parse("[MoniOptions]\r\nAC=089\r\nac=030\r\n[monioptions]\r\nExtra=1\r\n"
                  "[Other]\nKey = spaced value \t\n");
        QCOMPARE(ini.readString(QStringLiteral("MONIOPTIONS"), QStringLiteral("Ac")), QStringLiteral("089"));
        QVERIFY(!ini.valueExists(QStringLiteral("MoniOptions"), QStringLiteral("Extra")));
        QCOMPARE(ini.sections(), QStringList({QStringLiteral("MoniOptions"), QStringLiteral("Other")}));
        QCOMPARE(ini.keys(QStringLiteral("moniOPTIONS")), QStringList({QStringLiteral("AC")}));
        QCOMPARE(ini.readString(QStringLiteral("other"), QStringLiteral("KEY")), QStringLiteral("spaced value"));
        QCOMPARE(ini.readString(QStringLiteral("none"), QStringLiteral("x"), QStringLiteral("dflt")), QStringLiteral("dflt"));
    }

    void valuesAreRaw()
    {
        IniFile ini;
        ini.parse("[S]\r\nq=\"quoted\"\r\nb=a\\nb\r\neq=a=b\r\nempty=\r\n");
        QCOMPARE(ini.readString(QStringLiteral("S"), QStringLiteral("q")), QStringLiteral("\"quoted\""));
        QCOMPARE(ini.readString(QStringLiteral("S"), QStringLiteral("b")), QStringLiteral("a\\nb"));
        QCOMPARE(ini.readString(QStringLiteral("S"), QStringLiteral("eq")), QStringLiteral("a=b"));
        QVERIFY(ini.valueExists(QStringLiteral("S"), QStringLiteral("empty")));
        QCOMPARE(ini.readString(QStringLiteral("S"), QStringLiteral("empty"), QStringLiteral("d")), QString());
    }

    void integersFollowTheWindowsRules_data()
    {
        QTest::addColumn<QByteArray>("value");
        QTest::addColumn<int>("expected");
        QTest::newRow("plain") << QByteArray("42") << 42;
        QTest::newRow("negative") << QByteArray("-17") << -17;
        QTest::newRow("plus") << QByteArray("+5") << 5;
        QTest::newRow("hex 0x") << QByteArray("0x1F") << 31;
        QTest::newRow("hex dollar") << QByteArray("$ff") << 255;
        QTest::newRow("hex all bits") << QByteArray("0xFFFFFFFF") << -1;
        QTest::newRow("min") << QByteArray("-2147483648") << std::numeric_limits<int>::min();
        QTest::newRow("overflow") << QByteArray("2147483648") << -99;
        QTest::newRow("trailing junk") << QByteArray("12abc") << -99;
        QTest::newRow("decimal point") << QByteArray("1.5") << -99;
        QTest::newRow("empty") << QByteArray("") << -99;
        QTest::newRow("bare prefix") << QByteArray("0x") << -99;
        QTest::newRow("sign only") << QByteArray("-") << -99;
    }
    void integersFollowTheWindowsRules()
    {
        QFETCH(QByteArray, value);
        QFETCH(int, expected);
        IniFile ini;
        ini.parse("[S]\r\nv=" + value + "\r\n");
        QCOMPARE(ini.readInteger(QStringLiteral("S"), QStringLiteral("v"), -99), expected);
    }

    void boolsAndFloats()
    {
        IniFile ini;
        ini.parse("[S]\r\nt=1\r\nn=-3\r\nf=0\r\nj=yes\r\nd=2.5\r\nc=2,5\r\nx=abc\r\n");
        QVERIFY(ini.readBool(QStringLiteral("S"), QStringLiteral("t"), false));
        QVERIFY(ini.readBool(QStringLiteral("S"), QStringLiteral("n"), false));
        QVERIFY(!ini.readBool(QStringLiteral("S"), QStringLiteral("f"), true));
        QVERIFY(ini.readBool(QStringLiteral("S"), QStringLiteral("j"), true));
        QVERIFY(!ini.readBool(QStringLiteral("S"), QStringLiteral("j"), false));
        QVERIFY(ini.readBool(QStringLiteral("S"), QStringLiteral("missing"), true));
        QCOMPARE(ini.readFloat(QStringLiteral("S"), QStringLiteral("d"), 0), 2.5);
        QCOMPARE(ini.readFloat(QStringLiteral("S"), QStringLiteral("c"), 0), 2.5);
        QCOMPARE(ini.readFloat(QStringLiteral("S"), QStringLiteral("x"), 7.25), 7.25);
    }

    void junkIsSkipped()
    {
        QByteArray junk("garbage before any section\r\nk=v\r\n[S]\r\n");
        junk += QByteArray("\x00\x01\xFF=\x00", 5);
        static const char tail[] = "\r\n;comment=1\r\nno equals sign\r\n=novalue\r\n  key\x00 = va\x00lue \r\n[unterminated\r\nk=2\r";
        junk += QByteArray(tail, sizeof(tail) - 1);
        IniFile ini;
        ini.parse(junk);
        QVERIFY(!ini.keys(QStringLiteral("S")).contains(QStringLiteral(";comment")));
        QCOMPARE(ini.readString(QStringLiteral("S"), QStringLiteral("key")), QStringLiteral("value"));
        QCOMPARE(ini.readString(QStringLiteral("unterminated"), QStringLiteral("k")), QStringLiteral("2"));
        QCOMPARE(ini.sections().size(), 2);

        // NULs in front of a byte-order mark: read as the UTF-8 file it is, and the same again
        // after writing (the mark must not become text that reads as a mark the second time).
        IniFile marked;
        marked.parse(QByteArray("\x00\xEF\xBB\xBF[S]\r\nk=\xC3\xA4", 13));
        QCOMPARE(marked.readString(QStringLiteral("S"), QStringLiteral("k")), QString::fromUtf8("ä"));
        IniFile reread;
        reread.parse(marked.serialize());
        QCOMPARE(reread.sections(), marked.sections());
        QCOMPARE(reread.readString(QStringLiteral("S"), QStringLiteral("k")), QString::fromUtf8("ä"));
    }

    void roundTripIsWindows1252WithCrLf()
    {
        QTemporaryDir dir;
        const QString path = dir.filePath(QStringLiteral("Store"));
        {
            QFile f(path);
            QVERIFY(f.open(QIODevice::WriteOnly));
            f.write("[Stra\xDF" "e]\nOrt=K\xF6ln \x80\n");
        }
        IniFile ini(path);
        QVERIFY(ini.isLoaded());
        QCOMPARE(ini.readString(QStringLiteral("STRASSE"), QStringLiteral("Ort")), QString());
        QCOMPARE(ini.readString(QString::fromUtf8("Straße"), QStringLiteral("ort")), QString::fromUtf8("Köln €"));
        ini.writeString(QString::fromUtf8("straße"), QStringLiteral("ORT"), QString::fromUtf8("Zürich"));
        ini.writeInteger(QStringLiteral("Neu"), QStringLiteral("Zahl"), -4);
        ini.writeString(QStringLiteral("Neu"), QStringLiteral("Zeilen"), QStringLiteral("a\r\nb"));
        QVERIFY(ini.save());

        QFile f(path);
        QVERIFY(f.open(QIODevice::ReadOnly));
        QCOMPARE(f.readAll(), QByteArray("[Stra\xDF" "e]\r\nOrt=Z\xFCrich\r\n\r\n[Neu]\r\nZahl=-4\r\nZeilen=a  b\r\n"));
        IniFile again(path);
        QCOMPARE(again.readInteger(QStringLiteral("neu"), QStringLiteral("zahl"), 0), -4);
    }

    void missingFileIsEmpty()
    {
        IniFile ini(QStringLiteral("/nonexistent/dir/file.ini"));
        QVERIFY(!ini.isLoaded());
        QVERIFY(ini.sections().isEmpty());
        QCOMPARE(ini.readInteger(QStringLiteral("AppColor"), QStringLiteral("Value"), 2), 2);
    }

    void deleteAndErase()
    {
        IniFile ini;
        ini.parse("[A]\r\nx=1\r\ny=2\r\nz=3\r\n[B]\r\nk=v\r\n");
        ini.deleteKey(QStringLiteral("a"), QStringLiteral("Y"));
        QCOMPARE(ini.keys(QStringLiteral("A")), QStringList({QStringLiteral("x"), QStringLiteral("z")}));
        QCOMPARE(ini.readString(QStringLiteral("A"), QStringLiteral("z")), QStringLiteral("3"));
        ini.eraseSection(QStringLiteral("A"));
        QCOMPARE(ini.sections(), QStringList({QStringLiteral("B")}));
        QCOMPARE(ini.readString(QStringLiteral("b"), QStringLiteral("K")), QStringLiteral("v"));
    }

    void codePageMapping()
    {
        const QByteArray all = [] {
            QByteArray b;
            for (int i = 0; i < 256; ++i)
                b.append(static_cast<char>(i));
            return b;
        }();
        const QString text = fromWindows1252(all);
        QCOMPARE(text.size(), 256);
        QCOMPARE(text.at(0x80), QChar(0x20AC));
        QCOMPARE(text.at(0x81), QChar(0x81));
        QCOMPARE(text.at(0xE4), QChar(0xE4));
        QCOMPARE(toWindows1252(text), all);
        QCOMPARE(toWindows1252(QString::fromUtf8("a\u0100\U0001F600b")), QByteArray("a??b"));
    }

    void editingKeepsWhatItDoesNotTouch()
    {
        const QByteArray original = "; Kopf\r\n\r\n[A]\r\n x = 1 \r\n; \xFC" "ber y\r\ny=2\r\nx=doppelt\r\nohne Gleich\r\n\r\n"
                                    "[B]\r\nk=v\r\n[a]\r\nz=versteckt\r\n";
        IniFile ini;
        ini.parse(original);
        QCOMPARE(ini.serialize(), original);
        QCOMPARE(ini.readString(QStringLiteral("A"), QStringLiteral("x")), QStringLiteral("1"));
        QCOMPARE(ini.readString(QStringLiteral("A"), QStringLiteral("z")), QString());

        // An unchanged value keeps its line; a changed one is written anew; a new key follows
        // the section's last key.
        ini.writeString(QStringLiteral("a"), QStringLiteral("X"), QStringLiteral("1"));
        ini.writeInteger(QStringLiteral("A"), QStringLiteral("y"), 3);
        ini.writeString(QStringLiteral("A"), QStringLiteral("neu"), QStringLiteral("n"));
        ini.writeString(QStringLiteral("C"), QStringLiteral("c"), QStringLiteral("1"));
        QCOMPARE(ini.serialize(), QByteArray("; Kopf\r\n\r\n[A]\r\n x = 1 \r\n; \xFC" "ber y\r\ny=3\r\nneu=n\r\nx=doppelt\r\n"
                                             "ohne Gleich\r\n\r\n[B]\r\nk=v\r\n[a]\r\nz=versteckt\r\n\r\n[C]\r\nc=1\r\n"));

        // A deleted key's comment stays with what follows.
        ini.deleteKey(QStringLiteral("A"), QStringLiteral("y"));
        QVERIFY(ini.serialize().contains("; \xFC" "ber y\r\nneu=n\r\n"));
        ini.deleteKey(QStringLiteral("A"), QStringLiteral("neu"));
        QVERIFY(ini.serialize().startsWith("; Kopf\r\n\r\n[A]\r\n x = 1 \r\n; \xFC" "ber y\r\nx=doppelt\r\n"));
    }

    void utf8FilesStayUtf8()
    {
        IniFile ini;
        ini.parse("\xEF\xBB\xBF[S]\nk=\xC3\xA4\n");
        QCOMPARE(ini.readString(QStringLiteral("S"), QStringLiteral("k")), QString::fromUtf8("ä"));
        ini.writeString(QStringLiteral("S"), QStringLiteral("n"), QString::fromUtf8("€"));
        QCOMPARE(ini.serialize(), QByteArray("\xEF\xBB\xBF[S]\r\nk=\xC3\xA4\r\nn=\xE2\x82\xAC\r\n"));
    }
};

ORVANTA_TEST(TestIniFile)
#include "tst_inifile.moc"
