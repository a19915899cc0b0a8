// SPDX-License-Identifier: Apache-2.0
// Prints what the port and the utility library take from the environment; with "sources"
// also where facts came from or why there are none, with another argument what becomes of that text
// when it is enciphered.
#include <cstdio>

#include "AESCrypto.h"
#include "CoreLogger.h"
#include "backend/Backend.h"
#include "coresystem_port.h"

namespace {

template <class Answer>
void printSource(const char* fact, const Answer& answer)
{
    std::printf("%s: %s\n", fact, (answer ? answer.value().source : answer.error().reason).c_str());
}

} // namespace

int main(int count, char** arguments)
{
    CoreLogger& logger = *CoreLogger::GetInstance();
    std::printf("backend=%s\n", coresystem_port::backendName().c_str());
    std::printf("debug=%d\n", logger.GetDebugMode());
    std::printf("tag=%d:%s\n", logger.HasLogTag() ? 1 : 0, logger.GetLogTag());
    if (count < 2)
        return 0;
    if (arguments[1] == std::string("sources")) {
        printSource("language", port::backend().get<port::Question::Language>());
        printSource("font size", port::backend().get<port::Question::FontSize>());
        printSource("storage", port::backend().internalStorage());
        printSource("sales code", port::backend().configuration("db/csc/salescode"));
        return 0;
    }
    AESCrypto& cipher = *AESCrypto::GetInstance();
    std::printf("enciphered=%s\n", cipher.Encrypt(arguments[1]).c_str());
    std::printf("configured=%d\n", cipher.HasConfiguredKey() ? 1 : 0);
    std::printf("problem=%s\n", cipher.GetProblem().c_str());
    return 0;
}
