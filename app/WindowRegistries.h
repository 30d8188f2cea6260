#pragma once
// The main window's registries of open windows and records: contact edit windows, the contact
// records they edit, and log detail windows. Each window carries its slot ("tag") and what it
// shows ("recordSlot", "logKey") as properties, because slots travel in window messages.

#include "app/SlotRegistry.h"

#include <memory>

class QWidget;

namespace orvanta {

class TvkMiniKontakt;

class WindowRegistries final {
public:
    WindowRegistries();
    ~WindowRegistries();
    WindowRegistries(const WindowRegistries&) = delete;
    WindowRegistries& operator=(const WindowRegistries&) = delete;

    [[nodiscard]] WindowSlots& editWindows() { return m_editWindows; }
    [[nodiscard]] ObjectSlots<TvkMiniKontakt>& contactRecords() { return m_contactRecords; }
    [[nodiscard]] WindowSlots& logDetailWindows() { return m_logDetailWindows; }

    // Log detail windows, at most one per call.
    [[nodiscard]] int logDetailSlotOf(int logKey) const; // -1: no window shows the call
    [[nodiscard]] int nextLogDetailSlot() const { return m_logDetailWindows.nextSlot(); }
    int addLogDetail(QWidget* window, int logKey);
    void freeLogDetail(int slot) { m_logDetailWindows.free(slot); }
    [[nodiscard]] bool allLogDetailsFree() const { return m_logDetailWindows.allFree(); }

    // Contact records and the edit windows that show them.
    [[nodiscard]] int recordSlotOf(int contactKey) const; // -1: no record of the contact
    [[nodiscard]] QWidget* editWindowOfRecord(int recordSlot) const;
    int addRecord(std::unique_ptr<TvkMiniKontakt> record);
    void freeRecord(int recordSlot);
    [[nodiscard]] int nextEditSlot() const { return m_editWindows.nextSlot(); }
    int addEditWindow(QWidget* window, int recordSlot);
    // Frees the edit window and the record it shows.
    void freeEditWindow(int editSlot);

    // Frees every window and record: edit windows first, then their records, then the details.
    void clear();

private:
    WindowSlots m_editWindows;
    ObjectSlots<TvkMiniKontakt> m_contactRecords;
    WindowSlots m_logDetailWindows;
};

} // namespace orvanta
