#include "categories/CategoryDialogs.h"
#include "tests/support/TestRegistry.h"

#include <QAction>
#include <QLineEdit>
#include <QListWidget>
#include <QPushButton>
#include <QTest>

using namespace orvanta;

namespace {

QStringList lines(const QListWidget* list)
{
    QStringList out;
    for (int i = 0; i < list->count(); ++i)
        out << list->item(i)->text();
    return out;
}

} // namespace

class TestCategoryDialogs final : public QObject {
    Q_OBJECT

private Q_SLOTS:
    void aNewNameEnablesOkAndCannotBeginWithABlank()
    {
        Tkateditform form;
        form.show();
        auto* name = form.findChild<QLineEdit*>(QStringLiteral("RzE1"));
        auto* remark = form.findChild<QLineEdit*>(QStringLiteral("RzE2"));
        auto* ok = form.findChild<QPushButton*>(QStringLiteral("RzB1"));
        QVERIFY(!ok->isEnabled());
        QVERIFY(!form.findChild<QAction*>(QStringLiteral("katedit_ok"))->isEnabled());
        QTest::keyClicks(name, QStringLiteral("  Gute Kunden"));
        QCOMPARE(name->text(), QStringLiteral("Gute Kunden"));
        QVERIFY(form.changed());
        QVERIFY(ok->isEnabled());
        // At the start again, a blank still cannot go in front.
        name->setCursorPosition(0);
        QTest::keyClick(name, Qt::Key_Space);
        QCOMPARE(name->text(), QStringLiteral("Gute Kunden"));
        QTest::keyClicks(name, QStringLiteral("x123456789012345678901234567890"));
        QCOMPARE(name->text().size(), 30);
        QTest::keyClicks(remark, QString(50, QLatin1Char('r')));
        QCOMPARE(remark->text().size(), 40);
        QTest::mouseClick(ok, Qt::LeftButton);
        QVERIFY(form.confirmed());
        QCOMPARE(form.name(), name->text());
        QCOMPARE(form.remark(), QString(40, QLatin1Char('r')));
    }

    void anEditedCategoryStartsUnchangedAndCancelKeepsItsValues()
    {
        Tkateditform form;
        form.setName(QStringLiteral("Familie"));
        form.setRemark(QStringLiteral("alle"));
        form.show();
        auto* name = form.findChild<QLineEdit*>(QStringLiteral("RzE1"));
        auto* ok = form.findChild<QPushButton*>(QStringLiteral("RzB1"));
        QCOMPARE(name->text(), QStringLiteral("Familie"));
        QCOMPARE(form.findChild<QLineEdit*>(QStringLiteral("RzE2"))->text(), QStringLiteral("alle"));
        QVERIFY(!form.changed());
        QVERIFY(ok->isEnabled());
        name->clear();
        QVERIFY(!ok->isEnabled());
        // OK does nothing on an empty name, even when triggered by other means.
        form.katedit_okExecute();
        QVERIFY(!form.confirmed());
        QTest::keyClicks(name, QStringLiteral("Verwandte"));
        QVERIFY(ok->isEnabled());
        QTest::mouseClick(form.findChild<QPushButton*>(QStringLiteral("RzB2")), Qt::LeftButton);
        QVERIFY(!form.confirmed());
        QCOMPARE(form.name(), QStringLiteral("Familie"));
    }

    void theChoiceListIsAlphabeticalAndTheFirstOfTwoEqualNamesWins()
    {
        TSelKatForm form;
        form.Add_kd(0, QStringLiteral("Null"));
        form.Add_kd(-3, QStringLiteral("Minus"));
        form.Add_kd(3, QString());
        form.Add_kd(5, QStringLiteral("kunden"));
        form.Add_kd(2, QStringLiteral("Ärzte"));
        form.Add_kd(4, QStringLiteral("Familie"));
        form.Add_kd(7, QStringLiteral("Familie"));
        form.Add_kd(9, QStringLiteral("Zulieferer"));
        QCOMPARE(form.entryCount(), 5);
        form.show();
        auto* list = form.findChild<QListWidget*>(QStringLiteral("FLB1"));
        QCOMPARE(lines(list),
                 QStringList({ QStringLiteral("Ärzte"), QStringLiteral("Familie"), QStringLiteral("Familie"),
                               QStringLiteral("kunden"), QStringLiteral("Zulieferer") }));
        QCOMPARE(list->currentRow(), 0);
        QVERIFY(form.findChild<QPushButton*>(QStringLiteral("RzB1"))->isEnabled());
        QCOMPARE(form.GetKatID(QStringLiteral("KUNDEN")), -1);
        list->setCurrentRow(2);
        QTest::mouseClick(form.findChild<QPushButton*>(QStringLiteral("RzB1")), Qt::LeftButton);
        QVERIFY(form.confirmed());
        QCOMPARE(form.chosenName(), QStringLiteral("Familie"));
        QCOMPARE(form.chosenId(), 4);
    }

    void withoutCategoriesThereIsNothingToConfirm()
    {
        TSelKatForm form;
        form.show();
        QVERIFY(!form.findChild<QPushButton*>(QStringLiteral("RzB1"))->isEnabled());
        form.SelKat_OKExecute();
        QVERIFY(!form.confirmed());
        QCOMPARE(form.chosenId(), -1);
    }
};

ORVANTA_TEST(TestCategoryDialogs)
#include "tst_categorydialogs.moc"
