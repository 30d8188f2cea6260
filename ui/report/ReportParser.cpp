#include "ui/report/ReportParser.h"

#include <QRegularExpression>
#include <QStringDecoder>

#include <cmath>
#include <optional>

namespace orvanta {

namespace {

struct Token {
    QString text;
    bool quoted = false; // the whole token was a quoted string
};

// A failure inside the reader; parse() turns it into the result's message.
struct ParseError {
    QString message;
};

[[noreturn]] void fail(int line, const QString& message)
{
    throw ParseError{QStringLiteral("Zeile %1: %2").arg(line).arg(message)};
}

QList<Token> tokenize(QStringView line, int lineNo)
{
    QList<Token> tokens;
    qsizetype i = 0;
    const qsizetype n = line.size();
    while (i < n) {
        if (line[i].isSpace()) {
            ++i;
            continue;
        }
        if (line[i] == u'#')
            break;
        Token token;
        token.quoted = line[i] == u'"';
        while (i < n && !line[i].isSpace()) {
            if (line[i] != u'"') {
                token.text += line[i++];
                continue;
            }
            // A quoted run; "" inside stands for one quote.
            ++i;
            for (;;) {
                if (i >= n)
                    fail(lineNo, QStringLiteral("Anführungszeichen nicht geschlossen"));
                if (line[i] == u'"') {
                    if (i + 1 < n && line[i + 1] == u'"') {
                        token.text += u'"';
                        i += 2;
                        continue;
                    }
                    ++i;
                    break;
                }
                token.text += line[i++];
            }
            if (token.quoted)
                break; // "abc"def is two tokens' worth of confusion: the quote ends the token
        }
        if (token.text.size() > ReportParser::kMaxTextLength)
            fail(lineNo, QStringLiteral("Text länger als %1 Zeichen").arg(ReportParser::kMaxTextLength));
        tokens.append(token);
    }
    return tokens;
}

double number(const QString& text, int line, double min, double max, const QString& what)
{
    bool ok = false;
    const double value = text.toDouble(&ok);
    if (!ok || !std::isfinite(value))
        fail(line, QStringLiteral("„%1“ ist keine Zahl (%2)").arg(text, what));
    if (value < min || value > max)
        fail(line, QStringLiteral("%1 %2 außerhalb von %3 bis %4").arg(what, text).arg(min).arg(max));
    return value;
}

QColor colour(const QString& text, int line)
{
    static const QRegularExpression hex(QStringLiteral("^[0-9A-Fa-f]{6}$"));
    if (!hex.match(text).hasMatch())
        fail(line, QStringLiteral("Farbe „%1“ ist nicht RRGGBB (sechs Hexadezimalziffern)").arg(text));
    return QColor(QStringLiteral("#") + text);
}

std::optional<ReportBand::Kind> bandKind(const QString& word)
{
    static const std::pair<const char*, ReportBand::Kind> kinds[] = {
        {"title", ReportBand::Kind::Title},
        {"pageheader", ReportBand::Kind::PageHeader},
        {"groupheader", ReportBand::Kind::GroupHeader},
        {"detail", ReportBand::Kind::Detail},
        {"groupfooter", ReportBand::Kind::GroupFooter},
        {"pagefooter", ReportBand::Kind::PageFooter},
        {"summary", ReportBand::Kind::Summary},
    };
    for (const auto& [name, kind] : kinds)
        if (word.compare(QLatin1String(name), Qt::CaseInsensitive) == 0)
            return kind;
    return std::nullopt;
}

// Braces must pair and enclose a name; "{{" and "}}" stand for literal braces.
void checkTemplate(const QString& text, int line)
{
    for (qsizetype i = 0; i < text.size(); ++i) {
        if (text[i] == u'}') {
            if (i + 1 < text.size() && text[i + 1] == u'}') {
                ++i;
                continue;
            }
            fail(line, QStringLiteral("„}“ ohne „{“"));
        }
        if (text[i] != u'{')
            continue;
        if (i + 1 < text.size() && text[i + 1] == u'{') {
            ++i;
            continue;
        }
        const qsizetype close = text.indexOf(u'}', i + 1);
        if (close < 0)
            fail(line, QStringLiteral("„{“ ohne „}“"));
        const QStringView name = QStringView(text).sliced(i + 1, close - i - 1).trimmed();
        if (name.isEmpty() || name.contains(u'{'))
            fail(line, QStringLiteral("leerer oder verschachtelter Platzhalter"));
        i = close;
    }
}

class Reader {
public:
    ReportProject project;

    void line(QStringView text, int no)
    {
        const QList<Token> tokens = tokenize(text, no);
        if (tokens.isEmpty())
            return;
        const QString keyword = tokens[0].quoted ? QString() : tokens[0].text.toLower();
        if (!m_sawHeader) {
            if (keyword != u"orvex" || tokens.size() != 2 || tokens[1].text != u"1")
                fail(no, QStringLiteral("keine Berichtsdatei: die erste Zeile muss „orvex 1“ lauten"));
            m_sawHeader = true;
            return;
        }
        if (!m_report) {
            if (keyword != u"report")
                fail(no, QStringLiteral("„report Name“ erwartet, „%1“ gefunden").arg(tokens[0].text));
            startReport(tokens, no);
            return;
        }
        if (keyword == u"end") {
            endReport(tokens, no);
        } else if (keyword == u"paper") {
            beforeBands(no, keyword);
            paper(tokens, no);
        } else if (keyword == u"margins") {
            beforeBands(no, keyword);
            arity(tokens, 5, 5, no);
            const double l = number(tokens[1].text, no, 0, kMaxMargin, QStringLiteral("Rand"));
            const double t = number(tokens[2].text, no, 0, kMaxMargin, QStringLiteral("Rand"));
            const double r = number(tokens[3].text, no, 0, kMaxMargin, QStringLiteral("Rand"));
            const double b = number(tokens[4].text, no, 0, kMaxMargin, QStringLiteral("Rand"));
            m_report->margins = QMarginsF(l, t, r, b);
            checkPrintable(no);
        } else if (keyword == u"font") {
            beforeBands(no, keyword);
            arity(tokens, 3, 3, no);
            m_report->font.family = tokens[1].text;
            m_report->font.size = number(tokens[2].text, no, 1, kMaxFontSize, QStringLiteral("Schriftgröße"));
        } else if (keyword == u"band") {
            band(tokens, no);
        } else if (keyword == u"text" || keyword == u"richtext" || keyword == u"line" || keyword == u"box") {
            item(tokens, no, keyword);
        } else {
            fail(no, QStringLiteral("unbekanntes Wort „%1“").arg(tokens[0].text));
        }
    }

    void finish(int lastLine)
    {
        if (!m_sawHeader)
            fail(std::max(lastLine, 1), QStringLiteral("die Datei ist leer"));
        if (m_report)
            fail(lastLine,
                 QStringLiteral("Bericht „%1“ (ab Zeile %2) endet ohne „end“ — Datei abgeschnitten?")
                     .arg(m_report->name)
                     .arg(m_report->line));
    }

private:
    static constexpr double kMaxMargin = 200;
    static constexpr double kMaxFontSize = 200;
    static constexpr double kMaxPen = 20;

    std::optional<ReportDefinition> m_report;
    bool m_sawHeader = false;

    static void arity(const QList<Token>& tokens, qsizetype min, qsizetype max, int no)
    {
        if (tokens.size() < min || tokens.size() > max)
            fail(no,
                 min == max ? QStringLiteral("„%1“ braucht %2 Angaben").arg(tokens[0].text).arg(min - 1)
                            : QStringLiteral("„%1“ braucht %2 bis %3 Angaben").arg(tokens[0].text).arg(min - 1).arg(max - 1));
    }

    void beforeBands(int no, const QString& keyword) const
    {
        if (!m_report->bands.isEmpty())
            fail(no, QStringLiteral("„%1“ muss vor dem ersten Band stehen").arg(keyword));
    }

    void checkPrintable(int no) const
    {
        const QSizeF area = m_report->printable();
        if (area.width() < 10 || area.height() < 10)
            fail(no, QStringLiteral("die Ränder lassen keinen Platz auf dem Papier"));
    }

    void startReport(const QList<Token>& tokens, int no)
    {
        if (tokens.size() < 2 || tokens.size() > 3)
            fail(no, QStringLiteral("„report Name [title=\"Fenstertitel\"]“ erwartet"));
        const QString& name = tokens[1].text;
        static const QRegularExpression valid(QStringLiteral("^[A-Za-z_][A-Za-z0-9_]{0,63}$"));
        if (!valid.match(name).hasMatch())
            fail(no, QStringLiteral("ungültiger Berichtsname „%1“").arg(name.left(80)));
        if (project.find(name))
            fail(no, QStringLiteral("Bericht „%1“ gibt es schon").arg(name));
        if (project.reports.size() >= ReportParser::kMaxReports)
            fail(no, QStringLiteral("mehr als %1 Berichte").arg(ReportParser::kMaxReports));
        m_report.emplace();
        m_report->name = name;
        m_report->line = no;
        if (tokens.size() == 3) {
            const QString& option = tokens[2].text;
            if (tokens[2].quoted || !option.startsWith(QLatin1String("title=")))
                fail(no, QStringLiteral("unbekannte Angabe „%1“").arg(option.left(80)));
            m_report->title = option.mid(6);
        }
    }

    void endReport(const QList<Token>& tokens, int no)
    {
        arity(tokens, 1, 1, no);
        for (const ReportBand& b : m_report->bands) {
            if (b.kind != ReportBand::Kind::GroupFooter)
                continue;
            bool matched = false;
            for (const ReportBand& h : m_report->bands)
                matched = matched || (h.kind == ReportBand::Kind::GroupHeader && h.groupBy == b.groupBy);
            if (!matched)
                fail(b.line, QStringLiteral("Gruppenfuß für „%1“ ohne Gruppenkopf").arg(b.groupBy));
        }
        project.reports.append(std::move(*m_report));
        m_report.reset();
    }

    void paper(const QList<Token>& tokens, int no)
    {
        arity(tokens, 2, 3, no);
        QSizeF size;
        const QString format = tokens[1].text.toLower();
        qsizetype next = 2;
        if (format == u"a4")
            size = {210, 297};
        else if (format == u"a5")
            size = {148, 210};
        else if (format == u"a3")
            size = {297, 420};
        else if (format == u"letter")
            size = {215.9, 279.4};
        else {
            arity(tokens, 3, 3, no);
            size = {number(tokens[1].text, no, 50, ReportParser::kMaxPaper, QStringLiteral("Papierbreite")),
                    number(tokens[2].text, no, 50, ReportParser::kMaxPaper, QStringLiteral("Papierhöhe"))};
            next = 3;
        }
        if (next < tokens.size()) {
            const QString orientation = tokens[next].text.toLower();
            if (orientation == u"landscape")
                size.transpose();
            else if (orientation != u"portrait")
                fail(no, QStringLiteral("„portrait“ oder „landscape“ erwartet, „%1“ gefunden").arg(tokens[next].text.left(80)));
        }
        m_report->paper = size;
        checkPrintable(no);
    }

    void band(const QList<Token>& tokens, int no)
    {
        if (tokens.size() < 3)
            fail(no, QStringLiteral("„band Art Höhe“ erwartet"));
        const auto kind = bandKind(tokens[1].text);
        if (!kind)
            fail(no,
                 QStringLiteral("unbekannte Bandart „%1“ (title, pageheader, groupheader, detail, groupfooter, "
                                "pagefooter, summary)")
                     .arg(tokens[1].text.left(80)));
        if (m_report->bands.size() >= ReportParser::kMaxBandsPerReport)
            fail(no, QStringLiteral("mehr als %1 Bänder in einem Bericht").arg(ReportParser::kMaxBandsPerReport));
        ReportBand band;
        band.kind = *kind;
        band.line = no;
        band.height = number(tokens[2].text, no, 0, m_report->printable().height(), QStringLiteral("Bandhöhe"));
        for (qsizetype i = 3; i < tokens.size(); ++i) {
            const auto [key, value] = option(tokens[i], no);
            if (key == u"by" && (band.kind == ReportBand::Kind::GroupHeader || band.kind == ReportBand::Kind::GroupFooter))
                band.groupBy = fieldName(value, no);
            else if (key == u"shade" && band.kind == ReportBand::Kind::Detail)
                band.shadeField = fieldName(value, no);
            else if (key == u"shadecolor" && band.kind == ReportBand::Kind::Detail)
                band.shade = colour(value, no);
            else
                fail(no, QStringLiteral("„%1“ passt nicht zu diesem Band").arg(tokens[i].text.left(80)));
        }
        const bool grouped = band.kind == ReportBand::Kind::GroupHeader || band.kind == ReportBand::Kind::GroupFooter;
        if (grouped && band.groupBy.isEmpty())
            fail(no, QStringLiteral("Gruppenband ohne „by=Feld“"));
        if (!band.shadeField.isEmpty() && !band.shade.isValid())
            band.shade = QColor(0xEE, 0xF2, 0xF7);
        for (const ReportBand& other : std::as_const(m_report->bands)) {
            if (other.kind == band.kind && other.groupBy == band.groupBy)
                fail(no, QStringLiteral("dieses Band gibt es schon (Zeile %1)").arg(other.line));
        }
        m_report->bands.append(band);
    }

    static QString fieldName(const QString& value, int no)
    {
        static const QRegularExpression valid(QStringLiteral("^[A-Za-z_][A-Za-z0-9_]{0,63}$"));
        if (!valid.match(value).hasMatch())
            fail(no, QStringLiteral("ungültiger Feldname „%1“").arg(value.left(80)));
        return value;
    }

    static std::pair<QString, QString> option(const Token& token, int no)
    {
        const qsizetype eq = token.text.indexOf(u'=');
        if (token.quoted || eq <= 0)
            return {token.quoted ? QString() : token.text.toLower(), QString()};
        Q_UNUSED(no)
        return {token.text.left(eq).toLower(), token.text.mid(eq + 1)};
    }

    void item(const QList<Token>& tokens, int no, const QString& keyword)
    {
        if (m_report->bands.isEmpty())
            fail(no, QStringLiteral("„%1“ außerhalb eines Bandes").arg(keyword));
        ReportBand& band = m_report->bands.last();
        if (band.items.size() >= ReportParser::kMaxItemsPerBand)
            fail(no, QStringLiteral("mehr als %1 Elemente in einem Band").arg(ReportParser::kMaxItemsPerBand));
        if (tokens.size() < 5)
            fail(no, QStringLiteral("„%1 X Y Breite Höhe …“ erwartet").arg(keyword));
        ReportItem item;
        item.line = no;
        item.kind = keyword == u"text" ? ReportItem::Kind::Text
            : keyword == u"richtext"   ? ReportItem::Kind::RichText
            : keyword == u"line"       ? ReportItem::Kind::Line
                                       : ReportItem::Kind::Box;
        const QSizeF area = m_report->printable();
        const double x = number(tokens[1].text, no, 0, area.width(), QStringLiteral("X"));
        const double y = number(tokens[2].text, no, 0, band.height, QStringLiteral("Y"));
        if (item.kind == ReportItem::Kind::Line) {
            const double x2 = number(tokens[3].text, no, 0, area.width(), QStringLiteral("X2"));
            const double y2 = number(tokens[4].text, no, 0, band.height, QStringLiteral("Y2"));
            item.rect = QRectF(QPointF(x, y), QPointF(x2, y2));
        } else {
            const double w = number(tokens[3].text, no, 0, area.width() - x, QStringLiteral("Breite"));
            const double h = number(tokens[4].text, no, 0, band.height - y, QStringLiteral("Höhe"));
            item.rect = QRectF(x, y, w, h);
        }
        const bool hasText = item.kind == ReportItem::Kind::Text || item.kind == ReportItem::Kind::RichText;
        bool haveText = false;
        for (qsizetype i = 5; i < tokens.size(); ++i) {
            const Token& token = tokens[i];
            const bool richName = item.kind == ReportItem::Kind::RichText && !token.text.contains(u'=');
            if (hasText && !haveText && (token.quoted || richName)) {
                item.text = token.text;
                haveText = true;
                continue;
            }
            const auto [key, value] = option(token, no);
            if (hasText && key == u"bold" && value.isEmpty())
                item.font.bold = true;
            else if (hasText && key == u"italic" && value.isEmpty())
                item.font.italic = true;
            else if (hasText && key == u"size")
                item.font.size = number(value, no, 1, kMaxFontSize, QStringLiteral("Schriftgröße"));
            else if (hasText && key == u"font" && !value.isEmpty())
                item.font.family = value;
            else if (hasText && key == u"align")
                item.align = (item.align & Qt::AlignVertical_Mask) | horizontal(value, no);
            else if (hasText && key == u"valign")
                item.align = (item.align & Qt::AlignHorizontal_Mask) | vertical(value, no);
            else if (key == u"color")
                item.color = colour(value, no);
            else if (!hasText && key == u"width")
                item.penWidth = number(value, no, 0, kMaxPen, QStringLiteral("Strichbreite"));
            else if (item.kind == ReportItem::Kind::Box && key == u"fill")
                item.fill = colour(value, no);
            else
                fail(no, QStringLiteral("unbekannte Angabe „%1“").arg(token.text.left(80)));
        }
        if (item.kind == ReportItem::Kind::Text) {
            if (!haveText)
                fail(no, QStringLiteral("„text“ ohne Text in Anführungszeichen"));
            checkTemplate(item.text, no);
        } else if (item.kind == ReportItem::Kind::RichText) {
            if (!haveText)
                fail(no, QStringLiteral("„richtext“ ohne Parameternamen"));
            item.text = fieldName(item.text, no);
            if (band.kind != ReportBand::Kind::Title && band.kind != ReportBand::Kind::Summary)
                fail(no, QStringLiteral("„richtext“ steht nur im Band title oder summary"));
        }
        band.items.append(item);
    }

    static Qt::Alignment horizontal(const QString& value, int no)
    {
        if (value == u"left")
            return Qt::AlignLeft;
        if (value == u"center")
            return Qt::AlignHCenter;
        if (value == u"right")
            return Qt::AlignRight;
        fail(no, QStringLiteral("„align=%1“: left, center oder right erwartet").arg(value.left(80)));
    }

    static Qt::Alignment vertical(const QString& value, int no)
    {
        if (value == u"top")
            return Qt::AlignTop;
        if (value == u"middle")
            return Qt::AlignVCenter;
        if (value == u"bottom")
            return Qt::AlignBottom;
        fail(no, QStringLiteral("„valign=%1“: top, middle oder bottom erwartet").arg(value.left(80)));
    }
};

} // namespace

ReportParseResult ReportParser::parse(QByteArrayView data)
{
    ReportParseResult result;
    if (data.size() > kMaxFileSize) {
        result.error = QStringLiteral("die Datei ist größer als %1 MB").arg(kMaxFileSize / (1024 * 1024));
        return result;
    }
    Reader reader;
    int lineNo = 0;
    try {
        qsizetype from = 0;
        if (data.startsWith("\xEF\xBB\xBF"))
            from = 3; // editors on Windows like to start UTF-8 with a byte-order mark
        while (from < data.size()) {
            qsizetype to = data.indexOf('\n', from);
            if (to < 0)
                to = data.size();
            ++lineNo;
            QByteArrayView bytes = data.sliced(from, to - from);
            if (bytes.endsWith('\r'))
                bytes.chop(1);
            if (bytes.contains('\0'))
                fail(lineNo, QStringLiteral("Nullzeichen — keine Textdatei"));
            QStringDecoder decoder(QStringDecoder::Utf8);
            const QString text = decoder.decode(bytes);
            if (decoder.hasError())
                fail(lineNo, QStringLiteral("kein gültiges UTF-8"));
            reader.line(text, lineNo);
            from = to + 1;
        }
        reader.finish(lineNo);
    } catch (const ParseError& e) {
        result.error = e.message;
        return result;
    }
    result.project = std::move(reader.project);
    return result;
}

} // namespace orvanta
