#include "app/MainWindowFeatures.h"

#include "app/CallLogFeature.h"
#include "app/CategoriesFeature.h"
#include "app/ContactEditFeature.h"
#include "app/ContactsFeature.h"
#include "app/ExportFeature.h"

namespace orvanta {

std::vector<MainWindowFeature> defaultMainWindowFeatures()
{
    // A view whose frame no feature provides shows an empty frame.
    return {registerCallLogFeature, registerContactsFeature, registerContactEditFeature, registerExportFeature,
            registerCategoriesFeature};
}

} // namespace orvanta
