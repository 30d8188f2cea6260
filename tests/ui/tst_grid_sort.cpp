#include "tests/support/TestRegistry.h"
#include "ui/grid/GridCollation.h"
#include "ui/grid/GridController.h"
#include "ui/grid/MemoryGridSource.h"

#include <QRandomGenerator>
#include <QSignalSpy>
#include <QTest>

using namespace orvanta;

namespace {

// Rows of (name, number, date) with the source order as the last column's meaning.
std::unique_ptr<MemoryGridSource> makeSource(const QList<std::tuple<QString, int, QDate>>& rows)
{
    auto src = std::make_unique<MemoryGridSource>(std::vector<MemoryGridSource::Field>{
        {QStringLiteral("NAME"), GridFieldType::Text},
        {QStringLiteral("NUM"), GridFieldType::Integer},
        {QStringLiteral("DAY"), GridFieldType::Date},
    });
    for (const auto& [name, num, day] : rows) {
        const quint32 r = src->appendRow();
        if (!name.isNull())
            src->setText(r, 0, name);
        if (num >= 0)
            src->setInt(r, 1, num);
        src->setDate(r, 2, day);
    }
    return src;
}

void addColumns(GridController& g)
{
    g.addColumn(GridColumn(QStringLiteral("colName"), QStringLiteral("NAME"), QStringLiteral("Name")));
    g.addColumn(GridColumn(QStringLiteral("colNum"), QStringLiteral("NUM"), QStringLiteral("Nummer")));
    g.addColumn(GridColumn(QStringLiteral("colDay"), QStringLiteral("DAY"), QStringLiteral("Datum")));
}

QStringList column(const GridController& g, int c)
{
    QStringList out;
    for (int r = 0; r < g.rowCount(); ++r)
        out << g.displayText(r, c);
    return out;
}

QList<int> records(const GridController& g)
{
    QList<int> out;
    for (int r = 0; r < g.rowCount(); ++r)
        out << g.recordAt(r);
    return out;
}

} // namespace

class TestGridSort final : public QObject {
    Q_OBJECT

private Q_SLOTS:
    void collationOrdersLikeTheAnsiWordSort()
    {
        QStringList words = {QStringLiteral("Zebra"), QStringLiteral("ärger"), QStringLiteral("Apfel"), QStringLiteral("Arzt"),
                             QStringLiteral("Öl"),    QStringLiteral("Ofen"),  QStringLiteral("Straße"), QStringLiteral("Strasse"),
                             QStringLiteral("Strand"), QStringLiteral("12"),   QStringLiteral(" x"),    QStringLiteral("Co-op"),
                             QStringLiteral("coop"), QStringLiteral("Éclair"), QStringLiteral("Ecke")};
        std::vector<QByteArray> bytes;
        for (const QString& w : std::as_const(words))
            bytes.push_back(w.toLatin1());
        std::stable_sort(bytes.begin(), bytes.end(), [](const QByteArray& a, const QByteArray& b) { return gridcollation::less(a, b); });
        QStringList sorted;
        for (const QByteArray& b : bytes)
            sorted << QString::fromLatin1(b);
        QCOMPARE(sorted, (QStringList{QStringLiteral(" x"), QStringLiteral("12"), QStringLiteral("Apfel"), QStringLiteral("ärger"),
                                      QStringLiteral("Arzt"), QStringLiteral("Co-op"), QStringLiteral("coop"),
                                      QStringLiteral("Ecke"), QStringLiteral("Éclair"), QStringLiteral("Ofen"), QStringLiteral("Öl"), QStringLiteral("Strand"),
                                      QStringLiteral("Strasse"), QStringLiteral("Straße"), QStringLiteral("Zebra")}));
        // Case alone never decides; a different accent or spelling always does.
        QCOMPARE(gridcollation::compare("MEIER", "meier"), 0);
        QCOMPARE(gridcollation::compare("\xc4pfel", "\xe4PFEL"), 0);
        QVERIFY(gridcollation::compare("Apfel", "\xc4pfel") < 0);
        QVERIFY(gridcollation::compare("", "a") < 0);
        QVERIFY(gridcollation::compare("a", "") > 0);
    }

    void sortKeysOrderLikeCompare()
    {
        // Short texts over an alphabet full of ties: case, accents, expansions, ignored marks.
        const QByteArray alphabet("aAbB-' \xe4\xc4\xdfsSeE\xe9\xe6" "0z\x00", 19);
        QRandomGenerator rng(1);
        std::vector<QByteArray> texts;
        for (int i = 0; i < 400; ++i) {
            QByteArray t;
            for (int n = int(rng.bounded(5)); n > 0; --n)
                t.append(alphabet[int(rng.bounded(quint32(alphabet.size())))]);
            texts.push_back(t);
        }
        for (const QByteArray& a : texts) {
            for (const QByteArray& b : texts) {
                const int c = gridcollation::compare(a, b);
                const QByteArray ka = gridcollation::sortKey(a);
                const QByteArray kb = gridcollation::sortKey(b);
                const int k = std::string_view(ka.constData(), size_t(ka.size())).compare(std::string_view(kb.constData(), size_t(kb.size())));
                if ((c < 0) != (k < 0) || (c == 0) != (k == 0))
                    QFAIL(qPrintable(QStringLiteral("%1 vs %2: compare %3, key %4").arg(QString::fromLatin1(a.toHex()), QString::fromLatin1(b.toHex())).arg(c).arg(k)));
            }
        }
    }

    void likeMatchesWildcards()
    {
        QVERIFY(gridcollation::like("Berlin", "B%"));
        QVERIFY(!gridcollation::like("berlin", "B%"));
        QVERIFY(gridcollation::like("berlin", "B%", false));
        QVERIFY(gridcollation::like("\xc4rger", "\xc4%"));
        QVERIFY(gridcollation::like("Meier", "M_i%r"));
        QVERIFY(gridcollation::like("", "%"));
        QVERIFY(!gridcollation::like("", "_"));
        QVERIFY(gridcollation::like("abcabd", "%ab_"));
        QVERIFY(!gridcollation::like("abc", "%x%"));
    }

    void sortsByTextCaseInsensitiveAndStable()
    {
        const QDate d(2024, 3, 1);
        auto src = makeSource({{QStringLiteral("meier"), 1, d},
                               {QStringLiteral("Zander"), 2, d},
                               {QStringLiteral("Meier"), 3, d},
                               {QStringLiteral("Ärger"), 4, d},
                               {QString(), 5, d},
                               {QStringLiteral("MEIER"), 6, d}});
        GridController g;
        addColumns(g);
        g.setSource(src.get());
        g.setSortOrder(0, GridSortOrder::Ascending);
        // Null first, equal texts in source order.
        QCOMPARE(column(g, 1), (QStringList{"5", "4", "1", "3", "6", "2"}));
        g.setSortOrder(0, GridSortOrder::Descending);
        QCOMPARE(column(g, 1), (QStringList{"2", "1", "3", "6", "4", "5"}));
        QCOMPARE(g.sortIndex(0), 0);
        QCOMPARE(g.sortedColumns().size(), size_t(1));
    }

    void sortsByManyColumnsInKeyOrder()
    {
        auto src = makeSource({{QStringLiteral("b"), 1, QDate(2024, 1, 2)},
                               {QStringLiteral("a"), 2, QDate(2024, 1, 1)},
                               {QStringLiteral("b"), 3, QDate(2024, 1, 1)},
                               {QStringLiteral("a"), 4, QDate(2024, 1, 2)},
                               {QStringLiteral("a"), -1, QDate()}});
        GridController g;
        addColumns(g);
        g.setSource(src.get());
        g.beginUpdate();
        g.setSortOrder(2, GridSortOrder::Descending);
        g.setSortOrder(0, GridSortOrder::Ascending);
        g.endUpdate();
        QCOMPARE(records(g), (QList<int>{3, 0, 1, 2, 4})); // null date last when descending
        // Swapping the key order swaps the result.
        g.clearSorting();
        g.setSortOrder(0, GridSortOrder::Ascending);
        g.setSortOrder(2, GridSortOrder::Descending);
        QCOMPARE(records(g), (QList<int>{3, 1, 4, 0, 2}));
        g.clearSorting();
        QCOMPARE(records(g), (QList<int>{0, 1, 2, 3, 4}));
    }

    void sortsByDisplayTextWhenTheColumnSaysSo()
    {
        auto src = makeSource({{QString(), 0, QDate()}, {QString(), 1, QDate()}, {QString(), 7, QDate()}});
        GridController g;
        GridColumn direction(QStringLiteral("dir"), QStringLiteral("NUM"), QStringLiteral("Verbindung"));
        direction.sortText = [](const GridSource& s, quint32 r) -> QByteArrayView {
            switch (s.intValue(r, 1)) {
            case 0:
                return "Eingang";
            case 1:
                return "Ausgang";
            default:
                return "Unbekannt";
            }
        };
        const int c = g.addColumn(direction);
        g.setSource(src.get());
        g.setSortOrder(c, GridSortOrder::Ascending);
        QCOMPARE(column(g, c), (QStringList{"Ausgang", "Eingang", "Unbekannt"}));
    }

    void headerClicksSortToggleAndCombine()
    {
        auto src = makeSource({{QStringLiteral("b"), 2, QDate()}, {QStringLiteral("a"), 1, QDate()}, {QStringLiteral("a"), 3, QDate()}});
        GridController g;
        addColumns(g);
        g.setSource(src.get());
        g.headerClicked(1, {});
        QCOMPARE(records(g), (QList<int>{1, 0, 2}));
        g.headerClicked(1, {});
        QCOMPARE(records(g), (QList<int>{2, 0, 1}));
        g.headerClicked(0, {}); // alone: replaces the number key
        QCOMPARE(g.sortIndex(1), -1);
        QCOMPARE(records(g), (QList<int>{1, 2, 0}));
        g.headerClicked(1, Qt::ShiftModifier);
        g.headerClicked(1, Qt::ShiftModifier); // second key, now descending
        QCOMPARE(records(g), (QList<int>{2, 1, 0}));
        g.headerClicked(0, Qt::ControlModifier);
        QCOMPARE(g.sortedColumns(), std::vector<int>{1});
        GridColumn key(QStringLiteral("key"), QStringLiteral("NUM"));
        key.sortable = false;
        const int k = g.addColumn(key);
        g.headerClicked(k, {});
        QCOMPARE(g.sortIndex(k), -1);
    }

    void focusFollowsTheRecordOrGoesToTheTop()
    {
        auto src = makeSource({{QStringLiteral("c"), 1, QDate()}, {QStringLiteral("a"), 2, QDate()}, {QStringLiteral("b"), 3, QDate()}});
        GridController g;
        addColumns(g);
        g.setSource(src.get());
        QSignalSpy focusSpy(&g, &GridController::focusedRecordChanged);
        g.setFocusedRow(2);
        QCOMPARE(g.focusedRecord(), 2);
        g.setSortOrder(0, GridSortOrder::Ascending);
        QCOMPARE(g.focusedRecord(), 2);
        QCOMPARE(g.focusedRow(), 1);
        QCOMPARE(focusSpy.count(), 1); // the record did not change with the sort
        g.setFocusFirstAfterSort(true);
        g.setSortOrder(0, GridSortOrder::Descending);
        QCOMPARE(g.focusedRow(), 0);
        QCOMPARE(g.focusedRecord(), 0);
    }

    // Another view over the same rows takes the sort keys over instead of computing them; the
    // giver computes its own again, a source of another size never takes foreign keys.
    void sortKeysHandOverToAViewOfTheSameRows()
    {
        const auto src = makeSource({{QStringLiteral("b"), 2, {}}, {QStringLiteral("C"), 1, {}}, {QStringLiteral("a"), 3, {}}});
        GridController table;
        addColumns(table);
        table.setSource(src.get());
        table.setSortOrder(0, GridSortOrder::Ascending);
        QCOMPARE(records(table), (QList<int>{2, 0, 1}));
        GridController::FieldRanks ranks = table.takeFieldRanks();
        QCOMPARE(ranks.size(), size_t(1)); // only what was computed: NAME
        QCOMPARE(ranks.front().first, QStringLiteral("NAME"));

        // The cards: same field under another column name, plus a column sorting by its own
        // text, which must not take the field's keys.
        const auto own = [](const GridSource&, quint32 row) {
            return row == 0 ? QByteArrayView("z") : (row == 1 ? QByteArrayView("y") : QByteArrayView("x"));
        };
        GridController cards;
        GridColumn computed(QStringLiteral("cardComputed"), QStringLiteral("NAME"));
        computed.sortText = own;
        cards.addColumn(computed);
        cards.addColumn(GridColumn(QStringLiteral("cardName"), QStringLiteral("NAME")));
        // A source of the same size with other texts shows that the keys are taken, not computed.
        const auto other = makeSource({{QStringLiteral("x"), 0, {}}, {QStringLiteral("x"), 0, {}}, {QStringLiteral("x"), 0, {}}});
        cards.setSource(other.get());
        cards.adoptFieldRanks(ranks);
        cards.setSortOrder(1, GridSortOrder::Ascending);
        QCOMPARE(records(cards), (QList<int>{2, 0, 1}));
        cards.setSortOrder(1, GridSortOrder::None);
        cards.setSortOrder(0, GridSortOrder::Ascending);
        QCOMPARE(records(cards), (QList<int>{2, 1, 0}));

        const auto shorter = makeSource({{QStringLiteral("q"), 0, {}}, {QStringLiteral("p"), 0, {}}});
        GridController small;
        small.addColumn(GridColumn(QStringLiteral("n"), QStringLiteral("NAME")));
        small.setSource(shorter.get());
        small.adoptFieldRanks(ranks);
        small.setSortOrder(0, GridSortOrder::Ascending);
        QCOMPARE(records(small), (QList<int>{1, 0}));

        table.reapply();
        table.setSortOrder(0, GridSortOrder::Descending);
        QCOMPARE(records(table), (QList<int>{1, 0, 2}));
    }

    void refreshKeepsTheFocusedKey()
    {
        MemoryGridSource src({{QStringLiteral("LID"), GridFieldType::Integer}, {QStringLiteral("NAME"), GridFieldType::Text}});
        for (int i = 0; i < 5; ++i) {
            const quint32 r = src.appendRow();
            src.setInt(r, 0, 100 + i);
            src.setText(r, 1, QString(QChar(u'a' + i)));
        }
        GridController g;
        g.addColumn(GridColumn(QStringLiteral("lid"), QStringLiteral("LID")));
        g.setKeyField(QStringLiteral("LID"));
        g.setSource(&src);
        g.setFocusedRow(3);
        QCOMPARE(g.locate(103), 3);
        // The re-read puts a new record in front: the focus stays on key 103.
        MemoryGridSource fresh({{QStringLiteral("LID"), GridFieldType::Integer}, {QStringLiteral("NAME"), GridFieldType::Text}});
        for (const int lid : {99, 100, 101, 102, 103, 104}) {
            const quint32 r = fresh.appendRow();
            fresh.setInt(r, 0, lid);
        }
        src.clear();
        g.setSource(&fresh);
        QCOMPARE(g.focusedRow(), 0);
        g.setFocusedRow(4);
        QCOMPARE(g.focusedRecord(), 4);
        fresh.setInt(0, 0, 103); // two rows of key 103: the first wins
        fresh.setInt(4, 0, 50);
        g.sourceChanged();
        QCOMPARE(g.focusedRecord(), 0);
        QCOMPARE(g.locate(77), -1);
    }
};

ORVANTA_TEST(TestGridSort)
#include "tst_grid_sort.moc"
