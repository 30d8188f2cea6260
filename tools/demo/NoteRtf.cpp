#include "tools/demo/NoteRtf.h"

namespace orvanta::demo {

QString noteRtf(const QStringList& paragraphs)
{
    QString rtf = QStringLiteral("{\\rtf1\\ansi\\ansicpg1252\\deff0{\\fonttbl{\\f0\\fswiss\\fcharset0 Arial;}}\r\n"
                                 "\\viewkind4\\uc1\\pard\\f0\\fs20 ");
    bool first = true;
    for (const QString& p : paragraphs) {
        if (!first)
            rtf += QStringLiteral("\\par\r\n");
        first = false;
        for (const QChar c : p) {
            const char16_t u = c.unicode();
            if (u == u'\\' || u == u'{' || u == u'}') {
                rtf += u'\\';
                rtf += c;
            } else if (u >= 0x20 && u < 0x80) {
                rtf += c;
            } else if (u >= 0xA0 && u <= 0xFF) {
                // Latin-1 and Windows-1252 agree in this range.
                rtf += QStringLiteral("\\'%1").arg(int(u), 2, 16, QLatin1Char('0'));
            } else if (u == 0x20AC) {
                rtf += QStringLiteral("\\'80");
            } else {
                rtf += u'?';
            }
        }
    }
    rtf += QStringLiteral("\\par\r\n}\r\n");
    return rtf;
}

} // namespace orvanta::demo
