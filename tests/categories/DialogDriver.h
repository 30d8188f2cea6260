#pragma once
// Drives the next modal dialog of a type once it shows: a test queues what the user would do
// before the code under test runs exec().

#include <QApplication>
#include <QTimer>

#include <functional>
#include <memory>

namespace orvanta::test {

template <class Dialog> void onNextDialog(std::function<void(Dialog*)> step)
{
    auto* timer = new QTimer;
    timer->setInterval(10);
    // Gives up after ten seconds, so a dialog that never came cannot drive a later test.
    auto ticks = std::make_shared<int>(1000);
    QObject::connect(timer, &QTimer::timeout, [timer, step, ticks] {
        auto* d = qobject_cast<Dialog*>(QApplication::activeModalWidget());
        if (--*ticks <= 0) {
            timer->stop();
            timer->deleteLater();
            return;
        }
        if (!d || !d->isVisible())
            return;
        timer->stop();
        timer->deleteLater();
        step(d);
    });
    timer->start();
}

} // namespace orvanta::test
