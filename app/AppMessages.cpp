// Window messages for the main window, over the platform's message event.

#include "app/AppServices.h"

#include "platform/WindowMessages.h"

namespace orvanta {

void postAppMessage(QObject* target, int message, qint64 wParam, qint64 lParam)
{
    postMessage(target, message, static_cast<qintptr>(wParam), static_cast<qintptr>(lParam));
}

void sendAppMessage(QObject* target, int message, qint64 wParam, qint64 lParam)
{
    sendMessage(target, message, static_cast<qintptr>(wParam), static_cast<qintptr>(lParam));
}

bool readAppMessage(const QEvent* event, int& message, qint64& wParam, qint64& lParam)
{
    auto* m = asWindowMessage(const_cast<QEvent*>(event));
    if (!m)
        return false;
    message = m->message();
    wParam = m->wParam();
    lParam = m->lParam();
    return true;
}

} // namespace orvanta
