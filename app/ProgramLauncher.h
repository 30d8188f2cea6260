#pragma once
// Starts the companion programs (monitor, setup, info, import) from the program folder. A
// program started "with waiting" sets a marker; when it ends, finishedWaiting() tells the main
// window to reload what the program may have changed.

#include <QObject>
#include <QStringList>

class QProcess;

namespace orvanta {

class ProgramLauncher final : public QObject {
    Q_OBJECT
    Q_DISABLE_COPY_MOVE(ProgramLauncher)

public:
    explicit ProgramLauncher(QObject* parent = nullptr);
    ~ProgramLauncher() override;

    void setStartFolder(const QString& folder) { m_folder = folder; }
    [[nodiscard]] const QString& startFolder() const { return m_folder; }

    // The file that runs for a name: start folder + name; a name ending in ".exe" that is missing
    // there resolves to the same name without the ending. Empty when neither exists.
    [[nodiscard]] QString resolve(const QString& name) const;

    // Returns false (and reports) when the program cannot be started.
    bool start(const QString& name, const QStringList& arguments, bool wait);
    [[nodiscard]] bool isWaiting() const { return m_waiting; }

Q_SIGNALS:
    void finishedWaiting();

private:
    QString m_folder;
    bool m_waiting = false;
};

} // namespace orvanta
