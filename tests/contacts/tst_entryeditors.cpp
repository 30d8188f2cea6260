#include "contacts/EntryEditors.h"
#include "tests/support/TestRegistry.h"
#include "tests/support/TypeKeys.h"

#include <QAction>
#include <QApplication>
#include <QKeyEvent>
#include <QCheckBox>
#include <QLineEdit>
#include <QPushButton>
#include <QTest>
#include <QTimer>

using namespace orvanta;
using orvanta::test::typeKeys;

namespace {

QLineEdit* edit(const QWidget& w, const char* name)
{
    return w.findChild<QLineEdit*>(QLatin1String(name));
}

} // namespace

class TstEntryEditors : public QObject {
    Q_OBJECT

private Q_SLOTS:
    void typedKeysOutsideEachFieldsSetAreSwallowed()
    {
        Tcomeditform f;
        f.show();
        QLineEdit* lc = edit(f, "RzEdit1");
        typeKeys(lc, QStringLiteral("+49a+1("));
        QCOMPARE(lc->text(), QStringLiteral("+491"));
        // Nothing goes in front of a leading "+".
        lc->setCursorPosition(0);
        typeKeys(lc, QStringLiteral("7+"));
        QCOMPARE(lc->text(), QStringLiteral("+491"));
        lc->clear();
        typeKeys(lc, QStringLiteral("0049+"));
        QCOMPARE(lc->text(), QStringLiteral("0049"));
        QTest::keyClick(lc, Qt::Key_Backspace);
        QCOMPARE(lc->text(), QStringLiteral("004"));

        QLineEdit* vorw = edit(f, "RzEdit3");
        typeKeys(vorw, QStringLiteral("+089 x/"));
        QCOMPARE(vorw->text(), QStringLiteral("089"));

        QLineEdit* nr = edit(f, "RzEdit4");
        typeKeys(nr, QStringLiteral("12/34-56 #7+8(9)abc"));
        QCOMPARE(nr->text(), QStringLiteral("12/34-56 #7+89"));
        QCOMPARE(nr->maxLength(), 15);

        QLineEdit* label = edit(f, "RzEdit2");
        typeKeys(label, QStringLiteral(" Tel Büro"));
        QCOMPARE(label->text(), QStringLiteral("Tel Büro"));
        QCOMPARE(label->maxLength(), 20);
        // Pasted text is not filtered.
        vorw->clear();
        vorw->insert(QStringLiteral("+4a"));
        QCOMPARE(vorw->text(), QStringLiteral("+4a"));

        Tmaileditform m;
        m.show();
        typeKeys(edit(m, "RzEdit2"), QStringLiteral(" a b@c.de"));
        QCOMPARE(edit(m, "RzEdit2")->text(), QStringLiteral("a b@c.de"));
    }

    void okNeedsTheRequiredFieldsAndCancelKeepsTheEntry()
    {
        Tcomeditform f;
        f.KOMMBEZ = QStringLiteral("Büro");
        f.LC = QStringLiteral("0049");
        f.NUMBER = QStringLiteral("123");
        f.AUTOREJECT = true;
        f.show();
        auto* ok = f.findChild<QAction*>(QStringLiteral("comeditfo_ok"));
        QVERIFY(ok->isEnabled());
        QVERIFY(f.findChild<QCheckBox*>(QStringLiteral("RzCheckBox1"))->isChecked());
        edit(f, "RzEdit4")->clear();
        QVERIFY(!ok->isEnabled());
        QVERIFY(!f.findChild<QPushButton*>(QStringLiteral("RzButton1"))->isEnabled());
        edit(f, "RzEdit4")->setText(QStringLiteral("999"));
        edit(f, "RzEdit2")->clear();
        QVERIFY(!ok->isEnabled());
        edit(f, "RzEdit2")->setText(QStringLiteral("Neu"));
        edit(f, "RzEdit5")->setText(QStringLiteral("Bemerkt"));
        f.findChild<QCheckBox*>(QStringLiteral("RzCheckBox1"))->setChecked(false);
        f.findChild<QPushButton*>(QStringLiteral("RzButton2"))->click();
        QVERIFY(!f.ok());
        QCOMPARE(f.KOMMBEZ, QStringLiteral("Büro"));
        QCOMPARE(f.NUMBER, QStringLiteral("123"));
        QVERIFY(f.AUTOREJECT);

        Tcomeditform g;
        g.show();
        QVERIFY(!g.findChild<QAction*>(QStringLiteral("comeditfo_ok"))->isEnabled());
        edit(g, "RzEdit2")->setText(QStringLiteral("Mobil"));
        edit(g, "RzEdit4")->setText(QStringLiteral("0171"));
        g.findChild<QCheckBox*>(QStringLiteral("RzCheckBox1"))->setChecked(true);
        g.findChild<QPushButton*>(QStringLiteral("RzButton1"))->click();
        QVERIFY(g.ok());
        QCOMPARE(g.KOMMBEZ, QStringLiteral("Mobil"));
        QCOMPARE(g.NUMBER, QStringLiteral("0171"));
        QVERIFY(g.AUTOREJECT);

        Tmaileditform m;
        m.MAILADDR = QStringLiteral("alt@x.de");
        m.show();
        auto* mailOk = m.findChild<QAction*>(QStringLiteral("mailedit_ok"));
        edit(m, "RzEdit2")->clear();
        QVERIFY(!mailOk->isEnabled());
        edit(m, "RzEdit2")->setText(QStringLiteral("neu@x.de"));
        QVERIFY(mailOk->isEnabled()); // no remark needed
        m.findChild<QPushButton*>(QStringLiteral("RzButton2"))->click();
        QVERIFY(!m.ok());
        QCOMPARE(m.MAILADDR, QStringLiteral("alt@x.de"));
        mailOk->trigger();
        QVERIFY(m.ok());
        QCOMPARE(m.MAILADDR, QStringLiteral("neu@x.de"));
        QCOMPARE(m.BEMERK, QString());
    }
};

ORVANTA_TEST(TstEntryEditors)
#include "tst_entryeditors.moc"
