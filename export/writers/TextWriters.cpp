#include "export/writers/TextWriters.h"

#include "ui/grid/GridSnapshot.h"

#include <QIODevice>
#include <QSet>

#include <algorithm>

namespace orvanta {

namespace {

bool writeAll(QIODevice& out, const QByteArray& bytes)
{
    return out.write(bytes) == bytes.size();
}

bool isXmlChar(char32_t c)
{
    return c == 0x9 || c == 0xA || c == 0xD || (c >= 0x20 && c <= 0xD7FF) || (c >= 0xE000 && c <= 0xFFFD)
        || (c >= 0x10000 && c <= 0x10FFFF);
}

} // namespace

QByteArray escapeMarkup(const QString& text)
{
    // Most cells hold nothing to replace: encode them directly.
    const bool plain = std::all_of(text.begin(), text.end(), [](QChar ch) {
        const char16_t c = ch.unicode();
        return (c >= 0x20 || c == '\t' || c == '\n') && c != '<' && c != '>' && c != '&' && c != '"' && c != '\''
            && !ch.isSurrogate() && c < 0xFFFE;
    });
    if (plain)
        return text.toUtf8();
    QString clean;
    clean.reserve(text.size());
    for (const char32_t c : text.toUcs4()) {
        switch (c) {
        case '<': clean += QLatin1String("&lt;"); break;
        case '>': clean += QLatin1String("&gt;"); break;
        case '&': clean += QLatin1String("&amp;"); break;
        case '"': clean += QLatin1String("&quot;"); break;
        case '\'': clean += QLatin1String("&#39;"); break;
        // A bare CR would be read back as LF by any parser.
        case '\r': clean += QLatin1String("&#13;"); break;
        default:
            clean += QString::fromUcs4(isXmlChar(c) ? &c : U"\uFFFD", 1);
        }
    }
    return clean.toUtf8();
}

QString xmlElementName(const QString& caption, int index)
{
    QString name;
    for (const QChar ch : caption) {
        const bool ok = ch.isLetterOrNumber() || ch == u'_' || ch == u'-' || ch == u'.';
        name += ok && !ch.isSurrogate() ? ch : QChar(u'_');
    }
    if (caption.trimmed().isEmpty())
        return QStringLiteral("Spalte%1").arg(index + 1);
    const QChar first = name.front();
    if (!(first.isLetter() || first == u'_') || name.startsWith(QLatin1String("xml"), Qt::CaseInsensitive))
        name.prepend(u'_');
    return name;
}

QByteArray csvField(const QString& text)
{
    QByteArray bytes = text.toUtf8();
    if (!bytes.contains(',') && !bytes.contains('"') && !bytes.contains('\n') && !bytes.contains('\r'))
        return bytes;
    bytes.replace('"', "\"\"");
    return '"' + bytes + '"';
}

// --- HTML -------------------------------------------------------------------------------------

bool HtmlExportWriter::begin(QIODevice& out, const GridSnapshot& grid)
{
    m_columns = grid.columnCount();
    QByteArray head = "<!DOCTYPE html>\n<html>\n<head>\n<meta charset=\"utf-8\"/>\n<title>Export</title>\n"
                      "<style>table{border-collapse:collapse}td,th{border:1px solid #999;padding:2px 4px;"
                      "white-space:pre-wrap;vertical-align:top}tr.group td{font-weight:bold;background:#eee}</style>\n"
                      "</head>\n<body>\n<table>\n<thead>\n<tr>";
    for (const GridSnapshotColumn& column : grid.columns())
        head += "<th>" + escapeMarkup(column.caption) + "</th>";
    head += "</tr>\n</thead>\n<tbody>\n";
    return writeAll(out, head);
}

bool HtmlExportWriter::groupRow(QIODevice& out, int /*level*/, const QString& text)
{
    m_line = "<tr class=\"group\"><td colspan=\"" + QByteArray::number(std::max(1, m_columns)) + "\">";
    m_line += escapeMarkup(text) + "</td></tr>\n";
    return writeAll(out, m_line);
}

bool HtmlExportWriter::dataRow(QIODevice& out, const GridSnapshot& grid)
{
    m_line = "<tr>";
    for (int i = 0; i < m_columns; ++i)
        m_line += "<td>" + escapeMarkup(grid.cellText(i)) + "</td>";
    m_line += "</tr>\n";
    return writeAll(out, m_line);
}

bool HtmlExportWriter::finish(QIODevice& out)
{
    return writeAll(out, "</tbody>\n</table>\n</body>\n</html>\n");
}

// --- XML --------------------------------------------------------------------------------------

bool XmlExportWriter::begin(QIODevice& out, const GridSnapshot& grid)
{
    m_names.clear();
    QSet<QString> used;
    QByteArray head = "<?xml version=\"1.0\" encoding=\"UTF-8\"?>\n<export>\n<columns>\n";
    for (int i = 0; i < grid.columnCount(); ++i) {
        const QString& caption = grid.columns()[static_cast<size_t>(i)].caption;
        QString name = xmlElementName(caption, i);
        for (int n = 2; used.contains(name.toLower()); ++n)
            name = xmlElementName(caption, i) + QStringLiteral("_%1").arg(n);
        used.insert(name.toLower());
        m_names.push_back(name.toUtf8());
        head += "<column name=\"" + m_names.back() + "\">" + escapeMarkup(caption) + "</column>\n";
    }
    head += "</columns>\n<rows>\n";
    return writeAll(out, head);
}

bool XmlExportWriter::groupRow(QIODevice& out, int level, const QString& text)
{
    return writeAll(out, "<group level=\"" + QByteArray::number(level) + "\">" + escapeMarkup(text) + "</group>\n");
}

bool XmlExportWriter::dataRow(QIODevice& out, const GridSnapshot& grid)
{
    m_line = "<row>";
    for (size_t i = 0; i < m_names.size(); ++i)
        m_line += '<' + m_names[i] + '>' + escapeMarkup(grid.cellText(static_cast<int>(i))) + "</" + m_names[i] + '>';
    m_line += "</row>\n";
    return writeAll(out, m_line);
}

bool XmlExportWriter::finish(QIODevice& out)
{
    return writeAll(out, "</rows>\n</export>\n");
}

// --- text -------------------------------------------------------------------------------------

bool TextExportWriter::begin(QIODevice& out, const GridSnapshot& grid)
{
    m_columns = grid.columnCount();
    m_line.clear();
    for (int i = 0; i < m_columns; ++i) {
        if (i > 0)
            m_line += ',';
        m_line += csvField(grid.columns()[static_cast<size_t>(i)].caption);
    }
    return writeAll(out, m_line + "\r\n");
}

bool TextExportWriter::groupRow(QIODevice& out, int /*level*/, const QString& text)
{
    // The group text in the first field, so every record has the same number of fields.
    m_line = csvField(text) + QByteArray(std::max(0, m_columns - 1), ',') + "\r\n";
    return writeAll(out, m_line);
}

bool TextExportWriter::dataRow(QIODevice& out, const GridSnapshot& grid)
{
    m_line.clear();
    for (int i = 0; i < m_columns; ++i) {
        if (i > 0)
            m_line += ',';
        m_line += csvField(grid.cellText(i));
    }
    return writeAll(out, m_line + "\r\n");
}

bool TextExportWriter::finish(QIODevice& /*out*/)
{
    return true;
}

} // namespace orvanta
