// Any mark-up text, read as UTF-8 and as Latin-1, must build a document without crashing or
// hanging, whatever its tags, attributes, entities and image indexes.
#include "ui/markup/MarkupDocument.h"

#include <QGuiApplication>
#include <QPalette>
#include <QPixmap>
#include <QTextDocument>
#include <cstdint>

namespace {

// Two images, so both valid and out-of-range "idx:n" are reached.
const QList<QPixmap>& images()
{
    static const QList<QPixmap> list = [] {
        QList<QPixmap> l;
        for (const QColor& c : {QColor(Qt::red), QColor(Qt::blue)}) {
            QPixmap p(16, 16);
            p.fill(c);
            l.append(p);
        }
        return l;
    }();
    return list;
}

void build(const QString& markup)
{
    QTextDocument document;
    orvanta::buildMarkupDocument(document, markup, images(), QGuiApplication::palette());
}

} // namespace

extern "C" int LLVMFuzzerInitialize(int* argc, char*** argv)
{
    if (qEnvironmentVariableIsEmpty("QT_QPA_PLATFORM"))
        qputenv("QT_QPA_PLATFORM", "offscreen");
    static QGuiApplication app(*argc, *argv); // fonts, pixmaps and the palette
    return 0;
}

extern "C" int LLVMFuzzerTestOneInput(const uint8_t* data, size_t size)
{
    const QByteArrayView input(reinterpret_cast<const char*>(data), qsizetype(size));
    build(QString::fromUtf8(input));
    build(QString::fromLatin1(input));
    return 0;
}
