#include "phone/PhoneErrors.h"

#include <QDebug>

namespace orvanta {

void phoneLogError(const QString& message, const AppException* exception)
{
    qWarning().noquote() << message << (exception ? exception->message() : QString());
}

void phoneShowError(const QString& message, const AppException* exception)
{
    qWarning().noquote() << message << (exception ? exception->message() : QString());
}

} // namespace orvanta
