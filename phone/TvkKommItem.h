#pragma once
// One telephone entry (table COM) and one e-mail entry (table E_MAIL) of a contact record. The
// widths are those of the database columns; the contact record cuts to them when it stores an
// item.

#include <QList>
#include <QString>

#include <cstdint>

namespace orvanta {

// Passed as :STAT / :STATUS to the synchronising procedures when the contact is saved.
enum class EntryStatus : std::uint8_t {
    Unchanged = 0, // as loaded or as saved
    New = 1,
    Changed = 2,
    Deleted = 3, // stays in the list until saved
};

struct TvkKommItem {
    static constexpr int KOMMBEZWidth = 20;
    static constexpr int LCWidth = 5;
    static constexpr int VORWWidth = 10;
    static constexpr int NUMBERWidth = 15;
    static constexpr int NUMBEROFWidth = 15;
    static constexpr int VORWNUMBERWidth = 25;
    static constexpr int LCVORWNUMBERWidth = 29;
    static constexpr int BEMERKUNGWidth = 40;

    std::int32_t LID = 0; // key of the COM row, 0 for a new entry
    std::int32_t CID = 0; // owning contact
    QString KOMMBEZ;      // kind, e.g. "Telefon"
    QString LC;           // country code, e.g. "0049"
    QString VORW;         // area code as dialled, leading zero included
    QString NUMBER;       // local number
    // Derived digit forms for matching; filled by the contact record.
    QString NUMBEROF;
    QString VORWNUMBER;
    QString LCVORWNUMBER;
    QString BEMERKUNG;
    std::uint8_t AUTOREJECT = 0; // 1: the monitor rejects calls from this number
    EntryStatus status = EntryStatus::Unchanged;

    friend bool operator==(const TvkKommItem&, const TvkKommItem&) = default;
};

struct TvkMailItem {
    static constexpr int MAILADDRWidth = 40;
    static constexpr int BEMERKWidth = 40;

    std::int32_t LID = 0; // key of the E_MAIL row, 0 for a new entry
    std::int32_t CID = 0;
    QString MAILADDR;
    QString BEMERK;
    EntryStatus status = EntryStatus::Unchanged;

    friend bool operator==(const TvkMailItem&, const TvkMailItem&) = default;
};

using TvkKommArray = QList<TvkKommItem>;
using TvkMailArray = QList<TvkMailItem>;

} // namespace orvanta
