#include "contacts/ContactDeletion.h"

#include "contacts/ContactStatements.h"
#include "db/TDM2.h"
#include "db/TransactionWork.h"
#include "ui/dialogs/BusyCursor.h"

namespace orvanta {

bool DeleteDS(TDM2& dm, int lid)
{
    BusyCursor busy;
    if (!dm.DBConnect())
        return false;
    return runInTransaction(dm.IBSQLTS, QStringLiteral("# Orvanta - DeleteDS\r\nKontakt konnte nicht gelöscht werden."),
                            [&] {
                                FbStatement& sql = dm.IBSQL1;
                                sql.setSql(QString::fromLatin1(contactsql::kDeleteContact));
                                sql.setParam(u"D_LID", lid);
                                sql.execute();
                                sql.close();
                            });
}

} // namespace orvanta
