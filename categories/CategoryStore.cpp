#include "categories/CategoryStore.h"

#include "categories/CategoryStatements.h"
#include "db/TDM2.h"
#include "db/TransactionWork.h"
#include "platform/DialogService.h"
#include "platform/ErrorLog.h"
#include "ui/dialogs/BusyCursor.h"

namespace orvanta {
namespace {

    const QString kDbError = QStringLiteral("\r\nEs ist ein Datenbankfehler bei der Bearbeitung aufgetreten!");

    QString label(const char* operation)
    {
        return QStringLiteral("# CatControl - ") + QLatin1String(operation) + kDbError;
    }

} // namespace

KatSaveResult InsertKat(TDM2& dm, int id, const QString& name, const QString& remark, int* savedId)
{
    BusyCursor busy;
    if (!dm.DBConnect())
        return KatSaveResult::DatabaseError;
    int r = 0;
    bool answered = false;
    const bool stored = runInTransaction(dm.IBSQLTS, label("InsertKat"), [&] {
        FbStatement& sql = dm.IBSQL1;
        sql.setSql(QString::fromLatin1(katsql::kInsertKat));
        sql.setParam(u"KID", id);
        sql.setParam(u"KA", name);
        sql.setParam(u"BEM", remark);
        sql.execute();
        r = sql.isNull(0) ? 0 : sql.asInt(0);
        sql.close();
        answered = true;
        return r >= 1;
    });
    if (stored) {
        if (savedId)
            *savedId = r;
        return KatSaveResult::Saved;
    }
    if (!answered) // the helper has reported the failure
        return KatSaveResult::DatabaseError;
    BusyCursor::resetCursor();
    if (r == -2) {
        dialogs().information(QStringLiteral("Die angegebene Kategoriebezeichnung ist bereits vorhanden!"));
        return KatSaveResult::NameTaken;
    }
    reportError(label("InsertKat") + QStringLiteral("\r\nKategorie kann nicht gespeichert werden."));
    return KatSaveResult::DatabaseError;
}

bool DeleteKat(TDM2& dm, int id)
{
    BusyCursor busy;
    if (!dm.DBConnect())
        return false;
    return runInTransaction(dm.IBSQLTS, label("DeleteKat"), [&] {
        FbStatement& sql = dm.IBSQL1;
        sql.setSql(QString::fromLatin1(katsql::kDeleteKat));
        sql.setParam(u"KID", id);
        sql.execute();
        sql.close();
    });
}

bool DeleteRelated(TDM2& dm, int assignmentId)
{
    BusyCursor busy;
    if (!dm.DBConnect())
        return false;
    return runInTransaction(dm.IBSQLTS, label("DeleteRelated"), [&] {
        FbStatement& sql = dm.IBSQL1;
        sql.setSql(QString::fromLatin1(katsql::kDeleteRelated));
        sql.setParam(u"ID", assignmentId);
        sql.execute();
        sql.close();
    });
}

bool ChangeConKat(TDM2& dm, int assignmentId, int categoryId)
{
    BusyCursor busy;
    if (!dm.DBConnect())
        return false;
    return runInTransaction(dm.IBSQLTS, label("ChangeConKat"), [&] {
        FbStatement& sql = dm.IBSQL1;
        sql.setSql(QString::fromLatin1(katsql::kChangeConKat));
        sql.setParam(u"CK_ID", assignmentId);
        sql.setParam(u"KID", categoryId);
        sql.execute();
        sql.close();
    });
}

} // namespace orvanta
