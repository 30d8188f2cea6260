#include "app/ActionRegistry.h"
#include "app/SlotRegistry.h"
#include "tests/support/TestRegistry.h"
#include "ui/calendar/PlannerCalendar.h"
#include "ui/navbar/AdvNavBar.h"
#include "ui/statusbar/PanelStatusBar.h"

#include <QAction>
#include <QHelpEvent>
#include <QSignalSpy>
#include <QTest>
#include <QToolButton>
#include <QToolTip>

using namespace orvanta;

class TestWidgets final : public QObject {
    Q_OBJECT

private Q_SLOTS:
    void calendarMarksDaysWithHints()
    {
        PlannerCalendar cal;
        cal.resize(220, 200);
        cal.show();
        QVERIFY(QTest::qWaitForWindowExposed(&cal));
        cal.setDate(QDate(2024, 5, 15));
        cal.addEvent(QDate(2024, 5, 14), QStringLiteral("Protokoll vom 14.05.2024"));
        cal.addEvent(QDate(2023, 12, 31), QStringLiteral("Protokoll vom 31.12.2023"));
        cal.addEvent(QDate(), QStringLiteral("ignored"));
        QCOMPARE(cal.eventCount(), 2);
        QCOMPARE(cal.latestEventDay(QDate(1900, 1, 1)), QDate(2024, 5, 14));
        QVERIFY(!cal.latestEventDay(QDate(2025, 1, 1)).isValid());

        // The hint of a marked day is its tool tip; an unmarked day has none.
        const QRect marked = cal.dayRect(QDate(2024, 5, 14));
        QVERIFY(!marked.isEmpty());
        QCOMPARE(cal.dateAt(marked.center()), QDate(2024, 5, 14));
        QHelpEvent help(QEvent::ToolTip, marked.center(), cal.mapToGlobal(marked.center()));
        QApplication::sendEvent(&cal, &help);
        QTRY_COMPARE(QToolTip::text(), QStringLiteral("Protokoll vom 14.05.2024"));
        const QRect plain = cal.dayRect(QDate(2024, 5, 16));
        QHelpEvent none(QEvent::ToolTip, plain.center(), cal.mapToGlobal(plain.center()));
        QApplication::sendEvent(&cal, &none);
        QTRY_VERIFY(!QToolTip::isVisible());

        // A click picks the day; the month buttons carry their hints and only move the month.
        QSignalSpy picked(&cal, &PlannerCalendar::daySelected);
        QTest::mouseClick(&cal, Qt::LeftButton, {}, marked.center());
        QCOMPARE(picked.size(), 1);
        QCOMPARE(picked.first().first().toDate(), QDate(2024, 5, 14));
        auto* prev = cal.findChild<QToolButton*>(QStringLiteral("PC1_prevMonth"));
        auto* next = cal.findChild<QToolButton*>(QStringLiteral("PC1_nextMonth"));
        QCOMPARE(prev->toolTip(), QStringLiteral("vorheriger Monat"));
        QCOMPARE(next->toolTip(), QStringLiteral("nächster Monat"));
        prev->click();
        QCOMPARE(cal.shownMonth(), QDate(2024, 4, 1));
        QCOMPARE(cal.date(), QDate(2024, 5, 14));
        QCOMPARE(picked.size(), 1);
        QTest::keyClick(&cal, Qt::Key_Down);
        QCOMPARE(cal.date(), QDate(2024, 5, 21));
        QCOMPARE(cal.shownMonth(), QDate(2024, 5, 1));

        cal.beginUpdate();
        cal.beginUpdate();
        cal.clearEvents();
        cal.endUpdate();
        QVERIFY(!cal.updatesEnabled());
        cal.endUpdate();
        cal.endUpdate(); // unbalanced: harmless
        QVERIFY(cal.updatesEnabled());
        QVERIFY(!cal.hasEvents());
    }

    void navBarReportsOnlyTheUsersChoice()
    {
        AdvNavBar bar;
        for (const char* caption : {"A", "B", "C"}) {
            auto* p = new AdvNavBarPanel(QString::fromLatin1(caption));
            p->setObjectName(QStringLiteral("panel") + QString::fromLatin1(caption));
            bar.addPanel(p);
        }
        QSignalSpy changed(&bar, &AdvNavBar::changed);
        QCOMPARE(bar.activeTabIndex(), 0);
        bar.setActiveTabIndex(2);
        bar.setActiveTabIndex(7);
        QCOMPARE(bar.activeTabIndex(), 2);
        QCOMPARE(changed.size(), 0);
        bar.panelButton(1)->click();
        QCOMPARE(bar.activeTabIndex(), 1);
        QCOMPARE(changed.size(), 1);
        bar.panelButton(1)->click(); // the panel already shown
        QCOMPARE(changed.size(), 1);
        bar.setStyleIndex(9);
        QCOMPARE(bar.styleIndex(), 1);
    }

    void statusPanelsIgnoreUnknownIndexes()
    {
        PanelStatusBar bar({100, 0});
        bar.setPanelText(1, QStringLiteral("x"));
        bar.setPanelText(5, QStringLiteral("y"));
        bar.setPanelText(-1, QStringLiteral("y"));
        QCOMPARE(bar.panelText(1), QStringLiteral("x"));
        QCOMPARE(bar.panelText(5), QString());
    }

    void windowSlotsSurviveWindowsDestroyedElsewhere()
    {
        WindowSlots slots;
        auto* a = new QWidget;
        auto* b = new QWidget;
        QCOMPARE(slots.take(a), 0);
        QCOMPARE(slots.take(b), 1);
        delete a; // closed and freed by someone else
        QCOMPARE(slots.firstFree(), 0);
        QCOMPARE(slots.take(new QWidget), 0);
        QCOMPARE(slots.size(), 2);
        slots.free(1);
        slots.free(17);
        QCOMPARE(slots.firstUsed(), 0);
        slots.clear();
        QVERIFY(slots.allFree());
        QCoreApplication::sendPostedEvents(nullptr, QEvent::DeferredDelete);
    }

    void actionsRunOnlyWhileTheirRuleAllows()
    {
        QObject owner;
        ActionRegistry actions(&owner);
        bool allowed = false;
        int runs = 0;
        QAction* ruled =
            actions.add(QStringLiteral("ruled"), QStringLiteral("Regel"), [&] { ++runs; }, [&] { return allowed; });
        QAction* declared = actions.add(QStringLiteral("declared"), QStringLiteral("Ohne"));
        QCOMPARE(declared->text(), QStringLiteral("Ohne"));
        actions.update();
        QVERIFY(!ruled->isEnabled());
        QVERIFY(!declared->isEnabled()); // nobody gave it a handler yet

        // A stale enabled state does not let a trigger through.
        ruled->setEnabled(true);
        ruled->trigger();
        QCOMPARE(runs, 0);
        QVERIFY(!ruled->isEnabled());
        allowed = true;
        actions.runIfEnabled(QStringLiteral("ruled"));
        QCOMPARE(runs, 1);

        // A feature gives the declared action its behaviour; without a rule it is always enabled.
        int featureRuns = 0;
        actions.define(QStringLiteral("declared"), [&] { ++featureRuns; });
        actions.update();
        QVERIFY(declared->isEnabled());
        declared->trigger();
        QCOMPARE(featureRuns, 1);
        QVERIFY(!actions.find(QStringLiteral("unknown")));

        // Once frozen, the rules are no longer asked.
        actions.freeze();
        allowed = false;
        actions.update();
        QVERIFY(ruled->isEnabled());
    }
};

ORVANTA_TEST(TestWidgets)
#include "tst_widgets.moc"
