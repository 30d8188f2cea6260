#include "tests/support/TestRegistry.h"
#include "tests/ui/RtfTestFormats.h"
#include "ui/rtf/RtfCodePage.h"
#include "ui/rtf/RtfReader.h"

#include <QStringDecoder>
#include <QTest>

using namespace orvanta;
using namespace orvanta::test;

namespace {

// A note as the rich-edit control of the old contact editor stored it.
const QByteArray kRichEditNote = "{\\rtf1\\ansi\\ansicpg1252\\deff0\\deflang1031{\\fonttbl{\\f0\\fswiss\\fcharset0 Arial;}}\r\n"
                                 "{\\*\\generator Msftedit 5.41.21.2510;}\\viewkind4\\uc1\\pard\\f0\\fs16 Gr\\'fc\\'dfe an "
                                 "M\\'fcller\\par\r\n}\r\n";

// WordPad: font and colour tables, a centred heading, formatting toggled on and off.
const QByteArray kWordPad =
    "{\\rtf1\\ansi\\ansicpg1252\\deff0\\nouicompat\\deflang1031{\\fonttbl{\\f0\\fnil\\fcharset0 Calibri;}"
    "{\\f1\\fnil\\fcharset0 Times New Roman;}}\r\n"
    "{\\colortbl ;\\red255\\green0\\blue0;\\red0\\green77\\blue187;}\r\n"
    "{\\*\\generator Riched20 10.0.19041}\\viewkind4\\uc1 \r\n"
    "\\pard\\sa200\\sl276\\slmult1\\qc\\b\\f0\\fs28\\lang7 Rechnung\\b0\\par\r\n"
    "\\pard\\sa200\\sl276\\slmult1\\cf1\\f1\\fs22 Bitte \\i bis Freitag\\i0  \\ul zahlen\\ulnone , \\strike nicht"
    "\\strike0  sp\\'e4ter.\\cf2\\par\r\n"
    "\\qr\\cf0\\fs20 Gru\\'df\\par\r\n}\r\n";

// WordPad's bullets: the marker in \pntext, the list definition in \pn.
const QByteArray kBullets = "{\\rtf1\\ansi\\ansicpg1252\\deff0{\\fonttbl{\\f0\\fnil\\fcharset0 Arial;}{\\f1\\fnil\\fcharset2 "
                            "Symbol;}}\r\n\\viewkind4\\uc1\\pard\\f0\\fs20 Einkauf:\\par\r\n"
                            "{\\pntext\\f1\\'B7\\tab}{\\*\\pn\\pnlvlblt\\pnf1\\pnindent0{\\pntxtb\\'B7}}\\fi-360\\li720 "
                            "Milch\\par\r\n{\\pntext\\f1\\'B7\\tab}Brot\\par\r\n\\pard Ende\\par\r\n}\r\n";

QString read(const QByteArray& rtf, QTextDocument& doc, bool expectComplete = true)
{
    const bool complete = RtfReader::read(rtf, &doc);
    if (complete != expectComplete)
        qWarning("read() returned %d for %s", complete, rtf.left(200).constData());
    return blockTexts(doc).join(u'\n');
}

SeenFormat format(const char* family, qreal points, const char* styles = "", QColor color = QColor())
{
    const QByteArray s(styles);
    return SeenFormat{QString::fromLatin1(family), points, s.contains('b'), s.contains('i'), s.contains('u'),
                      s.contains('s'), color};
}

} // namespace

class TestRtfReader : public QObject {
    Q_OBJECT

private Q_SLOTS:
    void richEditNoteWithUmlauts()
    {
        QTextDocument doc;
        QVERIFY(RtfReader::read(kRichEditNote, &doc));
        // The closing \par ends the paragraph and opens no empty one.
        QCOMPARE(blockTexts(doc), QStringList{QStringLiteral("Grüße an Müller")});
        QCOMPARE(seenAt(doc, 0), format("Arial", 8));
        QCOMPARE(seenAt(doc, 14), format("Arial", 8));
    }

    void wordPadFontsColoursAndAlignment()
    {
        QTextDocument doc;
        QVERIFY(RtfReader::read(kWordPad, &doc));
        QCOMPARE(blockTexts(doc), QStringList({QStringLiteral("Rechnung"),
                                               QStringLiteral("Bitte bis Freitag zahlen, nicht später."),
                                               QStringLiteral("Gruß")}));
        const QColor red(255, 0, 0);
        QCOMPARE(seenAt(doc, QStringLiteral("Rechnung")), format("Calibri", 14, "b"));
        QCOMPARE(seenAt(doc, QStringLiteral("Bitte")), format("Times New Roman", 11, "", red));
        QCOMPARE(seenAt(doc, QStringLiteral("Freitag")), format("Times New Roman", 11, "i", red));
        QCOMPARE(seenAt(doc, QStringLiteral("zahlen")), format("Times New Roman", 11, "u", red));
        QCOMPARE(seenAt(doc, QStringLiteral(", ")), format("Times New Roman", 11, "", red));
        QCOMPARE(seenAt(doc, QStringLiteral("nicht")), format("Times New Roman", 11, "s", red));
        QCOMPARE(seenAt(doc, QStringLiteral("später")), format("Times New Roman", 11, "", red));
        QCOMPARE(seenAt(doc, QStringLiteral("Gruß")), format("Times New Roman", 10));

        QCOMPARE(alignmentOf(doc.findBlockByNumber(0)), Qt::AlignHCenter);
        QCOMPARE(alignmentOf(doc.findBlockByNumber(1)), Qt::AlignLeft);
        // Paragraph formatting carries on after \par until \pard.
        QCOMPARE(alignmentOf(doc.findBlockByNumber(2)), Qt::AlignRight);
    }

    void bulletedList()
    {
        QTextDocument doc;
        QVERIFY(RtfReader::read(kBullets, &doc));
        QCOMPARE(blockTexts(doc), QStringList({QStringLiteral("Einkauf:"), QStringLiteral("Milch"),
                                               QStringLiteral("Brot"), QStringLiteral("Ende")}));
        const QTextBlock milch = doc.findBlockByNumber(1);
        const QTextBlock brot = doc.findBlockByNumber(2);
        QVERIFY(milch.textList());
        QCOMPARE(milch.textList()->format().style(), QTextListFormat::ListDisc);
        QCOMPARE(brot.textList(), milch.textList());
        QCOMPARE(milch.textList()->count(), 2);
        QVERIFY(!doc.findBlockByNumber(0).textList());
        QVERIFY(!doc.findBlockByNumber(3).textList());
    }

    void newerListsAndNumbering()
    {
        // Word and LibreOffice: list table skipped, \ls with a visible \listtext marker.
        const QByteArray rtf =
            "{\\rtf1\\ansi\\deff0{\\fonttbl{\\f0 Arial;}}{\\*\\listtable{\\list\\listtemplateid1{\\listlevel"
            "\\levelnfc23{\\leveltext\\'01\\u8226 ?;}}\\listid1}}{\\listoverridetable{\\listoverride\\listid1\\ls1}}"
            "{\\listtext\\pard\\plain \\u8226\\tab}\\pard\\ls1 Eins\\par {\\listtext 1.\\tab}\\pard\\ls2 Zwei\\par"
            "{\\pntext 2.\\tab}{\\*\\pn\\pnlvlbody\\pndec\\pnstart1}Drei\\par}";
        QTextDocument doc;
        QCOMPARE(read(rtf, doc), QStringLiteral("Eins\nZwei\nDrei"));
        QCOMPARE(listStyleOf(doc.findBlockByNumber(0)), int(QTextListFormat::ListDisc));
        QCOMPARE(listStyleOf(doc.findBlockByNumber(1)), int(QTextListFormat::ListDecimal));
        QCOMPARE(doc.findBlockByNumber(2).textList(), doc.findBlockByNumber(1).textList());
    }

    void unicodeEscapesAndFallbacks()
    {
        const QByteArray rtf = "{\\rtf1\\ansi\\ansicpg1252\\deff0{\\fonttbl{\\f0\\fnil Arial;}}\\uc1\\pard\\f0\\fs20 "
                               "Preis: 20 \\u8364? netto; \\uc2\\u20013\\'d6\\'d0 und {\\uc0\\u8212}\\u8212\\'97\\'97 "
                               "\\uc1\\u-10179?\\u-8704? \\u-1022?\\par}";
        QTextDocument doc;
        QCOMPARE(read(rtf, doc), QStringLiteral("Preis: 20 € netto; 中 und —— 😀 \uFC02"));
    }

    void codePagesFromDocumentAndFont()
    {
        // Czech rich edit; a Cyrillic font in a Western document; a byte the font's set lacks.
        const QByteArray rtf = "{\\rtf1\\ansi\\ansicpg1250\\deff0{\\fonttbl{\\f0\\fswiss\\fcharset238 Arial CE;}"
                               "{\\f1\\fswiss\\fcharset204 Arial Cyr;}{\\f2\\fnil\\fcharset0 Courier;}}"
                               "\\f0 \\'8akoda \\'9f\\'e8 {\\f1 \\'cf\\'f0\\'e8\\'e2\\'e5\\'f2} \\f2 \\'e8\\par}";
        QTextDocument doc;
        QCOMPARE(read(rtf, doc), QStringLiteral("Škoda źč Привет č"));
        QCOMPARE(seenAt(doc, QStringLiteral("Привет")).family, QStringLiteral("Arial Cyr"));

        const QByteArray western = "{\\rtf1\\ansi{\\fonttbl{\\f0 Arial;}}\\'80 \\'84\\'93\\'94 \\'fc\\par}";
        QCOMPARE(read(western, doc), QStringLiteral("€ „“” ü"));
    }

    void builtInCodePagesMatchTheSystemTables()
    {
        // Where the toolkit brings its own tables, ours must agree on every defined byte.
        for (int cp : {1250, 1251, 1252}) {
            QStringDecoder system(QByteArray("windows-" + QByteArray::number(cp)).constData());
            if (!system.isValid())
                continue;
            for (int b = 0x80; b < 0x100; ++b) {
                const char byte = char(b);
                const QString expected = system.decode(QByteArrayView(&byte, 1));
                system.resetState();
                if (expected.size() != 1 || expected.at(0) == QChar::ReplacementCharacter || expected.at(0).unicode() < 0xA0)
                    continue; // undefined in that code page
                QCOMPARE(QChar(RtfCodePage::builtIn(cp, uchar(b))), expected.at(0));
            }
        }
    }

    void skipsWhatIsNotText()
    {
        const QByteArray rtf =
            "{\\rtf1\\ansi\\deff0{\\fonttbl{\\f0\\froman{\\*\\panose 02020603050405020304}Times;}}"
            "{\\stylesheet{\\s0 Normal;}}{\\info{\\title Titel}{\\author Jemand}}{\\*\\unknowndest geheim}"
            "{\\header Kopf\\par}A{\\pict\\wmetafile8\\picw10 0a0b\\bin6 {}}\\{x}B"
            "{\\object\\objemb{\\*\\objdata 0102}{\\result Bild}}C{\\field{\\*\\fldinst HYPERLINK \"x\"}"
            "{\\fldrslt Link}} \\\\ \\{ \\} \\~\\-\\_ x\\line y\\tab z\\emdash \\unknownword7 "
            "{\\upr{ansi}{\\*\\ud{wide}}}\\par}";
        QTextDocument doc;
        QCOMPARE(read(rtf, doc), QStringLiteral("ABCLink \\ { } \u00A0\u00AD\u2011 x\u2028y\tz\u2014wide"));
    }

    void plainCharacterFormattingResets()
    {
        const QByteArray rtf = "{\\rtf1\\ansi\\deff1{\\fonttbl{\\f0 Courier;}{\\f1 Verdana;}}{\\colortbl;\\red0\\green128"
                               "\\blue0;}\\f0\\fs40\\b\\i\\ul\\strike\\cf1 X{\\b0 Y}Z\\plain W\\b1 V\\b0\\ul0 U\\par}";
        QTextDocument doc;
        QCOMPARE(read(rtf, doc), QStringLiteral("XYZWVU"));
        QCOMPARE(seenAt(doc, 0), format("Courier", 20, "bius", QColor(0, 128, 0)));
        QCOMPARE(seenAt(doc, 1), format("Courier", 20, "ius", QColor(0, 128, 0)));
        QCOMPARE(seenAt(doc, 2), format("Courier", 20, "bius", QColor(0, 128, 0)));
        QCOMPARE(seenAt(doc, 3), format("Verdana", 12)); // \plain: default font, 12 pt
        QCOMPARE(seenAt(doc, 4), format("Verdana", 12, "b"));
        QCOMPARE(seenAt(doc, 5), format("Verdana", 12));
    }

    void emptyParagraphsSurvive()
    {
        QTextDocument doc;
        QCOMPARE(read("{\\rtf1 A\\par\\par B\\par\\par}", doc), QStringLiteral("A\n\nB\n"));
        QCOMPARE(read("{\\rtf1 A\\par B}", doc), QStringLiteral("A\nB"));
        QCOMPARE(read("{\\rtf1 \\par}", doc), QString());
        QCOMPARE(doc.blockCount(), 1);
    }

    void plainTextIsLoadedAsIs()
    {
        QTextDocument doc;
        QVERIFY(RtfReader::read("Zeile 1\r\nZeile {2}\\b\rZeile 3", &doc));
        QCOMPARE(blockTexts(doc), QStringList({QStringLiteral("Zeile 1"), QStringLiteral("Zeile {2}\\b"),
                                               QStringLiteral("Zeile 3")}));
        QVERIFY(RtfReader::read("M\xfcller \x80", &doc)); // not UTF-8: Windows-1252
        QCOMPARE(doc.toPlainText(), QStringLiteral("Müller €"));
        QVERIFY(RtfReader::read("\xEF\xBB\xBFM\xC3\xBCller", &doc));
        QCOMPARE(doc.toPlainText(), QStringLiteral("Müller"));
        QVERIFY(!RtfReader::isRtf(" {\\rtf1}"));
    }

    void loadingReplacesContentAndIsNotUndoable()
    {
        QTextDocument doc;
        QTextCursor(&doc).insertText(QStringLiteral("alt"));
        QVERIFY(doc.isUndoAvailable());
        QVERIFY(RtfReader::read(kRichEditNote, &doc));
        QCOMPARE(doc.toPlainText(), QStringLiteral("Grüße an Müller"));
        QVERIFY(!doc.isUndoAvailable());
        QVERIFY(doc.isUndoRedoEnabled());
    }
};

ORVANTA_TEST(TestRtfReader)
#include "tst_rtfreader.moc"
