#include "app/MainWindowFeatures.h"

#include "app/CallLogFeature.h"
#include "app/ExportFeature.h"

namespace orvanta {

std::vector<MainWindowFeature> defaultMainWindowFeatures()
{
    // A view whose frame no feature provides shows an empty frame.
    return {registerCallLogFeature, registerExportFeature};
}

} // namespace orvanta
