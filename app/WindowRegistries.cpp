#include "app/WindowRegistries.h"

#include "phone/TvkMiniKontakt.h"

namespace orvanta {

namespace {

constexpr const char* kTag = "tag";               // slot in the window's registry
constexpr const char* kRecordSlot = "recordSlot"; // slot of the edit window's contact record
constexpr const char* kLogKey = "logKey";

} // namespace

WindowRegistries::WindowRegistries() = default;

WindowRegistries::~WindowRegistries()
{
    clear();
}

int WindowRegistries::logDetailSlotOf(int logKey) const
{
    for (int i = 0; i < m_logDetailWindows.size(); ++i)
        if (const QWidget* w = m_logDetailWindows.at(i); w && w->property(kLogKey).toInt() == logKey)
            return i;
    return -1;
}

int WindowRegistries::addLogDetail(QWidget* window, int logKey)
{
    window->setProperty(kTag, m_logDetailWindows.nextSlot());
    window->setProperty(kLogKey, logKey);
    return m_logDetailWindows.take(window);
}

int WindowRegistries::recordSlotOf(int contactKey) const
{
    for (int i = 0; i < m_contactRecords.size(); ++i)
        if (const TvkMiniKontakt* r = m_contactRecords.at(i); r && r->LID() == contactKey)
            return i;
    return -1;
}

QWidget* WindowRegistries::editWindowOfRecord(int recordSlot) const
{
    for (int i = 0; i < m_editWindows.size(); ++i)
        if (QWidget* w = m_editWindows.at(i); w && w->property(kRecordSlot).toInt() == recordSlot)
            return w;
    return nullptr;
}

int WindowRegistries::addRecord(std::unique_ptr<TvkMiniKontakt> record)
{
    return m_contactRecords.take(std::move(record));
}

void WindowRegistries::freeRecord(int recordSlot)
{
    m_contactRecords.free(recordSlot);
}

int WindowRegistries::addEditWindow(QWidget* window, int recordSlot)
{
    window->setProperty(kTag, m_editWindows.nextSlot());
    window->setProperty(kRecordSlot, recordSlot);
    return m_editWindows.take(window);
}

void WindowRegistries::freeEditWindow(int editSlot)
{
    QWidget* w = m_editWindows.at(editSlot);
    if (!w)
        return;
    const QVariant recordSlot = w->property(kRecordSlot);
    if (recordSlot.isValid())
        m_contactRecords.free(recordSlot.toInt());
    m_editWindows.free(editSlot);
}

void WindowRegistries::clear()
{
    m_editWindows.clear();
    m_contactRecords.clear();
    m_logDetailWindows.clear();
}

} // namespace orvanta
