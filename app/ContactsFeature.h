#pragma once
// The address book in the main window: the contact list frame and the behaviour of deleting the
// selected contact (the questions, the check for an open edit window, the deletion, the refresh).

namespace orvanta {

class TLogform;

void registerContactsFeature(TLogform& mainWindow);

} // namespace orvanta
