// The monitor's settings, read once at start-up and kept for the run.

#include "app/AppServices.h"

#include "platform/RufwarteIni.h"
#include "platform/ProgramFolder.h"

#include <memory>

namespace orvanta {

namespace {

std::unique_ptr<TRufwarteIni>& instance()
{
    static std::unique_ptr<TRufwarteIni> settings;
    return settings;
}

} // namespace

void createMonitorSettings()
{
    // The settings object only ever reads: this program never writes the monitor's files.
    auto settings = std::make_unique<TRufwarteIni>();
    settings->SetFileNames(programFile(QString::fromLatin1(TRufwarteIni::kSettingsFile)),
                           QString::fromLatin1(TRufwarteIni::kSection), QString::fromLatin1(TRufwarteIni::kMsnFile),
                           QString::fromLatin1(TRufwarteIni::kApplicationName));
    settings->ReadFromIni();
    instance() = std::move(settings);
}

void freeMonitorSettings()
{
    instance().reset();
}

TRufwarteIni* monitorSettings()
{
    return instance().get();
}

} // namespace orvanta
