#include "db/TransactionWork.h"

#include "db/DatabaseError.h"
#include "db/FbTransaction.h"
#include "db/TDM2.h"
#include "platform/ErrorLog.h"

#include <QRandomGenerator>
#include <QThread>

#include <algorithm>
#include <atomic>

namespace orvanta {

void rollbackAndReport(FbTransaction* transaction, QStringView label, const std::exception& e, ErrorReport report)
{
    if (transaction)
        transaction->rollbackQuietly();
    if (report == ErrorReport::Show)
        reportError(label.toString(), &e);
    else
        logError(label.toString(), &e);
}

namespace detail {
namespace {
std::atomic<long long> g_lockConflictRetries{0};
} // namespace

long long lockConflictRetries()
{
    return g_lockConflictRetries.load();
}

bool runTransactionWork(FbTransaction& transaction, QStringView label, const std::function<bool()>& work,
                        ErrorReport report)
{
    for (int attempt = 0;; ++attempt) {
        try {
            TDM2::restart(transaction);
            if (!work()) {
                transaction.rollbackQuietly();
                return false;
            }
            transaction.commit();
            return true;
        } catch (const DatabaseError& e) {
            // Another attachment (the monitor, a second workstation) holds or has just changed the
            // same rows: a moment later the unit runs against a fresh snapshot and goes through.
            if (e.isLockConflict() && attempt + 1 < kLockConflictAttempts) {
                transaction.rollbackQuietly();
                ++g_lockConflictRetries;
                QThread::msleep(lockConflictPause(attempt));
                continue;
            }
            rollbackAndReport(&transaction, label, e, report);
            return false;
        } catch (const std::exception& e) {
            rollbackAndReport(&transaction, label, e, report);
            return false;
        } catch (...) {
            transaction.rollbackQuietly();
            throw;
        }
    }
}

unsigned long lockConflictPause(int attempt)
{
    // Drawn from half to all of the step: a writer that holds its rows at a steady beat would
    // otherwise meet every attempt at the same point of its beat.
    const unsigned long step = std::min(25UL << std::min(attempt, 5), 500UL);
    return step / 2 + QRandomGenerator::global()->bounded(quint32(step / 2 + 1));
}

} // namespace detail

} // namespace orvanta
