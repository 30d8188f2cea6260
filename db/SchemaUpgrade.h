#pragma once
// Databases made before the log list read its newest calls first lack the objects that make it
// fast: the two date-and-time indexes of LOG and the change counters its triggers keep. The log
// reads correctly without them, only slowly (a sort of the whole log before the first screen, a
// full re-read on every refresh). On connect the missing ones are created with the statements of
// the schema script itself. A database that refuses (no rights, objects in use) keeps working
// without them; the refusal goes to the error log only.

namespace orvanta {

class FbAttachment;

// Creates what is missing, each object in a transaction of its own; returns how many it made.
// Failures are logged, never thrown.
int addMissingLogObjects(FbAttachment& db);

} // namespace orvanta
