#include "tests/support/TestRegistry.h"
#include "ui/markup/MarkupDocument.h"
#include "ui/markup/MarkupPanel.h"

#include <QAbstractTextDocumentLayout>
#include <QRandomGenerator>
#include <QSignalSpy>
#include <QTest>
#include <QTextBlock>
#include <QTextDocument>

using namespace orvanta;

namespace {

// Each text fragment of a block as "text|flags", flags b u i a(href) c(#rgb).
QStringList fragments(const QTextBlock& block)
{
    QStringList out;
    for (auto it = block.begin(); !it.atEnd(); ++it) {
        const QTextFragment f = it.fragment();
        const QTextCharFormat cf = f.charFormat();
        QString flags;
        if (cf.fontWeight() == QFont::Bold)
            flags += u'b';
        if (cf.fontUnderline())
            flags += u'u';
        if (cf.fontItalic())
            flags += u'i';
        if (cf.isAnchor())
            flags += QStringLiteral("a(%1)").arg(cf.anchorHref());
        if (cf.isImageFormat())
            flags += QStringLiteral("img(%1)").arg(cf.toImageFormat().name());
        out << f.text() + u'|' + flags;
    }
    return out;
}

QList<qreal> tabs(const QTextBlock& block)
{
    QList<qreal> out;
    for (const QTextOption::Tab& t : block.blockFormat().tabPositions())
        out << t.position;
    return out;
}

} // namespace

class TestMarkup final : public QObject {
    Q_OBJECT

private Q_SLOTS:
    void noticeTextBecomesLinesWithBoldAndIndents()
    {
        const QString notice = QStringLiteral(
            "Sie können die Vorgabe übernehemen oder eine eigene möglichst treffende und<BR>aussagekräftige Kontaktbezeichnung eingeben."
            "<BR>Als Richtlinie  ist folgendes zu empfehlen:<BR><BR><IND x=\"5\"><B>'Name, Vorname'</B><IND x=\"155\">bei Kontakten "
            "ohne Firmenangabe oder<BR><IND x=\"5\"><B>'Firma'</B><IND x=\"155\">bei Kontakten ohne Personenangabe.<BR>");
        QTextDocument doc;
        buildMarkupDocument(doc, notice, {}, QPalette());
        QCOMPARE(doc.blockCount(), 7);
        QCOMPARE(doc.findBlockByNumber(2).text(), QStringLiteral("Als Richtlinie  ist folgendes zu empfehlen:"));
        QCOMPARE(doc.findBlockByNumber(3).text(), QString());
        const QTextBlock name = doc.findBlockByNumber(4);
        QCOMPARE(name.text(), QStringLiteral("\t'Name, Vorname'\tbei Kontakten ohne Firmenangabe oder"));
        QCOMPARE(tabs(name), (QList<qreal>{5, 155}));
        QCOMPARE(fragments(name), (QStringList{"\t|", "'Name, Vorname'|b", "\tbei Kontakten ohne Firmenangabe oder|"}));
        QCOMPARE(doc.findBlockByNumber(6).text(), QString());
        // The indented text starts at its tab stop.
        QVERIFY(doc.size().width() > 155); // lays the document out
        const QTextLayout* layout = doc.findBlockByNumber(5).layout();
        QCOMPARE(layout->lineCount(), 1);
        QVERIFY(layout->lineAt(0).cursorToX(1) >= 5 - 1);  // after the first tab
        QVERIFY(layout->lineAt(0).cursorToX(9) >= 155 - 1); // after "\t'Firma'\t"
        QVERIFY(layout->lineAt(0).cursorToX(9) < 155 + 10);
    }

    void entitiesAnchorsColoursAndImages()
    {
        QPixmap icon(24, 24);
        icon.fill(Qt::blue);
        QTextDocument doc;
        buildMarkupDocument(doc,
                            QStringLiteral("<BR>  <IMG src=\"idx:0\" align=\"middle\">  <B>Meier  -  Kunden</B><BR>"
                                           "auch &quot;hartes Ablehnen&quot; &amp; &lt;mehr&gt;&#228;<BR>"
                                           "<U>Kontakt</U> <I><A href=\"Web_www.x.de\">www.x.de</A></I> "
                                           "<FONT color=\"clred\">(automatisch Ablehnen)</FONT> <FONT color=\"clNavy\">n</FONT>"
                                           "<font color=\"$00FF00\">g</font><FONT color=\"nonsense\">x</FONT>y"),
                            {icon}, QPalette());
        QCOMPARE(doc.blockCount(), 4);
        QCOMPARE(fragments(doc.findBlockByNumber(1)),
                 (QStringList{"  |", QString(QChar::ObjectReplacementCharacter) + "|img(idx:0)", "  |", "Meier  -  Kunden|b"}));
        QVERIFY(!doc.resource(QTextDocument::ImageResource, QUrl(QStringLiteral("idx:0"))).isNull());
        QCOMPARE(doc.findBlockByNumber(2).text(), QStringLiteral("auch \"hartes Ablehnen\" & <mehr>ä"));
        const QTextBlock line = doc.findBlockByNumber(3);
        QCOMPARE(fragments(line).mid(0, 3), (QStringList{"Kontakt|u", " |", "www.x.de|uia(Web_www.x.de)"}));
        QColor red, navy, green, plain;
        for (auto it = line.begin(); !it.atEnd(); ++it) {
            const QString t = it.fragment().text();
            const QColor c = it.fragment().charFormat().foreground().color();
            if (t == u"(automatisch Ablehnen)")
                red = c;
            else if (t == u"n")
                navy = c;
            else if (t == u"g")
                green = c;
            else if (t == u"xy")
                plain = c;
        }
        QCOMPARE(red, QColor(0xFF, 0, 0));
        QCOMPARE(navy, QColor(0, 0, 0x80));
        QCOMPARE(green, QColor(0, 0xFF, 0)); // Delphi hex is $BBGGRR
        QCOMPARE(plain, QPalette().color(QPalette::WindowText)); // unknown colour: unchanged, and closes
    }

    void brokenMarkupIsShownNotLost_data()
    {
        QTest::addColumn<QString>("markup");
        QTest::addColumn<QString>("text");
        QTest::newRow("less-than") << "a < b und c>d" << "a < b und c>d";
        QTest::newRow("unclosed tag") << "x <B fett" << "x <B fett";
        QTest::newRow("unknown tags") << "<BLINK>an</BLINK><TABLE border=1><P>" << "an";
        QTest::newRow("close without open") << "</B></U></I></A></FONT>text" << "text";
        QTest::newRow("unknown entity") << "&bogus; & &#xZZ; &#0;" << "&bogus; & &#xZZ; &#0;";
        QTest::newRow("image out of range") << "<IMG src=\"idx:7\"><IMG src=\"idx:-1\"><IMG src=\"x\"><IMG>" << "";
        QTest::newRow("bad indent") << "<IND x=\"abc\">a<IND x=-4>b<IND>c" << "abc";
        QTest::newRow("raw line breaks ignored") << "eins\r\nzwei" << "einszwei";
        QTest::newRow("empty") << "" << "";
    }

    void brokenMarkupIsShownNotLost()
    {
        QFETCH(QString, markup);
        QFETCH(QString, text);
        QTextDocument doc;
        buildMarkupDocument(doc, markup, {}, QPalette());
        QCOMPARE(doc.toPlainText(), text);
    }

    void randomInputNeverCrashes()
    {
        const QString alphabet = QStringLiteral("<>/=\"' &;#xBRUIAINDFONTIMGhrefcolorsrcidx:0123456789äß\r\n");
        auto* rng = QRandomGenerator::global();
        QTextDocument doc;
        for (int round = 0; round < 2000; ++round) {
            QString s;
            const int len = rng->bounded(60);
            for (int i = 0; i < len; ++i)
                s += alphabet[rng->bounded(int(alphabet.size()))];
            buildMarkupDocument(doc, s, {}, QPalette());
            QVERIFY(doc.blockCount() >= 1);
        }
    }

    void panelReportsAnchorClicks()
    {
        MarkupPanel panel;
        panel.setLines({QStringLiteral("<BR>"), QStringLiteral("<IND x=\"35\"><A href=\"Notiz_12\">Notizen</A><BR>"),
                        QStringLiteral("<IND x=\"35\"><A href=\"Mail_a@b.de\">a@b.de</A>")});
        panel.resize(panel.sizeHint() + QSize(20, 20));
        panel.show();
        QVERIFY(panel.sizeHint().width() > 35);
        QSignalSpy clicks(&panel, &MarkupPanel::anchorClicked);
        const auto anchorPoint = [&](int blockNumber) {
            const QTextBlock b = panel.document()->findBlockByNumber(blockNumber);
            const QRectF r = panel.document()->documentLayout()->blockBoundingRect(b);
            const QTextLine line = b.layout()->lineAt(0);
            return QPoint(int(r.left() + line.cursorToX(3)), int(r.top() + line.height() / 2));
        };
        QCOMPARE(panel.anchorAt(anchorPoint(1)), QStringLiteral("Notiz_12"));
        QTest::mouseClick(&panel, Qt::LeftButton, {}, anchorPoint(2));
        QCOMPARE(clicks.count(), 1);
        QCOMPARE(clicks.at(0).at(0).toString(), QStringLiteral("Mail_a@b.de"));
        // Pressing on one anchor and releasing elsewhere clicks nothing.
        QTest::mousePress(&panel, Qt::LeftButton, {}, anchorPoint(1));
        QTest::mouseRelease(&panel, Qt::LeftButton, {}, QPoint(1, 1));
        QCOMPARE(clicks.count(), 1);
        QCOMPARE(panel.text(), QStringLiteral("<BR><IND x=\"35\"><A href=\"Notiz_12\">Notizen</A><BR><IND x=\"35\"><A href=\"Mail_a@b.de\">a@b.de</A>"));
        // Rendering puts ink on the panel.
        const QImage img = panel.grab().toImage();
        bool ink = false;
        for (int y = 0; y < img.height() && !ink; ++y)
            for (int x = 0; x < img.width() && !ink; ++x)
                ink = img.pixelColor(x, y) != img.pixelColor(0, 0);
        QVERIFY(ink);
    }
};

ORVANTA_TEST(TestMarkup)
#include "tst_markup.moc"
