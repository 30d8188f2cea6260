#include "db/CredentialCipher.h"

#include "db/B64Decoder.h"
#include "db/Gcrypt_p.h"
#include "db/PassPhraseConfig.h"
#include "platform/AppException.h"
#include "platform/Windows1252.h"

#include <array>
#include <cstring>
#include <mutex>

namespace orvanta {
namespace detail {

bool ensureGcrypt()
{
    static std::once_flag once;
    static bool usable = false;
    std::call_once(once, [] {
        if (gcry_control(GCRYCTL_INITIALIZATION_FINISHED_P)) {
            usable = true;
            return;
        }
        if (gcry_check_version(GCRYPT_VERSION) == nullptr)
            return;
        gcry_control(GCRYCTL_DISABLE_SECMEM, 0);
        gcry_control(GCRYCTL_INITIALIZATION_FINISHED, 0);
        usable = true;
    });
    return usable;
}

} // namespace detail

namespace {

constexpr std::size_t kKeySize = 32;
constexpr std::size_t kBlockSize = 16;

class CipherError final : public AppException {
public:
    using AppException::AppException;
    [[nodiscard]] QString className() const override { return QStringLiteral("ECipherError"); }
};

// Overwrites secrets in a way the optimiser may not drop.
void wipe(void* data, std::size_t size)
{
    volatile auto* bytes = static_cast<volatile unsigned char*>(data);
    for (std::size_t i = 0; i < size; ++i)
        bytes[i] = 0;
}

// The pass phrase is assembled only for the moment it is hashed; it is never stored whole.
std::array<unsigned char, kKeySize> deriveKey()
{
    static constexpr char table[] = ORVANTA_PASS_TABLE;
    static constexpr int indices[] = {ORVANTA_PASS_INDICES};
    static_assert(sizeof(table) > 1, "the pass-phrase table is empty");
    for (const int index : indices) {
        if (index < 0 || static_cast<std::size_t>(index) >= sizeof(table) - 1)
            throw CipherError(QStringLiteral("pass phrase index out of range"));
    }

    std::array<char, std::size(indices)> phrase{};
    for (std::size_t i = 0; i < phrase.size(); ++i)
        phrase[i] = table[indices[i]];
    std::array<unsigned char, kKeySize> key{};
    gcry_md_hash_buffer(GCRY_MD_SHA256, key.data(), phrase.data(), phrase.size());
    wipe(phrase.data(), phrase.size());
    return key;
}

// Owns an open cipher handle and the key copy; both are wiped on every way out.
class TwofishCfb8 final {
public:
    TwofishCfb8()
    {
        if (!detail::ensureGcrypt())
            throw CipherError(QStringLiteral("libgcrypt is not usable"));
        m_key = deriveKey();

        // The initial vector is the key's encryption of a zero block.
        std::array<unsigned char, kBlockSize> iv{};
        gcry_cipher_hd_t ecb = nullptr;
        check(gcry_cipher_open(&ecb, GCRY_CIPHER_TWOFISH, GCRY_CIPHER_MODE_ECB, 0));
        gcry_error_t err = gcry_cipher_setkey(ecb, m_key.data(), m_key.size());
        if (err == 0)
            err = gcry_cipher_encrypt(ecb, iv.data(), iv.size(), nullptr, 0);
        gcry_cipher_close(ecb);
        check(err);

        check(gcry_cipher_open(&m_handle, GCRY_CIPHER_TWOFISH, GCRY_CIPHER_MODE_CFB8, 0));
        err = gcry_cipher_setkey(m_handle, m_key.data(), m_key.size());
        if (err == 0)
            err = gcry_cipher_setiv(m_handle, iv.data(), iv.size());
        wipe(iv.data(), iv.size());
        check(err);
    }
    ~TwofishCfb8()
    {
        if (m_handle != nullptr)
            gcry_cipher_close(m_handle);
        wipe(m_key.data(), m_key.size());
    }
    TwofishCfb8(const TwofishCfb8&) = delete;
    TwofishCfb8& operator=(const TwofishCfb8&) = delete;

    void decrypt(QByteArray& data) { check(gcry_cipher_decrypt(m_handle, data.data(), data.size(), nullptr, 0)); }
    void encrypt(QByteArray& data) { check(gcry_cipher_encrypt(m_handle, data.data(), data.size(), nullptr, 0)); }

private:
    void check(gcry_error_t err)
    {
        if (err == 0)
            return;
        const QString text = QString::fromUtf8(gcry_strerror(err));
        if (m_handle != nullptr) {
            gcry_cipher_close(m_handle);
            m_handle = nullptr;
        }
        wipe(m_key.data(), m_key.size());
        throw CipherError(text);
    }

    gcry_cipher_hd_t m_handle = nullptr;
    std::array<unsigned char, kKeySize> m_key{};
};

} // namespace

QString CredentialCipher::decrypt(const QString& stored)
{
    const TB64Decoder decoder;
    QByteArray data = decoder.Decode(decoder.Decode(QStringView(stored)));
    if (data.isEmpty())
        return {};
    TwofishCfb8 cipher;
    cipher.decrypt(data);
    const QString plain = fromWindows1252(data);
    wipe(data.data(), static_cast<std::size_t>(data.size()));
    return plain;
}

QString CredentialCipher::encrypt(const QString& plain)
{
    QByteArray data = toWindows1252(plain);
    if (!data.isEmpty()) {
        TwofishCfb8 cipher;
        cipher.encrypt(data);
    }
    return QString::fromLatin1(data.toBase64().toBase64());
}

} // namespace orvanta
