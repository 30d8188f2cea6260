#include "categories/CategoryStore.h"
#include "db/TDM2.h"
#include "tests/categories/CategoryTestEnv.h"
#include "tests/support/TestRegistry.h"

#include <QTest>

using namespace orvanta;
using orvanta::test::CategoryTestEnv;

class TestCategoryStore final : public QObject {
    Q_OBJECT

private Q_SLOTS:
    void newAndRenamedCategoriesKeepTheirTextWhole()
    {
        CategoryTestEnv env;
        env.addCategory(1, QStringLiteral("Familie"));
        // 30 characters with quotes and umlauts, and a trailing blank the database trims.
        const QString name = QStringLiteral("Ärzte 'Süd' \"Öst\" und ßonstige ");
        QCOMPARE(name.trimmed().size(), 30);
        int id = 0;
        QCOMPARE(InsertKat(env.dm(), 0, name, QStringLiteral("Bemerkung mit ü"), &id), KatSaveResult::Saved);
        QVERIFY(id > 1);
        QCOMPARE(env.text(QStringLiteral("SELECT KATBEZ FROM KAT WHERE LID = %1").arg(id)), name.trimmed());
        QCOMPARE(env.text(QStringLiteral("SELECT BEMERKUNG FROM KAT WHERE LID = %1").arg(id)),
                 QStringLiteral("Bemerkung mit ü"));

        // Renaming a category to its own name in another case is no clash with itself.
        int same = 0;
        QCOMPARE(InsertKat(env.dm(), 1, QStringLiteral("FAMILIE"), QString(), &same), KatSaveResult::Saved);
        QCOMPARE(same, 1);
        QCOMPARE(env.text(QStringLiteral("SELECT KATBEZ FROM KAT WHERE LID = 1")), QStringLiteral("FAMILIE"));
        QCOMPARE(env.dialogs().count(), 0);
        QVERIFY(!env.dm().IBSQLTS.isActive());
    }

    void aNameThatDiffersOnlyInCaseIsRefusedAndNothingStored()
    {
        CategoryTestEnv env;
        env.addCategory(1, QStringLiteral("Familie"));
        env.addCategory(2, QStringLiteral("Freunde"));
        QCOMPARE(InsertKat(env.dm(), 0, QStringLiteral("fAMILIE"), QString()), KatSaveResult::NameTaken);
        QCOMPARE(InsertKat(env.dm(), 2, QStringLiteral("familie"), QStringLiteral("x")), KatSaveResult::NameTaken);
        QCOMPARE(env.dialogs().texts(DialogKind::Information),
                 QStringList(2, QStringLiteral("Die angegebene Kategoriebezeichnung ist bereits vorhanden!")));
        QCOMPARE(env.count(QStringLiteral("SELECT COUNT(*) FROM KAT")), 2);
        QCOMPARE(env.text(QStringLiteral("SELECT KATBEZ FROM KAT WHERE LID = 2")), QStringLiteral("Freunde"));
        QVERIFY(!env.errorLogText().contains(QStringLiteral("# CatControl")));
    }

    void renamingACategoryAnotherProgramDeletedIsADatabaseError()
    {
        CategoryTestEnv env;
        env.addCategory(1, QStringLiteral("Familie"));
        (void)env.dm();
        env.db().exec(QStringLiteral("DELETE FROM KAT WHERE LID = 1"));
        QCOMPARE(InsertKat(env.dm(), 1, QStringLiteral("Verwandte"), QString()), KatSaveResult::DatabaseError);
        const QString text = QStringLiteral("# CatControl - InsertKat\r\nEs ist ein Datenbankfehler bei der "
                                            "Bearbeitung aufgetreten!\r\nKategorie kann nicht gespeichert werden.");
        QVERIFY(env.dialogs().last().text.startsWith(text));
        QVERIFY(env.errorLogText().contains(text));
        QCOMPARE(env.count(QStringLiteral("SELECT COUNT(*) FROM KAT")), 0);
    }

    void deletingMovingAndCuttingChangeOnlyTheLinks()
    {
        CategoryTestEnv env;
        env.addCategory(1, QStringLiteral("Familie"));
        env.addCategory(2, QStringLiteral("Kunden"));
        env.addContact(10, QStringLiteral("Anna"), 1);
        env.addContact(11, QStringLiteral("Bert"), 1);
        env.addContact(12, QStringLiteral("Carl"), 2);

        QVERIFY(ChangeConKat(env.dm(), 110, 2));
        QCOMPARE(env.count(QStringLiteral("SELECT KID FROM CONKAT WHERE CID = 10")), 2);
        QVERIFY(DeleteRelated(env.dm(), 112));
        QCOMPARE(env.count(QStringLiteral("SELECT COUNT(*) FROM CONKAT WHERE CID = 12")), 0);
        QVERIFY(DeleteKat(env.dm(), 2));
        QCOMPARE(env.count(QStringLiteral("SELECT COUNT(*) FROM KAT")), 1);
        QCOMPARE(env.count(QStringLiteral("SELECT COUNT(*) FROM CONKAT")), 1); // Bert still in Familie
        QCOMPARE(env.count(QStringLiteral("SELECT COUNT(*) FROM CONTACT")), 3);
        QCOMPARE(env.dialogs().count(), 0);
    }

    void aMoveToACategoryThatIsGoneIsReportedAndChangesNothing()
    {
        CategoryTestEnv env;
        env.addCategory(1, QStringLiteral("Familie"));
        env.addContact(10, QStringLiteral("Anna"), 1);
        QVERIFY(!ChangeConKat(env.dm(), 110, 77));
        QVERIFY(env.dialogs().last().text.startsWith(QStringLiteral(
            "# CatControl - ChangeConKat\r\nEs ist ein Datenbankfehler bei der Bearbeitung aufgetreten!")));
        QCOMPARE(env.count(QStringLiteral("SELECT KID FROM CONKAT WHERE CID = 10")), 1);
        QVERIFY(!env.dm().IBSQLTS.isActive());
        // The connection is fine afterwards: the next write goes through.
        QVERIFY(DeleteRelated(env.dm(), 110));
        QCOMPARE(env.count(QStringLiteral("SELECT COUNT(*) FROM CONKAT")), 0);
    }
};

ORVANTA_TEST(TestCategoryStore)
#include "tst_categorystore.moc"
