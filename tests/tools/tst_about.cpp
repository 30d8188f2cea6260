// The information window: what it says comes from the installation it runs in.

#include "platform/ProgramFolder.h"
#include "tests/support/ProgramTestEnv.h"
#include "tests/support/TestRegistry.h"
#include "tools/about/AboutDialog.h"

#include <QLabel>
#include <QPushButton>
#include <QRegularExpression>
#include <QTest>

using namespace orvanta;
using orvanta::test::ProgramTestEnv;

class TestAbout : public QObject {
    Q_OBJECT

    static QString text(QWidget& w, const char* name)
    {
        auto* label = w.findChild<QLabel*>(QLatin1String(name));
        return label != nullptr ? label->text() : QStringLiteral("<fehlt>");
    }

private Q_SLOTS:
    void showsTheInstallationItRunsIn()
    {
        ProgramTestEnv e(QDateTime(QDate(2024, 5, 15), QTime(12, 0)), ProgramTestEnv::ErrorLogSetup::None);
        about::AboutDialog dialog;
        QCOMPARE(text(dialog, "lblProgram"), QStringLiteral("Varnik Orvanta"));
        QCOMPARE(text(dialog, "lblVersion"), QStringLiteral("Version " ORVANTA_VERSION));
        QVERIFY(text(dialog, "lblLicence").startsWith(QStringLiteral("Freeware")));
        QCOMPARE(text(dialog, "lblProgramFolder"), programFolder());
        QCOMPARE(text(dialog, "lblDatabase"), e.db().path());
        QCOMPARE(text(dialog, "lblQtVersion"), QString::fromLatin1(qVersion()));
        // The client's own version, "3.0.11.33637" (the legacy text's "6.3" is not Firebird's).
        QVERIFY2(QRegularExpression(QStringLiteral("^[3-9]\\.\\d+\\.\\d+\\.\\d+$")).match(text(dialog, "lblFirebirdVersion")).hasMatch(),
                 qPrintable(text(dialog, "lblFirebirdVersion")));

        auto* ok = dialog.findChild<QPushButton*>(QStringLiteral("btnOK"));
        QVERIFY(ok != nullptr);
        ok->click();
        QCOMPARE(dialog.result(), int(QDialog::Accepted));
    }

    void saysWhenNoDatabaseIsSet()
    {
        ProgramTestEnv e(QDateTime(QDate(2024, 5, 15), QTime(12, 0)), ProgramTestEnv::ErrorLogSetup::None);
        qputenv("VARNIK_HKLM", QFile::encodeName(e.file(QStringLiteral("leer.ini"))));
        about::AboutDialog dialog;
        QCOMPARE(text(dialog, "lblDatabase"), QStringLiteral("(keine Datenbank eingestellt)"));
    }
};

ORVANTA_TEST(TestAbout)
#include "tst_about.moc"
