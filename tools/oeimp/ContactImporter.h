#pragma once
// Reading an import file into the contacts it will create, and storing them one by one through
// the contact persistence of the edit window: each contact in its own transaction, so a contact
// is stored whole or not at all, and one that is already there is left alone.

#include "phone/ContactCards.h"

#include <QString>
#include <QStringList>

namespace orvanta {
class TDM2;
}

namespace orvanta::oeimp {

struct ImportPlan {
    QList<CardImport> contacts;
    // What the reader passed over or repaired, in German, by line.
    QStringList messages;
    int skipped = 0; // entries of the file that are no contact
    // Set when the file cannot be read at all; then nothing else is.
    QString error;
};

// A ".csv" file is read as an address-book export, anything else as vCards. homeCountry: the
// country of national numbers (1 Germany, 2 Austria, 3 Switzerland).
[[nodiscard]] ImportPlan readImportFile(const QString& path, int homeCountry);

enum class ImportOutcome { Imported, Skipped, Failed };

class ContactImporter final {
public:
    explicit ContactImporter(TDM2& dm) : m_dm(dm) {}

    // Already present: a contact with the same designation (any case) that has one of the
    // numbers; without numbers, the same designation alone. A category the database does not
    // know yet is created first, so that the contact can be put into it.
    [[nodiscard]] ImportOutcome importContact(const TvkMiniKontakt& contact);

    // Whether such a contact is already stored (a failed search counts as a find).
    [[nodiscard]] bool isPresent(const TvkMiniKontakt& contact);

private:
    enum class Presence { Absent, Present, Unknown };
    Presence presence(const TvkMiniKontakt& contact);
    bool ensureCategory(const QString& name);

    TDM2& m_dm;
    QStringList m_knownCategories;
};

} // namespace orvanta::oeimp
