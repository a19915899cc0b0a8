// SPDX-License-Identifier: Apache-2.0
/// \file
/// The cipher of debug log bodies.
#ifndef COREUTIL_AES_CRYPTO_H
#define COREUTIL_AES_CRYPTO_H

#include <string>

/// The process-wide cipher: AES-256-GCM (NIST SP 800-38D) with a random nonce for every text.
///
/// The key comes from SetKey() or LoadKeyFile(), else from the file that the environment variable
/// CORESYSTEM_LOG_KEY names (ignored in a set-user-ID process). With none of them a random key is
/// made for this process: what it enciphers cannot be read later. A key file that was named and
/// cannot be used is never replaced by another key. The key is never logged. Any thread.
class AESCrypto {
public:
    /// Bytes of a key.
    static const unsigned KEY_SIZE = 32;

    /// The one cipher; never null.
    static AESCrypto* GetInstance();

    /// Base64 of nonce, cipher text and tag; empty text is enciphered too.
    /// When there is no usable key or cipher the answer begins with "!" and names the reason
    /// instead; the text itself is never part of it.
    std::string Encrypt(const std::string& plain);

    /// Reverses Encrypt(). False, and `plain` untouched, when the text was not enciphered with this
    /// key or was changed since, or when there is no usable key.
    bool Decrypt(const std::string& enciphered, std::string& plain);

    /// Sets the key: KEY_SIZE bytes, copied.
    void SetKey(const unsigned char* key);

    /// Takes the key from a file: KEY_SIZE raw bytes, or 2 * KEY_SIZE hexadecimal digits with white
    /// space after them. On failure false, the reason in `problem`, and the key as it was.
    bool LoadKeyFile(const char* path, std::string& problem);

    /// Why there is no usable key or cipher; empty when there is.
    std::string GetProblem();

    /// Why the key file in use is unsafe, such as that every user may read it; empty when
    /// it is safe. It is also written to the log, once for each key file that is taken.
    std::string GetWarning();

    /// Whether a key was set or named, so that another process can read what this one enciphers.
    bool HasConfiguredKey();

private:
    AESCrypto();
    AESCrypto(const AESCrypto&) = delete;
    AESCrypto& operator=(const AESCrypto&) = delete;
};

#endif
