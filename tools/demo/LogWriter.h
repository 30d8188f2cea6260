#pragma once
// Inserts call records into LOG through one prepared statement; the key comes from the
// table's trigger, as with the call monitor.

#include "db/FbStatement.h"

namespace orvanta {
class FbAttachment;
class FbTransaction;
}

namespace orvanta::demo {

struct CallRow;

class LogWriter final {
public:
    LogWriter(FbAttachment& attachment, FbTransaction& transaction);
    void insert(const CallRow& row);

private:
    FbStatement m_insert;
};

} // namespace orvanta::demo
