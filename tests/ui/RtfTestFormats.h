#pragma once
// What a reader of the document sees at one character: the format with the document's defaults
// filled in. The rich-text tests compare documents through this.

#include <QColor>
#include <QDebug>
#include <QTextBlock>
#include <QTextCursor>
#include <QTextDocument>
#include <QTextList>

namespace orvanta::test {

struct SeenFormat {
    QString family;
    qreal points = 0;
    bool bold = false;
    bool italic = false;
    bool underline = false;
    bool strike = false;
    QColor color; // invalid: automatic

    bool operator==(const SeenFormat&) const = default;
};

inline QDebug operator<<(QDebug d, const SeenFormat& f)
{
    d.nospace() << f.family << ' ' << f.points << "pt" << (f.bold ? " b" : "") << (f.italic ? " i" : "")
                << (f.underline ? " ul" : "") << (f.strike ? " strike" : "") << ' ' << f.color;
    return d;
}

inline SeenFormat seenFormat(const QTextDocument& doc, const QTextCharFormat& fmt)
{
    const QFont font = fmt.font().resolve(doc.defaultFont());
    SeenFormat seen;
    seen.family = font.families().value(0, font.family());
    seen.points = font.pointSizeF();
    seen.bold = font.bold();
    seen.italic = font.italic();
    seen.underline = font.underline();
    seen.strike = font.strikeOut();
    if (fmt.hasProperty(QTextFormat::ForegroundBrush) && fmt.foreground().style() != Qt::NoBrush)
        seen.color = fmt.foreground().color();
    return seen;
}

// The format of the character at position pos.
inline SeenFormat seenAt(const QTextDocument& doc, int pos)
{
    QTextCursor cursor(const_cast<QTextDocument*>(&doc));
    cursor.setPosition(pos + 1);
    return seenFormat(doc, cursor.charFormat());
}

// The format of the first occurrence of text.
inline SeenFormat seenAt(const QTextDocument& doc, const QString& text)
{
    const QTextCursor found = doc.find(text);
    if (found.isNull()) {
        SeenFormat missing;
        missing.family = QStringLiteral("<%1 not found>").arg(text);
        return missing;
    }
    return seenAt(doc, found.selectionStart());
}

inline Qt::Alignment alignmentOf(const QTextBlock& block)
{
    const Qt::Alignment a = block.blockFormat().alignment() & Qt::AlignHorizontal_Mask;
    if (a & Qt::AlignHCenter)
        return Qt::AlignHCenter;
    if (a & Qt::AlignJustify)
        return Qt::AlignJustify;
    if (a & (Qt::AlignRight | Qt::AlignTrailing))
        return Qt::AlignRight;
    return Qt::AlignLeft;
}

inline int listStyleOf(const QTextBlock& block)
{
    return block.textList() ? int(block.textList()->format().style()) : 0;
}

inline QStringList blockTexts(const QTextDocument& doc)
{
    QStringList texts;
    for (QTextBlock b = doc.begin(); b.isValid(); b = b.next())
        texts << b.text();
    return texts;
}

} // namespace orvanta::test
