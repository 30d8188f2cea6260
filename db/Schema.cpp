#include "db/Schema.h"

namespace orvanta {

QString schemaScript()
{
    // Generated from db/schema.sql at configure time (db/CMakeLists.txt).
    static const char text[] =
#include "db/SchemaText.inc"
        ;
    return QString::fromUtf8(text, qsizetype(sizeof text) - 1);
}

} // namespace orvanta
