#pragma once
// Internals shared by the Firebird layer's classes (attachment, transaction, statement).

#include "db/FbApi_p.h"
#include "db/FbAttachment.h"
#include "db/FbStatement.h"
#include "db/FbTransaction.h"

#include <vector>

namespace orvanta {

struct FbAttachment::Private {
    QString databaseName;
    QStringList params;
    Firebird::IAttachment* handle = nullptr;
    std::vector<FbTransaction*> transactions;
    std::vector<FbStatement*> statements;
    std::function<void()> beforeDisconnect;

    // Releases every statement handle and ends active transactions; used before detaching.
    void releaseDependents();
    [[nodiscard]] Firebird::IAttachment* require() const;
};

struct FbTransaction::Private {
    FbAttachment* attachment = nullptr;
    QString name;
    QStringList params;
    EndAction endAction = EndAction::Commit;
    Firebird::ITransaction* handle = nullptr;

    [[nodiscard]] QByteArray buildTpb() const;
    // Closes the open cursors of statements that run in this transaction.
    void closeCursors();
};

} // namespace orvanta

namespace orvanta {
// Frees the statement's handles without touching the server state (the connection is closing).
void releaseStatementHandle(FbStatement& statement) noexcept;
// Forgets the attachment that is being destroyed under the object.
void detachTransaction(FbTransaction& transaction) noexcept;
void detachStatement(FbStatement& statement) noexcept;
} // namespace orvanta
