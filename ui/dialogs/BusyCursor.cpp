#include "ui/dialogs/BusyCursor.h"

#include "platform/BusyReset.h"

#include <QCursor>
#include <QGuiApplication>

namespace orvanta {
namespace {

// Bumped by resetCursor(): a BusyCursor made before a reset must not pop a later one's cursor.
unsigned g_generation = 0;

bool haveGui()
{
    return qobject_cast<QGuiApplication*>(QCoreApplication::instance()) != nullptr;
}

} // namespace

BusyCursor::BusyCursor()
    : m_generation(g_generation)
{
    setHourglass();
}

BusyCursor::~BusyCursor()
{
    if (m_generation == g_generation && haveGui() && QGuiApplication::overrideCursor() != nullptr)
        QGuiApplication::restoreOverrideCursor();
}

void BusyCursor::setHourglass()
{
    // The first hourglass tells the error log how to end it.
    setBusyResetHandler(&BusyCursor::resetCursor);
    if (haveGui())
        QGuiApplication::setOverrideCursor(QCursor(Qt::WaitCursor));
}

void BusyCursor::resetCursor()
{
    ++g_generation;
    if (!haveGui())
        return;
    while (QGuiApplication::overrideCursor() != nullptr)
        QGuiApplication::restoreOverrideCursor();
}

bool BusyCursor::isBusy()
{
    return haveGui() && QGuiApplication::overrideCursor() != nullptr
        && QGuiApplication::overrideCursor()->shape() == Qt::WaitCursor;
}

} // namespace orvanta
