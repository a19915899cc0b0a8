// SPDX-License-Identifier: Apache-2.0
// `coresystem log decipher`: makes a debug trace readable.
#include <cerrno>
#include <cstdio>
#include <cstdlib>
#include <cstring>
#include <memory>

#include <AESCrypto.h>

#include "Commands.h"
#include "Decipher.h"
#include "Session.h"
#include "Terminal.h"
#include "Text.h"

namespace cli {
namespace {

// Lines of standard input, of any length and with any bytes, each with its line feed if it has one.
class InputLines {
public:
    InputLines() = default;
    ~InputLines()
    {
        std::free(buffer_);
    }
    InputLines(const InputLines&) = delete;
    InputLines& operator=(const InputLines&) = delete;

    bool next(std::string& line)
    {
        const ssize_t size = getline(&buffer_, &capacity_, stdin);
        if (size < 0)
            return false;
        line.assign(buffer_, static_cast<std::size_t>(size));
        return true;
    }

private:
    char* buffer_ = nullptr;
    std::size_t capacity_ = 0;
};

void reportFailures(unsigned long number, unsigned failures)
{
    const std::string what = failures == 1 ? "a body" : std::to_string(failures) + " bodies";
    complain("line " + std::to_string(number) + ": " + what +
             " cannot be deciphered (another key, or changed since)");
}

ExitCode decipherInput()
{
    InputLines input;
    ExitCode result = SUCCESS;
    std::string line;
    for (unsigned long number = 1; input.next(line); ++number) {
        const Deciphered deciphered = decipherLine(line);
        writeOut(deciphered.line);
        if (deciphered.failures > 0) {
            reportFailures(number, deciphered.failures);
            result = FAILURE;
        }
    }
    if (std::ferror(stdin) != 0) {
        complain(std::string("standard input cannot be read: ") + std::strerror(errno));
        return FAILURE;
    }
    return result;
}

// Why there is no key to decipher with; empty when there is one.
std::string takeKey(const std::string& keyFile)
{
    AESCrypto& cipher = *AESCrypto::GetInstance();
    std::string problem;
    if (!keyFile.empty()) {
        cipher.LoadKeyFile(keyFile.c_str(), problem);
        return problem;
    }
    problem = cipher.GetProblem();
    if (problem.empty() && !cipher.HasConfiguredKey())
        problem = "no key: name the key file with --key or CORESYSTEM_LOG_KEY";
    return problem;
}

ExitCode runDecipher(const std::string& keyFile)
{
    if (const std::string problem = takeKey(keyFile); !problem.empty()) {
        complain(printable(problem));
        return FAILURE;
    }
    if (const std::string warning = AESCrypto::GetInstance()->GetWarning(); !warning.empty())
        complain("warning: " + printable(warning));
    return decipherInput();
}

} // namespace
} // namespace cli

void cli::addLogCommands(const Command& app, Invocation& invocation)
{
    const Command log = app.add("log", "Read the library's log");
    log.setFooter("Example: coresystem log decipher --key key <trace");
    log.requireCommand();
    const Command decipher = log.add("decipher", "Decipher log lines from standard input");
    const auto keyFile = std::make_shared<std::string>();
    const Argument key =
        decipher.option("--key", *keyFile, "Key file (default: that of CORESYSTEM_LOG_KEY)");
    key.called("FILE");
    decipher.setFooter(
        "Example: CORESYSTEM_LOG_DEBUG=1 CORESYSTEM_LOG_KEY=key coresystem info 2>&1 |\n"
        "             coresystem log decipher --key key\n"
        "Exit code 1: a body could not be deciphered, or there is no usable key.");
    decipher.onUse([&invocation, key, keyFile] {
        if (key.isGiven() && keyFile->empty())
            throw UsageError("--key names no file");
        invocation.command = [keyFile] { return runDecipher(*keyFile); };
    });
}
