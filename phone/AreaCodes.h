#pragma once
// The three countries' area-code tables, loaded once at start-up from the program folder, and the
// lookups that split a dialled number into area code, local number and region.
//
// The caller strips an international prefix ("0049", "0043", "0041") before the lookup of that
// country.

#include "phone/AreaCodeTable.h"

#include <QString>
#include <QStringView>

namespace orvanta {

// The tables the lookups below read. Germany tries prefixes of 2..5 digits, Austria 1..4,
// Switzerland 1..2.
[[nodiscard]] AreaCodeTable& germanAreaCodes();
[[nodiscard]] AreaCodeTable& austrianAreaCodes();
[[nodiscard]] AreaCodeTable& swissAreaCodes();

// Replace a table with the file "AreaCodes_DE" / "AreaCodes_A" / "AreaCodes_CH" of the program
// folder (or of the given folder). A missing file leaves the table empty and is only written to
// the error log; an unreadable file is also shown.
void LoadGermanAereaCodes();
void LoadAustriaAereaCodes();
void LoadSwissAereaCodes();
void LoadGermanAereaCodes(const QString& folder);
void LoadAustriaAereaCodes(const QString& folder);
void LoadSwissAereaCodes(const QString& folder);

// See AreaCodeTable::lookup: false when the country's table is empty (or the lookup failed).
bool GetGermanAereaCodes(QStringView number, QString& prefix, QString& rest, QString& region);
bool GetAustriaAereaCodes(QStringView number, QString& prefix, QString& rest, QString& region);
bool GetSwissAereaCodes(QStringView number, QString& prefix, QString& rest, QString& region);

} // namespace orvanta
