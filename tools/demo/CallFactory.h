#pragma once
// Random but plausible call records: callers from Germany, Austria and Switzerland, own numbers,
// both directions, the ISDN services, outcomes, durations, charges and remarks.

#include <QDate>
#include <QRandomGenerator>
#include <QString>
#include <QTime>

#include <vector>

namespace orvanta::demo {

struct CallRow {
    int service = 1;
    QString fromPhone;
    QString fromBez;
    QString fromSubb;
    QString onMsn;
    QString onBez;
    QString status;
    QDate date;
    QTime time;
    int cid = 0;
    QString bemerk;
    int ctype = 0; // 0 incoming, 1 outgoing, 2 unknown
    QTime ctime{0, 0};
    qint64 chargeCents = 0;
    int abid = 0; // > 0: a message on the answering machine
    QString region;
    QString from2;
    QString fromAnschluss;
    int ntype = 0;
    int nplan = 1;
    int present = 0;
    int b1 = 1;
    int b2 = 0;
    int b3 = 0;
};

// A caller's number as the line reports it, with the region of its area code.
struct Caller {
    QString number;
    QString region;
    int ntype = 2; // 1 international, 2 national, 4 subscriber
};

class CallFactory final {
public:
    explicit CallFactory(quint32 seed);

    // A call on the given day from (or, outgoing, to) a random number; every field filled.
    [[nodiscard]] CallRow randomCall(const QDate& day);
    // The same, with the number given (a known contact's); ctype -1 picks the direction.
    [[nodiscard]] CallRow callWith(const QDate& day, const Caller& caller, int ctype = -1);

    [[nodiscard]] Caller randomCaller();
    // A day within the given number of days up to lastDay, recent days more likely.
    [[nodiscard]] QDate randomDay(const QDate& lastDay, int days);
    [[nodiscard]] int bounded(int limit) { return int(m_rng.bounded(limit)); }

private:
    void fillOutcome(CallRow& row);

    QRandomGenerator m_rng;
    int m_nextAbid = 1;
};

// Digits of a number without the leading zeros: the form numbers are compared in.
[[nodiscard]] QString digitsOf(const QString& number);

} // namespace orvanta::demo
