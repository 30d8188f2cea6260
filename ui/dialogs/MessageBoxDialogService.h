#pragma once
// The dialog service of the running program: modal QMessageBox dialogs with German buttons over
// the active window. Start-up installs one; without a QApplication it answers as closing would.

#include "platform/DialogService.h"

namespace orvanta {

class MessageBoxDialogService final : public DialogService {
public:
    DialogButton show(DialogKind kind, const QString& title, const QString& text, DialogButtons buttons,
                      DialogButton defaultButton) override;
};

} // namespace orvanta
