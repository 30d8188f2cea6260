#include "app/CategoriesFeature.h"

#include "app/ContactEditFeature.h"
#include "app/TLogform.h"
#include "categories/TCatControl.h"
#include "contacts/Tcontacteditform.h"

#include <QPointer>

#include <memory>

namespace orvanta {
namespace {

    TCatControl::Callbacks callbacksOf(TLogform& w)
    {
        const QPointer<TLogform> main(&w);
        TCatControl::Callbacks cb;
        cb.HasRenameKatBez = [main](const QString& oldName, const QString& newName) {
            if (main)
                HasRenameKatBez(*main, oldName, newName);
        };
        cb.ChangeRelatedKontKat = [main](int contactKey, const QString& katbez) {
            if (main)
                ChangeRelatedKontKat(*main, contactKey, katbez);
        };
        return cb;
    }

} // namespace

void registerCategoriesFeature(TLogform& w)
{
    // The one manager of this main window; it is the main window's child and goes with it.
    auto manager = std::make_shared<QPointer<TCatControl>>();
    const QPointer<TLogform> main(&w);
    w.actions().define(QStringLiteral("_LogFo_KatVerw"), [main, manager] {
        if (!main)
            return;
        if (!*manager) {
            auto* c = new TCatControl(main->dataModule(), callbacksOf(*main), main);
            c->setAttribute(Qt::WA_DeleteOnClose);
            *manager = c;
        }
        (*manager)->show();
        (*manager)->raise();
        (*manager)->activateWindow();
    });
    Tcontacteditform::setCategoryPicker([main, manager](QWidget* parent) -> QString {
        if (!main)
            return {};
        // Both windows read the data module's category lists: the open one closes first.
        if (*manager)
            (*manager)->close();
        TCatControl picker(main->dataModule(), callbacksOf(*main), parent);
        return picker.execPick();
    });
}

} // namespace orvanta
