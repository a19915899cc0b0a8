// SPDX-License-Identifier: Apache-2.0
#ifndef TESTS_SUPPORT_HOSTILE_BUS_H
#define TESTS_SUPPORT_HOSTILE_BUS_H

#include <stdexcept>
#include <string>

#include <fcntl.h>
#include <unistd.h>

#include "support/Child.h"

// A bus that misbehaves in the place of another, as long as it lives.
class HostileBus {
public:
    HostileBus(const std::string& socket, const char* script)
    {
        unlink(socket.c_str());
        int answers[2];
        if (pipe2(life_, O_CLOEXEC) != 0 || pipe2(answers, O_CLOEXEC) != 0)
            throw std::runtime_error("no pipe");
        process_.start([&] {
            dup2(life_[0], STDIN_FILENO);
            dup2(answers[1], STDOUT_FILENO);
            execl(HOSTILE_BUS, HOSTILE_BUS, socket.c_str(), script, static_cast<char*>(nullptr));
        });
        close(answers[1]);
        char byte = 0;
        const bool isReady = read(answers[0], &byte, 1) == 1;
        close(answers[0]);
        if (!isReady)
            throw std::runtime_error(std::string(HOSTILE_BUS) + " does not start");
    }
    ~HostileBus()
    {
        close(life_[0]);
        close(life_[1]);
    }
    HostileBus(const HostileBus&) = delete;
    HostileBus& operator=(const HostileBus&) = delete;

private:
    int life_[2] = {-1, -1};
    Process process_;
};

#endif
