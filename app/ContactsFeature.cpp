#include "app/ContactsFeature.h"

#include "app/AppServices.h"
#include "app/ContactVCardExport.h"
#include "app/TLogform.h"
#include "contacts/ContactDeletion.h"
#include "contacts/ContactReports.h"
#include "contacts/Tcontacteditform.h"
#include "contacts/Tcontactlistframe.h"
#include "db/TDM2.h"
#include "platform/ErrorLog.h"

namespace orvanta {

namespace {

bool contactChosen(const TLogform& w)
{
    const ContactListFrame* f = w.contactFrame();
    return f && f->isConnected() && f->GetSelectedLID() > 0;
}

void ContDelExecute(TLogform& w)
{
    ContactListFrame* frame = w.contactFrame();
    const int lid = frame ? frame->GetSelectedLID() : -1;
    if (lid <= 0) {
        informationBox(QStringLiteral("Kein Kontakt ausgewählt."));
        return;
    }
    const WindowRegistries& windows = w.windowRegistries();
    if (const int slot = windows.recordSlotOf(lid); slot >= 0) {
        warningBox(QStringLiteral("Der zum Löschen ausgewählte Kontakt ist derzeit\r\nnoch in Bearbeitung."));
        if (QWidget* editor = windows.editWindowOfRecord(slot)) {
            editor->show();
            editor->raise();
            editor->activateWindow();
        }
        return;
    }
    if (!askWarning(QStringLiteral("Soll der Kontakt \"") + frame->GetSelectedContBez()
                    + QStringLiteral("\" gelöscht werden?")))
        return;
    if (!w.dataModule() || !DeleteDS(*w.dataModule(), lid))
        return;
    if (ContactListFrame* f = w.contactFrame())
        f->Refresh_View(0);
}

void PrintContactOverviewExecute(TLogform& w)
{
    TDM2* dm = w.dataModule();
    ReportOutcome outcome;
    if (!DruckKontaktUebersicht(dm ? &dm->rave_ibsql : nullptr, outcome))
        reportError(reportFailureEntry(QStringLiteral("DruckKontaktUebersicht"), outcome));
}

} // namespace

void registerContactsFeature(TLogform& w)
{
    TDM2* dm = w.dataModule();
    w.factories().contactFrame = [dm](QWidget* parent) -> ContactListFrame* {
        auto* frame = new Tcontactlistframe(dm, parent);
        addVCardExport(*frame, dm);
        return frame;
    };
    w.actions().define(QStringLiteral("_LogFo_ContDel"), [&w] { ContDelExecute(w); },
                       [&w] { return contactChosen(w); });
    w.actions().define(QStringLiteral("_LogFo_PrintContactOverview"), [&w] { PrintContactOverviewExecute(w); },
                       [&w] { return w.contactFrame() && w.contactFrame()->isConnected(); });
    // The edit window's note prints as the notes window's does; the window reports a failure.
    Tcontacteditform::setNotePrinter([](const QString& designation, const QByteArray& rtf) {
        ReportOutcome outcome;
        NotePrintResult result;
        if (!NotizDruck(designation, rtf, outcome)) {
            result.code = reportResultName(outcome.code);
            result.number = int(outcome.number);
            result.message = outcome.message;
        }
        return result;
    });
}

} // namespace orvanta
