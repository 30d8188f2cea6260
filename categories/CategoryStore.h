#pragma once
// The category manager's writes, each one unit of work on the data module's IBSQL1 in IBSQLTS:
// all of it is committed or nothing. They re-read no list; the window does that afterwards.
// A missing connection is reported by TDM2::DBConnect and writes nothing.

#include <QString>

namespace orvanta {

class TDM2;

// What became of a category being saved; the numbers are the ones the manager's loop acts on.
enum class KatSaveResult {
    Saved = 0, // stored; savedId holds its key
    DatabaseError = 1, // reported; nothing stored
    NameTaken = 2, // another category has this name in any case; the user was told
};

// id 0 creates the category, an existing id updates its name and remark. The database trims the
// name and refuses a name that another category has in any case (-2 from P_KAT_INSERT).
KatSaveResult InsertKat(TDM2& dm, int id, const QString& name, const QString& remark, int* savedId = nullptr);
// Deletes the category; its contacts belong to no category afterwards.
bool DeleteKat(TDM2& dm, int id);
// Removes one contact's category link (a CONKAT row).
bool DeleteRelated(TDM2& dm, int assignmentId);
// Moves one contact's category link to another category.
bool ChangeConKat(TDM2& dm, int assignmentId, int categoryId);

} // namespace orvanta
