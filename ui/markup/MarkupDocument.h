#pragma once
// The small mark-up of the detail notices and the contact summary, turned into a QTextDocument:
//   <BR>                 line break (a new block)
//   <B> <U> <I>          bold, underline, italic, with their closing tags
//   <IND x="n">          continue the line at pixel position n (a tab stop of the block)
//   <A href="...">       an anchor; the href is kept exactly as written
//   <FONT color="...">   text colour: Delphi names (clRed, clNavy, clWindowText ...),
//                        "#RRGGBB", "$BBGGRR" or a CSS name
//   <IMG src="idx:n" align="middle">  image n of the panel's image list
//   &quot; &amp; &lt; &gt; &nbsp; &#n;
// Unknown tags are dropped; a "<" or "&" that starts no tag or entity is shown as written.
// Raw line breaks in the text are ignored: only <BR> breaks a line.

#include <QColor>
#include <QList>
#include <QPixmap>
#include <QString>

class QPalette;
class QTextDocument;

namespace orvanta {

void buildMarkupDocument(QTextDocument& document, QStringView markup, const QList<QPixmap>& images,
                         const QPalette& palette);

// Colour of a FONT tag's value; invalid for a name nobody knows.
[[nodiscard]] QColor markupColor(QStringView name, const QPalette& palette);

} // namespace orvanta
