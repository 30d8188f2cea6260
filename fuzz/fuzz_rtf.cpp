// Any input must read without crashing, hanging or growing memory beyond its size; whatever was
// read must survive the writer and read back with the same text.
#include "ui/rtf/RtfReader.h"
#include "ui/rtf/RtfWriter.h"

#include <QGuiApplication>
#include <QTextDocument>
#include <cstdint>
#include <cstdlib>

extern "C" int LLVMFuzzerInitialize(int* argc, char*** argv)
{
    if (qEnvironmentVariableIsEmpty("QT_QPA_PLATFORM"))
        qputenv("QT_QPA_PLATFORM", "offscreen");
    static QGuiApplication app(*argc, *argv); // fonts for the text document
    return 0;
}

extern "C" int LLVMFuzzerTestOneInput(const uint8_t* data, size_t size)
{
    const QByteArray input(reinterpret_cast<const char*>(data), qsizetype(size));
    QTextDocument doc;
    orvanta::RtfReader::read(input, &doc);

    const QByteArray rtf = orvanta::RtfWriter::write(doc);
    QTextDocument back;
    back.setDefaultFont(doc.defaultFont());
    if (!orvanta::RtfReader::read(rtf, &back))
        std::abort(); // the writer produced damaged RTF
    if (back.toRawText() != doc.toRawText() || back.blockCount() != doc.blockCount())
        std::abort(); // text lost or changed on the way through the writer
    return 0;
}
