#include "platform/RufwarteIni.h"
#include "tests/support/ScriptedDialogService.h"
#include "tests/support/TestRegistry.h"

#include <QDir>
#include <QFile>
#include <QTemporaryDir>
#include <QTest>

using namespace orvanta;

namespace {

void writeFile(const QString& path, const QByteArray& contents)
{
    QFile file(path);
    QVERIFY(file.open(QIODevice::WriteOnly | QIODevice::Truncate));
    QCOMPARE(file.write(contents), contents.size());
}

QByteArray msnRecord(const QByteArray& msn, const QByteArray& name, int msnLength = -1)
{
    QByteArray record(TRufwarteIni::kMsnRecordSize, 'x');
    record[0] = static_cast<char>(msnLength < 0 ? msn.size() : msnLength);
    record.replace(1, msn.size(), msn);
    record[21] = static_cast<char>(name.size());
    record.replace(22, name.size(), name);
    return record;
}

} // namespace

class TestRufwarteIni : public QObject {
    Q_OBJECT

private:
    QTemporaryDir m_dir;
    std::unique_ptr<test::ScopedScriptedDialogs> m_dialogs;
    QByteArray m_oldConfigHome;

    QString path(const QString& name) const { return m_dir.filePath(name); }

    // A settings object on the files of the temporary folder.
    std::unique_ptr<TRufwarteIni> settings()
    {
        auto ini = std::make_unique<TRufwarteIni>();
        ini->SetFileNames(path("ISDNStore"), "MoniOptions", "msns", "rufwarte.exe");
        return ini;
    }

private Q_SLOTS:
    void init()
    {
        QVERIFY(m_dir.isValid());
        m_dialogs = std::make_unique<test::ScopedScriptedDialogs>();
        m_oldConfigHome = qgetenv("XDG_CONFIG_HOME");
        qputenv("XDG_CONFIG_HOME", QFile::encodeName(path("config")));
        for (const QString& name : QDir(m_dir.path()).entryList(QDir::Files))
            QFile::remove(path(name));
    }

    void cleanup()
    {
        m_dialogs.reset();
        if (m_oldConfigHome.isNull())
            qunsetenv("XDG_CONFIG_HOME");
        else
            qputenv("XDG_CONFIG_HOME", m_oldConfigHome);
    }

    void missingFileKeepsInitialValues()
    {
        auto ini = settings();
        QCOMPARE(ini->msnFile(), path("msns"));
        QCOMPARE(ini->colorFile(), path("OScheme"));
        QVERIFY(!ini->ReadFromIni());
        QCOMPARE((*m_dialogs)->texts(DialogKind::Error), QStringList {"INI-Datei konnte nicht gefunden werden."});
        QCOMPARE(ini->AC(), 1);
        QCOMPARE(ini->CLOSE_WND(), 5);
        QVERIFY(ini->OUT_SCSA());
        QCOMPARE(ini->MNSAL(), 2);
        QCOMPARE(ini->DBL(), 4);
        QCOMPARE(ini->TCPPORT(), 9090);

        TRufwarteIni undefined;
        QVERIFY(!undefined.ReadFromIni());
        QCOMPARE((*m_dialogs)->last().text, QString::fromUtf8("INI-Datei nicht definiert oder Sektion ungültig."));
        undefined.SetFileNames(path("ISDNStore"), QString(), "msns", "rufwarte.exe");
        writeFile(path("ISDNStore"), "[MoniOptions]\r\nAC=2\r\n");
        QVERIFY(!undefined.ReadFromIni());
        QCOMPARE(undefined.AC(), 1);
    }

    void missingKeysGiveDefaults()
    {
        writeFile(path("ISDNStore"), "[Other]\r\nAC=3\r\n[MoniOptions]\r\nJUNK\r\n");
        auto ini = settings();
        QVERIFY(ini->ReadFromIni());
        QCOMPARE((*m_dialogs)->count(), 0);
        QCOMPARE(ini->AC(), 0); // the default of the read, not the initial 1
        QCOMPARE(ini->CLOSE_WND(), 10);
        QCOMPARE(ini->CLOSE_WND_CONTACT(), 10);
        QVERIFY(!ini->OUT_SCSA());
        QVERIFY(ini->IWND());
        QVERIFY(ini->CIWNDA());
        QCOMPARE(ini->MNSAL(), 2);
        QCOMPARE(ini->AMT(), 0);
        QCOMPARE(ini->VB_AA(), 60);
        QCOMPARE(ini->RA(), 16);
        QCOMPARE(ini->DBL(), 4);
        QCOMPARE(ini->GEB(), 0.0);
        QVERIFY(ini->SOUND().isEmpty());
        QVERIFY(!ini->AutoStart());
    }

    void readsValuesWithTheirRules()
    {
        writeFile(path("ring.wav"), "RIFF");
        writeFile(path("VOICE.WAV"), "RIFF");
        const QByteArray text = "; the monitor's options\r\n"
                                "[moniOPTIONS]\r\n"
                                "incoming_msn_only=1\r\n"
                                "REJECT_WITHOUT_MSN=-3\r\n"
                                "SOUND=" + QFile::encodeName(path("ring.wav")) + "\r\n"
                                "SOUNDLOOP=yes\r\n"
                                "PS = 1 \r\n"
                                "CLOSE_WND=abc\r\n"
                                "CLOSE_WND_CONTACT=0x20\r\n"
                                "IWND=0\r\n"
                                "WND_POS=-7\r\n"
                                "VB_AA=99999999999\r\n"
                                "VB_Voice=" + QFile::encodeName(path("VOICE.WAV")) + "\r\n"
                                "AMT=10\r\n"
                                "MNSAL=5\r\n"
                                "GEB=0,25\r\n"
                                "CBC=012345678901\r\n"
                                "SMSN=M\xfcller\r\n"
                                "AC=258\r\n"
                                "DBL=-1\r\n"
                                "TCPSSTATE=511\r\n"
                                "TCPIP=192.168.0.1\r\n"
                                "TCPPORT=70000\r\n"
                                "RA=17\r\n"
                                "RA=18\r\n"
                                "\r\n"
                                "[MoniOptions]\r\n"
                                "CLIR=1\r\n";
        writeFile(path("ISDNStore"), text);
        auto ini = settings();
        QVERIFY(ini->ReadFromIni());
        QVERIFY(ini->INCOMING_MSN_ONLY());
        QVERIFY(ini->REJECT_WITHOUT_MSN()); // any non-zero integer
        QCOMPARE(ini->SOUND(), path("ring.wav"));
        QVERIFY(!ini->SOUNDLOOP()); // no integer: the default
        QVERIFY(ini->PS());
        QCOMPARE(ini->CLOSE_WND(), 10);
        QCOMPARE(ini->CLOSE_WND_CONTACT(), 32);
        QVERIFY(!ini->IWND());
        QCOMPARE(ini->WND_POS(), -7);
        QCOMPARE(ini->VB_AA(), 60); // beyond 32 bits: the default
        QVERIFY(ini->VB_Voice().isEmpty()); // ".WAV" is not ".wav"
        QCOMPARE(ini->AMT(), 0);
        QCOMPARE(ini->MNSAL(), 2);
        QCOMPARE(ini->GEBCurrency(), 2500);
        QCOMPARE(ini->CBC(), QStringLiteral("0123456789"));
        QCOMPARE(ini->SMSN(), QString::fromUtf8("Müller"));
        QCOMPARE(ini->AC(), 2);
        QCOMPARE(ini->DBL(), 255);
        QCOMPARE(ini->TCPSSTATE(), 255);
        QCOMPARE(ini->TCPIP(), QStringLiteral("192.168.0.1"));
        QCOMPARE(ini->TCPPORT(), 70000);
        QCOMPARE(ini->RA(), 17);     // the first of duplicate keys
        QVERIFY(!ini->CLIR());       // a repeated section is not read
        QCOMPARE((*m_dialogs)->count(), 0);
    }

    void guardedValuesKeepWhatTheyHold()
    {
        writeFile(path("a.wav"), "RIFF");
        writeFile(path("ISDNStore"), "[MoniOptions]\r\nVB_Voice=" + QFile::encodeName(path("a.wav"))
                                         + "\r\nAMT=9\r\nMNSAL=4\r\nGEB=1.5\r\n");
        auto ini = settings();
        QVERIFY(ini->ReadFromIni());
        QCOMPARE(ini->VB_Voice(), path("a.wav"));
        QCOMPARE(ini->AMT(), 9);
        QCOMPARE(ini->MNSAL(), 4);
        QCOMPARE(ini->GEB(), 1.5);

        // A second read with refused values keeps the accepted ones.
        writeFile(path("ISDNStore"),
            "[MoniOptions]\r\nVB_Voice=/nonexistent/b.wav\r\nAMT=-1\r\nMNSAL=0\r\nGEB=1e300\r\n");
        QVERIFY(ini->ReadFromIni());
        QCOMPARE(ini->VB_Voice(), path("a.wav"));
        QCOMPARE(ini->AMT(), 9);
        QCOMPARE(ini->MNSAL(), 4);
        QCOMPARE(ini->GEBCurrency(), 0); // no currency can hold it
    }

    void readsMsnRecords()
    {
        writeFile(path("msns"), msnRecord("4711", "B\xfcro") + msnRecord("0815", "Fax"));
        auto ini = settings();
        QCOMPARE(ini->MSNs().size(), 2);
        QCOMPARE(ini->MSNs().at(0), (MsnRecord {"4711", QString::fromUtf8("Büro")}));
        QCOMPARE(ini->MSNs().at(1), (MsnRecord {"0815", "Fax"}));

        // A trailing partial record is ignored; an over-long length byte reads only the field.
        writeFile(path("msns"), msnRecord("1", "A", 255) + QByteArray(51, '\xff'));
        ini->ReadMSNSFromFile();
        QCOMPARE(ini->MSNs().size(), 1);
        QCOMPARE(ini->MSNs().at(0).MSN, QString("1") + QString(19, u'x'));
        QCOMPARE(ini->MSNs().at(0).Bezeichnung, QStringLiteral("A"));

        writeFile(path("msns"), QByteArray(51, '\x14'));
        ini->ReadMSNSFromFile();
        QVERIFY(ini->MSNs().isEmpty());

        writeFile(path("msns"), msnRecord("2", "B"));
        ini->ReadMSNSFromFile();
        QCOMPARE(ini->MSNs().size(), 1);
        QVERIFY(QFile::remove(path("msns")));
        ini->ReadMSNSFromFile();
        QVERIFY(ini->MSNs().isEmpty());
        QCOMPARE((*m_dialogs)->count(), 0);
    }

    void autostartEntry()
    {
        writeFile(path("ISDNStore"), "[MoniOptions]\r\n");
        auto ini = settings();
        QVERIFY(!ini->IsAppInRun());
        QVERIFY(QDir().mkpath(path("config/autostart")));
        writeFile(path("config/autostart/rufwarte.desktop"), "[Desktop Entry]\n");
        QVERIFY(ini->IsAppInRun());
        QVERIFY(ini->ReadFromIni());
        QVERIFY(ini->AutoStart());

        TRufwarteIni unnamed;
        unnamed.SetFileNames(path("ISDNStore"), "MoniOptions", "msns", QString());
        QVERIFY(!unnamed.IsAppInRun());
        QVERIFY(QFile::remove(path("config/autostart/rufwarte.desktop")));
    }

    void neverWrites()
    {
        const QByteArray text = "[MoniOptions]\nAC=2\n[x]\n";
        writeFile(path("ISDNStore"), text);
        auto ini = settings();
        QVERIFY(ini->ReadFromIni());
        QFile file(path("ISDNStore"));
        QVERIFY(file.open(QIODevice::ReadOnly));
        QCOMPARE(file.readAll(), text);
        QVERIFY(!QFile::exists(path("msns")));
    }

    void writtenMsnFileReadsBack()
    {
        const QList<MsnRecord> msns{{QStringLiteral("3012345670"), QString::fromUtf8("Büro – Straße")},
                                    {QStringLiteral("123456789012345678901"), QString(31, u'x')},
                                    {QString(), QString()}};
        QVERIFY(writeMsnFile(path("msns"), msns));
        const QByteArray bytes = encodeMsnFile(msns);
        QCOMPARE(bytes.size(), 3 * TRufwarteIni::kMsnRecordSize);
        QCOMPARE(bytes.mid(21, 14), QByteArray("\x0D" "B\xFCro \x96 Stra\xDF" "e"));
        auto ini = settings();
        QCOMPARE(ini->MSNs(), (QList<MsnRecord>{msns[0], {QStringLiteral("12345678901234567890"), QString(30, u'x')}, {}}));
        QVERIFY(writeMsnFile(path("msns"), {}));
        ini->ReadMSNSFromFile();
        QVERIFY(ini->MSNs().isEmpty());
    }
};

ORVANTA_TEST(TestRufwarteIni)
#include "tst_rufwarteini.moc"
