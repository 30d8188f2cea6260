#pragma once
// The main window's registries of open windows and records. Slot numbers travel in window
// messages, so a slot keeps its number while occupied: a new entry takes the first empty slot,
// and only when there is none does the registry grow by one.

#include <QPointer>
#include <QWidget>

#include <memory>
#include <vector>

namespace orvanta {

// Owns plain objects (contact records).
template <class T>
class ObjectSlots final {
public:
    // The first empty slot, or -1.
    [[nodiscard]] int firstFree() const
    {
        for (std::size_t i = 0; i < m_items.size(); ++i)
            if (!m_items[i])
                return static_cast<int>(i);
        return -1;
    }
    // Puts the object into the first empty slot, growing by one when none is free.
    int take(std::unique_ptr<T> item)
    {
        int slot = firstFree();
        if (slot < 0) {
            m_items.emplace_back();
            slot = static_cast<int>(m_items.size()) - 1;
        }
        m_items[static_cast<std::size_t>(slot)] = std::move(item);
        return slot;
    }
    [[nodiscard]] T* at(int slot) const
    {
        return valid(slot) ? m_items[static_cast<std::size_t>(slot)].get() : nullptr;
    }
    void free(int slot)
    {
        if (valid(slot))
            m_items[static_cast<std::size_t>(slot)].reset();
    }
    void clear() { m_items.clear(); }
    [[nodiscard]] int size() const { return static_cast<int>(m_items.size()); }
    [[nodiscard]] bool isEmpty() const { return m_items.empty(); }
    [[nodiscard]] bool allFree() const { return firstUsed() < 0; }
    [[nodiscard]] int firstUsed() const
    {
        for (std::size_t i = 0; i < m_items.size(); ++i)
            if (m_items[i])
                return static_cast<int>(i);
        return -1;
    }

private:
    [[nodiscard]] bool valid(int slot) const { return slot >= 0 && slot < size(); }
    std::vector<std::unique_ptr<T>> m_items;
};

// Owns top-level windows. A window destroyed behind the registry's back leaves its slot empty.
class WindowSlots final {
public:
    WindowSlots() = default;
    WindowSlots(const WindowSlots&) = delete;
    WindowSlots& operator=(const WindowSlots&) = delete;
    ~WindowSlots() { clear(); }

    [[nodiscard]] int firstFree() const
    {
        for (std::size_t i = 0; i < m_items.size(); ++i)
            if (m_items[i].isNull())
                return static_cast<int>(i);
        return -1;
    }
    // The slot the next take() fills: the first empty one, else a new one at the end.
    [[nodiscard]] int nextSlot() const
    {
        const int free = firstFree();
        return free >= 0 ? free : size();
    }
    int take(QWidget* window)
    {
        int slot = firstFree();
        if (slot < 0) {
            m_items.emplace_back();
            slot = static_cast<int>(m_items.size()) - 1;
        }
        m_items[static_cast<std::size_t>(slot)] = window;
        return slot;
    }
    [[nodiscard]] QWidget* at(int slot) const
    {
        return valid(slot) ? m_items[static_cast<std::size_t>(slot)].data() : nullptr;
    }
    template <class W>
    [[nodiscard]] W* as(int slot) const
    {
        return qobject_cast<W*>(at(slot));
    }
    // Empties the slot and frees the window once control is back in the event loop, so a window
    // that reported its own closing is not destroyed under its caller.
    void free(int slot)
    {
        if (!valid(slot))
            return;
        QPointer<QWidget>& item = m_items[static_cast<std::size_t>(slot)];
        if (item) {
            item->hide();
            item->deleteLater();
        }
        item.clear();
    }
    void clear()
    {
        for (int i = 0; i < size(); ++i)
            free(i);
        m_items.clear();
    }
    [[nodiscard]] int size() const { return static_cast<int>(m_items.size()); }
    [[nodiscard]] bool allFree() const { return firstUsed() < 0; }
    [[nodiscard]] int firstUsed() const
    {
        for (std::size_t i = 0; i < m_items.size(); ++i)
            if (!m_items[i].isNull())
                return static_cast<int>(i);
        return -1;
    }

private:
    [[nodiscard]] bool valid(int slot) const { return slot >= 0 && slot < size(); }
    std::vector<QPointer<QWidget>> m_items;
};

} // namespace orvanta
