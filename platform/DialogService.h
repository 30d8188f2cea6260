#pragma once
// Every message box of the program goes through one dialog service. The program installs the
// message boxes of ui/dialogs at start-up; tests install a scripted one that records each dialog
// and answers as the test wants, so no dialog ever blocks a test. Without one installed, texts go
// to the standard error (command-line tools, early start-up).

#include <QFlags>
#include <QString>

namespace orvanta {

enum class DialogKind { Error, Warning, Information, Question };

enum class DialogButton {
    NoButton = 0x0,
    Ok = 0x1,
    Yes = 0x2,
    No = 0x4,
    Cancel = 0x8,
};
Q_DECLARE_FLAGS(DialogButtons, DialogButton)
Q_DECLARE_OPERATORS_FOR_FLAGS(DialogButtons)

class DialogService {
public:
    virtual ~DialogService() = default;

    // Shows one modal dialog and returns the button chosen (closing the dialog otherwise gives
    // Cancel when offered, else No, else Ok). An empty title gives the kind's German title.
    virtual DialogButton show(DialogKind kind, const QString& title, const QString& text, DialogButtons buttons,
                              DialogButton defaultButton) = 0;

    void error(const QString& text, const QString& title = {});
    void warning(const QString& text, const QString& title = {});
    void information(const QString& text, const QString& title = {});
    DialogButton question(const QString& text, DialogButtons buttons = DialogButton::Yes | DialogButton::No,
                          DialogButton defaultButton = DialogButton::Yes, const QString& title = {});

    // "Fehler", "Warnung", "Information", "Bestätigen".
    [[nodiscard]] static QString defaultTitle(DialogKind kind);
    // What closing the dialog without a click answers: Cancel when offered, else No, else Ok.
    [[nodiscard]] static DialogButton escapeAnswer(DialogButtons buttons);
};

// The process-wide service: the installed one, else the standard-error one.
[[nodiscard]] DialogService& dialogs();
// Installs a service (not owned; the caller keeps it alive while installed); nullptr restores
// the standard-error one. Returns the one installed before.
DialogService* setDialogService(DialogService* service);

} // namespace orvanta
