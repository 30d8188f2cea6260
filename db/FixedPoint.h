#pragma once

#include <QtGlobal>

// Arithmetic on Firebird's scaled integers (NUMERIC/DECIMAL), shared by the statement layer and
// the cached record store so both round the same way.
namespace orvanta::fixedpoint {

// 10^n for the small non-negative n a column scale gives.
inline qint64 pow10(int n)
{
    qint64 r = 1;
    for (int i = 0; i < n; ++i)
        r *= 10;
    return r;
}

// Rescales a fixed-point value from 'from' to 'to' decimal places, rounding half away from zero.
inline qint64 rescale(qint64 v, int from, int to)
{
    if (from == to)
        return v;
    if (to > from)
        return v * pow10(to - from);
    const qint64 div = pow10(from - to);
    const qint64 q = v / div;
    const qint64 r = v % div;
    if (2 * (r < 0 ? -r : r) >= div)
        return q + (v < 0 ? -1 : 1);
    return q;
}

} // namespace orvanta::fixedpoint
