#include "ui/rtf/RtfReader.h"

#include "ui/rtf/RtfCodePage.h"
#include "ui/rtf/RtfTokenizer.h"

#include <QHash>
#include <QStringDecoder>
#include <QTextCursor>
#include <QTextDocument>
#include <QTextList>
#include <string_view>
#include <unordered_map>
#include <vector>

namespace orvanta {
namespace {

// What the text of a group is for.
enum class Dest : quint8 { Text, Skip, FontTable, ColorTable, Pn, ListText, Upr };

enum class ListKind : quint8 { None, Bullet, Decimal, LowerAlpha, UpperAlpha, LowerRoman, UpperRoman };

enum class Word : quint8 {
    Unknown,
    // destinations
    SkipDest, FontTbl, ColorTbl, Pn, PnText, Upr, Ud,
    // document
    Ansi, Mac, Pc, Pca, AnsiCpg, Deff,
    // font and colour tables
    F, FCharset, Cpg, Red, Green, Blue,
    // character formatting
    Plain, B, I, Ul, UlNone, Strike, Fs, Cf,
    // paragraph formatting
    Pard, Ql, Qc, Qr, Qj, Ls,
    // text
    Par, Line, Tab, Char, Uc, U,
    // legacy list definitions
    PnLvlBlt, PnLvlBody, PnLvlCont, PnDec, PnLcltr, PnUcltr, PnLcrm, PnUcrm,
};

struct WordInfo {
    Word word = Word::Unknown;
    char16_t ch = 0; // for Word::Char
};

const std::unordered_map<std::string_view, WordInfo>& wordTable()
{
    static const std::unordered_map<std::string_view, WordInfo> table = [] {
        std::unordered_map<std::string_view, WordInfo> t;
        // Groups whose content is never document text.
        for (const char* name :
             {"stylesheet", "info", "pict", "object", "header", "headerl", "headerr", "headerf", "footer",
              "footerl", "footerr", "footerf", "footnote", "fldinst", "listtable", "listoverridetable",
              "rsidtbl", "revtbl", "filetbl", "generator", "xmlnstbl", "themedata", "colorschememapping",
              "latentstyles", "datastore", "mmathPr", "userprops", "template", "docvar", "bkmkstart",
              "bkmkend", "annotation", "atnid", "atnauthor", "atrfstart", "atrfend", "author", "operator",
              "title", "subject", "keywords", "comment", "doccomm", "creatim", "revtim", "printim", "buptim",
              "nonshppict", "shp", "shpinst", "shppict", "sp", "sn", "sv", "objdata", "pgdsctbl",
              "protusertbl", "wgrffmtfilter", "pnseclvl", "fchars", "lchars", "ftnsep", "ftnsepc", "ftncn",
              "aftnsep", "aftnsepc", "aftncn", "panose", "falt", "fname", "xe", "tc", "txe", "private",
              "background", "do", "pntxta", "pntxtb", "listpicture", "passwordhash", "ftnalt"})
            t.emplace(name, WordInfo{Word::SkipDest});
        const std::pair<const char*, Word> words[] = {
            {"fonttbl", Word::FontTbl}, {"colortbl", Word::ColorTbl}, {"pn", Word::Pn},
            {"pntext", Word::PnText}, {"listtext", Word::PnText}, {"upr", Word::Upr}, {"ud", Word::Ud},
            {"ansi", Word::Ansi}, {"mac", Word::Mac}, {"pc", Word::Pc}, {"pca", Word::Pca},
            {"ansicpg", Word::AnsiCpg}, {"deff", Word::Deff}, {"f", Word::F}, {"fcharset", Word::FCharset},
            {"cpg", Word::Cpg}, {"red", Word::Red}, {"green", Word::Green}, {"blue", Word::Blue},
            {"plain", Word::Plain}, {"b", Word::B}, {"i", Word::I}, {"ul", Word::Ul}, {"uld", Word::Ul},
            {"uldash", Word::Ul}, {"uldashd", Word::Ul}, {"uldashdd", Word::Ul}, {"uldb", Word::Ul},
            {"ulhwave", Word::Ul}, {"ulldash", Word::Ul}, {"ulth", Word::Ul}, {"ulthd", Word::Ul},
            {"ulthdash", Word::Ul}, {"ulthdashd", Word::Ul}, {"ulthdashdd", Word::Ul},
            {"ulthldash", Word::Ul}, {"ululdbwave", Word::Ul}, {"ulw", Word::Ul}, {"ulwave", Word::Ul},
            {"ulnone", Word::UlNone}, {"strike", Word::Strike}, {"striked", Word::Strike},
            {"fs", Word::Fs}, {"cf", Word::Cf}, {"pard", Word::Pard}, {"ql", Word::Ql}, {"qc", Word::Qc},
            {"qr", Word::Qr}, {"qj", Word::Qj}, {"qd", Word::Qj}, {"ls", Word::Ls}, {"par", Word::Par},
            {"sect", Word::Par}, {"page", Word::Par}, {"row", Word::Par}, {"nestrow", Word::Par},
            {"line", Word::Line}, {"tab", Word::Tab}, {"cell", Word::Tab}, {"nestcell", Word::Tab},
            {"uc", Word::Uc}, {"u", Word::U}, {"pnlvlblt", Word::PnLvlBlt}, {"pnlvlbody", Word::PnLvlBody},
            {"pnlvl", Word::PnLvlBody}, {"pnlvlcont", Word::PnLvlCont}, {"pndec", Word::PnDec},
            {"pnlcltr", Word::PnLcltr}, {"pnucltr", Word::PnUcltr}, {"pnlcrm", Word::PnLcrm},
            {"pnucrm", Word::PnUcrm}};
        for (const auto& [name, word] : words)
            t.emplace(name, WordInfo{word});
        const std::pair<const char*, char16_t> chars[] = {
            {"emdash", 0x2014}, {"endash", 0x2013}, {"emspace", 0x2003}, {"enspace", 0x2002},
            {"qmspace", 0x2005}, {"bullet", 0x2022}, {"lquote", 0x2018}, {"rquote", 0x2019},
            {"ldblquote", 0x201C}, {"rdblquote", 0x201D}, {"zwj", 0x200D}, {"zwnj", 0x200C},
            {"ltrmark", 0x200E}, {"rtlmark", 0x200F}, {"zwbo", 0x200B}};
        for (const auto& [name, ch] : chars)
            t.emplace(name, WordInfo{Word::Char, ch});
        return t;
    }();
    return table;
}

WordInfo lookup(QByteArrayView name)
{
    const auto& table = wordTable();
    const auto it = table.find(std::string_view(name.data(), size_t(name.size())));
    return it == table.end() ? WordInfo{} : it->second;
}

bool isDestination(Word w)
{
    switch (w) {
    case Word::SkipDest:
    case Word::FontTbl:
    case Word::ColorTbl:
    case Word::Pn:
    case Word::PnText:
    case Word::Upr:
    case Word::Ud:
        return true;
    default:
        return false;
    }
}

QTextListFormat::Style listStyle(ListKind kind)
{
    switch (kind) {
    case ListKind::Decimal: return QTextListFormat::ListDecimal;
    case ListKind::LowerAlpha: return QTextListFormat::ListLowerAlpha;
    case ListKind::UpperAlpha: return QTextListFormat::ListUpperAlpha;
    case ListKind::LowerRoman: return QTextListFormat::ListLowerRoman;
    case ListKind::UpperRoman: return QTextListFormat::ListUpperRoman;
    default: return QTextListFormat::ListDisc;
    }
}

struct CharProps {
    int font = -1; // -1: the document's default font
    int halfPoints = 24;
    int color = 0;
    bool bold = false;
    bool italic = false;
    bool underline = false;
    bool strike = false;
};

struct ParaProps {
    Qt::Alignment align = Qt::AlignLeft;
    ListKind list = ListKind::None;
    int ls = 0; // list override of newer writers; 0 = none
};

struct State {
    Dest dest = Dest::Text;
    CharProps chr;
    ParaProps para;
    int uc = 1;
    // Collected inside a \pn group and handed to the paragraph when it closes.
    ListKind pnKind = ListKind::None;
    bool pnBody = false;
    bool pnCont = false;
};

struct Font {
    QString name;
    int codePage = 0; // 0: the document's code page
};

constexpr int kMaxFontNameBytes = 256;
constexpr int kMaxListText = 32;

class Parser {
public:
    Parser(const QByteArray& data, QTextDocument* doc)
        : m_tokens(data)
        , m_doc(doc)
    {
    }

    bool run();

private:
    State& top() { return m_stack.back(); }
    void groupOpen();
    void groupClose();
    void controlWord(const RtfToken& t);
    void controlSymbol(char symbol);
    void textWord(const RtfToken& t, const WordInfo& info);
    void bytes(QByteArrayView run, bool literal);
    void appendChar(char32_t ch);
    void unicode(int param);

    int codePage();
    QTextCharFormat charFormat();
    void decodeBytes();
    void flush();
    void paragraph();
    void finishBlock();
    void commitFont();

    RtfTokenizer m_tokens;
    QTextDocument* m_doc;
    QTextCursor m_cursor;
    RtfCodePage m_codePages;

    std::vector<State> m_stack;
    int m_overflow = 0; // groups opened beyond kMaxDepth
    bool m_done = false;
    bool m_damaged = false;
    bool m_star = false;
    int m_ucSkip = 0;

    int m_docCodePage = 1252;
    int m_defaultFont = 0;
    QHash<int, Font> m_fonts;
    struct {
        int index = -1;
        QByteArray bytes;
        QString name;
        int charset = 0;
        int cpg = 0;
        bool done = true;
    } m_font;
    std::vector<QColor> m_colors;
    int m_rgb[3] = {0, 0, 0};
    bool m_rgbSet = false;

    QByteArray m_bytes; // text bytes not yet decoded
    QString m_text; // decoded text not yet inserted
    bool m_blockHasContent = false;
    QByteArray m_listText;
    QTextList* m_list = nullptr;
    ListKind m_listKind = ListKind::None;
};

bool Parser::run()
{
    m_doc->clear();
    m_cursor = QTextCursor(m_doc);
    m_cursor.beginEditBlock();
    m_stack.reserve(64);

    while (!m_done) {
        const RtfToken t = m_tokens.next();
        if (t.kind == RtfToken::Kind::End) {
            m_damaged = true; // the root group never closed
            break;
        }
        if (t.kind == RtfToken::Kind::GroupOpen) {
            groupOpen();
            continue;
        }
        if (t.kind == RtfToken::Kind::GroupClose) {
            groupClose();
            continue;
        }
        if (m_stack.empty())
            continue; // cannot happen: the input starts with "{"
        if (m_ucSkip > 0) {
            // The fallback of a \u character: one unit per byte, escape or control word.
            if (t.kind == RtfToken::Kind::Text) {
                const qsizetype n = std::min<qsizetype>(m_ucSkip, t.text.size());
                m_ucSkip -= int(n);
                if (n < t.text.size())
                    bytes(t.text.sliced(n), true);
            } else {
                --m_ucSkip;
            }
            continue;
        }
        switch (t.kind) {
        case RtfToken::Kind::ControlWord:
            controlWord(t);
            break;
        case RtfToken::Kind::ControlSymbol:
            controlSymbol(t.symbol);
            break;
        case RtfToken::Kind::HexByte: {
            m_star = false;
            const char b = static_cast<char>(t.byte);
            bytes(QByteArrayView(&b, 1), false);
            break;
        }
        case RtfToken::Kind::Text:
            m_star = false;
            bytes(t.text, true);
            break;
        default:
            m_star = false;
            break;
        }
    }

    if (!m_stack.empty()) {
        flush();
        if (top().dest == Dest::FontTable)
            commitFont();
    }
    // Writers end every paragraph with \par, the last one too; that mark opens no new paragraph.
    if (!m_blockHasContent && m_doc->blockCount() > 1) {
        m_cursor.deletePreviousChar();
    } else if (!m_stack.empty()) {
        finishBlock();
    }
    m_cursor.endEditBlock();
    return !m_damaged;
}

void Parser::groupOpen()
{
    m_ucSkip = 0;
    m_star = false;
    if (m_stack.empty()) {
        m_stack.emplace_back();
        return;
    }
    flush();
    if (int(m_stack.size()) >= RtfReader::kMaxDepth) {
        ++m_overflow;
        m_damaged = true;
        return;
    }
    m_stack.push_back(top());
}

void Parser::groupClose()
{
    m_ucSkip = 0;
    m_star = false;
    if (m_stack.empty())
        return;
    flush();
    if (m_overflow > 0) {
        --m_overflow;
        return;
    }
    const State closing = top();
    if (closing.dest == Dest::FontTable)
        commitFont();
    if (m_stack.size() == 1) {
        // The root group is done; whatever follows it is not part of the document.
        m_done = true;
        return;
    }
    m_stack.pop_back();
    State& parent = top();
    if (closing.dest == Dest::Pn && parent.dest != Dest::Pn) {
        ListKind kind = closing.pnKind;
        if (kind == ListKind::None && closing.pnBody)
            kind = ListKind::Decimal;
        parent.para.list = closing.pnCont ? ListKind::None : kind;
    }
}

void Parser::controlWord(const RtfToken& t)
{
    const WordInfo info = lookup(t.name);
    State& st = top();
    if (m_star) {
        m_star = false;
        if (!isDestination(info.word)) {
            st.dest = Dest::Skip; // an optional destination we do not know
            return;
        }
    }
    if (st.dest == Dest::Skip)
        return;
    switch (info.word) {
    case Word::SkipDest:
        st.dest = Dest::Skip;
        return;
    case Word::FontTbl:
        st.dest = Dest::FontTable;
        return;
    case Word::ColorTbl:
        st.dest = Dest::ColorTable;
        return;
    case Word::Pn:
        st.dest = Dest::Pn;
        st.pnKind = ListKind::None;
        st.pnBody = st.pnCont = false;
        return;
    case Word::PnText:
        st.dest = Dest::ListText;
        m_listText.clear();
        return;
    case Word::Upr:
        // Its first part is the 8-bit twin of the \ud part that follows.
        st.dest = Dest::Upr;
        return;
    case Word::Ud:
        if (st.dest == Dest::Upr)
            st.dest = Dest::Text;
        return;
    case Word::U:
        unicode(t.hasParam ? t.param : 0);
        return;
    default:
        break;
    }

    switch (st.dest) {
    case Dest::Text:
        textWord(t, info);
        break;
    case Dest::FontTable:
        if (info.word == Word::F) {
            commitFont();
            m_font.index = t.hasParam ? std::max(0, t.param) : 0;
            m_font.bytes.clear();
            m_font.name.clear();
            m_font.charset = 0;
            m_font.cpg = 0;
            m_font.done = false;
        } else if (info.word == Word::FCharset) {
            m_font.charset = t.param;
        } else if (info.word == Word::Cpg) {
            m_font.cpg = std::max(0, t.param);
        }
        break;
    case Dest::ColorTable: {
        const int component = info.word == Word::Red ? 0 : info.word == Word::Green ? 1 : info.word == Word::Blue ? 2 : -1;
        if (component >= 0) {
            m_rgb[component] = std::clamp(t.param, 0, 255);
            m_rgbSet = true;
        }
        break;
    }
    case Dest::Pn:
        switch (info.word) {
        case Word::PnLvlBlt: st.pnKind = ListKind::Bullet; break;
        case Word::PnLvlBody: st.pnBody = true; break;
        case Word::PnLvlCont: st.pnCont = true; break;
        case Word::PnDec: st.pnKind = ListKind::Decimal; break;
        case Word::PnLcltr: st.pnKind = ListKind::LowerAlpha; break;
        case Word::PnUcltr: st.pnKind = ListKind::UpperAlpha; break;
        case Word::PnLcrm: st.pnKind = ListKind::LowerRoman; break;
        case Word::PnUcrm: st.pnKind = ListKind::UpperRoman; break;
        default: break;
        }
        break;
    default:
        break;
    }
}

void Parser::textWord(const RtfToken& t, const WordInfo& info)
{
    State& st = top();
    const bool on = !t.hasParam || t.param != 0;
    switch (info.word) {
    case Word::Ansi: m_docCodePage = 1252; break;
    case Word::Mac: m_docCodePage = 10000; break;
    case Word::Pc: m_docCodePage = 437; break;
    case Word::Pca: m_docCodePage = 850; break;
    case Word::AnsiCpg:
        if (t.param > 0)
            m_docCodePage = t.param;
        break;
    case Word::Deff: m_defaultFont = std::max(0, t.param); break;
    case Word::F:
        flush();
        st.chr.font = t.hasParam ? std::max(0, t.param) : 0;
        break;
    case Word::Fs:
        flush();
        // Half points; Qt and the writers cap font sizes near 1638 points.
        st.chr.halfPoints = t.param > 0 ? std::clamp(t.param, 2, 3276) : 24;
        break;
    case Word::Cf:
        flush();
        st.chr.color = std::max(0, t.param);
        break;
    case Word::B: flush(); st.chr.bold = on; break;
    case Word::I: flush(); st.chr.italic = on; break;
    case Word::Ul: flush(); st.chr.underline = on; break;
    case Word::UlNone: flush(); st.chr.underline = false; break;
    case Word::Strike: flush(); st.chr.strike = on; break;
    case Word::Plain: flush(); st.chr = CharProps{}; break;
    case Word::Pard: st.para = ParaProps{}; break;
    case Word::Ql: st.para.align = Qt::AlignLeft; break;
    case Word::Qc: st.para.align = Qt::AlignHCenter; break;
    case Word::Qr: st.para.align = Qt::AlignRight; break;
    case Word::Qj: st.para.align = Qt::AlignJustify; break;
    case Word::Ls: st.para.ls = std::max(0, t.param); break;
    case Word::Par: paragraph(); break;
    case Word::Line: appendChar(QChar::LineSeparator); break;
    case Word::Tab: appendChar(u'\t'); break;
    case Word::Char: appendChar(info.ch); break;
    case Word::Uc: st.uc = t.hasParam ? std::clamp(t.param, 0, 16) : 1; break;
    default: break;
    }
}

void Parser::controlSymbol(char symbol)
{
    if (symbol == '*') {
        m_star = true;
        return;
    }
    m_star = false;
    switch (symbol) {
    case '\\':
    case '{':
    case '}':
        bytes(QByteArrayView(&symbol, 1), false);
        break;
    case '~':
        appendChar(0x00A0);
        break;
    case '-':
        appendChar(0x00AD);
        break;
    case '_':
        appendChar(0x2011);
        break;
    case '\n':
        if (top().dest == Dest::Text)
            paragraph();
        break;
    default:
        break; // \: \| and the like carry nothing we show
    }
}

void Parser::bytes(QByteArrayView run, bool literal)
{
    switch (top().dest) {
    case Dest::Text:
        for (char c : run) {
            if (c == '\t')
                appendChar(u'\t');
            else if (static_cast<unsigned char>(c) >= 0x20)
                m_bytes.append(c);
        }
        break;
    case Dest::FontTable:
        for (char c : run) {
            if (m_font.done)
                break;
            if (literal && c == ';')
                commitFont();
            else if (m_font.bytes.size() < kMaxFontNameBytes)
                m_font.bytes.append(c);
        }
        break;
    case Dest::ColorTable:
        if (!literal)
            break;
        for (char c : run) {
            if (c != ';')
                continue;
            if (int(m_colors.size()) < RtfReader::kMaxColors)
                m_colors.push_back(m_rgbSet ? QColor(m_rgb[0], m_rgb[1], m_rgb[2]) : QColor());
            m_rgb[0] = m_rgb[1] = m_rgb[2] = 0;
            m_rgbSet = false;
        }
        break;
    case Dest::ListText:
        m_listText.append(run.first(std::min<qsizetype>(run.size(), kMaxListText - m_listText.size())));
        break;
    default:
        break;
    }
}

void Parser::appendChar(char32_t ch)
{
    if (top().dest == Dest::FontTable) {
        if (!m_font.done) {
            m_codePages.decode(m_font.bytes, m_font.cpg, m_font.name);
            m_font.bytes.clear();
            m_font.name += QString::fromUcs4(&ch, 1);
        }
        return;
    }
    if (top().dest != Dest::Text)
        return;
    decodeBytes();
    m_text += QString::fromUcs4(&ch, 1);
}

void Parser::unicode(int param)
{
    m_ucSkip = top().uc;
    qint64 code = param;
    if (code < 0)
        code += 65536; // writers give code units above 32767 as negative 16-bit numbers
    if (code <= 0 || code > 0x10FFFF)
        return;
    if (code < 0x20 && code != '\t')
        return;
    if (code <= 0xFFFF) {
        // A surrogate half goes in as it is; its partner usually follows and flush() pairs them.
        const char16_t unit = char16_t(code);
        if (top().dest == Dest::Text) {
            decodeBytes();
            m_text += QChar(unit);
        } else {
            appendChar(unit);
        }
        return;
    }
    appendChar(char32_t(code));
}

int Parser::codePage()
{
    const int font = top().chr.font >= 0 ? top().chr.font : m_defaultFont;
    const auto it = m_fonts.constFind(font);
    if (it != m_fonts.constEnd() && it->codePage > 0)
        return it->codePage;
    return m_docCodePage;
}

QTextCharFormat Parser::charFormat()
{
    const CharProps& c = top().chr;
    QTextCharFormat fmt;
    const auto font = m_fonts.constFind(c.font >= 0 ? c.font : m_defaultFont);
    if (font != m_fonts.constEnd() && !font->name.isEmpty())
        fmt.setFontFamilies(QStringList{font->name});
    fmt.setFontPointSize(c.halfPoints / 2.0);
    fmt.setFontWeight(c.bold ? QFont::Bold : QFont::Normal);
    fmt.setFontItalic(c.italic);
    fmt.setFontUnderline(c.underline);
    fmt.setFontStrikeOut(c.strike);
    if (c.color < int(m_colors.size()) && m_colors[size_t(c.color)].isValid())
        fmt.setForeground(m_colors[size_t(c.color)]);
    return fmt;
}

void Parser::decodeBytes()
{
    if (m_bytes.isEmpty())
        return;
    m_codePages.decode(m_bytes, codePage(), m_text);
    m_bytes.clear();
}

void Parser::flush()
{
    decodeBytes();
    if (m_text.isEmpty())
        return;
    // The document takes U+2029 and line feeds as paragraph breaks, U+FDD0/U+FDD1 as frame
    // bounds and U+FFFC as an object, and needs whole surrogate pairs; text from escapes or
    // foreign code pages may hold any of them.
    QString clean;
    clean.reserve(m_text.size());
    for (qsizetype i = 0; i < m_text.size(); ++i) {
        const QChar c = m_text.at(i);
        if (c.isHighSurrogate() && i + 1 < m_text.size() && m_text.at(i + 1).isLowSurrogate()) {
            clean += c;
            clean += m_text.at(++i);
        } else if (c.isSurrogate()) {
            clean += QChar::ReplacementCharacter;
        } else if (c == QChar::ParagraphSeparator) {
            clean += QChar::LineSeparator;
        } else if (c == QChar(0xFDD0) || c == QChar(0xFDD1) || c == QChar::ObjectReplacementCharacter) {
            continue;
        } else if (c.unicode() >= 0x20 || c == u'\t') {
            clean += c;
        }
    }
    m_text.clear();
    if (clean.isEmpty())
        return;
    m_cursor.insertText(clean, charFormat());
    m_blockHasContent = true;
}

void Parser::paragraph()
{
    flush();
    finishBlock();
    m_cursor.insertBlock(QTextBlockFormat(), charFormat());
    m_blockHasContent = false;
}

void Parser::finishBlock()
{
    const ParaProps& p = top().para;
    QTextBlockFormat bf;
    bf.setAlignment(p.align);
    m_cursor.setBlockFormat(bf);
    m_cursor.setBlockCharFormat(charFormat());

    ListKind kind = p.list;
    if (kind == ListKind::None && p.ls > 0) {
        // Newer writers define lists in a table we skip; their visible number tells the kind.
        const bool numbered = std::any_of(m_listText.cbegin(), m_listText.cend(), [](char c) { return c >= '0' && c <= '9'; });
        kind = numbered ? ListKind::Decimal : ListKind::Bullet;
    }
    m_listText.clear();
    if (kind == ListKind::None) {
        m_list = nullptr;
        return;
    }
    if (m_list && m_listKind == kind) {
        m_list->add(m_cursor.block());
    } else {
        QTextListFormat lf;
        lf.setStyle(listStyle(kind));
        m_list = m_cursor.createList(lf);
        m_listKind = kind;
    }
}

void Parser::commitFont()
{
    if (m_font.done || m_font.index < 0)
        return;
    m_font.done = true;
    const int codePage = m_font.cpg > 0 ? m_font.cpg : RtfCodePage::forCharset(m_font.charset);
    m_codePages.decode(m_font.bytes, codePage > 0 ? codePage : m_docCodePage, m_font.name);
    if (m_fonts.size() >= RtfReader::kMaxFonts && !m_fonts.contains(m_font.index))
        return;
    m_fonts.insert(m_font.index, Font{m_font.name.trimmed(), codePage});
}

} // namespace

bool RtfReader::isRtf(const QByteArray& data)
{
    return data.startsWith("{\\rtf");
}

bool RtfReader::read(const QByteArray& data, QTextDocument* doc)
{
    if (!doc)
        return false;
    const bool undo = doc->isUndoRedoEnabled();
    doc->setUndoRedoEnabled(false);
    bool complete = true;
    if (isRtf(data)) {
        Parser parser(data, doc);
        complete = parser.run();
    } else {
        QByteArrayView bytes(data);
        QString text;
        if (bytes.startsWith("\xEF\xBB\xBF")) {
            text = QString::fromUtf8(bytes.sliced(3));
        } else {
            QStringDecoder utf8(QStringConverter::Utf8);
            text = utf8.decode(bytes);
            if (utf8.hasError()) {
                // Not UTF-8: the Windows code page these files come from.
                text.clear();
                RtfCodePage().decode(data, 1252, text);
            }
        }
        text.replace(QStringLiteral("\r\n"), QStringLiteral("\n"));
        text.replace(u'\r', u'\n');
        text.replace(QChar::ParagraphSeparator, u'\n');
        // Same rules as for text inside RTF: no control characters, objects or frame bounds.
        text.removeIf([](QChar c) {
            return (c.unicode() < 0x20 && c != u'\n' && c != u'\t') || c == QChar::ObjectReplacementCharacter
                || c == QChar(0xFDD0) || c == QChar(0xFDD1);
        });
        doc->setPlainText(text);
    }
    doc->setUndoRedoEnabled(undo);
    return complete;
}

} // namespace orvanta
