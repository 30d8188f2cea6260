#pragma once
// Description of one result column or parameter, in Qt terms.

#include <QString>

namespace orvanta {

enum class FbType : quint8 {
    SmallInt,  // 16-bit integer
    Integer,   // 32-bit integer
    BigInt,    // 64-bit integer
    Numeric,   // fixed point: integer storage with a negative scale (NUMERIC(p,s), DECIMAL)
    Float,
    Double,
    Char,      // fixed width text, read with its padding removed
    Varchar,
    Date,
    Time,
    Timestamp,
    TextBlob,  // blob of sub-type text, read whole as text
    Blob,      // binary blob, read whole as bytes
    Boolean,
};

struct FbColumn {
    QString name;      // the column's alias as the statement names it (upper case unless quoted)
    QString field;     // the underlying column name
    QString relation;  // table or view, empty for expressions
    FbType type = FbType::Integer;
    int width = 0;     // declared width in characters for text, bytes otherwise
    int scale = 0;     // decimal places (2 for NUMERIC(15,2)); 0 for non-numeric types
    bool nullable = true;
};

[[nodiscard]] inline bool isTextType(FbType t)
{
    return t == FbType::Char || t == FbType::Varchar || t == FbType::TextBlob;
}

} // namespace orvanta
