// SPDX-License-Identifier: Apache-2.0
// Radios and connections that answer, and change, as a test says.
#ifndef TESTS_SUPPORT_FAKE_NETWORK_H
#define TESTS_SUPPORT_FAKE_NETWORK_H

#include <functional>
#include <memory>
#include <mutex>
#include <utility>

#include "backend/Network.h"
#include "support/Answer.h"

class FakeNetwork : public port::Network {
public:
    struct Answers {
        Answer<port::CellularState> cellular = answered(port::CellularState::OutOfService);
        Answer<port::LinkState> wifi = answered(port::LinkState::Disconnected);
        Answer<port::WifiConnection> wifiConnection = answered(port::WifiConnection::Disconnected);
        Answer<port::LinkState> bluetooth = answered(port::LinkState::Deactivated);
        Answer<bool> flightMode = answered(false);
        Answer<bool> packetData = answered(false);
        Answer<bool> mobileData = answered(false);
        Answer<bool> dataRoaming = answered(false);
    };

    bool watchable = true;

    /// Changes the answers, and tells whoever watches.
    void change(const std::function<void(Answers&)>& edit)
    {
        {
            const std::lock_guard<std::mutex> lock(mutex_);
            edit(answers_);
        }
        tell();
    }
    void tell()
    {
        const std::lock_guard<std::mutex> lock(telling_);
        for (const auto* const call : {&changed_, &settled_})
            if (*call)
                (*call)();
    }
    int watches()
    {
        const std::lock_guard<std::mutex> lock(telling_);
        return watches_;
    }

    Answer<port::CellularState> cellular() override
    {
        return get(&Answers::cellular);
    }
    Answer<port::LinkState> wifi() override
    {
        return get(&Answers::wifi);
    }
    Answer<port::WifiConnection> wifiConnection() override
    {
        return get(&Answers::wifiConnection);
    }
    Answer<port::LinkState> bluetooth() override
    {
        return get(&Answers::bluetooth);
    }
    template <typename T>
    T get(T Answers::*answer)
    {
        const std::lock_guard<std::mutex> lock(mutex_);
        return answers_.*answer;
    }

    std::unique_ptr<port::Watch> watch(std::function<void()> changed) override
    {
        if (!watchable)
            return nullptr;
        return std::make_unique<OneWatch>(*this, std::move(changed));
    }

private:
    class OneWatch : public port::Watch {
    public:
        OneWatch(FakeNetwork& network, std::function<void()> changed) : network_(network)
        {
            const std::lock_guard<std::mutex> lock(network_.telling_);
            ++network_.watches_;
            network_.changed_ = std::move(changed);
        }
        ~OneWatch() override
        {
            const std::lock_guard<std::mutex> lock(network_.telling_);
            --network_.watches_;
            network_.changed_ = network_.settled_ = nullptr;
        }
        void tellSettled(std::function<void()> settled) override
        {
            const std::lock_guard<std::mutex> lock(network_.telling_);
            network_.settled_ = std::move(settled);
        }

    private:
        FakeNetwork& network_;
    };

    std::mutex mutex_;
    Answers answers_;
    std::mutex telling_; // held during a call, so that the end of a watch waits for it
    std::function<void()> changed_;
    std::function<void()> settled_;
    int watches_ = 0;
};

#endif
