#pragma once
// Text order of the grids: the ANSI (Windows-1252 / ISO 8859-1) order of the Windows word sort,
// case-insensitive. Letters with accents sort with their base letter ("Ärger" between "Apfel"
// and "Arzt"), "ß" as "ss", hyphen and apostrophe are ignored at first; accents then decide,
// and case never does. Two texts compare equal only when they differ in case alone, so
// grouping by such a column puts "Meier" and "MEIER" into one group.

#include <QByteArrayView>

namespace orvanta::gridcollation {

// < 0, 0 or > 0 like strcmp.
[[nodiscard]] int compare(QByteArrayView a, QByteArrayView b);
[[nodiscard]] inline bool less(QByteArrayView a, QByteArrayView b) { return compare(a, b) < 0; }

// A byte string whose plain byte order (memcmp, shorter first) is the order of compare():
// equal keys exactly when compare() gives 0. Sorting many texts by key is much faster than
// sorting them with compare().
[[nodiscard]] QByteArray sortKey(QByteArrayView text);
void appendSortKey(QByteArrayView text, QByteArray& out);

// Latin-1 lower case of one byte.
[[nodiscard]] unsigned char foldCase(unsigned char c);

// The folding of a case-insensitive search: every byte in lower case (foldCase), and the
// characters this order spells as two letters (ß as "ss", æ as "ae", þ as "th") as those
// letters. Accents stay: "ü" is not "u", as two texts differing in an accent never compare equal.
// Writes one or two bytes and returns how many.
int searchFold(unsigned char c, char out[2]);
void appendSearchFold(QByteArrayView text, QByteArray& out);

// SQL LIKE: '%' any run, '_' one character. Case-sensitive unless asked otherwise.
[[nodiscard]] bool like(QByteArrayView text, QByteArrayView pattern, bool caseSensitive = true);

} // namespace orvanta::gridcollation
