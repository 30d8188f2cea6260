#pragma once
// Several Qt Test classes share one executable per folder. Each test file registers its class
// with ORVANTA_TEST; the shared main runs all of them, or with "--only <file>" those of one file.

#include <QObject>
#include <functional>
#include <memory>

namespace orvanta::test {

using TestFactory = std::function<std::unique_ptr<QObject>()>;
bool registerTest(const char* sourceFile, TestFactory factory);

} // namespace orvanta::test

#define ORVANTA_TEST(Class)                                                                        \
    static const bool orvantaRegistered##Class [[maybe_unused]] =                                  \
        orvanta::test::registerTest(__FILE__, [] { return std::unique_ptr<QObject>(new Class); });
