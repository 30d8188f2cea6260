#include "app/MainWindowFactories.h"

#include "calllog/TLogDetailForm.h"
#include "calllog/Tlogframe.h"

namespace orvanta {

MainWindowFactories defaultMainWindowFactories(TDM2* dm)
{
    // A view whose frame is not provided here shows an empty frame.
    MainWindowFactories f;
    f.logFrame = [dm](QWidget* parent) -> LogListFrame* { return new Tlogframe(dm, parent); };
    f.logDetailWindow = [dm](QWidget* mainWindow, int slot, int logKey) -> QWidget* {
        auto* form = new TLogDetailForm(dm, logKey);
        form->setAttribute(Qt::WA_DeleteOnClose, false);
        form->setHostWindow(mainWindow);
        form->setTag(slot);
        return form;
    };
    return f;
}

} // namespace orvanta
