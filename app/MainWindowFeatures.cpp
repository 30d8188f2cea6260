#include "app/MainWindowFeatures.h"

#include "app/CallLogFeature.h"
#include "app/ContactEditFeature.h"
#include "app/ContactsFeature.h"
#include "app/ExportFeature.h"

namespace orvanta {

std::vector<MainWindowFeature> defaultMainWindowFeatures()
{
    // A view whose frame no feature provides shows an empty frame.
    return {registerCallLogFeature, registerContactsFeature, registerContactEditFeature, registerExportFeature};
}

} // namespace orvanta
