#pragma once
// The one check before the call log touches the database.

namespace orvanta {

class TDM2;

// Whether the data module is connected; otherwise reports the missing connection and returns
// false. A frame or window that was given no data module has no connection either.
[[nodiscard]] bool logDatabaseConnected(TDM2* dm);

} // namespace orvanta
