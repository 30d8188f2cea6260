#pragma once
// The program's one command-line switch: "/co-" followed by the key of a call-log record, as the
// only parameter. Read by the program at start and by a second start that hands it on.

#include <QStringList>

namespace orvanta {

struct ContactSwitch {
    bool present = false; // exactly one parameter, beginning with "/co-"
    bool valid = false;   // and the rest of it is a decimal integer
    int logId = 0;
};

[[nodiscard]] ContactSwitch readContactSwitch(const QStringList& parameters);

} // namespace orvanta
