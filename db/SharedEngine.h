#pragma once
// The embedded Firebird engine opens a database file exclusively unless it runs in the
// "SuperClassic" server mode. The program and the call monitor both work on the same file at
// the same time, so both switch the in-process engine to that mode before their first attach:
// a root folder in the runtime folder holds a firebird.conf with the mode and links to the
// installed engine's files, and FIREBIRD points at it.

#include <QString>

namespace orvanta {

// Does nothing when FIREBIRD is already set or no installed engine is found. Must run before
// the first database call of the process. Returns the root in use (empty: the default).
QString useSharedEmbeddedEngine();

} // namespace orvanta

namespace orvanta {

// The client library catches SIGTERM and SIGINT and, on them, cuts every connection of the
// process at once — before a program that handles those signals itself could end through its
// own tear-down (which still stores its state). A program that handles them calls this; the
// engine then shuts down when the program exits, as on a normal end.
void keepConnectionsOnTerminationSignals();

} // namespace orvanta
