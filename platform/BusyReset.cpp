#include "platform/BusyReset.h"

#include <atomic>

namespace orvanta {
namespace {

std::atomic<BusyResetHandler> g_handler{nullptr};

} // namespace

void setBusyResetHandler(BusyResetHandler handler)
{
    g_handler.store(handler);
}

void resetBusyIndicator()
{
    if (const BusyResetHandler handler = g_handler.load())
        handler();
}

} // namespace orvanta
