// SPDX-License-Identifier: Apache-2.0
// AESCrypto loads this module when it enciphers the first text: a process that never switches
// debug mode on does not load a cryptography library at start.
#ifndef COREUTIL_CIPHER_MODULE_H
#define COREUTIL_CIPHER_MODULE_H

#include <array>
#include <string>

namespace coreutil {

using Key = std::array<unsigned char, 32>;

struct CipherModule {
    bool (*makeRandomKey)(Key& key);
    /// Reads exactly as many hexadecimal digits as a key has.
    bool (*parseHexKey)(const std::string& digits, Key& key);
    bool (*encrypt)(const Key& key, const std::string& plain, std::string& text);
    bool (*decrypt)(const Key& key, const std::string& text, std::string& plain);
};

} // namespace coreutil

extern "C" __attribute__((visibility("default"))) const coreutil::CipherModule coreutilCipherModule;

#endif
