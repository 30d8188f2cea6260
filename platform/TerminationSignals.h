#pragma once
// SIGTERM and SIGINT (a log-out, `kill`, Ctrl+C) arrive as a Qt signal in the main thread, so
// the program ends through its normal tear-down — also while a modal dialog runs its own event
// loop, where the default action would either kill it mid-write or be ignored.

#include <QObject>

class QSocketNotifier;

namespace orvanta {

class TerminationSignals final : public QObject {
    Q_OBJECT
    Q_DISABLE_COPY_MOVE(TerminationSignals)

public:
    // Installs the handlers; one instance per process at a time.
    explicit TerminationSignals(QObject* parent = nullptr);
    // Restores the default handlers.
    ~TerminationSignals() override;

Q_SIGNALS:
    void terminationRequested(int signalNumber);

private:
    void readPending();

    QSocketNotifier* m_notifier = nullptr;
};

} // namespace orvanta
