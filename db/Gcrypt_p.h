#pragma once
// The one place that includes libgcrypt; only the credential cipher uses it.

#include <gcrypt.h>

namespace orvanta::detail {

// Checks the library version and finishes its initialisation once per process; false when the
// library is unusable.
bool ensureGcrypt();

} // namespace orvanta::detail
