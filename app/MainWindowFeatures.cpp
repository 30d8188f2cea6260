#include "app/MainWindowFeatures.h"

#include "app/CallLogFeature.h"
#include "app/ContactsFeature.h"

namespace orvanta {

std::vector<MainWindowFeature> defaultMainWindowFeatures()
{
    // A view whose frame no feature provides shows an empty frame.
    return {registerCallLogFeature, registerContactsFeature};
}

} // namespace orvanta
