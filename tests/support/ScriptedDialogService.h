#pragma once
// A dialog service for tests: records every dialog shown and answers from a queue the test
// fills, falling back to a default answer (or, when none is set, the dialog's default button).

#include "platform/DialogService.h"

#include <QList>
#include <QQueue>
#include <QStringList>
#include <functional>

namespace orvanta::test {

struct ShownDialog {
    DialogKind kind;
    QString title;
    QString text;
    DialogButtons buttons;
    DialogButton answer;
};

class ScriptedDialogService final : public DialogService {
public:
    DialogButton show(DialogKind kind, const QString& title, const QString& text, DialogButtons buttons,
                      DialogButton defaultButton) override;

    // The next dialogs take these answers in order.
    void enqueueAnswer(DialogButton answer) { m_answers.enqueue(answer); }
    // Answer once the queue is empty; NoButton means the dialog's own default button.
    void setDefaultAnswer(DialogButton answer) { m_defaultAnswer = answer; }
    // Runs while a dialog "is open" (e.g. to inspect what the user would see behind it).
    void setOnShow(std::function<void(const ShownDialog&)> callback) { m_onShow = std::move(callback); }

    [[nodiscard]] const QList<ShownDialog>& shown() const { return m_shown; }
    [[nodiscard]] QStringList texts() const;
    [[nodiscard]] QStringList texts(DialogKind kind) const;
    [[nodiscard]] int count() const { return static_cast<int>(m_shown.size()); }
    [[nodiscard]] int count(DialogKind kind) const;
    [[nodiscard]] const ShownDialog& last() const { return m_shown.constLast(); }
    [[nodiscard]] int pendingAnswers() const { return static_cast<int>(m_answers.size()); }
    void clear();

private:
    QList<ShownDialog> m_shown;
    QQueue<DialogButton> m_answers;
    DialogButton m_defaultAnswer = DialogButton::NoButton;
    std::function<void(const ShownDialog&)> m_onShow;
};

// Installs a scripted service for its lifetime and restores the previous one afterwards.
class ScopedScriptedDialogs final {
public:
    ScopedScriptedDialogs() { m_previous = setDialogService(&m_service); }
    ~ScopedScriptedDialogs() { setDialogService(m_previous); }
    ScopedScriptedDialogs(const ScopedScriptedDialogs&) = delete;
    ScopedScriptedDialogs& operator=(const ScopedScriptedDialogs&) = delete;

    ScriptedDialogService& service() { return m_service; }
    ScriptedDialogService* operator->() { return &m_service; }

private:
    ScriptedDialogService m_service;
    DialogService* m_previous = nullptr;
};

} // namespace orvanta::test
