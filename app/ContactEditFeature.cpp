#include "app/ContactEditFeature.h"

#include "app/AppServices.h"
#include "app/TLogform.h"
#include "calllog/LogMaintenance.h"
#include "calllog/NoticeForms.h"
#include "contacts/ContactNotices.h"
#include "contacts/ContactPersistence.h"
#include "contacts/Tcontacteditform.h"
#include "phone/TvkMiniKontakt.h"
#include "platform/DialogService.h"
#include "platform/RufwarteIni.h"

namespace orvanta {

namespace {

constexpr const char* kCallerNumber = "callerNumber";

// Links the log records of the caller's number to the new contact when the user agrees.
void offerRelink(TLogform& w, const QString& number, const QString& label, int key, const QString& contbez)
{
    if (!w.maintenance().LogCheckOfNumber(number))
        return;
    const QString question = QStringLiteral("Möchten Sie die Logbucheinträge der übergebene\r\nRufnummer \"") + number
        + QStringLiteral("\"\r\n") + QStringLiteral("mit dem neuen Kontakt verknüpfen?");
    if (!askConfirmation(question))
        return;
    if (w.maintenance().LogbuchAnpassen(number, label, key, contbez))
        if (LogListFrame* log = w.logFrame())
            log->Refresh_View(0);
}

bool saveContact(TLogform& w, int recordSlot, int kind)
{
    TDM2* dm = w.dataModule();
    TvkMiniKontakt* record = w.contactRecords().at(recordSlot);
    if (!dm || !record)
        return false;
    bool saved = false;
    if (kind == 1) {
        saved = EditConData(*dm, record);
    } else {
        QString caller;
        if (kind == 2)
            if (const QWidget* window = w.windowRegistries().editWindowOfRecord(recordSlot))
                caller = window->property(kCallerNumber).toString();
        saved = InsertConData(*dm, record, caller,
                              [&w](const QString& number, const QString& label, int key, const QString& contbez) {
                                  offerRelink(w, number, label, key, contbez);
                              });
    }
    if (saved)
        if (ContactListFrame* list = w.contactFrame())
            list->Refresh_View(record->LID());
    return saved;
}

template <class Notice>
void showNotice(QWidget* parent)
{
    Notice notice(parent);
    notice.exec();
}

} // namespace

void registerContactEditFeature(TLogform& w)
{
    setContactNotices({&showNotice<THinweisForm>, &showNotice<THinwAutoAblehnForm>});
    w.factories().contactEditWindow = [&w](QWidget* mainWindow, int, int) -> QWidget* {
        auto* form = new Tcontacteditform(
            mainWindow, [&w](int slot) { return w.contactRecords().at(slot); }, mainWindow);
        if (const TRufwarteIni* settings = monitorSettings())
            form->setHomeCountry(settings->AC());
        return form;
    };
    w.factories().loadContact = [](TLogform& mainWindow, TvkMiniKontakt& record, int contactKey) {
        return mainWindow.dataModule() && GetDSID_Data(*mainWindow.dataModule(), &record, contactKey);
    };
    w.factories().saveContact = &saveContact;
}

void ChangeRelatedKontKat(TLogform& w, int contactKey, const QString& katbez)
{
    const WindowRegistries& windows = w.windowRegistries();
    if (const int slot = windows.recordSlotOf(contactKey); slot >= 0)
        if (auto* form = qobject_cast<Tcontacteditform*>(windows.editWindowOfRecord(slot)))
            form->KatHasChanged(katbez);
    if (ContactListFrame* list = w.contactFrame())
        list->Refresh_View(0);
}

void HasRenameKatBez(TLogform& w, const QString& oldName, const QString& newName)
{
    ObjectSlots<TvkMiniKontakt>& records = w.contactRecords();
    for (int slot = 0; slot < records.size(); ++slot) {
        const TvkMiniKontakt* r = records.at(slot);
        if (!r || r->KATBEZ() != oldName)
            continue;
        if (auto* form = qobject_cast<Tcontacteditform*>(w.windowRegistries().editWindowOfRecord(slot)))
            form->KatHasChanged(newName);
    }
    if (ContactListFrame* list = w.contactFrame())
        list->Refresh_View(0);
}

} // namespace orvanta
