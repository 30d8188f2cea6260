#pragma once
// Drives the next modal dialog of a type once it shows: a test queues what the user would do
// before the code under test runs exec().

#include <QApplication>
#include <QTimer>

#include <functional>

namespace orvanta::test {

template <class Dialog> void onNextDialog(std::function<void(Dialog*)> step)
{
    auto* timer = new QTimer;
    timer->setInterval(10);
    QObject::connect(timer, &QTimer::timeout, [timer, step] {
        auto* d = qobject_cast<Dialog*>(QApplication::activeModalWidget());
        if (!d || !d->isVisible())
            return;
        timer->stop();
        timer->deleteLater();
        step(d);
    });
    timer->start();
}

} // namespace orvanta::test
