#pragma once
// Exported files read back by readers we did not write (xlrd, lxml, Python's csv module; see
// read_export.py), and what the grid shows, to compare them with.

#include "tests/TestPaths.h"
#include "ui/grid/GridController.h"

#include <QDebug>
#include <QFile>
#include <QJsonArray>
#include <QJsonDocument>
#include <QProcess>
#include <QStringList>
#include <QTest>

namespace orvanta::test {

using Table = QList<QStringList>;

// What the grid shows, read through the controller itself with every group expanded: the
// header of captions, then one row per grid row (a group row's text in its first cell).
inline Table shownTable(GridController& g, const QStringList& excluded)
{
    QList<int> cols;
    QStringList header;
    for (const int c : g.visibleColumns()) {
        if (!excluded.contains(g.column(c).name)) {
            cols << c;
            header << g.column(c).caption;
        }
    }
    Table t{header};
    g.expandAll(true);
    for (int r = 0; r < g.rowCount(); ++r) {
        QStringList row;
        for (int i = 0; i < cols.size(); ++i)
            row << (g.isGroupRow(r) ? (i == 0 ? g.groupRowText(r) : QString()) : g.displayText(r, cols[i]));
        t << row;
    }
    return t;
}

inline QString python()
{
    // The system interpreter, where the distribution's readers are installed.
    return QFile::exists(QStringLiteral("/usr/bin/python3")) ? QStringLiteral("/usr/bin/python3") : QStringLiteral("python3");
}

inline QList<Table> readBack(const QString& kind, const QString& path)
{
    QProcess p;
    p.start(python(), {QStringLiteral(ORVANTA_SOURCE_DIR "/tests/export/read_export.py"), kind, path});
    if (!p.waitForFinished(120000) || p.exitCode() != 0) {
        qWarning().noquote() << "reader failed:" << p.readAllStandardError();
        return {};
    }
    QList<Table> tables;
    for (const QJsonValue& t : QJsonDocument::fromJson(p.readAllStandardOutput()).array()) {
        Table table;
        for (const QJsonValue& r : t.toArray()) {
            QStringList row;
            for (const QJsonValue& c : r.toArray())
                row << c.toString();
            table << row;
        }
        tables << table;
    }
    return tables;
}

// XML and HTML cannot hold control characters other than tab and line breaks.
inline QString markupSafe(QString s)
{
    for (QChar& ch : s) {
        if (ch.unicode() < 0x20 && ch != u'\t' && ch != u'\n' && ch != u'\r')
            ch = QChar(0xFFFD);
    }
    return s;
}

inline void compareTables(const Table& got, const Table& want, bool markup)
{
    QCOMPARE(got.size(), want.size());
    for (int r = 0; r < want.size(); ++r) {
        QCOMPARE(got[r].size(), want[r].size());
        for (int c = 0; c < want[r].size(); ++c) {
            const QString expected = markup ? markupSafe(want[r][c]) : want[r][c];
            if (got[r][c] != expected)
                QFAIL(qPrintable(QStringLiteral("row %1 column %2: got \"%3\", want \"%4\"")
                                     .arg(r).arg(c).arg(got[r][c].left(60), expected.left(60))));
        }
    }
}

} // namespace orvanta::test
