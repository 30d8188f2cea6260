#include "app/ActionRegistry.h"

#include <QAction>

#include <utility>

namespace orvanta {

ActionRegistry::ActionRegistry(QObject* owner)
    : m_owner(owner)
{
}

QAction* ActionRegistry::add(const QString& name, const QString& caption, Handler execute, Rule enabled)
{
    Q_ASSERT_X(!find(name), "ActionRegistry::add", qPrintable(name));
    auto* a = new QAction(caption, m_owner);
    a->setObjectName(name);
    QObject::connect(a, &QAction::triggered, m_owner, [this, name] { run(name); });
    m_entries.push_back({a, std::move(execute), std::move(enabled)});
    return a;
}

void ActionRegistry::define(const QString& name, Handler execute, Rule enabled)
{
    Entry* e = entry(name);
    Q_ASSERT_X(e, "ActionRegistry::define", qPrintable(name));
    if (!e)
        return;
    e->execute = std::move(execute);
    e->enabled = std::move(enabled);
}

QAction* ActionRegistry::find(const QString& name) const
{
    const Entry* e = entry(name);
    return e ? e->action : nullptr;
}

void ActionRegistry::update()
{
    if (m_frozen)
        return;
    for (const Entry& e : m_entries) {
        const bool enabled = e.execute && (!e.enabled || e.enabled());
        if (e.action->isEnabled() != enabled)
            e.action->setEnabled(enabled);
    }
}

void ActionRegistry::runIfEnabled(const QString& name)
{
    update();
    if (QAction* a = find(name); a && a->isEnabled())
        a->trigger();
}

void ActionRegistry::run(const QString& name)
{
    update();
    const Entry* e = entry(name);
    if (!e || !e->action->isEnabled() || !e->execute)
        return;
    // A copy: the handler may give the action new behaviour while it runs.
    const Handler execute = e->execute;
    execute();
}

ActionRegistry::Entry* ActionRegistry::entry(const QString& name)
{
    return const_cast<Entry*>(std::as_const(*this).entry(name));
}

const ActionRegistry::Entry* ActionRegistry::entry(const QString& name) const
{
    for (const Entry& e : m_entries)
        if (e.action->objectName() == name)
            return &e;
    return nullptr;
}

} // namespace orvanta
