#include "platform/ContactSwitch.h"

namespace orvanta {

ContactSwitch readContactSwitch(const QStringList& parameters)
{
    ContactSwitch s;
    if (parameters.size() != 1 || !parameters.first().startsWith(QStringLiteral("/co-")))
        return s;
    s.present = true;
    s.logId = parameters.first().mid(4).toInt(&s.valid, 10);
    if (!s.valid)
        s.logId = 0;
    return s;
}

} // namespace orvanta
