#include "db/DatabaseError.h"

namespace orvanta {

DatabaseError::DatabaseError(QString message, QList<qint64> codes, int sqlCode, QString statement)
    : AppException(std::move(message))
    , m_codes(std::move(codes))
    , m_sqlCode(sqlCode)
    , m_statement(std::move(statement))
{
}

} // namespace orvanta
