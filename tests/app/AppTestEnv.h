#pragma once
// What the main-window tests need: a temporary program folder with the monitor's settings file,
// a fresh database reached through the registry as at a real start, a private runtime folder
// (mutexes, message sockets), scripted dialogs and a fixed clock. The main window itself creates
// the error log.

#include "app/CallLogFeature.h"
#include "app/TLogform.h"
#include "db/CredentialCipher.h"
#include "platform/ProgramFolder.h"
#include "platform/Registry.h"
#include "platform/WindowMessages.h"
#include "tests/support/ProgramTestEnv.h"
#include "ui/frames/LogListFrame.h"

#include <QFile>
#include <QTemporaryDir>
#include <QTest>

#include <functional>
#include <memory>
#include <vector>

namespace orvanta::test {

class AppTestEnv final {
public:
    static QDate today() { return {2024, 5, 15}; }

    AppTestEnv()
        : m_env(QDateTime(today(), QTime(12, 0)), ProgramTestEnv::ErrorLogSetup::None)
    {
        writeFile(QStringLiteral("ISDNStore"), "[MoniOptions]\r\nAC=1\r\n");
    }
    ~AppTestEnv() { m_window.reset(); }
    AppTestEnv(const AppTestEnv&) = delete;
    AppTestEnv& operator=(const AppTestEnv&) = delete;

    TempDatabase& db() { return m_env.db(); }
    TDM2& dm() { return m_env.dm(); }
    ScriptedDialogService& dialogs() { return m_env.dialogs(); }
    [[nodiscard]] QString folder() const { return m_env.folder(); }
    [[nodiscard]] QString runtimeFolder() const { return m_runtime.dir.path(); }
    [[nodiscard]] QString file(const QString& name) const { return m_env.file(name); }
    void writeFile(const QString& name, const QByteArray& bytes) const { (void)m_env.writeFile(name, bytes); }
    [[nodiscard]] QByteArray readFile(const QString& name) const { return m_env.readFile(name); }

    void addCall(int lid, const QString& date, const QString& fromphone, const QString& frombez = QString())
    {
        db().exec(QStringLiteral("INSERT INTO LOG (LID, TSDATE, TSTIME, FROMBEZ, FROMPHONE, CTYPE, SERVICE, STATUS) "
                                 "VALUES (%1, '%2', '10:00:00', '%3', '%4', 0, 1, 'angenommen')")
                      .arg(lid)
                      .arg(date, frombez, fromphone));
    }

    // The main window on the data module (created on first use) with the given parameters and
    // features (none: every view shows an empty frame).
    TLogform& window(const QStringList& parameters = {}, const std::vector<MainWindowFeature>& features = {})
    {
        if (!m_window)
            m_window = std::make_unique<TLogform>(&dm(), parameters, features);
        return *m_window;
    }
    [[nodiscard]] TLogform* existingWindow() const { return m_window.get(); }
    void destroyWindow() { m_window.reset(); }

private:
    // Mutexes and message sockets go to a private folder, set before anything else starts.
    struct RuntimeFolder {
        RuntimeFolder() { qputenv("XDG_RUNTIME_DIR", dir.path().toLocal8Bit()); }
        QTemporaryDir dir;
    };

    RuntimeFolder m_runtime;
    ProgramTestEnv m_env;
    std::unique_ptr<TLogform> m_window;
};

// A log list that keeps the state the host leaves it in; Refresh_View can take its time.
class RecordingLogFrame final : public LogListFrame {
public:
    using LogListFrame::LogListFrame;

    int refreshMs = 0;
    int filterKind = 0;
    LogGrouping groupKind = LogGrouping::None;
    int groupings = 0;        // how often the grouping was rebuilt
    int columnMenuBuilds = 0; // how often the "Ansicht" menu was rebuilt
    int refreshedLid = -1;
    int refreshes = 0;        // completed refreshes
    bool noLog = false;
    bool stored = false;
    int whatsOnFilter = 0;
    LogGrouping whatsOnGroup = LogGrouping::None;
    int currentLid = -1;
    bool busy = false;
    std::function<void()> onToGroup;

    void setViewMode(int mode) override { m_mode = mode; }
    int viewMode() const override { return m_mode; }
    void setLogDay(QDate day) override { m_day = day; }
    QDate logDay() const override { return m_day; }
    void setNoLog(bool value) override { noLog = value; }
    void setCaptionText(const QString& text) override { m_caption = text; }
    QString captionText() const override { return m_caption; }
    bool isBusy() const override { return busy; }
    void setBusy(bool b) override { busy = b; }
    bool Firstep(QObject*) override { return true; }
    bool OpenDBonDay(QDate day) override
    {
        m_day = day;
        return true;
    }
    void SetNewFilter(int kind) override { filterKind = kind; }
    void ToGroup(LogGrouping kind) override
    {
        groupKind = kind;
        ++groupings;
        if (onToGroup)
            onToGroup();
    }
    void WhatsOn(int& f, LogGrouping& g) override
    {
        f = whatsOnFilter;
        g = whatsOnGroup;
    }
    void SetTableViewPopup() override { ++columnMenuBuilds; }
    void Refresh_View(int lid) override
    {
        if (refreshMs > 0)
            QTest::qWait(refreshMs);
        refreshedLid = lid;
        ++refreshes;
    }
    bool StoreLogView() override
    {
        stored = true;
        return true;
    }
    bool CanExpandGroups() const override { return false; }
    void ExpandAllGroups(bool) override {}
    int CurrentLogLID() const override { return currentLid; }

private:
    int m_mode = 0;
    QDate m_day;
    QString m_caption;
};

// Replaces the detail and edit windows with plain ones after the features have registered.
inline MainWindowFeature plainWindows()
{
    return [](TLogform& w) {
        w.factories().logDetailWindow = [](QWidget*, int, int) -> QWidget* { return new QWidget; };
        w.factories().contactEditWindow = [](QWidget*, int, int) -> QWidget* { return new QWidget; };
    };
}

// The call log's actions as in the program, but its list is a RecordingLogFrame (the created
// frames land in *frames) and its windows are plain ones.
inline std::vector<MainWindowFeature> recordingFeatures(QList<QPointer<RecordingLogFrame>>* frames)
{
    return {registerCallLogFeature, plainWindows(), [frames](TLogform& w) {
                w.factories().logFrame = [frames](QWidget* parent) -> LogListFrame* {
                    auto* frame = new RecordingLogFrame(parent);
                    frames->append(frame);
                    return frame;
                };
            }};
}

} // namespace orvanta::test
