#pragma once
// Reporting seam of the phone units until the shared error log is available.

#include "platform/AppException.h"

#include <QString>

namespace orvanta {

void phoneLogError(const QString& message, const AppException* exception = nullptr);
void phoneShowError(const QString& message, const AppException* exception = nullptr);

} // namespace orvanta
