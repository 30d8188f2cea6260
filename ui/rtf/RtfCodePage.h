#pragma once
// Byte-to-text conversion for the 8-bit text inside RTF. The Windows code pages our notes use
// (1250, 1251, 1252) are built in, so reading never depends on how the toolkit was built; any
// other code page goes through QStringDecoder when it knows it, else falls back to 1252.

#include <QByteArray>
#include <QString>
#include <map>
#include <memory>

class QStringDecoder;

namespace orvanta {

class RtfCodePage final {
public:
    RtfCodePage();
    ~RtfCodePage();
    RtfCodePage(const RtfCodePage&) = delete;
    RtfCodePage& operator=(const RtfCodePage&) = delete;

    // Appends the text of bytes in code page codePage to out.
    void decode(const QByteArray& bytes, int codePage, QString& out);

    // The code page a font's \fcharsetN stands for; 0 where the document's code page applies.
    [[nodiscard]] static int forCharset(int charset);
    [[nodiscard]] static bool isBuiltIn(int codePage);
    // Decodes one byte with a built-in table (codePage 1250, 1251 or 1252).
    [[nodiscard]] static char16_t builtIn(int codePage, unsigned char byte);

private:
    QStringDecoder* decoderFor(int codePage);

    std::map<int, std::unique_ptr<QStringDecoder>> m_decoders;
};

} // namespace orvanta
