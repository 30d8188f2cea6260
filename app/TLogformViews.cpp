// The view switch of the main window and the buttons of the navigation panels.

#include "app/TLogform.h"

#include "calllog/LogMaintenance.h"
#include "platform/Clock.h"
#include "platform/ErrorLog.h"
#include "ui/calendar/PlannerCalendar.h"
#include "ui/frames/ContactListFrame.h"
#include "ui/frames/LogListFrame.h"
#include "ui/navbar/AdvNavBar.h"
#include "ui/statusbar/PanelStatusBar.h"

#include <QAction>
#include <QCheckBox>
#include <QLayout>
#include <QRadioButton>

namespace orvanta {

namespace {

// Clears a flag when the scope ends, however it ends.
class FlagGuard final {
public:
    explicit FlagGuard(bool& flag)
        : m_flag(flag)
    {
        m_flag = true;
    }
    ~FlagGuard() { m_flag = false; }
    FlagGuard(const FlagGuard&) = delete;
    FlagGuard& operator=(const FlagGuard&) = delete;

private:
    bool& m_flag;
};

} // namespace

LogMarkContext TLogform::markContext() const
{
    return {m_calendar, m_logFrame.data(), m_navBar->activeTabIndex() == TabCalendar};
}

void TLogform::freeFrames()
{
    if (m_logFrame) {
        try {
            m_logFrame->StoreLogView();
        } catch (const std::exception& e) {
            logError(QStringLiteral("# Orvanta - StoreLogView"), &e);
        }
        delete m_logFrame.data();
    }
    if (m_contactFrame) {
        try {
            m_contactFrame->DBDisconnect();
        } catch (const std::exception& e) {
            logError(QStringLiteral("# Orvanta - DBDisconnect"), &e);
        }
        delete m_contactFrame.data();
    }
    delete m_emptyFrame.data();
}

void TLogform::showEmptyFrame()
{
    auto* frame = new QWidget(m_p1);
    frame->setObjectName(QStringLiteral("emptyFrame"));
    frame->setAutoFillBackground(true);
    QPalette pal = frame->palette();
    pal.setColor(QPalette::Window, palette().color(QPalette::Base));
    frame->setPalette(pal);
    m_p1->layout()->addWidget(frame);
    m_emptyFrame = frame;
}

void TLogform::showContactFrame()
{
    ContactListFrame* frame = m_factories.contactFrame ? m_factories.contactFrame(m_p1) : nullptr;
    if (!frame) {
        showEmptyFrame();
        return;
    }
    frame->setObjectName(QStringLiteral("contactlistframe"));
    m_p1->layout()->addWidget(frame);
    m_contactFrame = frame;
    frame->DBConnect(this);
    int viewKind = 0;
    int grouping = 0;
    frame->GetViewState(viewKind, grouping);
    if (viewKind == 1 || viewKind == 2)
        m_rzrb[viewKind]->setChecked(true);
    FlagGuard guard(m_grouping);
    for (int i = 1; i <= 4; ++i) {
        m_rzcb[i]->setChecked(i - 1 == grouping);
        m_rzcb[i]->setEnabled(viewKind != 2);
    }
}

void TLogform::showLogFrame(int viewMode)
{
    LogListFrame* frame = m_factories.logFrame ? m_factories.logFrame(m_p1) : nullptr;
    if (!frame) {
        showEmptyFrame();
        return;
    }
    frame->setObjectName(QStringLiteral("logframe"));
    m_p1->layout()->addWidget(frame);
    m_logFrame = frame;
    frame->setViewMode(viewMode);
    if (viewMode == 1) {
        // Today when it has entries, else the latest day with entries, else today.
        QDate day = Clock::today();
        if (!m_calendar->hasEvent(day)) {
            const QDate latest = m_calendar->latestEventDay(QDate(1900, 1, 1));
            if (latest.isValid())
                day = latest;
        }
        m_calendar->setDate(day);
        frame->setLogDay(day);
    }
    frame->Firstep(this);
    if (viewMode == 1 && !m_calendar->hasEvents()) {
        frame->setNoLog(true);
        frame->setCaptionText(QStringLiteral("Kein Protokoll vorhanden."));
    }
}

void TLogform::AdvNavBar1Change()
{
    try {
        m_statusBar->setPanelText(2, QString());
        freeFrames();
        switch (m_navBar->activeTabIndex()) {
        case TabContacts:
            showContactFrame();
            break;
        case TabCalendar:
            showLogFrame(1);
            break;
        default:
            showLogFrame(0);
            syncLogButtons();
            break;
        }
        // The search entry of the list shown.
        const bool contacts = m_navBar->activeTabIndex() == TabContacts;
        action(QStringLiteral("_LogFo_Search"))->setVisible(contacts);
        action(QStringLiteral("_LogFo_LogSearch"))->setVisible(!contacts);
        updateActions();
    } catch (const std::exception& e) {
        reportError(QStringLiteral("# Orvanta - AdvNavBar1Change"), &e);
    }
}

void TLogform::syncLogButtons()
{
    if (!m_logFrame)
        return;
    int filterKind = 0;
    LogGrouping grouping = LogGrouping::None;
    m_logFrame->WhatsOn(filterKind, grouping);
    const int groupKind = static_cast<int>(grouping);
    FlagGuard guard(m_grouping);
    if (filterKind >= 0 && filterKind <= 3)
        m_rzrb[3 + filterKind]->setChecked(true);
    // Group kind k belongs to the box with tag k + 5.
    for (int n = 5; n <= 10; ++n)
        m_rzcb[n]->setChecked(n - 5 == groupKind);
    if (groupKind < 0 || groupKind > 5)
        m_rzcb[5]->setChecked(true);
}

void TLogform::selectPanelFromMenu(int tab)
{
    if (tab == m_navBar->activeTabIndex())
        return;
    m_navBar->setActiveTabIndex(tab);
    AdvNavBar1Change();
}

void TLogform::PC1DaySelected(QDate day)
{
    if (!m_logFrame)
        return;
    try {
        m_logFrame->OpenDBonDay(day);
    } catch (const std::exception& e) {
        reportError(QStringLiteral("# Orvanta - PC1DaySelected"), &e);
    }
}

void TLogform::contactGroupClicked(QCheckBox* box)
{
    if (m_grouping)
        return;
    FlagGuard guard(m_grouping);
    try {
        for (int i = 1; i <= 4; ++i)
            m_rzcb[i]->setChecked(m_rzcb[i] == box);
        if (m_contactFrame)
            m_contactFrame->ToGroup(box->property("tag").toInt());
    } catch (const std::exception& e) {
        reportError(QStringLiteral("# Orvanta - rzcb1Click"), &e);
    }
}

void TLogform::logGroupClicked(QCheckBox* box)
{
    if (m_grouping)
        return;
    FlagGuard guard(m_grouping);
    try {
        for (int n = 5; n <= 10; ++n)
            m_rzcb[n]->setChecked(m_rzcb[n] == box);
        if (m_logFrame) {
            m_logFrame->ToGroup(static_cast<LogGrouping>(box->property("tag").toInt() - 5));
            m_logFrame->SetTableViewPopup();
        }
    } catch (const std::exception& e) {
        reportError(QStringLiteral("# Orvanta - rzcb5Click"), &e);
    }
}

void TLogform::logFilterClicked(int tag)
{
    if (m_grouping)
        return;
    FlagGuard guard(m_grouping);
    try {
        if (m_logFrame)
            m_logFrame->SetNewFilter(tag);
    } catch (const std::exception& e) {
        reportError(QStringLiteral("# Orvanta - rzrb3Click"), &e);
    }
}

void TLogform::contactViewClicked(int kind)
{
    if (m_grouping)
        return;
    FlagGuard guard(m_grouping);
    try {
        if (!m_contactFrame)
            return;
        const bool switched = m_contactFrame->ChangeView(kind);
        // The card view has no grouping; back in the table the boxes show its grouping.
        int viewKind = 0;
        int grouping = 0;
        m_contactFrame->GetViewState(viewKind, grouping);
        for (int i = 1; i <= 4; ++i) {
            m_rzcb[i]->setEnabled(switched && viewKind == 1);
            m_rzcb[i]->setChecked(i - 1 == grouping);
        }
    } catch (const std::exception& e) {
        reportError(QStringLiteral("# Orvanta - rzrb1Click"), &e);
    }
}

} // namespace orvanta
