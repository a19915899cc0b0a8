// SPDX-License-Identifier: Apache-2.0
// Any bytes as a line of a debug trace.
#include <string>

#include <AESCrypto.h>

#include "Fuzz.h"
#include "cli/Decipher.h"

int LLVMFuzzerTestOneInput(const unsigned char* data, std::size_t size)
{
    const std::string line(reinterpret_cast<const char*>(data), size);
    const unsigned char key[AESCrypto::KEY_SIZE] = {1};
    AESCrypto::GetInstance()->SetKey(key);
    const cli::Deciphered read = cli::decipherLine(line);
    require(read.line == line, "a line that this key did not encipher stays as it is", read.line);
    // A body of ours in the midst of it is read.
    const std::string body = "{#!@" + AESCrypto::GetInstance()->Encrypt("plain") + "#!@}";
    const cli::Deciphered mixed = cli::decipherLine(line + body);
    require(mixed.line.size() >= 5 && mixed.line.compare(mixed.line.size() - 5, 5, "plain") == 0 &&
                mixed.failures == read.failures,
            "a body is read whatever stands before it", mixed.line);
    return 0;
}
