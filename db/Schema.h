#pragma once
// The database schema script (db/schema.sql), compiled in so that tools and tests can create a
// database without knowing where the source tree is.

#include <QString>

namespace orvanta {

// The whole script: SET TERM blocks included, no CREATE DATABASE and no CONNECT.
[[nodiscard]] QString schemaScript();

} // namespace orvanta
