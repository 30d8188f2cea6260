#pragma once
// Loading a contact into its in-memory record and saving the record back: the contact row with
// its address and category, then every number and e-mail entry by its change state, all in one
// transaction. The main window owns the records; it calls these and refreshes the list after.

#include <QString>

#include <functional>

namespace orvanta {

class TDM2;
class TvkMiniKontakt;

// Clears the record and fills it with the stored contact lid, its numbers and e-mail addresses
// (all unchanged). False, reported under "# Orvanta - GetDSID_Data", when the record is missing,
// the contact cannot be read or does not exist.
bool GetDSID_Data(TDM2& dm, TvkMiniKontakt* record, int lid);

// Offered, after a new contact made from a caller's number was stored, to link the log records
// of that number to it: the number, the label of the contact's entry that matched it, the new key
// and the contact's designation. The call log decides (it asks the user).
using LogRelink =
    std::function<void(const QString& number, const QString& label, int contactKey, const QString& contbez)>;

// Stores the record as a new contact. Entries marked deleted are not sent. callerNumber: the
// caller's number the contact was made from, or empty; when one of the entries matches it, relink
// is called after the commit. On success the record is reloaded under its new key; on failure
// nothing of the contact is stored and the record keeps every field and change state.
bool InsertConData(TDM2& dm, TvkMiniKontakt* record, const QString& callerNumber = {},
                   const LogRelink& relink = {});

// Stores the changes of an existing contact (entries that are not unchanged); the record is
// reloaded on success and left as it was on failure (including a contact deleted meanwhile).
bool EditConData(TDM2& dm, TvkMiniKontakt* record);

} // namespace orvanta
