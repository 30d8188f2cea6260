// The main window's actions, menus and tool bars, with their enable rules.

#include "app/TLogform.h"

#include "app/AppServices.h"
#include "platform/MonitorLink.h"
#include "app/ProgramLauncher.h"
#include "calllog/LogMaintenance.h"
#include "db/TDM2.h"
#include "platform/ErrorLog.h"
#include "ui/calendar/PlannerCalendar.h"
#include "ui/frames/ContactListFrame.h"
#include "ui/frames/LogListFrame.h"
#include "ui/navbar/AdvNavBar.h"

#include <QAction>
#include <QMenu>
#include <QMenuBar>
#include <QStyle>
#include <QToolBar>

namespace orvanta {

namespace {

// Actions forwarded to the frame of the current view.
const char* const kForwarded[] = {"_LogFo_Search",          "_LogFo_LogSearch",
                                  "_LogFo_AttachToContact", "_LogFo_lf_OpenContactFromLog",
                                  "_LogFo_ContExport",      "_LogFo_PrintContactOverview",
                                  "_LogFo_PrintContactExposee", "_LogFo_ContCall",
                                  "_LogFo_PlayVBItem",      "_LogFo_Expand",
                                  "_LogFo_Collapse"};

} // namespace

QAction* TLogform::makeAction(const QString& name, const QString& caption, const std::function<void()>& execute)
{
    auto* a = new QAction(caption, this);
    a->setObjectName(name);
    connect(a, &QAction::triggered, this, [this, execute, name] {
        // An action runs only while enabled, whatever triggered it.
        updateActions();
        if (action(name)->isEnabled())
            execute();
    });
    return a;
}

QAction* TLogform::action(const QString& objectName) const
{
    auto* a = findChild<QAction*>(objectName, Qt::FindDirectChildrenOnly);
    Q_ASSERT_X(a, "TLogform::action", qPrintable(objectName));
    return a;
}

void TLogform::buildActions()
{
    QStyle* st = style();
    makeAction(QStringLiteral("_LogFo_Close"), QStringLiteral("Beenden"), [this] { close(); });
    auto* closeApp = makeAction(QStringLiteral("_LogFo_CloseApp"), QStringLiteral("Beenden"),
                                [this] { m_monitor->postToMonitor(MonitorLink::MonitorQuit); });
    closeApp->setToolTip(QStringLiteral("Rufwarte beenden"));
    closeApp->setStatusTip(QStringLiteral("Rufwarte beenden"));
    closeApp->setIcon(st->standardIcon(QStyle::SP_MediaStop));
    makeAction(QStringLiteral("_LogFo_MoniSTOP"), QStringLiteral("Anhalten/Fortsetzen"),
               [this] { m_monitor->postToMonitor(MonitorLink::MonitorPauseResume); })
        ->setIcon(st->standardIcon(QStyle::SP_MediaPause));
    makeAction(QStringLiteral("_LogFo_MoniSTART"), QStringLiteral("Starten"),
               [this] { m_launcher->start(QStringLiteral("rufwarte.exe"), {}, false); })
        ->setIcon(st->standardIcon(QStyle::SP_MediaPlay));
    makeAction(QStringLiteral("_LogFo_Setup"), QStringLiteral("Einstellungen..."),
               [this] { m_launcher->start(QStringLiteral("AppSetup.exe"), {}, false); });
    makeAction(QStringLiteral("_LogFo_About"), QStringLiteral("Info"),
               [this] { m_launcher->start(QStringLiteral("About.exe"), {}, false); })
        ->setIcon(st->standardIcon(QStyle::SP_MessageBoxInformation));
    makeAction(QStringLiteral("_LogFo_OEImp"), QStringLiteral("Outlook Express"), [this] { OEImpExecute(); });
    makeAction(QStringLiteral("_LogFo_Print"), QStringLiteral("Drucken"), [this] { forwardToFrame(QStringLiteral("_LogFo_Print")); })
        ->setIcon(st->standardIcon(QStyle::SP_FileDialogDetailedView));
    makeAction(QStringLiteral("_LogFo_Export"), QStringLiteral("Exportieren..."),
               [this] { forwardToFrame(QStringLiteral("_LogFo_Export")); })
        ->setIcon(st->standardIcon(QStyle::SP_DialogSaveButton));
    makeAction(QStringLiteral("_LogFo_DelLog"), QStringLiteral("Protokolleintrag löschen"), [this] { DelLogExecute(); })
        ->setIcon(st->standardIcon(QStyle::SP_TrashIcon));
    makeAction(QStringLiteral("_LogFo_DelDayLog"), QStringLiteral("Tagesprotokoll löschen"), [this] { DelDayLogExecute(); });
    makeAction(QStringLiteral("_LogFo_ContNew"), QStringLiteral("Neu..."), [this] { CreateConDataEdit(0, 0); })
        ->setIcon(st->standardIcon(QStyle::SP_FileIcon));
    makeAction(QStringLiteral("_LogFo_ContEdit"), QStringLiteral("Bearbeiten..."), [this] { ContEditExecute(); })
        ->setIcon(st->standardIcon(QStyle::SP_FileDialogContentsView));
    makeAction(QStringLiteral("_LogFo_ContDel"), QStringLiteral("Löschen"), [this] { ContDelExecute(); })
        ->setIcon(st->standardIcon(QStyle::SP_DialogDiscardButton));
    makeAction(QStringLiteral("_LogFo_OpenLogBemerkung"), QStringLiteral("Bemerkung/Detailinformationen"),
               [this] { OpenLogBemerkungExecute(); })
        ->setIcon(st->standardIcon(QStyle::SP_FileDialogInfoView));
    makeAction(QStringLiteral("_LogFo_KatVerw"), QStringLiteral("Kategorieverwaltung"),
               [this] { forwardToFrame(QStringLiteral("_LogFo_KatVerw")); })
        ->setIcon(st->standardIcon(QStyle::SP_DirIcon));

    const struct {
        const char* name;
        const char* caption;
    } forwarded[] = {{"_LogFo_Search", "Suchen"},
                     {"_LogFo_LogSearch", "Suchen"},
                     {"_LogFo_AttachToContact", "Eintrag als Kontakt anlegen"},
                     {"_LogFo_lf_OpenContactFromLog", "Zugehörigen Kontakt öffnen"},
                     {"_LogFo_ContExport", "Exportieren..."},
                     {"_LogFo_PrintContactOverview", "Kontaktliste"},
                     {"_LogFo_PrintContactExposee", "Exposé"},
                     {"_LogFo_ContCall", "Anrufen"},
                     {"_LogFo_PlayVBItem", "Anrufbeantwortereintrag abhören..."},
                     {"_LogFo_Expand", "Alle Gruppen aufklappen"},
                     {"_LogFo_Collapse", "Alle Gruppen zuklappen"}};
    for (const auto& f : forwarded) {
        const QString name = QString::fromLatin1(f.name);
        makeAction(name, QString::fromUtf8(f.caption), [this, name] { forwardToFrame(name); });
    }

    makeAction(QStringLiteral("dxBB_Ansicht_Proto"), QStringLiteral("Protokoll"), [this] { selectPanelFromMenu(TabLog); });
    makeAction(QStringLiteral("dxBB_Ansicht_Proto_PK"), QStringLiteral("Protokoll per Kalender"),
               [this] { selectPanelFromMenu(TabCalendar); });
    makeAction(QStringLiteral("dxBB_Ansicht_Kontakte"), QStringLiteral("Kontakte"),
               [this] { selectPanelFromMenu(TabContacts); });
}

void TLogform::buildMenusAndBars()
{
    QMenuBar* bar = menuBar();
    bar->setObjectName(QStringLiteral("dxBarManager1"));
    const auto addMenu = [bar](const QString& name, const QString& title) {
        QMenu* m = bar->addMenu(title);
        m->setObjectName(name);
        return m;
    };
    const auto a = [this](const char* name) { return action(QString::fromLatin1(name)); };

    addMenu(QStringLiteral("dxBB_Programm"), QStringLiteral("Programm"))->addAction(a("_LogFo_Close"));

    QMenu* log = addMenu(QStringLiteral("dxBB_Protokoll"), QStringLiteral("Protokoll"));
    log->addAction(a("_LogFo_OpenLogBemerkung"));
    log->addAction(a("_LogFo_PlayVBItem"));
    log->addAction(a("_LogFo_AttachToContact"));
    log->addAction(a("_LogFo_lf_OpenContactFromLog"));
    log->addAction(a("_LogFo_LogSearch"));
    log->addSeparator();
    log->addAction(a("_LogFo_DelLog"));
    log->addAction(a("_LogFo_DelDayLog"));
    log->addSeparator();
    log->addAction(a("_LogFo_Print"));
    log->addAction(a("_LogFo_Export"));

    QMenu* contact = addMenu(QStringLiteral("dxBB_Kontakt"), QStringLiteral("Kontakt"));
    contact->addAction(a("_LogFo_ContNew"));
    contact->addAction(a("_LogFo_ContEdit"));
    contact->addAction(a("_LogFo_ContDel"));
    contact->addAction(a("_LogFo_ContCall"));
    contact->addAction(a("_LogFo_Search"));
    contact->addSeparator();
    QMenu* import = contact->addMenu(QStringLiteral("Importieren aus..."));
    import->setObjectName(QStringLiteral("dxBB_Kontakt_Import"));
    import->addAction(a("_LogFo_OEImp"));
    contact->addAction(a("_LogFo_ContExport"));
    QMenu* print = contact->addMenu(QStringLiteral("Drucken"));
    print->setObjectName(QStringLiteral("dxBB_Kontakt_Drucken"));
    print->addAction(a("_LogFo_PrintContactOverview"));
    print->addAction(a("_LogFo_PrintContactExposee"));

    addMenu(QStringLiteral("dxBB_Kategorie"), QStringLiteral("Kategorie"))->addAction(a("_LogFo_KatVerw"));

    QMenu* monitor = addMenu(QStringLiteral("dxBB_Monitor"), QStringLiteral("Monitor"));
    monitor->addAction(a("_LogFo_MoniSTART"));
    monitor->addAction(a("_LogFo_CloseApp"));
    monitor->addAction(a("_LogFo_MoniSTOP"));

    QMenu* view = addMenu(QStringLiteral("dxBB_Ansicht"), QStringLiteral("Ansicht"));
    view->addAction(a("dxBB_Ansicht_Proto"));
    view->addAction(a("dxBB_Ansicht_Proto_PK"));
    view->addAction(a("dxBB_Ansicht_Kontakte"));
    view->addSeparator();
    view->addAction(a("_LogFo_Expand"));
    view->addAction(a("_LogFo_Collapse"));

    addMenu(QStringLiteral("dxBB_Extras"), QStringLiteral("Extras"))->addAction(a("_LogFo_Setup"));
    addMenu(QStringLiteral("dxBB_Hilfe"), QStringLiteral("?"))->addAction(a("_LogFo_About"));

    const auto addBar = [this](const QString& name, const QString& title, std::initializer_list<const char*> names) {
        QToolBar* tb = addToolBar(title);
        tb->setObjectName(name);
        tb->setToolButtonStyle(Qt::ToolButtonTextBesideIcon);
        tb->setIconSize(QSize(16, 16));
        for (const char* n : names)
            tb->addAction(action(QString::fromLatin1(n)));
        m_toolBars.push_back(tb);
    };
    addBar(QStringLiteral("dxBarProtokoll"), QStringLiteral("Protokoll"),
           {"_LogFo_OpenLogBemerkung", "_LogFo_DelLog", "_LogFo_Print", "_LogFo_Export"});
    addBar(QStringLiteral("dxBarKontakt"), QStringLiteral("Kontakt"),
           {"_LogFo_ContNew", "_LogFo_ContEdit", "_LogFo_ContDel", "_LogFo_KatVerw"});
    addBar(QStringLiteral("dxBarMonitor"), QStringLiteral("Monitor"),
           {"_LogFo_MoniSTART", "_LogFo_MoniSTOP", "_LogFo_CloseApp"});
}

// ---------------------------------------------------------------------------------------------
// Enable rules

bool TLogform::logFrameReady() const
{
    return m_logFrame && !m_logFrame->isBusy();
}

bool TLogform::contactFrameReady() const
{
    return m_contactFrame && m_contactFrame->isConnected();
}

int TLogform::selectedLogLID() const
{
    return m_logFrame ? m_logFrame->CurrentLogLID() : -1;
}

void TLogform::refreshMonitorState()
{
    m_monitorExists = m_monitor->monitorWindowExists();
    updateActions();
}

void TLogform::updateActions()
{
    if (m_tornDown)
        return;
    const auto set = [this](const char* name, bool enabled) {
        QAction* a = action(QString::fromLatin1(name));
        if (a->isEnabled() != enabled)
            a->setEnabled(enabled);
    };
    set("_LogFo_CloseApp", m_monitorExists);
    set("_LogFo_MoniSTOP", m_monitorExists);
    set("_LogFo_MoniSTART", !m_monitorExists);

    const bool logReady = logFrameReady();
    set("_LogFo_Print", logReady);
    set("_LogFo_Export", logReady);
    set("_LogFo_DelLog", logReady);
    set("_LogFo_DelDayLog", logReady && m_navBar->activeTabIndex() == TabCalendar);

    const bool contactsReady = contactFrameReady();
    const bool contactSelected = contactsReady && m_contactFrame->GetSelectedLID() > 0;
    set("_LogFo_ContNew", contactsReady);
    set("_LogFo_OEImp", contactsReady && !m_launcher->isWaiting());
    set("_LogFo_ContEdit", contactSelected);
    set("_LogFo_ContDel", contactSelected);
    set("_LogFo_PrintContactExposee", contactSelected);
    set("_LogFo_OpenLogBemerkung", selectedLogLID() > 0);

    for (const char* name : kForwarded) {
        const QString n = QString::fromLatin1(name);
        if (n == QLatin1String("_LogFo_PrintContactExposee"))
            continue;
        bool enabled = false;
        if (n == QLatin1String("_LogFo_Expand") || n == QLatin1String("_LogFo_Collapse"))
            enabled = (m_logFrame && m_logFrame->CanExpandGroups())
                || (m_contactFrame && m_contactFrame->CanExpandGroups());
        else if (n == QLatin1String("_LogFo_ContExport") || n == QLatin1String("_LogFo_PrintContactOverview"))
            enabled = contactsReady;
        else if (m_logFrame)
            enabled = m_logFrame->isActionEnabled(n);
        else if (m_contactFrame)
            enabled = m_contactFrame->isActionEnabled(n);
        set(name, enabled);
    }
}

void TLogform::runIfEnabled(const QString& actionName)
{
    updateActions();
    QAction* a = action(actionName);
    if (a->isEnabled())
        a->trigger();
}

void TLogform::forwardToFrame(const QString& actionName)
{
    try {
        if (actionName == QLatin1String("_LogFo_Expand") || actionName == QLatin1String("_LogFo_Collapse")) {
            const bool expand = actionName == QLatin1String("_LogFo_Expand");
            if (m_logFrame)
                m_logFrame->ExpandAllGroups(expand);
            else if (m_contactFrame)
                m_contactFrame->ExpandGroups(expand);
            return;
        }
        if (m_logFrame)
            m_logFrame->executeAction(actionName);
        else if (m_contactFrame)
            m_contactFrame->executeAction(actionName);
    } catch (const std::exception& e) {
        reportError(QStringLiteral("# Orvanta - ") + actionName.mid(1) + QStringLiteral("Execute"), &e);
    }
}

// ---------------------------------------------------------------------------------------------
// Execute handlers

void TLogform::DelLogExecute()
{
    const int lid = selectedLogLID();
    if (lid <= 0) {
        informationBox(QStringLiteral("Bitte wählen Sie zuerst einen Logbucheintrag aus."));
        return;
    }
    if (!askWarning(QStringLiteral("Markierten Protokolleintrag löschen?")))
        return;
    if (m_maintenance->DeleteLogItem(lid, this) && m_logFrame)
        m_logFrame->Refresh_View(0);
}

void TLogform::DelDayLogExecute()
{
    if (!IfLogDetailArrayAllFree()) {
        warningBox(QStringLiteral("Derzeit ist noch ein Informationsfenster eines\r\nProtokolleintrags geöffnet.\r\n"
                                  "Bitte schließen Sie vor dem Löschen erst alle\r\nFenster mit den Detailinformationen."));
        return;
    }
    if (!m_logFrame)
        return;
    const QDate day = m_logFrame->logDay();
    if (!askWarning(QStringLiteral("Tagesprotokoll vom ") + day.toString(QStringLiteral("dd.MM.yyyy"))
                    + QStringLiteral(" löschen?")))
        return;
    const bool deleted = m_maintenance->DeleteLogDay(day, this);
    const bool marked = m_maintenance->markLogDays(1, markContext());
    if (deleted && marked)
        informationBox(QStringLiteral("Tagesprotokoll wurde erfolgreich gelöscht."));
}

void TLogform::OpenLogBemerkungExecute()
{
    const int lid = selectedLogLID();
    if (lid <= 0) {
        informationBox(QStringLiteral("Bitte wählen Sie zuerst einen Logbucheintrag aus."));
        return;
    }
    CreateLogDetailFo(lid);
}

void TLogform::ContEditExecute()
{
    const int lid = m_contactFrame ? m_contactFrame->GetSelectedLID() : -1;
    if (lid <= 0) {
        informationBox(QStringLiteral("Bitte wählen Sie einen Kontakt zum bearbeiten aus."));
        return;
    }
    CreateConDataEdit(lid, 0);
}

void TLogform::ContDelExecute()
{
    const int lid = m_contactFrame ? m_contactFrame->GetSelectedLID() : -1;
    if (lid <= 0) {
        informationBox(QStringLiteral("Kein Kontakt ausgewählt."));
        return;
    }
    // Deleting belongs to the contact persistence; the frame carries it out.
    forwardToFrame(QStringLiteral("_LogFo_ContDel"));
}

void TLogform::OEImpExecute()
{
    m_launcher->start(QStringLiteral("OEImp.exe"), {QStringLiteral("-OEImpRufwarte")}, true);
}

} // namespace orvanta
