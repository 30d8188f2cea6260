// Arbitrary bytes as a router's call-monitor stream: cut into lines in one piece and in two, which
// must give the same lines; every line is parsed and fed to the call tracker. The splitter's memory
// stays within its limit, the tracker's open calls within theirs, and no call ends with a negative
// duration or without a start.

#include "phone/RouterCallMonitor.h"

#include <cstddef>
#include <cstdint>

using namespace orvanta;

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size)
{
    const QByteArrayView input(reinterpret_cast<const char*>(data), static_cast<qsizetype>(size));
    constexpr qsizetype limit = 256;

    RouterLineSplitter whole(limit);
    const QList<QByteArray> lines = whole.feed(input);
    if (whole.pendingBytes() > limit)
        __builtin_trap();

    const qsizetype cut = size > 0 ? qsizetype(data[0]) % (input.size() + 1) : 0;
    RouterLineSplitter split(limit);
    QList<QByteArray> again = split.feed(input.first(cut));
    again += split.feed(input.sliced(cut));
    if (again != lines || split.pendingBytes() != whole.pendingBytes() || split.droppedLines() != whole.droppedLines())
        __builtin_trap();

    RouterCallTracker tracker;
    for (const QByteArray& line : lines) {
        if (line.size() > limit || line.contains('\n'))
            __builtin_trap();
        QString reason;
        const std::optional<RouterEvent> event = parseRouterLine(line, &reason);
        if (!event) {
            if (reason.isEmpty())
                __builtin_trap();
            continue;
        }
        if (!event->time.isValid() || event->remoteNumber.size() > kRouterMaxNumberLength
            || event->ownNumber.size() > kRouterMaxNumberLength)
            __builtin_trap();
        QStringList notes;
        for (const RouterCall& call : tracker.handle(*event, &notes)) {
            if (call.durationSeconds < 0 || !call.start.isValid() || (!call.answered && call.durationSeconds != 0))
                __builtin_trap();
        }
        if (tracker.openCalls() > RouterCallTracker::MaxOpenCalls)
            __builtin_trap();
    }
    return 0;
}
