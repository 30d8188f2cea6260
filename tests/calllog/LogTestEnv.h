#pragma once
// What every call-log test needs: a fresh database reached through the data module as at a
// real start (registry key with encrypted credentials), an error log and a program folder in a
// temporary folder, scripted dialogs, a fixed clock, and a host that records posted messages.

#include "db/CredentialCipher.h"
#include "platform/ProgramFolder.h"
#include "platform/Registry.h"
#include "platform/WindowMessages.h"
#include "tests/support/ProgramTestEnv.h"

#include <QCoreApplication>
#include <QElapsedTimer>
#include <QFile>
#include <QTest>

namespace orvanta::test {

// Receives the window messages a frame or window posts.
class MessageRecorder final : public QObject {
public:
    struct Message {
        int number;
        qintptr wParam;
        qintptr lParam;
    };
    QList<Message> messages;

    [[nodiscard]] QList<Message> of(int number) const
    {
        QList<Message> out;
        for (const Message& m : messages)
            if (m.number == number)
                out.append(m);
        return out;
    }
    void clear() { messages.clear(); }
    // Delivers what is queued for this receiver.
    void flush() { QCoreApplication::sendPostedEvents(this, WindowMessageEvent::eventType()); }

protected:
    void customEvent(QEvent* event) override
    {
        if (WindowMessageEvent* m = asWindowMessage(event))
            messages.append({m->message(), m->wParam(), m->lParam()});
    }
};

class LogTestEnv final {
public:
    // A Wednesday: the week runs from 13 to 19 May 2024.
    static QDate today() { return {2024, 5, 15}; }

    LogTestEnv()
        : m_env(QDateTime(today(), QTime(12, 0)), ProgramTestEnv::ErrorLogSetup::Create)
    {
    }

    TempDatabase& db() { return m_env.db(); }
    // The data module, connected on first use (after the test has filled the database).
    TDM2& dm() { return m_env.dm(); }
    ScriptedDialogService& dialogs() { return m_env.dialogs(); }
    MessageRecorder& host() { return m_host; }
    QString folder() const { return m_env.folder(); }
    QString file(const QString& name) const { return m_env.file(name); }
    void writeFile(const QString& name, const QByteArray& bytes) const { QVERIFY(m_env.writeFile(name, bytes)); }
    // The error log's file as text (Windows-1252 is Latin-1 for these texts).
    QString errorLogText() const
    {
        QFile f(m_env.errorLog()->filePath());
        return f.open(QIODevice::ReadOnly) ? QString::fromLatin1(f.readAll()) : QString();
    }

    // One call; text values given as SQL literals ("NULL" or "'x'").
    void addCall(int lid, const QString& date, const QString& time, const QString& frombez, const QString& fromphone,
                 int ctype = 0, const QString& service = QStringLiteral("1"), int abid = 0,
                 const QString& onbez = QStringLiteral("'Büro'"), const QString& onmsn = QStringLiteral("'4711'"))
    {
        db().exec(QStringLiteral("INSERT INTO LOG (LID, TSDATE, TSTIME, TS, FROMBEZ, FROMPHONE, CTYPE, SERVICE, ABID, "
                                 "ONBEZ, ONMSN, STATUS, REGION, CCHARGE, CTIME) VALUES (%1, %2, %3, NULL, %4, %5, %6, "
                                 "%7, %8, %9, %10, 'angenommen', 'Berlin', 1.5, '00:01:30')")
                      .arg(lid)
                      .arg(date, time, frombez, fromphone)
                      .arg(ctype)
                      .arg(service)
                      .arg(abid)
                      .arg(onbez, onmsn));
    }

private:
    ProgramTestEnv m_env;
    MessageRecorder m_host;
};

// Lets the log the data module reads in the background arrive completely; false on timeout.
inline bool waitForLog(TDM2& dm, int timeoutMs = 30000)
{
    QElapsedTimer timer;
    timer.start();
    while (dm.ibcds_log.isLoading()) {
        if (timer.elapsed() > timeoutMs)
            return false;
        QCoreApplication::processEvents(QEventLoop::AllEvents, 10);
    }
    QCoreApplication::processEvents();
    return true;
}

// Firstep, then the whole log arrived.
template <class Frame>
bool firstep(Frame& frame, LogTestEnv& env)
{
    const bool ok = frame.Firstep(&env.host());
    return waitForLog(env.dm()) && ok;
}

} // namespace orvanta::test
