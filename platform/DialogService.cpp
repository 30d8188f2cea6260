#include "platform/DialogService.h"

#include <QApplication>
#include <QMessageBox>
#include <QPushButton>

namespace orvanta {
namespace {

DialogService* g_installed = nullptr;

QMessageBox::Icon iconOf(DialogKind kind)
{
    switch (kind) {
    case DialogKind::Error:
        return QMessageBox::Critical;
    case DialogKind::Warning:
        return QMessageBox::Warning;
    case DialogKind::Information:
        return QMessageBox::Information;
    case DialogKind::Question:
        return QMessageBox::Question;
    }
    return QMessageBox::NoIcon;
}

DialogButton escapeAnswer(DialogButtons buttons)
{
    if (buttons.testFlag(DialogButton::Cancel))
        return DialogButton::Cancel;
    if (buttons.testFlag(DialogButton::No))
        return DialogButton::No;
    return DialogButton::Ok;
}

} // namespace

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

DialogButton MessageBoxDialogService::show(DialogKind kind, const QString& title, const QString& text,
                                           DialogButtons buttons, DialogButton defaultButton)
{
    if (buttons == DialogButton::NoButton)
        buttons = DialogButton::Ok;
    if (qobject_cast<QApplication*>(QCoreApplication::instance()) == nullptr)
        return escapeAnswer(buttons);

    // Messages carry Windows line ends; a lone CR would show as a glyph.
    QString shown = text;
    shown.replace(QStringLiteral("\r\n"), QStringLiteral("\n")).replace(u'\r', u'\n');

    QMessageBox box(iconOf(kind), title.isEmpty() ? defaultTitle(kind) : title, shown, QMessageBox::NoButton,
                    QApplication::activeWindow());
    struct Choice {
        DialogButton button;
        const char* text;
        QMessageBox::ButtonRole role;
    };
    const Choice choices[] = {
        {DialogButton::Ok, "OK", QMessageBox::AcceptRole},
        {DialogButton::Yes, "Ja", QMessageBox::YesRole},
        {DialogButton::No, "Nein", QMessageBox::NoRole},
        {DialogButton::Cancel, "Abbrechen", QMessageBox::RejectRole},
    };
    QList<QPair<QAbstractButton*, DialogButton>> made;
    for (const Choice& choice : choices) {
        if (!buttons.testFlag(choice.button))
            continue;
        QPushButton* button = box.addButton(QString::fromLatin1(choice.text), choice.role);
        made.append({button, choice.button});
        if (choice.button == defaultButton)
            box.setDefaultButton(button);
    }
    for (const auto& [button, value] : made) {
        if (value == escapeAnswer(buttons))
            box.setEscapeButton(button);
    }
    box.exec();
    for (const auto& [button, value] : made) {
        if (box.clickedButton() == button)
            return value;
    }
    return escapeAnswer(buttons);
}

DialogService& dialogs()
{
    static MessageBoxDialogService messageBoxes;
    return g_installed != nullptr ? *g_installed : messageBoxes;
}

DialogService* setDialogService(DialogService* service)
{
    DialogService* previous = g_installed;
    g_installed = service;
    return previous;
}

} // namespace orvanta
