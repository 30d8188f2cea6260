#include "tools/demo/CallFactory.h"

#include <array>

namespace orvanta::demo {
namespace {

struct Region {
    const char* prefix; // as dialled from Germany
    const char* name;   // UTF-8
    int ntype;
};

// Weighted by repetition: most calls are domestic.
constexpr std::array regions{
    Region{"030", "Berlin", 2},          Region{"030", "Berlin", 2},
    Region{"040", "Hamburg", 2},         Region{"089", "München", 2},
    Region{"0221", "Köln", 2},           Region{"069", "Frankfurt am Main", 2},
    Region{"0711", "Stuttgart", 2},      Region{"0211", "Düsseldorf", 2},
    Region{"0351", "Dresden", 2},        Region{"0341", "Leipzig", 2},
    Region{"0511", "Hannover", 2},       Region{"0201", "Essen", 2},
    Region{"0202", "Wuppertal", 2},      Region{"0203", "Duisburg", 2},
    Region{"0151", "Mobilfunk", 2},      Region{"0171", "Mobilfunk", 2},
    Region{"0176", "Mobilfunk", 2},      Region{"00431", "Wien", 1},
    Region{"0043316", "Graz", 1},        Region{"0043662", "Salzburg", 1},
    Region{"0043512", "Innsbruck", 1},   Region{"0043732", "Linz", 1},
    Region{"004144", "Zürich", 1},       Region{"004131", "Bern", 1},
    Region{"004161", "Basel", 1},        Region{"004122", "Genf", 1},
    Region{"004141", "Luzern", 1},       Region{"004171", "St. Gallen", 1},
};

struct Line {
    const char* msn;
    const char* name;
};
constexpr std::array ownLines{Line{"4711001", "Büro"}, Line{"4711001", "Büro"}, Line{"4711002", "Privat"},
                              Line{"4711009", "Fax"}};

// Speech dominates; faxes and analogue calls are common; every other service occurs now and then.
int pickService(QRandomGenerator& rng)
{
    const int p = int(rng.bounded(100));
    if (p < 68)
        return 1;
    if (p < 74)
        return 10;
    if (p < 79)
        return p < 77 ? 4 : 5;
    if (p < 86)
        return p < 84 ? 11 : 12;
    if (p < 88)
        return 0;
    return 2 + int(rng.bounded(21)); // 2 .. 22
}

constexpr std::array remarks{"Rückruf erbeten", "Angebot besprochen", "Termin vereinbart",
                             "Bitte zurückrufen", "Lieferung bestätigt", "Rechnung nachfragen",
                             "Hat sich verwählt", "Wegen Wartungsvertrag", "Privat", "Reklamation"};

QString text(const char* utf8) { return QString::fromUtf8(utf8); }

} // namespace

QString digitsOf(const QString& number)
{
    QString out;
    for (const QChar c : number) {
        if (c >= u'0' && c <= u'9' && (c != u'0' || !out.isEmpty()))
            out += c;
    }
    return out;
}

CallFactory::CallFactory(quint32 seed)
    : m_rng(seed)
{
}

Caller CallFactory::randomCaller()
{
    const Region& r = regions[m_rng.bounded(int(regions.size()))];
    QString number = QString::fromLatin1(r.prefix);
    const int localDigits = 5 + int(m_rng.bounded(4));
    number += QChar(u'1' + char16_t(m_rng.bounded(9)));
    for (int i = 1; i < localDigits; ++i)
        number += QChar(u'0' + char16_t(m_rng.bounded(10)));
    return Caller{number, text(r.name), r.ntype};
}

QDate CallFactory::randomDay(const QDate& lastDay, int days)
{
    // The square of a uniform number leans towards 0, i.e. towards the last day.
    const double u = m_rng.generateDouble();
    return lastDay.addDays(-qint64(u * u * days));
}

CallRow CallFactory::randomCall(const QDate& day)
{
    const int kind = int(m_rng.bounded(100));
    if (kind < 8) {
        // A caller who withholds the number, or a line that did not report one.
        Caller c;
        c.number = kind < 4 ? text("Nummer unterdrückt") : kind < 6 ? QStringLiteral("Unbekannt") : QString();
        c.ntype = 0;
        // Only incoming calls can have a withheld caller.
        CallRow row = callWith(day, c, 0);
        row.present = kind < 4 ? 1 : 2;
        return row;
    }
    return callWith(day, randomCaller());
}

CallRow CallFactory::callWith(const QDate& day, const Caller& caller, int ctype)
{
    CallRow row;
    row.date = day;
    // Office hours are busiest.
    const int hour = 7 + int(m_rng.bounded(8)) + int(m_rng.bounded(7));
    row.time = QTime(hour, int(m_rng.bounded(60)), int(m_rng.bounded(60)));
    row.fromPhone = caller.number;
    // The monitor writes the number as the caller's text until a contact claims it; printed
    // reports show this text as it is stored.
    row.fromBez = caller.number;
    row.region = caller.region;
    row.ntype = caller.ntype;
    const int dir = int(m_rng.bounded(100));
    row.ctype = ctype >= 0 ? ctype : dir < 70 ? 0 : dir < 97 ? 1 : 2;
    row.service = pickService(m_rng);
    const Line& line = ownLines[m_rng.bounded(int(ownLines.size()))];
    row.onMsn = QString::fromLatin1(line.msn);
    row.onBez = text(line.name);
    if (row.service == 11 || row.service == 12) {
        row.onMsn = QStringLiteral("4711009");
        row.onBez = text("Fax");
    }
    if (m_rng.bounded(20) == 0 && !caller.number.isEmpty())
        row.from2 = caller.number;
    row.b1 = int(m_rng.bounded(3));
    row.b2 = int(m_rng.bounded(3));
    row.b3 = int(m_rng.bounded(2));
    fillOutcome(row);
    if (m_rng.bounded(12) == 0)
        row.bemerk = text(remarks[m_rng.bounded(int(remarks.size()))]);
    return row;
}

void CallFactory::fillOutcome(CallRow& row)
{
    const int o = int(m_rng.bounded(100));
    bool connected = false;
    if (row.ctype == 1) {
        row.status = o < 75 ? QStringLiteral("Verbunden") : o < 90 ? QStringLiteral("Keine Antwort") : QStringLiteral("Besetzt");
        connected = o < 75;
    } else if (row.ctype == 0) {
        if (o < 55) {
            row.status = QStringLiteral("Verbunden");
            connected = true;
        } else if (o < 75) {
            row.status = QStringLiteral("Nicht angenommen");
        } else if (o < 90) {
            row.status = QStringLiteral("Anrufbeantworter");
            row.abid = m_nextAbid++;
            row.ctime = QTime(0, 0).addSecs(5 + int(m_rng.bounded(90)));
        } else if (o < 96) {
            row.status = QStringLiteral("Besetzt");
        } else {
            row.status = QStringLiteral("Abgelehnt");
        }
    } else {
        row.status = QString();
    }
    if (connected) {
        // Mostly short calls, a few long ones.
        const int secs = 10 + int(m_rng.bounded(240)) + (m_rng.bounded(10) == 0 ? int(m_rng.bounded(3600)) : 0);
        row.ctime = QTime(0, 0).addSecs(secs);
        if (row.ctype == 1) {
            const int perMinute = row.ntype == 1 ? 9 : row.region == QStringLiteral("Mobilfunk") ? 6 : 2;
            row.chargeCents = qint64((secs + 59) / 60) * perMinute;
        }
    }
}

} // namespace orvanta::demo
