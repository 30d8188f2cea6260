#pragma once
// A window that records the window messages it receives: number, parameters, and whether each
// came from the queue (posted) or at once (sent while `delivering` was set by the test).

#include "platform/WindowMessages.h"

#include <QList>
#include <QObject>

#include <functional>

namespace orvanta::test {

class MessageReceiver final : public QObject {
public:
    struct Got {
        int message;
        qintptr wParam;
        qintptr lParam;
        bool posted;
    };
    QList<Got> got;
    // Set around a send to tell sent messages from posted ones.
    bool delivering = false;
    // What a sent message returns; none: 0.
    std::function<qintptr(const WindowMessageEvent&)> answer;

protected:
    bool event(QEvent* e) override
    {
        if (WindowMessageEvent* m = asWindowMessage(e)) {
            got.append({m->message(), m->wParam(), m->lParam(), !delivering});
            if (answer)
                m->setResult(answer(*m));
            return true;
        }
        return QObject::event(e);
    }
};

} // namespace orvanta::test
