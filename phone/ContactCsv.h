#pragma once
// Address-book exports as CSV (Outlook in German or English, Thunderbird, Google and plain
// "Vorname;Nachname;Telefon" lists): the header row names the columns, which are matched by name.
// Separator (comma, semicolon or tab) and encoding (UTF-8 or Windows-1252) are recognised; quoted
// fields may hold separators, quotes and line breaks.

#include "phone/VCard.h"

#include <QByteArrayView>

namespace orvanta {

// The rows as cards. Like the vCard reader it never fails: rows without content, rows with more
// or fewer fields than the header and columns nobody knows are listed in German in the messages.
[[nodiscard]] VCardReadResult readContactCsv(QByteArrayView contents);

} // namespace orvanta
