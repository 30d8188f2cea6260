#include "platform/Clock.h"

#include <QMutex>

namespace orvanta::Clock {
namespace {

QMutex& guard()
{
    static QMutex mutex;
    return mutex;
}

QDateTime& fixedMoment()
{
    static QDateTime moment;
    return moment;
}

} // namespace

QDateTime now()
{
    {
        QMutexLocker lock(&guard());
        if (fixedMoment().isValid())
            return fixedMoment();
    }
    return QDateTime::currentDateTime();
}

QDate today()
{
    return now().date();
}

void setFixed(const QDateTime& moment)
{
    QMutexLocker lock(&guard());
    fixedMoment() = moment.toLocalTime();
}

void reset()
{
    QMutexLocker lock(&guard());
    fixedMoment() = QDateTime();
}

bool isFixed()
{
    QMutexLocker lock(&guard());
    return fixedMoment().isValid();
}

} // namespace orvanta::Clock
