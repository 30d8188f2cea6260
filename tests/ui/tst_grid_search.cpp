#include "tests/support/TestRegistry.h"
#include "ui/grid/GridCollation.h"
#include "ui/grid/GridController.h"
#include "ui/grid/GridSearch.h"
#include "ui/grid/MemoryGridSource.h"

#include <QTest>

using namespace orvanta;

namespace {

// Names with umlauts, ß and wildcard characters; a date and a computed column.
std::unique_ptr<MemoryGridSource> makeNames()
{
    auto src = std::make_unique<MemoryGridSource>(std::vector<MemoryGridSource::Field>{
        {QStringLiteral("NAME"), GridFieldType::Text},
        {QStringLiteral("TSDATE"), GridFieldType::Date},
        {QStringLiteral("STATUS"), GridFieldType::Text},
    });
    const QStringList names = {QStringLiteral("Müller"), QStringLiteral("Muller"), QStringLiteral("Straße 5"),
                               QStringLiteral("STRASSE 7"), QStringLiteral("50% Rabatt"), QStringLiteral("a_b"),
                               QStringLiteral("Meier \"Sepp\""), QStringLiteral("Ærø"), QString()};
    for (int i = 0; i < names.size(); ++i) {
        const quint32 r = src->appendRow();
        if (!names[i].isEmpty())
            src->setText(r, 0, names[i]);
        src->setDate(r, 1, QDate(2024, 3, 1 + i % 3));
        src->setText(r, 2, i % 2 ? QStringLiteral("angenommen") : QStringLiteral("besetzt"));
    }
    return src;
}

QList<int> found(GridController& g)
{
    QList<int> out;
    for (const quint32 r : g.recordsInOrder())
        out << int(r);
    std::sort(out.begin(), out.end());
    return out;
}

} // namespace

class TestGridSearch final : public QObject {
    Q_OBJECT

private Q_SLOTS:
    void foldingFollowsTheCollation()
    {
        // Case and the two-letter characters fold; accents stay.
        QByteArray out;
        gridcollation::appendSearchFold(QByteArrayLiteral("Stra\xDF" "e \xC4" "RGER \xC6" "\xDE"), out);
        QCOMPARE(out, QByteArrayLiteral("strasse \xE4" "rger aeth"));
    }

    void matchesText_data()
    {
        QTest::addColumn<QString>("needle");
        QTest::addColumn<QString>("cell");
        QTest::addColumn<bool>("exact");
        QTest::addColumn<bool>("caseSensitive");
        QTest::addColumn<bool>("hit");
        QTest::newRow("ss finds ß") << "strasse" << "Straße" << false << false << true;
        QTest::newRow("ß finds ss") << "straße" << "STRASSE" << false << false << true;
        QTest::newRow("u is not ü") << "muller" << "Müller" << false << false << false;
        QTest::newRow("ü in any case") << "müller" << "MÜLLER" << false << false << true;
        QTest::newRow("part") << "ll" << "Müller" << false << false << true;
        QTest::newRow("exact whole") << "MÜLLER" << "Müller" << true << false << true;
        QTest::newRow("exact part") << "Müll" << "Müller" << true << false << false;
        QTest::newRow("case kept") << "müller" << "Müller" << false << true << false;
        QTest::newRow("case kept ß") << "Strasse" << "Straße" << false << true << false;
        QTest::newRow("case same") << "Müll" << "Müller" << false << true << true;
        QTest::newRow("percent literal") << "0%" << "50% Rabatt" << false << false << true;
        QTest::newRow("percent no wildcard") << "5%t" << "50% Rabatt" << false << false << false;
        QTest::newRow("underscore literal") << "a_b" << "a_b" << true << false << true;
        QTest::newRow("underscore no wildcard") << "a_b" << "axb" << false << false << false;
        QTest::newRow("star literal") << "*" << "Meier" << false << false << false;
        QTest::newRow("quotes") << "\"Sepp\"" << "Meier \"Sepp\"" << false << false << true;
        QTest::newRow("euro") << "€" << "10 €" << false << false << true;
        QTest::newRow("no latin-1") << "Ω" << "Ω" << false << false << false;
    }

    void matchesText()
    {
        QFETCH(QString, needle);
        QFETCH(QString, cell);
        QFETCH(bool, exact);
        QFETCH(bool, caseSensitive);
        QFETCH(bool, hit);
        MemoryGridSource src({{QStringLiteral("X"), GridFieldType::Text}});
        GridSearch search;
        search.text = needle;
        search.exact = exact;
        search.caseSensitive = caseSensitive;
        const GridSearchMatcher m(search, src, {});
        QByteArray bytes;
        (void)gridSearchBytes(cell, bytes);
        QCOMPARE(m.matchesText(bytes), hit);
    }

    void searchesTheChosenColumnsWithinOrInsteadOfTheFilter()
    {
        auto src = makeNames();
        GridController g;
        const int name = g.addColumn(GridColumn(QStringLiteral("name"), QStringLiteral("NAME"), QStringLiteral("Name")));
        const int day = g.addColumn(GridColumn(QStringLiteral("day"), QStringLiteral("TSDATE"), QStringLiteral("Datum")));
        const int status = g.addColumn(GridColumn(QStringLiteral("status"), QStringLiteral("STATUS")));
        // A computed column that reads another field.
        GridColumn shout(QStringLiteral("shout"), {});
        shout.displayText = [](const GridSource& s, quint32 r) { return s.text(r, 0).toUpper(); };
        const int loud = g.addColumn(shout);
        g.setSource(src.get());
        g.setSortOrder(name, GridSortOrder::Ascending);

        GridSearch search;
        search.text = QStringLiteral("strasse");
        search.columns = {name};
        g.setSearch(search);
        QVERIFY(g.isSearching());
        QCOMPARE(found(g), (QList<int>{2, 3}));

        // Dates by their display text, formatted once per day.
        search.text = QStringLiteral("02.03.");
        search.columns = {day};
        g.setSearch(search);
        QCOMPARE(found(g), (QList<int>{1, 4, 7}));

        // Any chosen column: a hit in the one or the other.
        search.text = QStringLiteral("besetzt");
        search.columns = {name, status};
        g.setSearch(search);
        QCOMPARE(found(g), (QList<int>{0, 2, 4, 6, 8}));
        search.text = QStringLiteral("ÆRØ");
        search.columns = {loud};
        g.setSearch(search);
        QCOMPARE(found(g), (QList<int>{7}));

        // A filter: replaced by the search, or narrowed by it.
        g.addFilterItem(GridFilterItem::condition(QStringLiteral("status"), GridFilterOperator::Equal,
                                                  QStringLiteral("angenommen")));
        g.setFilterActive(true);
        const QString filterText = g.filterText();
        search.text = QStringLiteral("m");
        search.columns = {name};
        g.setSearch(search);
        QCOMPARE(found(g), (QList<int>{0, 1, 6}));
        search.narrow = true;
        g.setSearch(search);
        QCOMPARE(found(g), (QList<int>{1}));

        // No text or no column: no search, the filter alone.
        g.setSearch(GridSearch{QString(), {name}, false, false, true});
        QVERIFY(!g.isSearching());
        QCOMPARE(found(g), (QList<int>{1, 3, 5, 7}));
        g.setSearch(search);
        g.clearSearch();
        QCOMPARE(found(g), (QList<int>{1, 3, 5, 7}));
        // The search is no part of the filter or its text.
        QCOMPARE(g.filterText(), filterText);
    }
};

ORVANTA_TEST(TestGridSearch)
#include "tst_grid_search.moc"
