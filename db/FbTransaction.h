#pragma once
// A transaction on one attachment, started with a parameter block built from words:
// "concurrency", "consistency", "read_committed", "rec_version", "no_rec_version", "wait",
// "nowait", "read", "write", "lock_timeout=N". No words: the server's default
// (concurrency, wait, write).

#include <QString>
#include <QStringList>

#include <memory>

namespace orvanta {

class FbAttachment;

class FbTransaction final {
public:
    // What happens to a transaction still active when its connection closes.
    enum class EndAction { Commit, Rollback, None };

    explicit FbTransaction(FbAttachment& attachment, QStringList params = {}, EndAction endAction = EndAction::Commit,
                           QString name = {});
    ~FbTransaction(); // rolls back if still active
    FbTransaction(const FbTransaction&) = delete;
    FbTransaction& operator=(const FbTransaction&) = delete;

    [[nodiscard]] const QString& name() const;
    [[nodiscard]] const QStringList& params() const;
    void setParams(QStringList params); // takes effect at the next start
    [[nodiscard]] EndAction endAction() const;
    [[nodiscard]] FbAttachment* attachment() const;

    // Each throws DatabaseError; commit and rollback of an inactive transaction are errors.
    void start();
    void commit();
    void rollback();
    void commitRetaining();
    [[nodiscard]] bool isActive() const;

    // Rolls back when active, swallowing errors: for cleanup paths that must not throw.
    void rollbackQuietly() noexcept;

    struct Private;
    [[nodiscard]] Private* d_func() const { return d.get(); }

private:
    std::unique_ptr<Private> d;
};

} // namespace orvanta
