#include "platform/AppException.h"
