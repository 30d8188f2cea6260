#pragma once
// The program's "now": today, this week and this month, the error log's time stamps. Tests fix
// it to a known moment so date-dependent behaviour is testable on any day.

#include <QDate>
#include <QDateTime>

namespace orvanta::Clock {

// Local time.
[[nodiscard]] QDateTime now();
[[nodiscard]] QDate today();

// From now on now() returns this moment until reset() (or another setFixed()).
void setFixed(const QDateTime& moment);
void reset();
[[nodiscard]] bool isFixed();

} // namespace orvanta::Clock

namespace orvanta {

// Fixes the clock for one scope (a test), restoring the real clock afterwards.
class ScopedFixedClock final {
public:
    explicit ScopedFixedClock(const QDateTime& moment) { Clock::setFixed(moment); }
    ~ScopedFixedClock() { Clock::reset(); }
    ScopedFixedClock(const ScopedFixedClock&) = delete;
    ScopedFixedClock& operator=(const ScopedFixedClock&) = delete;
};

} // namespace orvanta
