#include "db/FbApi_p.h"
#include "db/SharedEngine.h"

#include <array>

namespace orvanta::fbapi {

using namespace Firebird;

IMaster* master()
{
    static IMaster* const m = fb_get_master_interface();
    return m;
}

IUtil* util()
{
    static IUtil* const u = master()->getUtilInterface();
    return u;
}

Status::Status()
    : m_status(master()->getStatus())
    , m_wrapper(m_status)
{
}

Status::~Status()
{
    m_status->dispose();
}

DatabaseError toError(const FbException& e, const QString& context)
{
    IStatus* status = e.getStatus();
    std::array<char, 4096> buffer{};
    util()->formatStatus(buffer.data(), unsigned(buffer.size() - 1), status);
    // The engine separates its message lines with "\n"; the program's texts use CR LF.
    QString message = decodeText(buffer.data(), qsizetype(qstrlen(buffer.data()))).trimmed();
    message.replace(QStringLiteral("\r\n"), QStringLiteral("\n"));
    message.replace(QLatin1Char('\n'), QStringLiteral("\r\n"));

    QList<qint64> codes;
    const ISC_STATUS* v = status->getErrors();
    const int sqlCode = int(isc_sqlcode(v));
    // Walk the status vector: (isc_arg_gds, code) pairs carry the codes, other arguments are skipped.
    while (v && *v != isc_arg_end) {
        const ISC_STATUS kind = *v++;
        const ISC_STATUS value = *v++;
        if (kind == isc_arg_gds && value != 0)
            codes.append(qint64(value));
        else if (kind == isc_arg_cstring)
            ++v; // length, then pointer
    }
    return DatabaseError(std::move(message), std::move(codes), sqlCode, context);
}

} // namespace orvanta::fbapi

namespace orvanta {

namespace {

int refuseSignalShutdown(const int reason, const int /*mask*/, void* /*arg*/)
{
    return reason == fb_shutrsn_signal ? 1 : 0;
}

} // namespace

void keepConnectionsOnTerminationSignals()
{
    ISC_STATUS_ARRAY status{};
    fb_shutdown_callback(status, refuseSignalShutdown, fb_shut_confirmation, nullptr);
}

} // namespace orvanta
