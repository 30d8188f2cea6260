#include "tests/support/ScriptedDialogService.h"

namespace orvanta::test {

DialogButton ScriptedDialogService::show(DialogKind kind, const QString& title, const QString& text,
                                         DialogButtons buttons, DialogButton defaultButton)
{
    DialogButton answer = m_answers.isEmpty() ? m_defaultAnswer : m_answers.dequeue();
    if (answer == DialogButton::NoButton)
        answer = defaultButton != DialogButton::NoButton ? defaultButton : DialogButton::Ok;
    m_shown.append(ShownDialog{kind, title.isEmpty() ? defaultTitle(kind) : title, text, buttons, answer});
    if (m_onShow)
        m_onShow(m_shown.constLast());
    return answer;
}

QStringList ScriptedDialogService::texts() const
{
    QStringList all;
    for (const ShownDialog& dialog : m_shown)
        all.append(dialog.text);
    return all;
}

QStringList ScriptedDialogService::texts(DialogKind kind) const
{
    QStringList all;
    for (const ShownDialog& dialog : m_shown) {
        if (dialog.kind == kind)
            all.append(dialog.text);
    }
    return all;
}

int ScriptedDialogService::count(DialogKind kind) const
{
    return static_cast<int>(texts(kind).size());
}

void ScriptedDialogService::clear()
{
    m_shown.clear();
    m_answers.clear();
}

} // namespace orvanta::test
