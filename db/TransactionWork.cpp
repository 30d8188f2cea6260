#include "db/TransactionWork.h"

#include "db/FbTransaction.h"
#include "db/TDM2.h"
#include "platform/ErrorLog.h"

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

bool runTransactionWork(FbTransaction& transaction, QStringView label, const std::function<bool()>& work,
                        ErrorReport report)
{
    try {
        TDM2::restart(transaction);
        if (!work()) {
            transaction.rollbackQuietly();
            return false;
        }
        transaction.commit();
        return true;
    } catch (const std::exception& e) {
        rollbackAndReport(&transaction, label, e, report);
        return false;
    } catch (...) {
        transaction.rollbackQuietly();
        throw;
    }
}

} // namespace detail

} // namespace orvanta
