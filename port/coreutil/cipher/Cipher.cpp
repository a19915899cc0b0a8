// SPDX-License-Identifier: Apache-2.0
// AES-256-GCM by OpenSSL. Text form: base64 of nonce, cipher text and tag.
#include "CipherModule.h"

#include <memory>

#include <openssl/crypto.h>
#include <openssl/err.h>
#include <openssl/evp.h>
#include <openssl/rand.h>

namespace {

using coreutil::Key;

constexpr std::size_t NONCE_SIZE = 12; // what GCM is made for, NIST SP 800-38D
constexpr std::size_t TAG_SIZE = 16;

struct FreeContext {
    void operator()(EVP_CIPHER_CTX* context) const
    {
        EVP_CIPHER_CTX_free(context);
    }
};
using Context = std::unique_ptr<EVP_CIPHER_CTX, FreeContext>;

unsigned char* bytes(std::string& text)
{
    return reinterpret_cast<unsigned char*>(text.data());
}

const unsigned char* bytes(const std::string& text)
{
    return reinterpret_cast<const unsigned char*>(text.data());
}

std::string toBase64(const std::string& data)
{
    std::string text((data.size() + 2) / 3 * 4 + 1, '\0'); // EVP_EncodeBlock writes a NUL
    text.resize(static_cast<std::size_t>(
        EVP_EncodeBlock(bytes(text), bytes(data), static_cast<int>(data.size()))));
    return text;
}

bool fromBase64(const std::string& text, std::string& data)
{
    if (text.empty() || text.size() % 4 != 0)
        return false;
    data.resize(text.size() / 4 * 3);
    if (EVP_DecodeBlock(bytes(data), bytes(text), static_cast<int>(text.size())) < 0)
        return false;
    const std::size_t padding = text.size() - 1 - text.find_last_not_of('=');
    if (padding > 2)
        return false;
    data.resize(data.size() - padding);
    // The decoder lets other texts pass for the same bytes: "=" in the middle, bits behind the end.
    return toBase64(data) == text;
}

// Leaves the calling thread's OpenSSL error queue as it was: the application may use OpenSSL too.
class QuietErrors {
public:
    QuietErrors()
    {
        ERR_set_mark();
    }
    ~QuietErrors()
    {
        ERR_pop_to_mark();
    }
    QuietErrors(const QuietErrors&) = delete;
    QuietErrors& operator=(const QuietErrors&) = delete;
};

bool makeRandomKey(Key& key)
{
    const QuietErrors quiet;
    return RAND_priv_bytes(key.data(), static_cast<int>(key.size())) == 1;
}

bool parseHexKey(const std::string& digits, Key& key)
{
    const QuietErrors quiet;
    std::size_t size = 0;
    return OPENSSL_hexstr2buf_ex(key.data(), key.size(), &size, digits.c_str(), '\0') == 1 &&
           size == key.size();
}

bool encrypt(const Key& key, const std::string& plain, std::string& text)
{
    const QuietErrors quiet;
    std::string sealed(NONCE_SIZE + plain.size() + TAG_SIZE, '\0');
    unsigned char* const nonce = bytes(sealed);
    unsigned char* const body = nonce + NONCE_SIZE;
    unsigned char* const tag = body + plain.size();
    const Context context(EVP_CIPHER_CTX_new());
    int length = 0;
    if (!context || RAND_bytes(nonce, static_cast<int>(NONCE_SIZE)) != 1 ||
        EVP_EncryptInit_ex(context.get(), EVP_aes_256_gcm(), nullptr, key.data(), nonce) != 1 ||
        EVP_EncryptUpdate(context.get(), body, &length, bytes(plain),
                          static_cast<int>(plain.size())) != 1 ||
        EVP_EncryptFinal_ex(context.get(), tag, &length) != 1 ||
        EVP_CIPHER_CTX_ctrl(context.get(), EVP_CTRL_GCM_GET_TAG, static_cast<int>(TAG_SIZE), tag) !=
            1)
        return false;
    text = toBase64(sealed);
    return true;
}

bool decrypt(const Key& key, const std::string& text, std::string& plain)
{
    const QuietErrors quiet;
    std::string sealed;
    if (!fromBase64(text, sealed) || sealed.size() < NONCE_SIZE + TAG_SIZE)
        return false;
    std::string opened(sealed.size() - NONCE_SIZE - TAG_SIZE, '\0');
    unsigned char* const nonce = bytes(sealed);
    unsigned char* const body = nonce + NONCE_SIZE;
    unsigned char* const tag = body + opened.size();
    const Context context(EVP_CIPHER_CTX_new());
    int length = 0;
    if (!context ||
        EVP_DecryptInit_ex(context.get(), EVP_aes_256_gcm(), nullptr, key.data(), nonce) != 1 ||
        EVP_DecryptUpdate(context.get(), bytes(opened), &length, body,
                          static_cast<int>(opened.size())) != 1 ||
        EVP_CIPHER_CTX_ctrl(context.get(), EVP_CTRL_GCM_SET_TAG, static_cast<int>(TAG_SIZE), tag) !=
            1 ||
        EVP_DecryptFinal_ex(context.get(), tag, &length) != 1)
        return false;
    plain = std::move(opened);
    return true;
}

} // namespace

extern "C" const coreutil::CipherModule coreutilCipherModule = {makeRandomKey, parseHexKey, encrypt,
                                                                decrypt};
