#pragma once
// A named mutex shared between processes of the same user: a lock file in $XDG_RUNTIME_DIR
// (else /tmp) held with flock. The kernel drops the lock when the holder ends, however it ends,
// so a crashed instance never blocks the next start.

#include <QString>

namespace orvanta {

class NamedMutex final {
public:
    // Takes the mutex when no other holder has it (like creating a mutex initially owned).
    explicit NamedMutex(const QString& name);
    ~NamedMutex(); // releases it
    NamedMutex(const NamedMutex&) = delete;
    NamedMutex& operator=(const NamedMutex&) = delete;

    // Another holder had it, so this object does not own it.
    [[nodiscard]] bool alreadyExists() const { return m_alreadyExists; }
    [[nodiscard]] bool isOwned() const { return m_fd >= 0; }
    void release();

    // Whether some holder owns the mutex now, without taking it (like opening an existing mutex).
    [[nodiscard]] static bool isHeld(const QString& name);
    // The lock file; the name is made file-safe ("Varnik Orvanta" -> "Varnik_Orvanta").
    [[nodiscard]] static QString lockFilePath(const QString& name);

private:
    int m_fd = -1;
    bool m_alreadyExists = false;
};

} // namespace orvanta
