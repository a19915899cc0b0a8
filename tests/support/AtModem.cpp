// SPDX-License-Identifier: Apache-2.0
#include "support/AtModem.h"

#include <algorithm>
#include <cstddef>
#include <cstring>
#include <stdexcept>

#include <poll.h>
#include <sys/eventfd.h>
#include <sys/socket.h>
#include <sys/un.h>
#include <unistd.h>

namespace {

const char OK[] = "OK";
const char ERROR[] = "ERROR";
// 27.007, 9.2.1
const char SIM_NOT_INSERTED[] = "+CME ERROR: 10";
const char SIM_PIN_REQUIRED[] = "+CME ERROR: 11";
const char SIM_PUK_REQUIRED[] = "+CME ERROR: 12";
const char INCORRECT_PASSWORD[] = "+CME ERROR: 16";

int listenAt(const std::string& port)
{
    sockaddr_un address = {};
    address.sun_family = AF_UNIX;
    // An abstract name: it begins with a zero byte, and the word "abstract:" is part of it.
    port.copy(address.sun_path + 1, sizeof address.sun_path - 1);
    const auto size = static_cast<socklen_t>(offsetof(sockaddr_un, sun_path) + 1 + port.size());
    const int listener = socket(AF_UNIX, SOCK_STREAM | SOCK_CLOEXEC, 0);
    if (bind(listener, reinterpret_cast<sockaddr*>(&address), size) != 0 ||
        listen(listener, 8) != 0)
        throw std::runtime_error("cannot listen at " + port);
    return listener;
}

std::string information(const std::string& text)
{
    return text + "\n" + OK;
}

// Digits as a card stores them: two to a byte, the first in the lower half.
std::string swapped(std::string digits)
{
    if (digits.size() % 2 != 0)
        digits += 'F';
    for (std::size_t i = 0; i + 1 < digits.size(); i += 2)
        std::swap(digits[i], digits[i + 1]);
    return digits;
}

// "\r\n" around each line of an answer.
std::string framed(const std::string& answer)
{
    std::string text = "\r\n";
    for (const char c : answer)
        text += c == '\n' ? "\r\n\r\n" : std::string(1, c);
    return text + "\r\n";
}

// The commands of a line, which semicolons part.
std::vector<std::string> commandsOf(const std::string& line)
{
    std::vector<std::string> commands(1);
    bool quoted = false;
    for (const char c : line) {
        quoted ^= c == '"';
        if (c == ';' && !quoted)
            commands.emplace_back();
        else
            commands.back() += c;
    }
    return commands;
}

} // namespace

// A command is its name and one of the forms "=?", "?", "=" or none, as 27.007 has them.
struct AtModem::Row {
    const char* command;
    const char* text; // the whole answer; null: the handler's
    std::string (*handler)(AtModem& modem, const std::string& argument) = nullptr;
};

const AtModem::Row AtModem::ROWS[] = {
    {"+GCAP", "+GCAP: +CGSM\nOK"},
    {"I", "Simulated modem\n+GCAP: +CGSM\nOK"},
    {"+CGMI", "Simulations\nOK"},
    {"+CGMM", "AT modem\nOK"},
    {"+CGMR", "1.0\nOK"},
    {"+CGSN", nullptr, [](AtModem& modem, const auto&) { return information(modem.state_.imei); }},
    {"+WS46=?", "+WS46: (12,22,28,25,29)\nOK"},
    {"+IFC=?", "+IFC: (0-2),(0-2)\nOK"},
    {"+CSCS=?", "+CSCS: (\"IRA\")\nOK"},
    {"+CSCS?", "+CSCS: \"IRA\"\nOK"},
    {"+CFUN=?", "+CFUN: (0,1,4),(0,1)\nOK"},
    {"+CFUN?", "+CFUN: 1\nOK"},
    // the card
    {"+CPIN?", nullptr,
     [](AtModem& modem, const auto&) {
         const std::string error = modem.cardError();
         return error == SIM_NOT_INSERTED   ? error
                : error == SIM_PIN_REQUIRED ? information("+CPIN: SIM PIN")
                : error == SIM_PUK_REQUIRED ? information("+CPIN: SIM PUK")
                                            : information("+CPIN: READY");
     }},
    {"+CPIN=", nullptr,
     [](AtModem& modem, const auto& argument) -> std::string {
         State& state = modem.state_;
         if (state.pinRetries > 0 && argument == "\"" + state.pin + "\"") {
             state.pin.clear();
             return OK;
         }
         state.pinRetries = std::max(0, state.pinRetries - 1);
         return INCORRECT_PASSWORD;
     }},
    {"+CLCK=?", "+CLCK: (\"SC\")\nOK"},
    {"+CLCK=", nullptr,
     [](AtModem& modem, const auto& argument) {
         if (argument.compare(0, 6, "\"SC\",2") != 0)
             return std::string(ERROR);
         return information(modem.state_.pin.empty() ? "+CLCK: 0" : "+CLCK: 1");
     }},
    // VERIFY and UNBLOCK CHV without data (51.011, 9.2.9 and 9.2.13): the card tells the retries
    // left.
    {"+CSIM=", nullptr,
     [](AtModem& modem, const auto& argument) {
         const bool unblock = argument.find("\"002C") != std::string::npos;
         const int left = unblock ? modem.state_.pukRetries : modem.state_.pinRetries;
         return information(std::string("+CSIM: 4,\"63C") + "0123456789ABCDEF"[left] + "\"");
     }},
    // READ BINARY of the card's number, of the length of its MNC, and of its operator's name
    // (51.011, 10.1.1, 10.3.18 and 10.3.11); no other file is there.
    {"+CRSM=", nullptr,
     [](AtModem& modem, const auto& argument) {
         const std::pair<const char*, std::string> files[] = {
             {"176,12258", swapped("8901010123456789012")},
             {"176,28589", "0000000" + std::to_string(modem.state_.mncLength)},
             {"176,28486", "0153494D" + std::string(26, 'F')}};
         if (!modem.cardError().empty())
             return modem.cardError();
         for (const auto& [file, content] : files)
             if (argument.compare(0, 9, file) == 0)
                 return information("+CRSM: 144,0,\"" + content + "\"");
         return information("+CRSM: 148,4");
     }},
    {"+CIMI", nullptr,
     [](AtModem& modem, const auto&) {
         return modem.cardError().empty() ? information(modem.state_.imsi) : modem.cardError();
     }},
    {"+CNUM", nullptr,
     [](AtModem& modem, const auto&) {
         const std::string& number = modem.state_.number;
         if (!modem.cardError().empty() || number.empty())
             return modem.cardError().empty() ? OK : modem.cardError();
         return information("+CNUM: \"\",\"" + number + "\"," +
                            (number.front() == '+' ? "145" : "129"));
     }},
    // the network, besides +CREG and its kind
    {"+COPS?", nullptr,
     [](AtModem& modem, const auto&) {
         return information(modem.isRegistered() ? "+COPS: 0,2,\"" + modem.state_.network + "\",7"
                                                 : "+COPS: 0");
     }},
    {"+CSQ", "+CSQ: 20,99\nOK"},
    {"+CGATT?", nullptr,
     [](AtModem& modem, const auto&) {
         return information(modem.isRegistered() ? "+CGATT: 1" : "+CGATT: 0");
     }},
    {"+CGDCONT=?", "+CGDCONT: (1-11),\"IP\",,,(0-2),(0-3)\nOK"},
    {"+CGDCONT?", "+CGDCONT: 1,\"IP\",\"internet\",\"\",0,0\nOK"},
    {"+CGACT?", "+CGACT: 1,0\nOK"},
    // messages
    {"+CNMI=?", "+CNMI: (0-2),(0-3),(0,2),(0-2),(0,1)\nOK"},
    {"+CMGF=?", "+CMGF: (0,1)\nOK"},
    {"+CPMS=?", "+CPMS: (\"SM\",\"ME\"),(\"SM\",\"ME\"),(\"SM\",\"ME\")\nOK"},
    {"+CPMS?", "+CPMS: \"ME\",0,10,\"ME\",0,10,\"ME\",0,10\nOK"},
    {"+CPMS=", "+CPMS: 0,10,0,10,0,10\nOK"},
    {"+CMGL=", OK},
};

// Settings that change nothing that is asked for.
const std::string SETTINGS[] = {"E",        "V",      "X",      "Z",      "&",
                                "+CMEE=",   "+CSCS=", "+IFC=",  "+CFUN=", "+COPS=",
                                "+CGEREP=", "+CTZR=", "+CTZU=", "+CNMI=", "+CMGF=",
                                "+CLIP=",   "+CRC=",  "+CCWA=", "+CUSD="};

AtModem::AtModem(const std::string& name, const State& state)
    : port_("abstract:at-modem-" + std::to_string(getpid()) + "-" + name), socket_(listenAt(port_)),
      stop_(eventfd(0, EFD_CLOEXEC)), state_(state), thread_(&AtModem::serve, this)
{
}

AtModem::~AtModem()
{
    eventfd_write(stop_, 1);
    thread_.join();
    for (const Caller& caller : callers_)
        close(caller.descriptor);
    close(socket_);
    close(stop_);
}

void AtModem::change(const std::function<void(State&)>& edit)
{
    const std::lock_guard<std::mutex> lock(mutex_);
    const int before = registration();
    edit(state_);
    if (registration() == before)
        return;
    for (const auto& [command, mode] : reports_)
        for (const Caller& caller : callers_)
            if (const std::string line = framed(registrationLine(command, "")); mode != "0")
                send(caller.descriptor, line.data(), line.size(), MSG_NOSIGNAL);
}

void AtModem::serve()
{
    for (;;) {
        std::vector<pollfd> watched = {{stop_, POLLIN, 0}, {socket_, POLLIN, 0}};
        for (const Caller& caller : callers_)
            watched.push_back({caller.descriptor, POLLIN, 0});
        poll(watched.data(), watched.size(), -1);
        if (watched[0].revents != 0)
            return;
        const std::lock_guard<std::mutex> lock(mutex_);
        for (std::size_t i = watched.size(); i > 2; --i)
            if (watched[i - 1].revents != 0 && !hear(callers_[i - 3]))
                callers_.erase(callers_.begin() + static_cast<std::ptrdiff_t>(i - 3));
        const int caller =
            watched[1].revents != 0 ? accept4(socket_, nullptr, nullptr, SOCK_CLOEXEC) : -1;
        if (caller >= 0)
            callers_.push_back({caller, ""});
    }
}

// False when the caller hung up.
bool AtModem::hear(Caller& caller)
{
    char block[1024];
    const ssize_t size = recv(caller.descriptor, block, sizeof block, 0);
    if (size <= 0) {
        close(caller.descriptor);
        return false;
    }
    caller.received.append(block, static_cast<std::size_t>(size));
    for (std::size_t end; (end = caller.received.find('\r')) != std::string::npos;) {
        const std::string reply = answer(caller.received.substr(0, end));
        caller.received.erase(0, end + 1);
        send(caller.descriptor, reply.data(), reply.size(), MSG_NOSIGNAL);
    }
    return true;
}

// The answer to a line is that to its commands, up to the first that fails.
std::string AtModem::answer(const std::string& line)
{
    const std::size_t begin = line.find("AT");
    if (begin == std::string::npos)
        return "";
    std::string texts;
    for (const std::string& command : commandsOf(line.substr(begin + 2))) {
        const std::string reply = answerTo(command);
        const std::size_t last = reply.rfind('\n') + 1;
        if (reply.substr(last) != OK)
            return framed(texts + reply);
        texts += reply.substr(0, last);
    }
    return framed(texts + OK);
}

std::string AtModem::answerTo(const std::string& command)
{
    if (command.empty())
        return OK;
    for (auto& [domain, mode] : reports_) {
        if (command == domain + "=?")
            return information(domain + ": (0-2)");
        if (command == domain + "?")
            return information(registrationLine(domain, mode + ","));
        if (command.rfind(domain + "=", 0) == 0) {
            mode = command.substr(domain.size() + 1);
            return OK;
        }
    }
    for (const Row& row : ROWS) {
        const std::string known = row.command;
        if (known.back() == '=' ? command.compare(0, known.size(), known) == 0 : command == known)
            return row.text != nullptr ? row.text
                                       : row.handler(*this, command.substr(known.size()));
    }
    const auto begins = [&](const std::string& name) { return command.rfind(name, 0) == 0; };
    return std::any_of(std::begin(SETTINGS), std::end(SETTINGS), begins) ? OK : ERROR;
}

std::string AtModem::cardError() const
{
    if (!state_.hasSim)
        return SIM_NOT_INSERTED;
    if (state_.pin.empty())
        return "";
    return state_.pinRetries > 0 ? SIM_PIN_REQUIRED : SIM_PUK_REQUIRED;
}

int AtModem::registration() const
{
    return cardError().empty() ? state_.registration : 0;
}

bool AtModem::isRegistered() const
{
    return registration() == 1 || registration() == 5;
}

std::string AtModem::registrationLine(const std::string& command, const std::string& mode) const
{
    const bool hasPlace = isRegistered() && reports_.at(command) == "2";
    return command + ": " + mode + std::to_string(registration()) +
           (hasPlace ? ",\"1234\",\"001122BB\",7" : "");
}
