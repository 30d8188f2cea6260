// Feeds arbitrary registry text to the Base64 decoder and the credential decryption: either
// decodes or raises ConvertError, never anything else; well-formed Base64 round-trips.

#include "db/B64Decoder.h"
#include "db/CredentialCipher.h"
#include "platform/AppException.h"
#include "platform/ConvertError.h"

#include <QByteArray>
#include <QString>
#include <cstdlib>

extern "C" int LLVMFuzzerTestOneInput(const uint8_t* data, size_t size)
{
    using namespace orvanta;
    const QByteArray input(reinterpret_cast<const char*>(data), static_cast<qsizetype>(size));
    const TB64Decoder decoder;

    try {
        const QByteArray decoded = decoder.Decode(QByteArrayView(input));
        if (decoded.size() > input.size())
            std::abort();
        // The same text as a QString decodes the same.
        if (decoder.Decode(QStringView(QString::fromLatin1(input))) != decoded)
            std::abort();
    } catch (const ConvertError&) {
    }

    // Any bytes survive an encode/decode round trip.
    if (decoder.Decode(QByteArrayView(input.toBase64())) != input)
        std::abort();

    try {
        (void)CredentialCipher::decrypt(QString::fromLatin1(input));
    } catch (const AppException&) {
    }
    return 0;
}
