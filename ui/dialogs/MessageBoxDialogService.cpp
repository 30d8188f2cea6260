#include "ui/dialogs/MessageBoxDialogService.h"

#include <QApplication>
#include <QMessageBox>
#include <QPushButton>

namespace orvanta {
namespace {

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

} // namespace

DialogButton MessageBoxDialogService::show(DialogKind kind, const QString& title, const QString& text,
                                           DialogButtons buttons, DialogButton defaultButton)
{
    if (buttons == DialogButton::NoButton)
        buttons = DialogButton::Ok;
    if (qobject_cast<QApplication*>(QCoreApplication::instance()) == nullptr)
        return DialogService::escapeAnswer(buttons);

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
        if (value == DialogService::escapeAnswer(buttons))
            box.setEscapeButton(button);
    }
    box.exec();
    for (const auto& [button, value] : made) {
        if (box.clickedButton() == button)
            return value;
    }
    return DialogService::escapeAnswer(buttons);
}

} // namespace orvanta
