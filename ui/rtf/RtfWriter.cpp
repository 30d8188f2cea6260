#include "ui/rtf/RtfWriter.h"

#include <QTextBlock>
#include <QTextDocument>
#include <QTextList>

namespace orvanta {
namespace {

// What one run of text looks like, with everything the document leaves open resolved.
struct RunProps {
    int font = 0;
    int halfPoints = 24;
    int color = 0; // index into the colour table; 0 = automatic
    bool bold = false;
    bool italic = false;
    bool underline = false;
    bool strike = false;
};

class Writer {
public:
    explicit Writer(const QTextDocument& doc)
        : m_doc(doc)
    {
        fontIndex(familyOf(doc.defaultFont())); // \deff0
    }

    QByteArray run();

private:
    static QString familyOf(const QFont& font);
    int fontIndex(const QString& family);
    int colorIndex(const QColor& color);
    RunProps propsOf(const QTextCharFormat& fmt);

    void word(const char* w);
    void word(const char* w, int param);
    void raw(const QByteArray& text);
    void text(const QString& text);
    void switchTo(const RunProps& want);
    void listPrefix(const QTextBlock& block, QTextList* list);
    void appendEscaped(QByteArray& out, const QString& text, bool inFontTable) const;

    const QTextDocument& m_doc;
    QStringList m_fonts;
    QList<QColor> m_colors;
    int m_symbolFont = -1;
    QByteArray m_body;
    bool m_delimit = false; // the last control word still needs its delimiting space
    RunProps m_state; // what a reader has in effect now
};

QString Writer::familyOf(const QFont& font)
{
    QString family = font.families().value(0, font.family());
    family.remove(QLatin1Char(';')); // ends a font-table entry
    family = family.trimmed();
    return family.isEmpty() ? QStringLiteral("Arial") : family;
}

int Writer::fontIndex(const QString& family)
{
    qsizetype index = m_fonts.indexOf(family);
    if (index < 0) {
        index = m_fonts.size();
        m_fonts.append(family);
    }
    return int(index);
}

int Writer::colorIndex(const QColor& color)
{
    if (!color.isValid())
        return 0;
    const QColor rgb = color.toRgb();
    for (qsizetype i = 0; i < m_colors.size(); ++i) {
        if (m_colors[i].rgb() == rgb.rgb())
            return int(i) + 1;
    }
    m_colors.append(rgb);
    return int(m_colors.size());
}

RunProps Writer::propsOf(const QTextCharFormat& fmt)
{
    const QFont font = fmt.font().resolve(m_doc.defaultFont());
    RunProps p;
    p.font = fontIndex(familyOf(font));
    qreal points = font.pointSizeF();
    if (points <= 0)
        points = font.pixelSize() * 0.75; // 96 dpi, as the editors assume
    p.halfPoints = std::clamp(qRound(points * 2), 2, 3276);
    p.bold = font.bold();
    p.italic = font.italic();
    p.underline = font.underline();
    p.strike = font.strikeOut();
    if (fmt.hasProperty(QTextFormat::ForegroundBrush) && fmt.foreground().style() != Qt::NoBrush)
        p.color = colorIndex(fmt.foreground().color());
    return p;
}

void Writer::word(const char* w)
{
    m_body += '\\';
    m_body += w;
    m_delimit = true;
}

void Writer::word(const char* w, int param)
{
    word(w);
    m_body += QByteArray::number(param);
}

void Writer::raw(const QByteArray& text)
{
    if (m_delimit && !text.isEmpty() && text.front() != '\\' && text.front() != '{' && text.front() != '}')
        m_body += ' ';
    m_delimit = false;
    m_body += text;
}

void Writer::appendEscaped(QByteArray& out, const QString& text, bool inFontTable) const
{
    for (qsizetype i = 0; i < text.size(); ++i) {
        const char16_t c = text.at(i).unicode();
        if (c == '\\' || c == '{' || c == '}') {
            out += '\\';
            out += char(c);
        } else if (c >= 0x20 && c < 0x7F) {
            out += char(c);
        } else if (!inFontTable && c == '\t') {
            out += "\\tab ";
        } else if (!inFontTable && c == QChar::LineSeparator) {
            out += "\\line ";
        } else if (!inFontTable && c == 0x00A0) {
            out += "\\~";
        } else if (!inFontTable && c == 0x00AD) {
            out += "\\-";
        } else if (!inFontTable && c == 0x2011) {
            out += "\\_";
        } else if (c == QChar::ObjectReplacementCharacter || c == 0xFDD0 || c == 0xFDD1) {
            // images, other objects and frame bounds are not carried over
        } else if (c >= 0xA0 && c <= 0xFF) {
            // Windows-1252 and Latin-1 agree from 0xA0 on.
            out += "\\'";
            out += QByteArray::number(int(c), 16).rightJustified(2, '0');
        } else {
            // Control word parameters are signed 16-bit: code units above 32767 go negative.
            out += "\\u";
            out += QByteArray::number(c > 0x7FFF ? int(c) - 0x10000 : int(c));
            out += '?';
        }
    }
}

void Writer::text(const QString& text)
{
    QByteArray escaped;
    appendEscaped(escaped, text, false);
    raw(escaped);
}

void Writer::switchTo(const RunProps& want)
{
    if (want.font != m_state.font)
        word("f", want.font);
    if (want.halfPoints != m_state.halfPoints)
        word("fs", want.halfPoints);
    if (want.color != m_state.color)
        word("cf", want.color);
    if (want.bold != m_state.bold)
        word(want.bold ? "b" : "b0");
    if (want.italic != m_state.italic)
        word(want.italic ? "i" : "i0");
    if (want.underline != m_state.underline)
        word(want.underline ? "ul" : "ulnone");
    if (want.strike != m_state.strike)
        word(want.strike ? "strike" : "strike0");
    m_state = want;
}

void Writer::listPrefix(const QTextBlock& block, QTextList* list)
{
    // The list form WordPad and rich-edit controls write; readers without it still show the
    // \pntext marker.
    const QTextListFormat::Style style = list->format().style();
    const char* numbering = nullptr;
    switch (style) {
    case QTextListFormat::ListDecimal: numbering = "pndec"; break;
    case QTextListFormat::ListLowerAlpha: numbering = "pnlcltr"; break;
    case QTextListFormat::ListUpperAlpha: numbering = "pnucltr"; break;
    case QTextListFormat::ListLowerRoman: numbering = "pnlcrm"; break;
    case QTextListFormat::ListUpperRoman: numbering = "pnucrm"; break;
    default: break;
    }
    QByteArray group;
    if (!numbering) {
        if (m_symbolFont < 0)
            m_symbolFont = fontIndex(QStringLiteral("Symbol"));
        const QByteArray f = QByteArray::number(m_symbolFont);
        group = "{\\pntext\\f" + f + "\\'B7\\tab}{\\*\\pn\\pnlvlblt\\pnf" + f + "\\pnindent0{\\pntxtb\\'B7}}";
    } else {
        QByteArray marker;
        appendEscaped(marker, list->itemText(block), false);
        group = "{\\pntext\\f0 " + marker + "\\tab}{\\*\\pn\\pnlvlbody\\pnf0\\pnindent0\\pnstart1\\" + numbering
            + "{\\pntxta.}}";
    }
    raw(group);
    word("fi", -360);
    word("li", 720);
}

QByteArray Writer::run()
{
    for (QTextBlock block = m_doc.begin(); block.isValid(); block = block.next()) {
        word("pard");
        const Qt::Alignment align = block.blockFormat().alignment() & Qt::AlignHorizontal_Mask;
        if (align & Qt::AlignHCenter)
            word("qc");
        else if (align & Qt::AlignJustify)
            word("qj");
        else if (align & (Qt::AlignRight | Qt::AlignTrailing))
            word("qr");
        if (QTextList* list = block.textList())
            listPrefix(block, list);

        bool empty = true;
        for (auto it = block.begin(); !it.atEnd(); ++it) {
            const QTextFragment fragment = it.fragment();
            if (!fragment.isValid() || fragment.length() == 0)
                continue;
            switchTo(propsOf(fragment.charFormat()));
            text(fragment.text());
            empty = false;
        }
        if (empty)
            switchTo(propsOf(block.charFormat())); // the empty line keeps its height
        word("par");
        m_body += "\r\n";
        m_delimit = false;
    }

    QByteArray out = "{\\rtf1\\ansi\\ansicpg1252\\deff0\\deflang1031{\\fonttbl";
    for (qsizetype i = 0; i < m_fonts.size(); ++i) {
        out += "{\\f" + QByteArray::number(i) + "\\fnil\\fcharset" + (i == m_symbolFont ? "2 " : "0 ");
        appendEscaped(out, m_fonts[i], true);
        out += ";}";
    }
    out += "}\r\n{\\colortbl ;";
    for (const QColor& c : std::as_const(m_colors)) {
        out += "\\red" + QByteArray::number(c.red()) + "\\green" + QByteArray::number(c.green()) + "\\blue"
            + QByteArray::number(c.blue()) + ';';
    }
    out += "}\r\n\\viewkind4\\uc1\r\n";
    out += m_body;
    out += "}\r\n";
    return out;
}

} // namespace

QByteArray RtfWriter::write(const QTextDocument& doc)
{
    return Writer(doc).run();
}

} // namespace orvanta
