#pragma once
// The main window's actions by objectName, each with the handler it runs and the rule that
// enables it. The main window declares every action of its menus and tool bars; a feature gives
// the actions it owns their behaviour, so the main window need not know each feature's rules.

#include <QString>

#include <functional>
#include <vector>

class QAction;
class QObject;

namespace orvanta {

class ActionRegistry final {
public:
    using Handler = std::function<void()>;
    using Rule = std::function<bool()>;

    // owner: the parent of the actions.
    explicit ActionRegistry(QObject* owner);
    ActionRegistry(const ActionRegistry&) = delete;
    ActionRegistry& operator=(const ActionRegistry&) = delete;

    // Declares an action. Its handler runs only while the action is enabled, whatever triggers it.
    QAction* add(const QString& name, const QString& caption, Handler execute = {}, Rule enabled = {});
    // Gives a declared action its behaviour (replacing any it had).
    void define(const QString& name, Handler execute, Rule enabled = {});
    // The declared action; null for a name never declared.
    [[nodiscard]] QAction* find(const QString& name) const;

    // Brings every enabled state up to date: without a handler an action is disabled, without a
    // rule enabled.
    void update();
    // Triggers the action when it is enabled once brought up to date.
    void runIfEnabled(const QString& name);
    // From now on the enabled states stay as they are: the rules would reach frames and files
    // that are already closed.
    void freeze() { m_frozen = true; }

private:
    struct Entry {
        QAction* action;
        Handler execute;
        Rule enabled;
    };
    [[nodiscard]] Entry* entry(const QString& name);
    [[nodiscard]] const Entry* entry(const QString& name) const;
    void run(const QString& name);

    QObject* m_owner;
    std::vector<Entry> m_entries;
    bool m_frozen = false;
};

} // namespace orvanta
