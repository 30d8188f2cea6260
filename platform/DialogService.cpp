#include "platform/DialogService.h"

#include <cstdio>

namespace orvanta {
namespace {

DialogService* g_installed = nullptr;

// Nobody to ask (no window system, or no service installed yet): the text goes to the
// standard error so it is not lost, and the answer is the one closing the box gives.
class ConsoleDialogService final : public DialogService {
public:
    DialogButton show(DialogKind kind, const QString& title, const QString& text, DialogButtons buttons,
                      DialogButton) override
    {
        std::fprintf(stderr, "%s: %s\n", qPrintable(title.isEmpty() ? defaultTitle(kind) : title), qPrintable(text));
        return escapeAnswer(buttons == DialogButton::NoButton ? DialogButtons(DialogButton::Ok) : buttons);
    }
};

} // namespace

DialogButton DialogService::escapeAnswer(DialogButtons buttons)
{
    if (buttons.testFlag(DialogButton::Cancel))
        return DialogButton::Cancel;
    if (buttons.testFlag(DialogButton::No))
        return DialogButton::No;
    return DialogButton::Ok;
}

void DialogService::error(const QString& text, const QString& title)
{
    show(DialogKind::Error, title, text, DialogButton::Ok, DialogButton::Ok);
}

void DialogService::warning(const QString& text, const QString& title)
{
    show(DialogKind::Warning, title, text, DialogButton::Ok, DialogButton::Ok);
}

void DialogService::information(const QString& text, const QString& title)
{
    show(DialogKind::Information, title, text, DialogButton::Ok, DialogButton::Ok);
}

DialogButton DialogService::question(const QString& text, DialogButtons buttons, DialogButton defaultButton,
                                     const QString& title)
{
    return show(DialogKind::Question, title, text, buttons, defaultButton);
}

QString DialogService::defaultTitle(DialogKind kind)
{
    switch (kind) {
    case DialogKind::Error:
        return QStringLiteral("Fehler");
    case DialogKind::Warning:
        return QStringLiteral("Warnung");
    case DialogKind::Information:
        return QStringLiteral("Information");
    case DialogKind::Question:
        return QString::fromUtf8("Bestätigen");
    }
    return {};
}

DialogService& dialogs()
{
    static ConsoleDialogService console;
    return g_installed != nullptr ? *g_installed : console;
}

DialogService* setDialogService(DialogService* service)
{
    DialogService* previous = g_installed;
    g_installed = service;
    return previous;
}

} // namespace orvanta
