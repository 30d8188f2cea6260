#include "tests/support/TestRegistry.h"
#include "tests/ui/RtfTestFormats.h"
#include "ui/rtf/RtfReader.h"
#include "ui/rtf/RtfWriter.h"

#include <QRandomGenerator>
#include <QTest>

using namespace orvanta;
using namespace orvanta::test;

namespace {

const QByteArray kNote = "{\\rtf1\\ansi\\ansicpg1252\\deff0{\\fonttbl{\\f0\\fnil\\fcharset0 Calibri;}}\r\n"
                         "{\\colortbl ;\\red255\\green0\\blue0;}\\viewkind4\\uc1 \r\n"
                         "\\pard\\qc\\b\\f0\\fs28 Rechnung\\b0\\par\r\n"
                         "\\pard\\cf1\\fs22 Bitte \\i bis Freitag\\i0  zahlen, sp\\'e4ter \\'fcberweisen.\\par\r\n}\r\n";

QString text(const QTextDocument& doc)
{
    return blockTexts(doc).join(u'\n');
}

// What the writer makes of a document must read back to the same text.
void checkWriterKeepsText(const QTextDocument& doc)
{
    QTextDocument back;
    back.setDefaultFont(doc.defaultFont());
    QVERIFY(RtfReader::read(RtfWriter::write(doc), &back));
    QCOMPARE(text(back), text(doc));
}

} // namespace

class TestRtfRobust : public QObject {
    Q_OBJECT

private Q_SLOTS:
    void truncatedInputShowsWhatWasRead()
    {
        QTextDocument full;
        QVERIFY(RtfReader::read(kNote, &full));
        const QString fullText = text(full);
        for (qsizetype cut = 5; cut < kNote.indexOf("\\par\r\n}"); ++cut) {
            QTextDocument doc;
            QVERIFY2(!RtfReader::read(kNote.left(cut), &doc), "a cut file must be reported as damaged");
            QVERIFY2(fullText.startsWith(text(doc)), qPrintable(QStringLiteral("%1: %2").arg(cut).arg(text(doc))));
        }
    }

    void unbalancedBraces()
    {
        QTextDocument doc;
        // Text after the document's closing brace is not part of it.
        QVERIFY(RtfReader::read("{\\rtf1 A}}} B}", &doc));
        QCOMPARE(text(doc), QStringLiteral("A"));
        QVERIFY(!RtfReader::read("{\\rtf1 {\\b A{\\i B", &doc));
        QCOMPARE(text(doc), QStringLiteral("AB"));
        QCOMPARE(seenAt(doc, 1).italic, true);
    }

    void deepNestingNeitherOverflowsNorLosesText()
    {
        const int depth = 100000;
        QTextDocument doc;
        QVERIFY(!RtfReader::read("{\\rtf1 " + QByteArray(depth, '{') + "\\b tief" + QByteArray(depth, '}') + " flach}", &doc));
        QCOMPARE(text(doc), QStringLiteral("tief flach"));
        QVERIFY(seenAt(doc, 0).bold);
        QVERIFY(!RtfReader::read("{\\rtf1 " + QByteArray(depth, '{') + "offen", &doc));
        QCOMPARE(text(doc), QStringLiteral("offen"));
    }

    void absurdNumbersAreClamped()
    {
        QTextDocument doc;
        QVERIFY(RtfReader::read("{\\rtf1\\ansicpg99999999999{\\fonttbl{\\f-5 Arial;}{\\f99999999999 Big;}}"
                                "\\fs99999999999 A\\fs-7 B\\cf99999999999 C{\\uc99999999999\\u99999999999 0123456789abcdefD}"
                                "\\uc1\\u-99999?E\\f-3\\'fc\\par}",
                                &doc));
        QCOMPARE(text(doc), QStringLiteral("ABCDEü"));
        QCOMPARE(seenAt(doc, 0).points, 1638.0);
        QCOMPARE(seenAt(doc, 1).points, 12.0);
        QVERIFY(!seenAt(doc, 2).color.isValid());
        checkWriterKeepsText(doc);
    }

    void binaryDataIsSkippedWithinBounds()
    {
        QTextDocument doc;
        QVERIFY(RtfReader::read("{\\rtf1 A{\\pict\\bin5 " + QByteArray("\0}\\{x", 5) + "}B\\bin3 {{{C}", &doc));
        QCOMPARE(text(doc), QStringLiteral("ABC"));
        QVERIFY(!RtfReader::read("{\\rtf1 A\\bin99999999999 B}", &doc));
        QCOMPARE(text(doc), QStringLiteral("A"));
        QVERIFY(RtfReader::read("{\\rtf1 A\\bin-5 B}", &doc));
        QCOMPARE(text(doc), QStringLiteral("AB"));
    }

    void tablesAreCapped()
    {
        QByteArray rtf = "{\\rtf1{\\fonttbl";
        for (int i = 0; i < 10000; ++i)
            rtf += "{\\f" + QByteArray::number(i) + " Font" + QByteArray::number(i) + ";}";
        rtf += "}{\\colortbl;";
        for (int i = 0; i < 10000; ++i)
            rtf += "\\red" + QByteArray::number(i % 256) + "\\green1\\blue2;";
        rtf += "}\\f10\\cf7 a\\f9999\\cf9999 b\\par}";
        QTextDocument doc;
        QVERIFY(RtfReader::read(rtf, &doc));
        QCOMPARE(seenAt(doc, 0).family, QStringLiteral("Font10"));
        QCOMPARE(seenAt(doc, 0).color, QColor(6, 1, 2));
        QCOMPARE(seenAt(doc, 1).family, seenFormat(doc, QTextCharFormat()).family);
        QVERIFY(!seenAt(doc, 1).color.isValid());
    }

    void charactersTheDocumentReservesAreDropped()
    {
        // Frame bounds, object markers, paragraph separators, lone surrogates, control codes.
        QTextDocument doc;
        QVERIFY(RtfReader::read("{\\rtf1 a\\u-560?\\u-559?\\u-4?b\\u8233?c\\u-10179?d\\u-8704?\\u-8704?e\\u7?\\u10?f}", &doc));
        QCOMPARE(text(doc), QStringLiteral("ab\u2028c\uFFFDd\uFFFD\uFFFDef"));
        checkWriterKeepsText(doc);
    }

    void randomJunkNeverBreaksReaderOrWriter()
    {
        // Fragments of real RTF shuffled with raw bytes: the fuzz target's check, repeatable.
        const QByteArrayList pieces = {"{", "}", "\\par ", "\\b", "\\b0 ", "\\u8364?", "\\u-10179?", "\\'fc", "\\'",
                                       "\\uc2", "{\\*\\pn\\pnlvlblt}", "{\\fonttbl{\\f1\\fcharset238 X;}}", "\\f1 ",
                                       "{\\colortbl;\\red1;}", "\\cf1", "\\bin3 ", "\\pard", "\\qc", "\\ls1",
                                       "{\\pntext x}", "\\line", "\\tab", "text ", "\\", "\\fs", "\x80\xff\x01\n\r"};
        QRandomGenerator random(4711);
        for (int round = 0; round < 300; ++round) {
            QByteArray input = "{\\rtf1 ";
            const int count = random.bounded(1, 200);
            for (int i = 0; i < count; ++i) {
                if (random.bounded(4) == 0)
                    input += char(random.bounded(256));
                else
                    input += pieces.at(random.bounded(pieces.size()));
            }
            QTextDocument doc;
            RtfReader::read(input, &doc);
            checkWriterKeepsText(doc);
            if (QTest::currentTestFailed()) {
                qWarning("input: %s", input.toPercentEncoding().constData());
                return;
            }
        }
    }
};

ORVANTA_TEST(TestRtfRobust)
#include "tst_rtfrobust.moc"
