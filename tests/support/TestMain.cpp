#include "tests/support/TestRegistry.h"

#include <QApplication>
#include <QFileInfo>
#include <QTest>

namespace orvanta::test {
namespace {

struct Entry {
    QString key;
    TestFactory factory;
};

std::vector<Entry>& registry()
{
    static std::vector<Entry> entries;
    return entries;
}

} // namespace

bool registerTest(const char* sourceFile, TestFactory factory)
{
    registry().push_back({QFileInfo(QString::fromUtf8(sourceFile)).completeBaseName(), std::move(factory)});
    return true;
}

} // namespace orvanta::test

int main(int argc, char* argv[])
{
    QApplication app(argc, argv);
    QApplication::setAttribute(Qt::AA_Use96Dpi, true);

    QStringList args = app.arguments();
    QString only;
    const qsizetype onlyAt = args.indexOf(QStringLiteral("--only"));
    if (onlyAt > 0 && onlyAt + 1 < args.size()) {
        only = args.at(onlyAt + 1);
        args.remove(onlyAt, 2);
    }

    int failures = 0;
    int ran = 0;
    for (const auto& entry : orvanta::test::registry()) {
        if (!only.isEmpty() && entry.key != only)
            continue;
        auto object = entry.factory();
        failures += QTest::qExec(object.get(), args);
        ++ran;
    }
    if (ran == 0) {
        qCritical("no test class matched %s", qPrintable(only));
        return 1;
    }
    return failures == 0 ? 0 : 1;
}
