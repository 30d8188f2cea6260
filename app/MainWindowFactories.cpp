#include "app/MainWindowFactories.h"

#include "calllog/TLogDetailForm.h"
#include "calllog/Tlogframe.h"

namespace orvanta {

MainWindowFactories defaultMainWindowFactories()
{
    // A view whose frame is not provided here shows an empty frame.
    MainWindowFactories f;
    f.logFrame = [](QWidget* parent) -> LogListFrame* { return new Tlogframe(nullptr, parent); };
    f.logDetailWindow = [](QWidget* mainWindow, int slot, int logKey) -> QWidget* {
        auto* form = new TLogDetailForm(nullptr, nullptr);
        form->setAttribute(Qt::WA_DeleteOnClose, false);
        form->setHostWindow(mainWindow);
        form->setTag(slot);
        form->setLogId(logKey);
        return form;
    };
    return f;
}

} // namespace orvanta
