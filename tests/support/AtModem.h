// SPDX-License-Identifier: Apache-2.0
// A simulated modem that speaks AT commands (3GPP TS 27.007, 27.005, 51.011).
#ifndef TESTS_SUPPORT_AT_MODEM_H
#define TESTS_SUPPORT_AT_MODEM_H

#include <functional>
#include <map>
#include <mutex>
#include <string>
#include <thread>
#include <vector>

/// Listens on an abstract socket, as ModemManager's virtual ports do, from construction to
/// destruction. Any number of connections; any thread.
class AtModem {
public:
    struct State {
        std::string imei = "490154203237518";
        bool hasSim = true;
        std::string imsi = "001010123456789";
        int mncLength = 2;
        std::string number = "+15551230001"; // empty: none on the card
        std::string pin;                     // what the card asks for; empty: nothing
        int pinRetries = 3;                  // with none left it asks for the PUK
        int pukRetries = 10;
        int registration = 1; // <stat> of +CREG: 1 home, 2 searching, 3 denied, 5 roaming
        std::string network = "00101";
    };

    AtModem(const std::string& name, const State& state);
    ~AtModem();
    AtModem(const AtModem&) = delete;
    AtModem& operator=(const AtModem&) = delete;

    /// As ModemManager takes it.
    const std::string& port() const
    {
        return port_;
    }
    /// Changes the state and says by itself what a real modem would.
    void change(const std::function<void(State&)>& edit);

private:
    struct Row;
    struct Caller {
        int descriptor;
        std::string received;
    };

    void serve();
    bool hear(Caller& caller);
    std::string answer(const std::string& line);
    std::string answerTo(const std::string& command);

    std::string cardError() const;
    int registration() const;
    bool isRegistered() const;
    std::string registrationLine(const std::string& command, const std::string& mode) const;

    static const Row ROWS[];

    const std::string port_;
    const int socket_;
    const int stop_;
    std::mutex mutex_;
    State state_;
    std::map<std::string, std::string> reports_ = { // how much each reports
        {"+CREG", "0"},
        {"+CGREG", "0"},
        {"+CEREG", "0"}};
    std::vector<Caller> callers_;
    std::thread thread_;
};

#endif
