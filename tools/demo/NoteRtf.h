#pragma once
// Plain paragraphs as a small RTF document, the form contact notes are stored in.

#include <QString>
#include <QStringList>

namespace orvanta::demo {

// Characters outside 7-bit ASCII become \'hh escapes of their Windows-1252 code (or '?').
[[nodiscard]] QString noteRtf(const QStringList& paragraphs);

} // namespace orvanta::demo
