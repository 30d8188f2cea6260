#pragma once
// The per-user folder for locks, sockets and the engine's private configuration:
// $XDG_RUNTIME_DIR, else the folder Qt keeps for the user (/tmp/runtime-<user>, mode 0700 and
// owned by the user). Never a folder all users share: another user's lock there would make the
// program end silently at start, and another user's socket would receive its messages.

#include <QString>

namespace orvanta {

[[nodiscard]] QString userRuntimeFolder();

} // namespace orvanta
