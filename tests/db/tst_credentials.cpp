#include "db/B64Decoder.h"
#include "db/CredentialCipher.h"
#include "db/StoredConnection.h"
#include "platform/ConvertError.h"
#include "tests/support/TestRegistry.h"

#include <QFile>
#include <QTemporaryDir>
#include <QTest>

using namespace orvanta;

class TestCredentials : public QObject {
    Q_OBJECT

private Q_SLOTS:
    void decoderKnownAnswers_data()
    {
        QTest::addColumn<QString>("text");
        QTest::addColumn<QByteArray>("bytes");
        QTest::newRow("empty") << QString() << QByteArray();
        QTest::newRow("padded") << QStringLiteral("TWFu") << QByteArray("Man");
        QTest::newRow("two left") << QStringLiteral("TQ==") << QByteArray("M");
        QTest::newRow("three left") << QStringLiteral("TWE=") << QByteArray("Ma");
        QTest::newRow("unpadded") << QStringLiteral("TWE") << QByteArray("Ma");
        QTest::newRow("noise dropped") << QStringLiteral(" T-W\r\nF_u.ä ") << QByteArray("Man");
        QTest::newRow("stops at =") << QStringLiteral("TWFu=TWFu") << QByteArray("Man");
        QTest::newRow("leading =") << QStringLiteral("=TWFu") << QByteArray();
        QTest::newRow("binary") << QStringLiteral("/+8A") << QByteArray("\xFF\xEF\x00", 3);
    }
    void decoderKnownAnswers()
    {
        QFETCH(QString, text);
        QFETCH(QByteArray, bytes);
        QCOMPARE(TB64Decoder().Decode(QStringView(text)), bytes);
        QCOMPARE(TB64Decoder().Decode(QByteArrayView(text.toUtf8())), bytes);
    }

    void oneCharacterOverIsIncomplete()
    {
        for (const char* text : {"T", "TWFuT", "TWFu T=", "TWFuT=="}) {
            try {
                (void)TB64Decoder().Decode(QStringView(QString::fromLatin1(text)));
                QFAIL(text);
            } catch (const ConvertError& e) {
                QCOMPARE(e.className(), QStringLiteral("EConvertError"));
                QCOMPARE(e.message(), QString::fromUtf8("BASE64-Daten unvollständig."));
            }
        }
    }

    void storedCredentialsDecrypt_data()
    {
        QTest::addColumn<QString>("stored");
        QTest::addColumn<QString>("plain");
        QTest::newRow("user") << QStringLiteral("Y1d0SVh0ZlM=") << QStringLiteral("SYSDBA");
        QTest::newRow("password") << QStringLiteral("VDhaMFZIdzBBY1Vm") << QStringLiteral("masterkey");
        QTest::newRow("blank inside") << QStringLiteral("VDhaMFZI dzBBY1Vm") << QStringLiteral("masterkey");
        QTest::newRow("line break inside") << QStringLiteral("VDhaM\r\nFZIdzBBY1Vm") << QStringLiteral("masterkey");
        QTest::newRow("both, at the ends") << QStringLiteral(" \nVDhaMFZIdzBBY1Vm\r\n ") << QStringLiteral("masterkey");
        QTest::newRow("empty") << QString() << QString();
    }
    void storedCredentialsDecrypt()
    {
        QFETCH(QString, stored);
        QFETCH(QString, plain);
        QCOMPARE(CredentialCipher::decrypt(stored), plain);
    }

    void encryptionRoundTrips()
    {
        QCOMPARE(CredentialCipher::encrypt(QStringLiteral("masterkey")), QStringLiteral("VDhaMFZIdzBBY1Vm"));
        QCOMPARE(CredentialCipher::encrypt(QStringLiteral("SYSDBA")), QStringLiteral("Y1d0SVh0ZlM="));
        for (const QString& plain : {QString::fromUtf8("Größe € 42"), QString(200, u'x'), QStringLiteral("a")})
            QCOMPARE(CredentialCipher::decrypt(CredentialCipher::encrypt(plain)), plain);
    }

    void undecodableStoredValueRaises()
    {
        QVERIFY_THROWS_EXCEPTION(ConvertError, (void)CredentialCipher::decrypt(QStringLiteral("VDhaMFZIdzBBY1VmX")));
    }

    void storedConnectionRoundTripsThroughTheRegistry()
    {
        QTemporaryDir dir;
        qputenv("VARNIK_HKLM", QFile::encodeName(dir.filePath(QStringLiteral("hklm.ini"))));
        QCOMPARE(StoredConnection::read(), StoredConnection{});
        const StoredConnection written{QStringLiteral("srv:/data/orvanta.fdb"), QString::fromUtf8("Jürgen"),
                                       QString::fromUtf8("Geheim € 1")};
        QVERIFY(written.write());
        QCOMPARE(StoredConnection::read(), written);
        QCOMPARE(StoredConnection::readDatabaseName(), written.database);

        // The file holds only the encrypted forms, as the monitor writes them.
        QFile f(dir.filePath(QStringLiteral("hklm.ini")));
        QVERIFY(f.open(QIODevice::ReadOnly));
        const QByteArray bytes = f.readAll();
        QVERIFY(bytes.contains("Username=" + CredentialCipher::encrypt(written.user).toLatin1() + "\r\n"));
        QVERIFY(!bytes.contains("Geheim"));
        qunsetenv("VARNIK_HKLM");
    }
};

ORVANTA_TEST(TestCredentials)
#include "tst_credentials.moc"
