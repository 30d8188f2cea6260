#include "app/CallLogFeature.h"

#include "app/AppServices.h"
#include "app/TLogform.h"
#include "calllog/LogMaintenance.h"
#include "calllog/TLogDetailForm.h"
#include "calllog/TLogPrintSelection.h"
#include "calllog/Tlogframe.h"
#include "ui/navbar/AdvNavBar.h"

namespace orvanta {

namespace {

// The log actions wait while the list is busy with a refresh.
bool logFrameReady(const TLogform& w)
{
    return w.logFrame() && !w.logFrame()->isBusy();
}

int selectedCall(const TLogform& w)
{
    return w.logFrame() ? w.logFrame()->CurrentLogLID() : -1;
}

void DelLogExecute(TLogform& w)
{
    const int lid = selectedCall(w);
    if (lid <= 0) {
        informationBox(QStringLiteral("Bitte wählen Sie zuerst einen Logbucheintrag aus."));
        return;
    }
    if (!askWarning(QStringLiteral("Markierten Protokolleintrag löschen?")))
        return;
    if (w.maintenance().DeleteLogItem(lid, &w) && w.logFrame())
        w.logFrame()->Refresh_View(0);
}

void DelDayLogExecute(TLogform& w)
{
    if (!w.IfLogDetailArrayAllFree()) {
        warningBox(QStringLiteral("Derzeit ist noch ein Informationsfenster eines\r\nProtokolleintrags geöffnet.\r\n"
                                  "Bitte schließen Sie vor dem Löschen erst alle\r\nFenster mit den Detailinformationen."));
        return;
    }
    if (!w.logFrame())
        return;
    const QDate day = w.logFrame()->logDay();
    if (!askWarning(QStringLiteral("Tagesprotokoll vom ") + day.toString(QStringLiteral("dd.MM.yyyy"))
                    + QStringLiteral(" löschen?")))
        return;
    const bool deleted = w.maintenance().DeleteLogDay(day, &w);
    const bool marked = w.maintenance().markLogDays(DayMarking::MarksAndShowDay, w.markContext());
    if (deleted && marked)
        informationBox(QStringLiteral("Tagesprotokoll wurde erfolgreich gelöscht."));
}

void OpenLogBemerkungExecute(TLogform& w)
{
    const int lid = selectedCall(w);
    if (lid <= 0) {
        informationBox(QStringLiteral("Bitte wählen Sie zuerst einen Logbucheintrag aus."));
        return;
    }
    w.CreateLogDetailFo(lid);
}

// The print selection, modal; it runs the report itself.
void PrintExecute(TLogform& w)
{
    TLogPrintSelection selection(w.dataModule(), &w);
    selection.exec();
}

} // namespace

void registerCallLogFeature(TLogform& w)
{
    TDM2* dm = w.dataModule();
    MainWindowFactories& f = w.factories();
    f.logFrame = [dm](QWidget* parent) -> LogListFrame* { return new Tlogframe(dm, parent); };
    f.logDetailWindow = [dm](QWidget* mainWindow, int slot, int logKey) -> QWidget* {
        auto* form = new TLogDetailForm(dm, logKey);
        form->setAttribute(Qt::WA_DeleteOnClose, false);
        form->setHostWindow(mainWindow);
        form->setTag(slot);
        return form;
    };

    ActionRegistry& actions = w.actions();
    const auto ready = [&w] { return logFrameReady(w); };
    actions.define(QStringLiteral("_LogFo_Print"), [&w] { PrintExecute(w); }, ready);
    actions.define(QStringLiteral("_LogFo_DelLog"), [&w] { DelLogExecute(w); }, ready);
    actions.define(QStringLiteral("_LogFo_DelDayLog"), [&w] { DelDayLogExecute(w); },
                   [&w] { return logFrameReady(w) && w.navBar()->activeTabIndex() == TLogform::TabCalendar; });
    actions.define(QStringLiteral("_LogFo_OpenLogBemerkung"), [&w] { OpenLogBemerkungExecute(w); },
                   [&w] { return selectedCall(w) > 0; });
}

} // namespace orvanta
