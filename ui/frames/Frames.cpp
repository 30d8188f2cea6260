// The frame interfaces are header-only; this unit gives their meta objects a home.
#include "ui/frames/ContactListFrame.h"
#include "ui/frames/LogListFrame.h"
