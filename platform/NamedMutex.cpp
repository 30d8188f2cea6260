#include "platform/NamedMutex.h"

#include "platform/RuntimeFolder.h"

#include <QCryptographicHash>
#include <QFileInfo>

#include <cerrno>
#include <fcntl.h>
#include <sys/file.h>
#include <unistd.h>

namespace orvanta {
namespace {

// Opens (creating) the lock file; -1 on failure. Close-on-exec, so programs we start do not
// inherit the lock and keep it after we end.
int openLockFile(const QString& name)
{
    const QByteArray path = QFile::encodeName(NamedMutex::lockFilePath(name));
    int fd = -1;
    do {
        fd = ::open(path.constData(), O_RDWR | O_CREAT | O_CLOEXEC, 0600);
    } while (fd < 0 && errno == EINTR);
    return fd;
}

bool tryLock(int fd)
{
    int rc = -1;
    do {
        rc = ::flock(fd, LOCK_EX | LOCK_NB);
    } while (rc != 0 && errno == EINTR);
    return rc == 0;
}

} // namespace

NamedMutex::NamedMutex(const QString& name)
{
    const int fd = openLockFile(name);
    if (fd < 0) {
        // A lock file we may not open belongs to someone else's holder.
        m_alreadyExists = true;
        return;
    }
    if (tryLock(fd)) {
        m_fd = fd;
    } else {
        ::close(fd);
        m_alreadyExists = true;
    }
}

NamedMutex::~NamedMutex()
{
    release();
}

void NamedMutex::release()
{
    if (m_fd < 0)
        return;
    ::flock(m_fd, LOCK_UN);
    ::close(m_fd);
    m_fd = -1;
}

bool NamedMutex::isHeld(const QString& name)
{
    if (!QFileInfo::exists(lockFilePath(name)))
        return false;
    const int fd = openLockFile(name);
    if (fd < 0)
        return true;
    const bool free = tryLock(fd);
    // Closing drops the probe's lock at once.
    ::close(fd);
    return !free;
}

QString NamedMutex::lockFilePath(const QString& name)
{
    QString safe;
    for (const QChar c : name)
        safe += (c.isLetterOrNumber() && c.unicode() < 0x80) || c == u'-' || c == u'.' ? c : QChar(u'_');
    // Names that differ only in replaced characters still get files of their own.
    const QByteArray digest = QCryptographicHash::hash(name.toUtf8(), QCryptographicHash::Sha1).toHex().left(8);
    const QString fileName = safe.left(64) + u'-' + QString::fromLatin1(digest) + QStringLiteral(".lock");

    // The mutex is per user as on Windows.
    return userRuntimeFolder() + QStringLiteral("/orvanta-") + fileName;
}

} // namespace orvanta
