// SPDX-License-Identifier: Apache-2.0
#include "Terminal.h"

#include <cerrno>
#include <csignal>
#include <cstdio>

#include <fcntl.h>
#include <unistd.h>

void cli::prepareStandardStreams()
{
    std::signal(SIGPIPE, SIG_IGN);
    std::signal(SIGXFSZ, SIG_IGN);
    for (const int stream : {STDIN_FILENO, STDOUT_FILENO, STDERR_FILENO}) {
        // Opened the wrong way round, so that using the stream still fails.
        const int mode = stream == STDIN_FILENO ? O_WRONLY : O_RDONLY;
        if (fcntl(stream, F_GETFD) < 0 && open("/dev/null", mode) != stream)
            throw OutputFailed{errno};
    }
}

void cli::writeOut(const std::string& text)
{
    if (std::fwrite(text.data(), 1, text.size(), stdout) != text.size() || std::fflush(stdout) != 0)
        throw OutputFailed{errno};
}

void cli::complain(const std::string& text)
{
    writeErrorLine("coresystem: " + text);
}

void cli::writeErrorLine(const std::string& text)
{
    const std::string line = text + "\n";
    std::fwrite(line.data(), 1, line.size(), stderr);
}

std::string cli::heading(const std::string& text)
{
    return isatty(STDOUT_FILENO) == 1 ? "\033[1m" + text + "\033[0m" : text;
}
