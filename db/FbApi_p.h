#pragma once
// The one place that includes the Firebird client's object API. Everything outside db/Fb*.cpp
// speaks Qt; these helpers turn client status into DatabaseError and database text into QString.

#include "db/DatabaseError.h"
#include "db/DbText.h"

#include <firebird/Interface.h>

#include <QByteArray>
#include <QString>

namespace orvanta::fbapi {

Firebird::IMaster* master();
Firebird::IUtil* util();

// A status wrapper that throws FbException; wrap calls in guard() to convert it.
class Status final {
public:
    Status();
    ~Status();
    Status(const Status&) = delete;
    Status& operator=(const Status&) = delete;
    Firebird::ThrowStatusWrapper* operator&() { return &m_wrapper; }
    Firebird::ThrowStatusWrapper* get() { return &m_wrapper; }

private:
    Firebird::IStatus* m_status;
    Firebird::ThrowStatusWrapper m_wrapper;
};

// Builds the DatabaseError for a failed client call; context names what was attempted.
[[nodiscard]] DatabaseError toError(const Firebird::FbException& e, const QString& context = {});

// Runs f, turning a client exception into a DatabaseError.
template <typename F>
auto guard(F&& f, const QString& context = {}) -> decltype(f())
{
    try {
        return f();
    } catch (const Firebird::FbException& e) {
        throw toError(e, context);
    }
}

// The same, running onFailure first when f throws anything: for releasing the handles f had
// acquired before the failure. onFailure must not throw.
template <typename F, typename Cleanup>
auto guard(F&& f, const QString& context, Cleanup&& onFailure) -> decltype(f())
{
    try {
        return f();
    } catch (const Firebird::FbException& e) {
        onFailure();
        throw toError(e, context);
    } catch (...) {
        onFailure();
        throw;
    }
}

[[nodiscard]] inline QString decodeText(const char* data, qsizetype size) { return decodeDbText(data, size); }
[[nodiscard]] inline QByteArray encodeText(QStringView text) { return encodeDbText(text); }

// Dates: days since 17 Nov 1858; times: 1/10000 s since midnight.
[[nodiscard]] inline qint64 julianDayFromIsc(ISC_DATE d) { return qint64(d) + 2400001; }
[[nodiscard]] inline ISC_DATE iscFromJulianDay(qint64 jd) { return ISC_DATE(jd - 2400001); }

} // namespace orvanta::fbapi
