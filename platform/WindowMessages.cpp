#include "platform/WindowMessages.h"

#include <QCoreApplication>

namespace orvanta {

WindowMessageEvent::WindowMessageEvent(int message, qintptr wParam, qintptr lParam)
    : QEvent(eventType())
    , m_message(message)
    , m_wParam(wParam)
    , m_lParam(lParam)
{
}

QEvent::Type WindowMessageEvent::eventType()
{
    static const auto type = static_cast<QEvent::Type>(QEvent::registerEventType());
    return type;
}

WindowMessageEvent* asWindowMessage(QEvent* event)
{
    return event != nullptr && event->type() == WindowMessageEvent::eventType() ? static_cast<WindowMessageEvent*>(event)
                                                                                 : nullptr;
}

void postMessage(QObject* receiver, int message, qintptr wParam, qintptr lParam)
{
    if (receiver != nullptr)
        QCoreApplication::postEvent(receiver, new WindowMessageEvent(message, wParam, lParam));
}

qintptr sendMessage(QObject* receiver, int message, qintptr wParam, qintptr lParam)
{
    if (receiver == nullptr)
        return 0;
    WindowMessageEvent event(message, wParam, lParam);
    QCoreApplication::sendEvent(receiver, &event);
    return event.result();
}

} // namespace orvanta
