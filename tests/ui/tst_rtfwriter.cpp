#include "platform/AppException.h"
#include "tests/support/TestRegistry.h"
#include "tests/ui/RtfTestFormats.h"
#include "ui/rtf/RtfReader.h"
#include "ui/rtf/RtfText.h"
#include "ui/rtf/RtfWriter.h"

#include <QTemporaryDir>
#include <QTest>
#include <QTextEdit>

using namespace orvanta;
using namespace orvanta::test;

namespace {

QTextCharFormat charFormat(const QString& family, qreal points, QFont::Weight weight = QFont::Normal)
{
    QTextCharFormat f;
    if (!family.isEmpty())
        f.setFontFamilies({family});
    if (points > 0)
        f.setFontPointSize(points);
    f.setFontWeight(weight);
    return f;
}

QTextBlockFormat aligned(Qt::Alignment a)
{
    QTextBlockFormat f;
    f.setAlignment(a);
    return f;
}

// A note using everything the editors can set.
void buildNote(QTextDocument& doc)
{
    doc.setDefaultFont(QFont(QStringLiteral("Arial"), 8));
    QTextCursor c(&doc);
    c.setBlockFormat(aligned(Qt::AlignHCenter));
    QTextCharFormat heading = charFormat(QStringLiteral("Verdana"), 14, QFont::Bold);
    heading.setForeground(QColor(0, 0, 200));
    c.insertText(QStringLiteral("Überschrift"), heading);

    c.insertBlock(aligned(Qt::AlignLeft), QTextCharFormat());
    c.insertText(QStringLiteral("Standard "), QTextCharFormat());
    QTextCharFormat f = charFormat(QStringLiteral("Times New Roman"), 10.5);
    f.setFontItalic(true);
    c.insertText(QStringLiteral("kursiv "), f);
    f.setFontUnderline(true);
    f.setForeground(QColor(255, 0, 0));
    c.insertText(QStringLiteral("unterstrichen "), f);
    f.setFontItalic(false);
    f.setFontUnderline(false);
    f.setFontStrikeOut(true);
    c.insertText(QStringLiteral("durch"), f);
    f.setForeground(QColor(0, 0, 0)); // explicit black is not the automatic colour
    f.setFontStrikeOut(false);
    c.insertText(QStringLiteral(" schwarz"), f);
    c.insertText(QStringLiteral(" Grüße € 中文 😀 \t\\{};\u00A0\u00AD\u2011\u0085\u2028neue Zeile"),
                 charFormat(QStringLiteral("Ségoe Ünï"), 72));
    c.insertText(QStringLiteral(" 你好"), charFormat(QStringLiteral("微软雅黑"), 9));

    QTextCharFormat emptyLine = charFormat(QString(), 20);
    c.insertBlock(aligned(Qt::AlignRight), emptyLine);

    c.insertBlock(aligned(Qt::AlignLeft), QTextCharFormat());
    c.insertText(QStringLiteral("Eins"));
    c.createList(QTextListFormat::ListDisc);
    c.insertBlock();
    c.insertText(QStringLiteral("Zwei"), charFormat(QString(), 0, QFont::Bold));

    c.insertBlock(aligned(Qt::AlignLeft), QTextCharFormat());
    c.insertText(QStringLiteral("Erstens"));
    c.createList(QTextListFormat::ListDecimal);
    c.insertBlock();
    c.insertText(QStringLiteral("Zweitens"));

    c.insertBlock(aligned(Qt::AlignJustify), QTextCharFormat());
    c.insertText(QStringLiteral("Blocksatz am Ende"));
    c.insertBlock(aligned(Qt::AlignLeft), QTextCharFormat());
}

// Text, paragraph properties, list membership and every character's format must agree.
void compareDocuments(const QTextDocument& expected, const QTextDocument& actual)
{
    QCOMPARE(blockTexts(actual), blockTexts(expected));
    QTextBlock e = expected.begin();
    QTextBlock a = actual.begin();
    for (; e.isValid(); e = e.next(), a = a.next()) {
        QCOMPARE(alignmentOf(a), alignmentOf(e));
        QCOMPARE(listStyleOf(a), listStyleOf(e));
        const bool eContinues = e.textList() && e.previous().isValid() && e.previous().textList() == e.textList();
        const bool aContinues = a.textList() && a.previous().isValid() && a.previous().textList() == a.textList();
        QCOMPARE(aContinues, eContinues);
        for (int i = 0; i < e.length() - 1; ++i) {
            const SeenFormat want = seenAt(expected, e.position() + i);
            const SeenFormat got = seenAt(actual, a.position() + i);
            if (!(got == want)) {
                qWarning() << "block" << e.blockNumber() << "char" << i << e.text().mid(i, 1);
                QCOMPARE(got, want);
            }
        }
    }
}

bool bracesBalanced(const QByteArray& rtf)
{
    int depth = 0;
    for (qsizetype i = 0; i < rtf.size(); ++i) {
        if (rtf[i] == '\\')
            ++i;
        else if (rtf[i] == '{')
            ++depth;
        else if (rtf[i] == '}' && --depth < 0)
            return false;
    }
    return depth == 0;
}

} // namespace

class TestRtfWriter : public QObject {
    Q_OBJECT

private Q_SLOTS:
    void roundTripKeepsTextAndFormats()
    {
        QTextDocument doc;
        buildNote(doc);
        const QByteArray rtf = RtfWriter::write(doc);
        QTextDocument back;
        back.setDefaultFont(doc.defaultFont()); // as in an editor of the same kind
        QVERIFY(RtfReader::read(rtf, &back));
        compareDocuments(doc, back);
        if (QTest::currentTestFailed())
            qWarning("%s", rtf.constData());
        // Nothing is lost or added on a second pass either.
        QCOMPARE(RtfWriter::write(back), rtf);
    }

    void outputIsPlainAsciiRtfOtherProgramsOpen()
    {
        QTextDocument doc;
        buildNote(doc);
        const QByteArray rtf = RtfWriter::write(doc);
        QVERIFY(rtf.startsWith("{\\rtf1\\ansi\\ansicpg1252\\deff0"));
        QVERIFY(rtf.contains("{\\fonttbl{\\f0\\fnil\\fcharset0 Arial;}"));
        QVERIFY(rtf.contains("{\\colortbl ;\\red0\\green0\\blue200;"));
        QVERIFY(bracesBalanced(rtf));
        QVERIFY(std::all_of(rtf.cbegin(), rtf.cend(), [](char c) { return uchar(c) < 0x80; }));
        // 8-bit text as code-page escapes, the rest as signed 16-bit \u with a fallback.
        QVERIFY(rtf.contains("Gr\\'fc\\'dfe \\u8364? \\u20013?\\u25991? \\u-10179?\\u-8704?"));
        QVERIFY(rtf.contains("S\\'e9goe \\'dcn\\'ef;"));
        // Bullets in the form rich-edit controls write, with a visible marker for the rest.
        QVERIFY(rtf.contains("{\\pntext\\f"));
        QVERIFY(rtf.contains("\\pnlvlblt"));
        QVERIFY(rtf.endsWith("\\par\r\n}\r\n"));
    }

    void defaultFontOfTheEditorIsWrittenOut()
    {
        QTextEdit edit;
        edit.setFont(QFont(QStringLiteral("Arial"), 8));
        edit.insertPlainText(QStringLiteral("Notiz\nzweite Zeile"));
        const QByteArray rtf = RtfText::content(edit);
        QVERIFY(rtf.contains("\\fs16"));

        // Another editor with another default shows the note as it was written.
        QTextEdit other;
        other.setFont(QFont(QStringLiteral("Courier"), 20));
        QVERIFY(RtfText::setContent(&other, rtf));
        QCOMPARE(other.toPlainText(), QStringLiteral("Notiz\nzweite Zeile"));
        QCOMPARE(seenAt(*other.document(), 0).family, QStringLiteral("Arial"));
        QCOMPARE(seenAt(*other.document(), 0).points, 8.0);
        QVERIFY(!other.document()->isModified());
        QCOMPARE(other.textCursor().position(), 0);
    }

    void emptyDocumentsStayEmpty()
    {
        QTextDocument doc;
        QTextDocument back;
        QTextCursor(&back).insertText(QStringLiteral("alt"));
        QVERIFY(RtfReader::read(RtfWriter::write(doc), &back));
        QCOMPARE(back.toPlainText(), QString());
        QCOMPARE(back.blockCount(), 1);
    }

    void filesRoundTripAndFailuresAreReported()
    {
        QTemporaryDir dir;
        QVERIFY(dir.isValid());
        QTextDocument doc;
        buildNote(doc);
        const QString path = dir.filePath(QStringLiteral("kalenderinfo.rtf"));
        RtfText::saveFile(path, doc);
        QTextEdit edit;
        QVERIFY(RtfText::loadFile(path, &edit));
        compareDocuments(doc, *edit.document());

        QVERIFY_THROWS_EXCEPTION(AppException, RtfText::loadFile(dir.filePath(QStringLiteral("fehlt.rtf")), &doc));
        try {
            RtfText::saveFile(dir.filePath(QStringLiteral("kein/ordner.rtf")), doc);
            QFAIL("saving into a missing folder must fail");
        } catch (const AppException& e) {
            QVERIFY2(e.message().contains(QStringLiteral("ordner.rtf")), qPrintable(e.message()));
        }
        // A failed load leaves the document as it was.
        QCOMPARE(blockTexts(doc).first(), QStringLiteral("Überschrift"));
    }
};

ORVANTA_TEST(TestRtfWriter)
#include "tst_rtfwriter.moc"
