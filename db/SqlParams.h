#pragma once
// Named parameters: ":NAME" markers become the client's positional "?" markers. String literals,
// quoted identifiers and comments are copied unchanged, so a colon there is not a parameter.

#include <QString>
#include <QStringList>

namespace orvanta {

struct ParsedSql {
    QString sql;       // text with "?" in place of each marker
    QStringList names; // one upper-case name per "?", in order; "" for a plain "?" in the input
};

[[nodiscard]] ParsedSql parseNamedParameters(QStringView sql);

} // namespace orvanta
