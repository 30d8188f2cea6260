#pragma once
// One way to run a unit of work on the database: all of it in one transaction or none of it, and
// a failure reported under the caller's label. The windows run their statements through it:
//
//   const bool saved = runInTransaction(m_dm->LogDetailTS, QStringLiteral("# LogDetailForm - SetBemerkung"), [&] {
//       query.setCommandText(QString::fromLatin1(logsql::kUpdateRemark));
//       query.execSQL();
//   }, ErrorReport::Log);
//   if (saved)
//       postMessage(m_host, WMLOGINFOCHANGE, m_logId, 1); // follow-ups are the caller's
//
// The sequence: TDM2::restart(transaction) (a transaction found active is rolled back, so the
// unit starts from a fresh snapshot and takes nothing left over with it), the work, commit. When
// any of the three throws a std::exception, the transaction is rolled back, `label` is reported
// with the exception ("label\r\nclass / message"), and the result is false: nothing of the unit
// stays written. Any other exception is rolled back too and passed on.
//
// A lock conflict (another attachment changed or holds the same rows; "nowait" transactions meet
// it at once, waiting ones when the other commits) is not reported: the unit is rolled back and
// run again from a fresh snapshot after a short pause, up to kLockConflictAttempts times in about
// three seconds; only a conflict that outlasts them is reported. So the work may run more than
// once and must not carry anything over from an earlier run.
//
// The work returns void or bool. Returning false declines the unit: it is rolled back, nothing is
// reported, and the result is false, so the caller can say why in its own words once the
// transaction has ended (e.g. "the record no longer exists").
//
// The transaction belongs to the helper while it runs: the work neither commits nor rolls back.
// Data sets and statements the work leaves open are the caller's to close.

#include <QStringView>

#include <exception>
#include <functional>
#include <type_traits>

namespace orvanta {

class FbTransaction;

// How a failure is reported: Show — reportError (error log and message box);
// Log — logError (error log only).
enum class ErrorReport { Show, Log };

namespace detail {
inline constexpr int kLockConflictAttempts = 12;
// The pause before the next attempt, in milliseconds, after attempt 0, 1, …
unsigned long lockConflictPause(int attempt);
// How many units this process has run again after a lock conflict (for load measurements).
[[nodiscard]] long long lockConflictRetries();
bool runTransactionWork(FbTransaction& transaction, QStringView label, const std::function<bool()>& work,
                        ErrorReport report);
} // namespace detail

template <typename Work>
bool runInTransaction(FbTransaction& transaction, QStringView label, Work&& work,
                      ErrorReport report = ErrorReport::Show)
{
    using Result = std::invoke_result_t<Work&>;
    static_assert(std::is_void_v<Result> || std::is_same_v<Result, bool>, "the work returns void or bool");
    if constexpr (std::is_void_v<Result>)
        return detail::runTransactionWork(
            transaction, label,
            [&work] {
                work();
                return true;
            },
            report);
    else
        return detail::runTransactionWork(transaction, label, [&work] { return work(); }, report);
}

// The failure half on its own, for work whose transaction is not ended by a commit here — a data
// set whose before-open hook starts its transaction and whose after-close hook commits it, like
// the log list: rolls the transaction back quietly (nullptr: there is none), then reports `label`
// with the exception.
void rollbackAndReport(FbTransaction* transaction, QStringView label, const std::exception& e,
                       ErrorReport report = ErrorReport::Show);

} // namespace orvanta
