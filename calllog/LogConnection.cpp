#include "calllog/LogConnection.h"

#include "db/TDM2.h"
#include "ui/dialogs/BusyCursor.h"
#include "platform/ErrorLog.h"

namespace orvanta {

bool logDatabaseConnected(TDM2* dm)
{
    if (!dm) {
        // The report must not sit under an hourglass started by the caller.
        BusyCursor::resetCursor();
        reportError(QStringLiteral("# DM2 - DBConnect\r\nKeine Verbindung zur Datenbank!"));
        return false;
    }
    return dm->DBConnect();
}

} // namespace orvanta
