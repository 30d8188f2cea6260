#pragma once
// Deleting a contact with its numbers, e-mail addresses, address and category link, in one
// transaction. The host asks the user first and refreshes the list afterwards.

namespace orvanta {

class TDM2;

// False, with "# Orvanta - DeleteDS\r\nKontakt konnte nicht gelöscht werden." reported and
// nothing deleted, when the database refused.
bool DeleteDS(TDM2& dm, int lid);

} // namespace orvanta
