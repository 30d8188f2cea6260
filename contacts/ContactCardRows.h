#pragma once
// The address cards of the contact list: which fields are card rows, in which order, with which
// caption, which are shown, which the user may not move, and the two rows computed from hidden
// ones ("Name" from surname and first name, "PLZ / Ort" from post code and town). The contact
// list builds its card view from this table alone.

#include <QString>

#include <span>

namespace orvanta {

struct ContactCardRow {
    const char* name;    // object name, also the layout file's key
    const char* field;   // source field; null for a computed row
    const char* caption;
    int tag;             // the "Ansicht" item that shows or hides it (0: none)
    bool visible;
    bool movable;
    bool captionRow;     // the card's title: sorted ascending, caption text not shown
};

// Every row of a card, in display order.
[[nodiscard]] std::span<const ContactCardRow> contactCardRows();

// Card width in pixels.
inline constexpr int kContactCardWidth = 300;

// "Name": surname, then one blank and the first name when there is one (no blank without a
// surname); "PLZ / Ort": post code, then two blanks and the town when there is one (no blanks
// without a post code). Null counts as empty.
[[nodiscard]] QString contactCardName(const QString& surname, const QString& firstName);
[[nodiscard]] QString contactCardPlace(const QString& postCode, const QString& town);

} // namespace orvanta
