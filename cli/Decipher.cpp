// SPDX-License-Identifier: Apache-2.0
#include "Decipher.h"

#include <AESCrypto.h>

#include "Text.h"

namespace cli {
namespace {

const std::string OPENING = "{#!@";
const std::string CLOSING = "#!@}";

// A text instead of a cipher text begins with "!" and says why nothing was enciphered.
bool isProblemText(const std::string& body)
{
    return !body.empty() && body.front() == '!';
}

// Replaces one marked body, "{#!@...#!@}", if it can be deciphered.
void decipherBody(const std::string& marked, Deciphered& result)
{
    const std::string body =
        marked.substr(OPENING.size(), marked.size() - OPENING.size() - CLOSING.size());
    std::string plain;
    if (AESCrypto::GetInstance()->Decrypt(body, plain)) {
        result.line += printable(plain); // a record stays one line
        return;
    }
    result.line += marked;
    result.failures += isProblemText(body) ? 0 : 1;
}

} // namespace

Deciphered decipherLine(const std::string& line)
{
    Deciphered result;
    std::size_t done = 0;
    for (;;) {
        const std::size_t opening = line.find(OPENING, done);
        if (opening == std::string::npos)
            break;
        const std::size_t closing = line.find(CLOSING, opening + OPENING.size());
        if (closing == std::string::npos)
            break;
        // The last opening before the end: an earlier one belongs to the text around.
        const std::size_t start = line.rfind(OPENING, closing - OPENING.size());
        const std::size_t end = closing + CLOSING.size();
        result.line.append(line, done, start - done);
        decipherBody(line.substr(start, end - start), result);
        done = end;
    }
    result.line.append(line, done, std::string::npos);
    return result;
}

} // namespace cli
