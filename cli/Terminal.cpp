// SPDX-License-Identifier: Apache-2.0
#include "Terminal.h"

#include <cerrno>
#include <csignal>
#include <cstdio>
#include <cstdlib>
#include <limits>

#include <fcntl.h>
#include <sys/ioctl.h>
#include <unistd.h>

namespace {

cli::Color color = cli::Color::Auto;
bool fullWidth = false;

// Empty for one that is not set.
std::string variable(const char* name)
{
    const char* const value = std::getenv(name);
    return value != nullptr ? value : "";
}

bool hasColor()
{
    if (color == cli::Color::Auto)
        return variable("NO_COLOR").empty() && cli::isSmartTerminal();
    return color == cli::Color::Always;
}

std::string between(const char* begin, const std::string& text)
{
    return hasColor() ? begin + text + "\033[0m" : text;
}

// COLUMNS wins, as it does for other programs.
long terminalColumns()
{
    const long wanted = std::strtol(variable("COLUMNS").c_str(), nullptr, 10);
    winsize size = {};
    return wanted > 0 ? wanted : ioctl(STDOUT_FILENO, TIOCGWINSZ, &size) == 0 ? size.ws_col : 0;
}

struct Tone {
    const char* word;
    const char* escape;
};

constexpr Tone TONES[] = {
    {"found", "\033[32m"},
    {"missing", "\033[33m"},
    {"not available", "\033[33m"},
    {"not installed", "\033[33m"},
};

} // namespace

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

void cli::useColor(Color when)
{
    color = when;
}

void cli::useFullWidth()
{
    fullWidth = true;
}

bool cli::isFullWidth()
{
    return fullWidth;
}

std::size_t cli::outputWidth()
{
    const long columns = fullWidth || isatty(STDOUT_FILENO) == 0 ? 0 : terminalColumns();
    return columns > 0 ? static_cast<std::size_t>(columns)
                       : std::numeric_limits<std::size_t>::max();
}

bool cli::isSmartTerminal()
{
    const std::string terminal = variable("TERM");
    return isatty(STDOUT_FILENO) == 1 && !terminal.empty() && terminal != "dumb";
}

std::string cli::heading(const std::string& text)
{
    return between("\033[1m", text);
}

std::string cli::colored(const std::string& word)
{
    for (const Tone& tone : TONES)
        if (word == tone.word)
            return between(tone.escape, word);
    return word;
}
