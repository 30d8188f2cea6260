#pragma once
// The call-monitor text protocol of home routers (TCP port 1012): one event per line, fields
// separated by ";":
//
//   dd.mm.yy hh:mm:ss;RING;id;caller;called;line;
//   dd.mm.yy hh:mm:ss;CALL;id;extension;own number;called;line;
//   dd.mm.yy hh:mm:ss;CONNECT;id;extension;number;
//   dd.mm.yy hh:mm:ss;DISCONNECT;id;seconds;
//
// RouterLineSplitter cuts the byte stream into lines with bounded memory, parseRouterLine reads
// one line, RouterCallTracker pairs the events of one connection id into finished calls. All
// three take any input: what they cannot use is reported in German and passed over.

#include <QByteArray>
#include <QByteArrayView>
#include <QDateTime>
#include <QList>
#include <QMap>
#include <QString>

#include <optional>

namespace orvanta {

// Cuts received bytes into lines ("\n" or "\r\n"). A line longer than the limit is dropped as it
// arrives, so an endless line costs no more than the limit; a line without its end is kept until
// the rest arrives.
class RouterLineSplitter final {
public:
    static constexpr qsizetype DefaultMaxLineLength = 4096;

    explicit RouterLineSplitter(qsizetype maxLineLength = DefaultMaxLineLength);

    // The complete lines in `bytes` together with what was kept before, without their line ends.
    [[nodiscard]] QList<QByteArray> feed(QByteArrayView bytes);
    // Forgets a started line (the connection it came from is gone).
    void clear();

    [[nodiscard]] qsizetype pendingBytes() const { return m_partial.size(); }
    // How many over-long lines were dropped so far.
    [[nodiscard]] int droppedLines() const { return m_dropped; }

private:
    qsizetype m_max;
    QByteArray m_partial;
    bool m_skipping = false; // inside an over-long line: everything up to its end is dropped
    int m_dropped = 0;
};

struct RouterEvent {
    enum class Kind { Ring, Call, Connect, Disconnect };

    Kind kind = Kind::Ring;
    QDateTime time; // the router's local clock
    int id = 0;     // the connection id; the router reuses ids once a call has ended
    // RING: the caller (empty when withheld); CALL and CONNECT: the other party.
    QString remoteNumber;
    // RING: the own number called; CALL: the own number used.
    QString ownNumber;
    // CALL and CONNECT: the extension (internal line) involved.
    QString extension;
    // RING and CALL: the line the call runs on (e.g. "SIP0").
    QString line;
    // DISCONNECT: the connected seconds.
    int seconds = 0;
};

// Numbers and texts longer than this are not numbers; they make the line unusable.
inline constexpr int kRouterMaxNumberLength = 25;

// One line without its line end; nothing and a German reason when it is no event.
[[nodiscard]] std::optional<RouterEvent> parseRouterLine(QByteArrayView line, QString* reason = nullptr);

// A call whose events are complete.
struct RouterCall {
    enum class Direction { Incoming = 0, Outgoing = 1 };

    Direction direction = Direction::Incoming;
    QString remoteNumber; // caller or called party; empty when the caller withheld it
    QString ownNumber;    // the own number (MSN) called or used
    QString extension;    // the extension that answered or dialled, when known
    QString line;
    bool answered = false;
    QDateTime start;      // time of RING or CALL
    int durationSeconds = 0;
};

// Pairs RING/CALL, CONNECT and DISCONNECT by connection id. Durations come from the router's own
// count, never from the difference of two time stamps, so a clock set back gives no negative or
// huge durations.
class RouterCallTracker final {
public:
    // Calls open at once beyond this are not believable; the oldest is then ended as it stands.
    static constexpr int MaxOpenCalls = 64;

    // The calls this event ends (usually none or one). Anything odd about the event is appended
    // to `notes` in German.
    QList<RouterCall> handle(const RouterEvent& event, QStringList* notes = nullptr);

    [[nodiscard]] int openCalls() const { return static_cast<int>(m_open.size()); }

private:
    struct Open {
        RouterCall call;
        quint64 order = 0;
    };
    RouterCall endOpen(int id);

    QMap<int, Open> m_open;
    quint64 m_nextOrder = 0;
};

} // namespace orvanta
