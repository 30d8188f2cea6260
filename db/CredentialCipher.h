#pragma once
// The database credentials in the monitor's registry key are Twofish-encrypted: the key is the
// SHA-256 digest of a pass phrase built at run time, the initial vector is the encryption of a
// zero block under that key, the mode is 8-bit cipher feedback, and the stored text is Base64 of
// the Base64 of the ciphertext.

#include <QString>

namespace orvanta::CredentialCipher {

// Throws ConvertError for text that is not Base64 and AppException when the cipher library fails.
[[nodiscard]] QString decrypt(const QString& stored);
// The registry text for a plain value (what the monitor writes).
[[nodiscard]] QString encrypt(const QString& plain);

} // namespace orvanta::CredentialCipher
