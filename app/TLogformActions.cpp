// The main window's actions, menus and tool bars, with the enable rules of its own actions (the
// features give the actions they own theirs).

#include "app/TLogform.h"

#include "app/AppServices.h"
#include "platform/MonitorLink.h"
#include "app/ProgramLauncher.h"
#include "platform/ErrorLog.h"
#include "ui/frames/ContactListFrame.h"
#include "ui/frames/LogListFrame.h"
#include "ui/statusbar/PanelStatusBar.h"

#include <QAction>
#include <QMenu>
#include <QMenuBar>
#include <QStyle>
#include <QTimer>
#include <QToolBar>

namespace orvanta {

QAction* TLogform::action(const QString& objectName) const
{
    QAction* a = m_actions.find(objectName);
    Q_ASSERT_X(a, "TLogform::action", qPrintable(objectName));
    return a;
}

void TLogform::buildActions()
{
    QStyle* st = style();
    const auto add = [this](const char* name, const QString& caption, ActionRegistry::Handler execute = {},
                            ActionRegistry::Rule enabled = {}) {
        return m_actions.add(QString::fromLatin1(name), caption, std::move(execute), std::move(enabled));
    };
    const auto monitorRuns = [this] { return m_monitorState != MonitorState::Absent; };
    // The monitor answers at once; the buttons follow it without waiting for the next poll.
    const auto tellMonitor = [this](int message) {
        m_monitor->postToMonitor(message);
        QTimer::singleShot(150, this, &TLogform::refreshMonitorState);
    };
    const auto contactsReady = [this] { return contactFrameReady(); };
    const auto contactChosen = [this] { return contactSelected(); };

    add("_LogFo_Close", QStringLiteral("Beenden"), [this] { close(); });
    auto* closeApp = add("_LogFo_CloseApp", QStringLiteral("Beenden"),
                         [tellMonitor] { tellMonitor(MonitorLink::MonitorQuit); }, monitorRuns);
    closeApp->setToolTip(QStringLiteral("Rufwarte beenden"));
    closeApp->setStatusTip(QStringLiteral("Rufwarte beenden"));
    closeApp->setIcon(st->standardIcon(QStyle::SP_MediaStop));
    add("_LogFo_MoniSTOP", QStringLiteral("Anhalten/Fortsetzen"),
        [tellMonitor] { tellMonitor(MonitorLink::MonitorPauseResume); }, monitorRuns)
        ->setIcon(st->standardIcon(QStyle::SP_MediaPause));
    add("_LogFo_MoniSTART", QStringLiteral("Starten"),
        [this] { m_launcher->start(QStringLiteral("rufwarte.exe"), {}, false); },
        [this] { return m_monitorState == MonitorState::Absent; })
        ->setIcon(st->standardIcon(QStyle::SP_MediaPlay));
    add("_LogFo_Setup", QStringLiteral("Einstellungen..."),
        [this] { m_launcher->start(QStringLiteral("AppSetup.exe"), {}, false); });
    add("_LogFo_About", QStringLiteral("Info"), [this] { m_launcher->start(QStringLiteral("About.exe"), {}, false); })
        ->setIcon(st->standardIcon(QStyle::SP_MessageBoxInformation));
    add("_LogFo_OEImp", QStringLiteral("Outlook Express"), [this] { OEImpExecute(); },
        [this] { return contactFrameReady() && !m_launcher->isWaiting(); });
    // The log's actions get their behaviour from the call-log feature.
    add("_LogFo_Print", QStringLiteral("Drucken"))->setIcon(st->standardIcon(QStyle::SP_FileDialogDetailedView));
    add("_LogFo_Export", QStringLiteral("Exportieren..."))->setIcon(st->standardIcon(QStyle::SP_DialogSaveButton));
    add("_LogFo_DelLog", QStringLiteral("Protokolleintrag löschen"))->setIcon(st->standardIcon(QStyle::SP_TrashIcon));
    add("_LogFo_DelDayLog", QStringLiteral("Tagesprotokoll löschen"));
    add("_LogFo_ContNew", QStringLiteral("Neu..."), [this] { CreateConDataEdit(0, 0); }, contactsReady)
        ->setIcon(st->standardIcon(QStyle::SP_FileIcon));
    add("_LogFo_ContEdit", QStringLiteral("Bearbeiten..."), [this] { ContEditExecute(); }, contactChosen)
        ->setIcon(st->standardIcon(QStyle::SP_FileDialogContentsView));
    add("_LogFo_ContDel", QStringLiteral("Löschen"), [this] { ContDelExecute(); }, contactChosen)
        ->setIcon(st->standardIcon(QStyle::SP_DialogDiscardButton));
    add("_LogFo_OpenLogBemerkung", QStringLiteral("Bemerkung/Detailinformationen"))
        ->setIcon(st->standardIcon(QStyle::SP_FileDialogInfoView));
    add("_LogFo_KatVerw", QStringLiteral("Kategorieverwaltung"), [this] { forwardToFrame(QStringLiteral("_LogFo_KatVerw")); })
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
        add(f.name, QString::fromUtf8(f.caption), [this, name] { forwardToFrame(name); },
            [this, name] { return frameAllows(name); });
    }
    // The search entries show whether the list's search panel is open.
    for (const char* name : {"_LogFo_Search", "_LogFo_LogSearch"})
        action(QString::fromLatin1(name))->setCheckable(true);

    add("dxBB_Ansicht_Proto", QStringLiteral("Protokoll"), [this] { selectPanelFromMenu(TabLog); });
    add("dxBB_Ansicht_Proto_PK", QStringLiteral("Protokoll per Kalender"), [this] { selectPanelFromMenu(TabCalendar); });
    add("dxBB_Ansicht_Kontakte", QStringLiteral("Kontakte"), [this] { selectPanelFromMenu(TabContacts); });
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

bool TLogform::contactFrameReady() const
{
    return m_contactFrame && m_contactFrame->isConnected();
}

bool TLogform::contactSelected() const
{
    return contactFrameReady() && m_contactFrame->GetSelectedLID() > 0;
}

bool TLogform::frameAllows(const QString& actionName) const
{
    if (actionName == QLatin1String("_LogFo_PrintContactExposee"))
        return contactSelected();
    if (actionName == QLatin1String("_LogFo_Expand") || actionName == QLatin1String("_LogFo_Collapse"))
        return (m_logFrame && m_logFrame->CanExpandGroups()) || (m_contactFrame && m_contactFrame->CanExpandGroups());
    if (actionName == QLatin1String("_LogFo_ContExport") || actionName == QLatin1String("_LogFo_PrintContactOverview"))
        return contactFrameReady();
    if (m_logFrame)
        return m_logFrame->isActionEnabled(actionName);
    return m_contactFrame && m_contactFrame->isActionEnabled(actionName);
}

void TLogform::refreshMonitorState()
{
    m_monitorState = m_monitor->monitorState();
    // Panel 1 is otherwise unused; a paused monitor logs no calls, which the user must see.
    m_statusBar->setPanelText(1, m_monitorState == MonitorState::Paused ? QStringLiteral("Rufwarte angehalten")
                                                                        : QString());
    updateActions();
}

void TLogform::updateActions()
{
    if (m_tornDown)
        return;
    m_actions.update();
    const bool searching = (m_logFrame && m_logFrame->isSearchShown()) || (m_contactFrame && m_contactFrame->isSearchShown());
    for (const char* name : {"_LogFo_Search", "_LogFo_LogSearch"}) {
        QAction* a = action(QString::fromLatin1(name));
        if (a->isChecked() != searching)
            a->setChecked(searching);
    }
}

void TLogform::runIfEnabled(const QString& actionName)
{
    m_actions.runIfEnabled(actionName);
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
