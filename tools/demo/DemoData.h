#pragma once
// Demo content for an empty call database.
//
//   fillDemo(db)              categories, contacts with numbers, e-mail addresses, addresses and
//                             notes (written through the stored procedures), and a few hundred
//                             calls over the last months, some linked to the contacts
//   generateCalls(db, n, s)   n further varied calls in one transaction, for benchmarks
//
// Both commit on success, roll back and throw DatabaseError on failure.

#include "platform/Clock.h"

#include <QDate>

namespace orvanta {
class FbAttachment;
}

namespace orvanta::demo {

struct DemoStats {
    int categories = 0;
    int contacts = 0;
    int numbers = 0;
    int mails = 0;
    int calls = 0;
    int linkedCalls = 0; // calls whose CID names a contact
};

// today: the last day that receives calls (a few of them on that day itself).
DemoStats fillDemo(FbAttachment& attachment, const QDate& today = Clock::today());

// Calls spread over the 365 days up to lastDay; the same seed gives the same rows.
// Returns the number of rows inserted.
qint64 generateCalls(FbAttachment& attachment, qint64 count, quint32 seed,
                     const QDate& lastDay = Clock::today());

} // namespace orvanta::demo
