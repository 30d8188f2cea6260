#pragma once
// A fresh embedded database in a temporary folder, for one test:
//
//   TempDatabase db;                 // tables, views and procedures of db/schema.sql
//   FbAttachment& a = db.attachment();
//   db.exec("INSERT INTO KAT (LID, KATBEZ) VALUES (1, 'Familie')");
//
// The schema is built once per test process into a template file and copied for each database,
// so a test pays for a file copy, not for the DDL.

#include "db/FbAttachment.h"

#include <QString>
#include <QTemporaryDir>

#include <memory>

namespace orvanta::test {

class TempDatabase final {
public:
    enum class Schema { Full, Empty };

    static constexpr const char* User = "SYSDBA";
    static constexpr const char* Password = "masterkey";

    // Throws DatabaseError when the database cannot be made (the test then fails with its message).
    explicit TempDatabase(Schema schema = Schema::Full);
    ~TempDatabase();
    TempDatabase(const TempDatabase&) = delete;
    TempDatabase& operator=(const TempDatabase&) = delete;

    [[nodiscard]] QString path() const;      // the database file
    [[nodiscard]] QString directory() const; // its temporary folder (for other files of the test)

    // The test's connection (SYSDBA, ISO8859_1), connected on first use.
    [[nodiscard]] FbAttachment& attachment();
    // A further, independent connection to the same file.
    [[nodiscard]] std::unique_ptr<FbAttachment> newAttachment() const;

    // Runs a script (one or more statements, committed) on the test's connection.
    void exec(const QString& script);
    // The first column of the first row of a query, or a null QVariant.
    [[nodiscard]] QVariant scalar(const QString& sql);

    [[nodiscard]] static QString schemaPath();
    // A database file with that schema at `path` (for a server to open); throws DatabaseError.
    static void copySchemaTo(const QString& path, Schema schema = Schema::Full);

private:
    QTemporaryDir m_dir;
    QString m_path;
    std::unique_ptr<FbAttachment> m_attachment;
};

} // namespace orvanta::test
