#include "phone/RouterCallMonitor.h"

#include <QStringList>

#include <algorithm>

namespace orvanta {

RouterLineSplitter::RouterLineSplitter(qsizetype maxLineLength)
    : m_max(std::max<qsizetype>(maxLineLength, 1))
{
}

QList<QByteArray> RouterLineSplitter::feed(QByteArrayView bytes)
{
    QList<QByteArray> lines;
    while (!bytes.isEmpty()) {
        const qsizetype end = bytes.indexOf('\n');
        const QByteArrayView piece = end < 0 ? bytes : bytes.first(end);
        bytes = end < 0 ? QByteArrayView() : bytes.sliced(end + 1);
        if (m_skipping) {
            if (end >= 0)
                m_skipping = false;
            continue;
        }
        if (m_partial.size() + piece.size() > m_max) {
            // Counted once, when it passes the limit; the rest up to its end is skipped unread.
            m_partial.clear();
            m_partial.squeeze();
            ++m_dropped;
            m_skipping = end < 0;
            continue;
        }
        m_partial.append(piece);
        if (end < 0)
            break;
        if (m_partial.endsWith('\r'))
            m_partial.chop(1);
        lines.append(m_partial);
        m_partial.clear();
    }
    return lines;
}

void RouterLineSplitter::clear()
{
    m_partial.clear();
    m_skipping = false;
}

namespace {

bool twoDigits(QByteArrayView s, qsizetype at, int& value)
{
    const char a = s[at];
    const char b = s[at + 1];
    if (a < '0' || a > '9' || b < '0' || b > '9')
        return false;
    value = (a - '0') * 10 + (b - '0');
    return true;
}

// "dd.mm.yy hh:mm:ss"; two-digit years are this century's.
std::optional<QDateTime> parseStamp(QByteArrayView s)
{
    if (s.size() != 17 || s[2] != '.' || s[5] != '.' || s[8] != ' ' || s[11] != ':' || s[14] != ':')
        return std::nullopt;
    int d = 0, mo = 0, y = 0, h = 0, mi = 0, se = 0;
    if (!twoDigits(s, 0, d) || !twoDigits(s, 3, mo) || !twoDigits(s, 6, y) || !twoDigits(s, 9, h)
        || !twoDigits(s, 12, mi) || !twoDigits(s, 15, se))
        return std::nullopt;
    const QDate date(2000 + y, mo, d);
    const QTime time(h, mi, se);
    if (!date.isValid() || !time.isValid())
        return std::nullopt;
    return QDateTime(date, time);
}

// A non-negative decimal of at most nine digits.
std::optional<int> parseCount(QByteArrayView s)
{
    s = s.trimmed();
    if (s.isEmpty() || s.size() > 9)
        return std::nullopt;
    int v = 0;
    for (const char c : s) {
        if (c < '0' || c > '9')
            return std::nullopt;
        v = v * 10 + (c - '0');
    }
    return v;
}

// Digits and the dialling signs; empty is allowed (a withheld caller).
std::optional<QString> parseNumber(QByteArrayView s)
{
    s = s.trimmed();
    if (s.size() > kRouterMaxNumberLength)
        return std::nullopt;
    for (const char c : s) {
        if (!((c >= '0' && c <= '9') || c == '+' || c == '*' || c == '#'))
            return std::nullopt;
    }
    return QString::fromLatin1(s);
}

// Names of extensions and lines: printable ASCII, cut to the length a number may have.
QString parseName(QByteArrayView s)
{
    QString out;
    for (const char c : s.trimmed()) {
        if (c >= 0x20 && c < 0x7f && out.size() < kRouterMaxNumberLength)
            out += QLatin1Char(c);
    }
    return out;
}

} // namespace

std::optional<RouterEvent> parseRouterLine(QByteArrayView line, QString* reason)
{
    const auto fail = [reason](const char* why) -> std::optional<RouterEvent> {
        if (reason)
            *reason = QString::fromUtf8(why);
        return std::nullopt;
    };
    if (line.endsWith('\r'))
        line.chop(1);
    // At most the fields of the longest event and a few unknown ones behind it.
    QList<QByteArrayView> f;
    while (f.size() < 12) {
        const qsizetype sep = line.indexOf(';');
        f.append(sep < 0 ? line : line.first(sep));
        if (sep < 0)
            break;
        line = line.sliced(sep + 1);
    }
    if (f.size() < 4)
        return fail("Die Zeile ist kein Ereignis des Anrufmonitors.");
    const std::optional<QDateTime> time = parseStamp(f[0].trimmed());
    if (!time)
        return fail("Die Zeile beginnt nicht mit Datum und Uhrzeit.");
    const std::optional<int> id = parseCount(f[2]);
    if (!id)
        return fail("Die Verbindungsnummer ist ungültig.");

    RouterEvent e;
    e.time = *time;
    e.id = *id;
    const QByteArrayView kind = f[1].trimmed();
    if (kind == "RING") {
        if (f.size() < 6)
            return fail("RING: Felder fehlen.");
        const auto caller = parseNumber(f[3]);
        const auto called = parseNumber(f[4]);
        if (!caller || !called)
            return fail("RING: Die Rufnummer ist ungültig.");
        e.kind = RouterEvent::Kind::Ring;
        e.remoteNumber = *caller;
        e.ownNumber = *called;
        e.line = parseName(f[5]);
    } else if (kind == "CALL") {
        if (f.size() < 7)
            return fail("CALL: Felder fehlen.");
        const auto own = parseNumber(f[4]);
        const auto called = parseNumber(f[5]);
        if (!own || !called)
            return fail("CALL: Die Rufnummer ist ungültig.");
        e.kind = RouterEvent::Kind::Call;
        e.extension = parseName(f[3]);
        e.ownNumber = *own;
        e.remoteNumber = *called;
        e.line = parseName(f[6]);
    } else if (kind == "CONNECT") {
        if (f.size() < 5)
            return fail("CONNECT: Felder fehlen.");
        const auto number = parseNumber(f[4]);
        if (!number)
            return fail("CONNECT: Die Rufnummer ist ungültig.");
        e.kind = RouterEvent::Kind::Connect;
        e.extension = parseName(f[3]);
        e.remoteNumber = *number;
    } else if (kind == "DISCONNECT") {
        const std::optional<int> seconds = parseCount(f[3]);
        if (!seconds)
            return fail("DISCONNECT: Die Dauer ist ungültig.");
        e.kind = RouterEvent::Kind::Disconnect;
        e.seconds = *seconds;
    } else {
        return fail("Unbekanntes Ereignis.");
    }
    return e;
}

RouterCall RouterCallTracker::endOpen(int id)
{
    RouterCall call = m_open.take(id).call;
    call.durationSeconds = 0; // the end was not seen: the length is unknown
    return call;
}

QList<RouterCall> RouterCallTracker::handle(const RouterEvent& event, QStringList* notes)
{
    const auto note = [notes, &event](const QString& text) {
        if (notes)
            notes->append(QStringLiteral("Verbindung %1: %2").arg(event.id).arg(text));
    };
    QList<RouterCall> ended;
    switch (event.kind) {
    case RouterEvent::Kind::Ring:
    case RouterEvent::Kind::Call: {
        if (m_open.contains(event.id)) {
            // Its DISCONNECT was missed (e.g. while the line was down): the call is kept as it
            // stands rather than overwritten.
            note(QStringLiteral("Neuer Anruf vor dem Ende des vorigen; der vorige wird ohne Dauer beendet."));
            ended.append(endOpen(event.id));
        } else if (m_open.size() >= MaxOpenCalls) {
            const auto oldest = std::min_element(m_open.cbegin(), m_open.cend(),
                                                 [](const Open& a, const Open& b) { return a.order < b.order; });
            note(QStringLiteral("Zu viele offene Verbindungen; die älteste (%1) wird ohne Dauer beendet.")
                     .arg(oldest.key()));
            ended.append(endOpen(oldest.key()));
        }
        Open open;
        open.order = m_nextOrder++;
        RouterCall& c = open.call;
        c.direction = event.kind == RouterEvent::Kind::Ring ? RouterCall::Direction::Incoming
                                                            : RouterCall::Direction::Outgoing;
        c.remoteNumber = event.remoteNumber;
        c.ownNumber = event.ownNumber;
        c.extension = event.extension;
        c.line = event.line;
        c.start = event.time;
        m_open.insert(event.id, open);
        break;
    }
    case RouterEvent::Kind::Connect: {
        const auto it = m_open.find(event.id);
        if (it == m_open.end()) {
            note(QStringLiteral("CONNECT ohne RING oder CALL wird übergangen."));
            break;
        }
        it->call.answered = true;
        if (!event.extension.isEmpty())
            it->call.extension = event.extension;
        if (it->call.remoteNumber.isEmpty() && it->call.direction == RouterCall::Direction::Outgoing)
            it->call.remoteNumber = event.remoteNumber;
        break;
    }
    case RouterEvent::Kind::Disconnect: {
        if (!m_open.contains(event.id)) {
            note(QStringLiteral("DISCONNECT ohne RING oder CALL wird übergangen."));
            break;
        }
        RouterCall call = m_open.take(event.id).call;
        call.durationSeconds = call.answered ? event.seconds : 0;
        ended.append(call);
        break;
    }
    }
    return ended;
}

} // namespace orvanta
