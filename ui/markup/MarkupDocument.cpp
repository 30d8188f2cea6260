#include "ui/markup/MarkupDocument.h"

#include <QPalette>
#include <QTextBlock>
#include <QTextCursor>
#include <QTextDocument>
#include <array>

namespace orvanta {
namespace {

struct Tag {
    QString name; // upper case, with a leading '/' for closing tags
    std::vector<std::pair<QString, QString>> attributes; // names in lower case

    [[nodiscard]] QString attribute(QStringView key) const
    {
        for (const auto& [k, v] : attributes) {
            if (k == key)
                return v;
        }
        return {};
    }
};

// Parses the inside of <...>; false when it is no tag at all (then the text is shown).
bool parseTag(QStringView inside, Tag& tag)
{
    qsizetype i = 0;
    const auto n = inside.size();
    if (i < n && inside[i] == u'/') {
        tag.name += u'/';
        ++i;
    }
    const qsizetype nameStart = i;
    while (i < n && (inside[i].isLetterOrNumber()))
        ++i;
    if (i == nameStart || !inside[nameStart].isLetter())
        return false;
    tag.name += inside.mid(nameStart, i - nameStart).toString().toUpper();
    while (i < n) {
        while (i < n && inside[i].isSpace())
            ++i;
        const qsizetype keyStart = i;
        while (i < n && !inside[i].isSpace() && inside[i] != u'=')
            ++i;
        if (i == keyStart) {
            ++i; // stray '='
            continue;
        }
        QString key = inside.mid(keyStart, i - keyStart).toString().toLower();
        while (i < n && inside[i].isSpace())
            ++i;
        QString value;
        if (i < n && inside[i] == u'=') {
            ++i;
            while (i < n && inside[i].isSpace())
                ++i;
            if (i < n && (inside[i] == u'"' || inside[i] == u'\'')) {
                const QChar quote = inside[i++];
                const qsizetype valueStart = i;
                while (i < n && inside[i] != quote)
                    ++i;
                value = inside.mid(valueStart, i - valueStart).toString();
                if (i < n)
                    ++i;
            } else {
                const qsizetype valueStart = i;
                while (i < n && !inside[i].isSpace())
                    ++i;
                value = inside.mid(valueStart, i - valueStart).toString();
            }
        }
        tag.attributes.emplace_back(std::move(key), std::move(value));
    }
    return true;
}

// "&quot;" and friends; returns the length consumed (0 when it is no entity).
qsizetype parseEntity(QStringView text, QString& out)
{
    const qsizetype semi = text.left(10).indexOf(u';');
    if (semi < 2)
        return 0;
    const QStringView name = text.mid(1, semi - 1);
    static const std::array<std::pair<const char16_t*, char16_t>, 6> named{{
        {u"quot", u'"'}, {u"amp", u'&'}, {u"lt", u'<'}, {u"gt", u'>'}, {u"nbsp", u'\u00A0'}, {u"apos", u'\''}}};
    for (const auto& [n, c] : named) {
        if (name.compare(QStringView(n), Qt::CaseInsensitive) == 0) {
            out += QChar(c);
            return semi + 1;
        }
    }
    if (name.startsWith(u'#')) {
        bool ok = false;
        const uint code = name.startsWith(u"#x", Qt::CaseInsensitive) ? name.mid(2).toUInt(&ok, 16) : name.mid(1).toUInt(&ok, 10);
        if (ok && code > 0 && code < 0x110000 && !(code >= 0xD800 && code < 0xE000)) {
            const char32_t c = code;
            out += QString::fromUcs4(&c, 1);
            return semi + 1;
        }
    }
    return 0;
}

class Builder {
public:
    Builder(QTextDocument& doc, const QList<QPixmap>& images, const QPalette& palette)
        : m_doc(doc)
        , m_cursor(&doc)
        , m_images(images)
        , m_palette(palette)
    {
    }

    void run(QStringView s)
    {
        for (qsizetype i = 0; i < s.size();) {
            const QChar c = s[i];
            if (c == u'<') {
                const qsizetype close = s.indexOf(u'>', i + 1);
                Tag tag;
                if (close > i && parseTag(s.mid(i + 1, close - i - 1), tag)) {
                    flush();
                    apply(tag);
                    i = close + 1;
                    continue;
                }
            } else if (c == u'&') {
                const qsizetype used = parseEntity(s.mid(i), m_text);
                if (used > 0) {
                    i += used;
                    continue;
                }
            } else if (c == u'\r' || c == u'\n') {
                ++i;
                continue;
            }
            m_text += c;
            ++i;
        }
        flush();
    }

private:
    [[nodiscard]] QTextCharFormat format() const
    {
        QTextCharFormat f;
        f.setFontWeight(m_bold > 0 ? QFont::Bold : QFont::Normal);
        f.setFontItalic(m_italic > 0);
        f.setFontUnderline(m_underline > 0 || !m_href.isNull());
        QColor color = m_colors.empty() ? m_palette.color(QPalette::WindowText) : m_colors.back();
        if (!m_href.isNull()) {
            f.setAnchor(true);
            f.setAnchorHref(m_href);
            if (m_colors.empty())
                color = m_palette.color(QPalette::Link);
        }
        f.setForeground(color);
        return f;
    }

    void flush()
    {
        if (m_text.isEmpty())
            return;
        m_cursor.insertText(m_text, format());
        m_text.clear();
    }

    void apply(const Tag& tag)
    {
        const QString& t = tag.name;
        if (t == u"BR") {
            m_cursor.insertBlock(QTextBlockFormat(), format());
        } else if (t == u"B") {
            ++m_bold;
        } else if (t == u"/B") {
            m_bold = std::max(0, m_bold - 1);
        } else if (t == u"U") {
            ++m_underline;
        } else if (t == u"/U") {
            m_underline = std::max(0, m_underline - 1);
        } else if (t == u"I") {
            ++m_italic;
        } else if (t == u"/I") {
            m_italic = std::max(0, m_italic - 1);
        } else if (t == u"A") {
            m_href = tag.attribute(u"href");
            if (m_href.isNull())
                m_href = QLatin1String("");
        } else if (t == u"/A") {
            m_href = QString();
        } else if (t == u"FONT") {
            const QColor c = markupColor(tag.attribute(u"color"), m_palette);
            // An unknown colour keeps the current one, so the closing tag still pairs up.
            m_colors.push_back(c.isValid() ? c : (m_colors.empty() ? m_palette.color(QPalette::WindowText) : m_colors.back()));
        } else if (t == u"/FONT") {
            if (!m_colors.empty())
                m_colors.pop_back();
        } else if (t == u"IND") {
            indent(tag.attribute(u"x"));
        } else if (t == u"IMG") {
            image(tag);
        }
    }

    void indent(const QString& value)
    {
        bool ok = false;
        const int x = value.trimmed().toInt(&ok);
        if (!ok || x < 0 || x > 100'000)
            return;
        QTextBlockFormat bf = m_cursor.blockFormat();
        QList<QTextOption::Tab> tabs = bf.tabPositions();
        const auto at = std::find_if(tabs.begin(), tabs.end(), [x](const QTextOption::Tab& tab) { return tab.position >= x; });
        if (at == tabs.end() || at->position != x)
            tabs.insert(at, QTextOption::Tab(x, QTextOption::LeftTab));
        bf.setTabPositions(tabs);
        m_cursor.setBlockFormat(bf);
        m_cursor.insertText(QStringLiteral("\t"), format());
    }

    void image(const Tag& tag)
    {
        const QString src = tag.attribute(u"src");
        if (!src.startsWith(QLatin1String("idx:"), Qt::CaseInsensitive))
            return;
        bool ok = false;
        const int index = QStringView(src).mid(4).toInt(&ok);
        if (!ok || index < 0 || index >= m_images.size() || m_images.at(index).isNull())
            return;
        const QString name = QStringLiteral("idx:%1").arg(index);
        m_doc.addResource(QTextDocument::ImageResource, QUrl(name), m_images.at(index).toImage());
        QTextImageFormat f;
        f.setName(name);
        f.setWidth(m_images.at(index).width());
        f.setHeight(m_images.at(index).height());
        if (tag.attribute(u"align").compare(QLatin1String("middle"), Qt::CaseInsensitive) == 0)
            f.setVerticalAlignment(QTextCharFormat::AlignMiddle);
        m_cursor.insertImage(f);
    }

    QTextDocument& m_doc;
    QTextCursor m_cursor;
    const QList<QPixmap>& m_images;
    const QPalette& m_palette;
    QString m_text;
    int m_bold = 0;
    int m_underline = 0;
    int m_italic = 0;
    QString m_href; // null outside anchors
    std::vector<QColor> m_colors;
};

} // namespace

QColor markupColor(QStringView name, const QPalette& palette)
{
    const QString n = name.trimmed().toString().toLower();
    if (n.isEmpty())
        return {};
    static const std::array<std::pair<const char*, QRgb>, 22> fixed{{
        {"clblack", 0x000000},   {"clmaroon", 0x800000}, {"clgreen", 0x008000},     {"clolive", 0x808000},
        {"clnavy", 0x000080},    {"clpurple", 0x800080}, {"clteal", 0x008080},      {"clgray", 0x808080},
        {"clgrey", 0x808080},    {"clsilver", 0xC0C0C0}, {"clred", 0xFF0000},       {"cllime", 0x00FF00},
        {"clyellow", 0xFFFF00},  {"clblue", 0x0000FF},   {"clfuchsia", 0xFF00FF},   {"claqua", 0x00FFFF},
        {"clwhite", 0xFFFFFF},   {"clltgray", 0xC0C0C0}, {"cldkgray", 0x808080},    {"clmoneygreen", 0xC0DCC0},
        {"clskyblue", 0xA6CAF0}, {"clcream", 0xFFFBF0},
    }};
    for (const auto& [key, rgb] : fixed) {
        if (n == QLatin1String(key))
            return QColor::fromRgb(rgb);
    }
    static const std::array<std::pair<const char*, QPalette::ColorRole>, 9> system{{
        {"clwindowtext", QPalette::WindowText}, {"clwindow", QPalette::Base},       {"clbtnface", QPalette::Button},
        {"clbtntext", QPalette::ButtonText},    {"clhighlight", QPalette::Highlight}, {"clhighlighttext", QPalette::HighlightedText},
        {"clinfobk", QPalette::ToolTipBase},    {"clinfotext", QPalette::ToolTipText}, {"clhotlight", QPalette::Link},
    }};
    for (const auto& [key, role] : system) {
        if (n == QLatin1String(key))
            return palette.color(role);
    }
    if (n == QLatin1String("clgraytext"))
        return palette.color(QPalette::Disabled, QPalette::Text);
    if (n.startsWith(u'$')) {
        // Delphi TColor in hex: $00BBGGRR.
        bool ok = false;
        const uint v = QStringView(n).mid(1).toUInt(&ok, 16);
        if (ok && v <= 0xFFFFFF)
            return QColor(static_cast<int>(v & 0xFF), static_cast<int>((v >> 8) & 0xFF), static_cast<int>((v >> 16) & 0xFF));
        return {};
    }
    const QColor css = QColor::fromString(n);
    return css;
}

void buildMarkupDocument(QTextDocument& document, QStringView markup, const QList<QPixmap>& images,
                         const QPalette& palette)
{
    document.clear();
    Builder builder(document, images, palette);
    builder.run(markup);
}

} // namespace orvanta
