// SPDX-License-Identifier: Apache-2.0
// A backend that answers what a test says.
#ifndef TESTS_SUPPORT_FAKE_BACKEND_H
#define TESTS_SUPPORT_FAKE_BACKEND_H

#include <functional>
#include <memory>
#include <mutex>
#include <string>
#include <utility>
#include <vector>

#include "backend/Backend.h"
#include "support/Answer.h"

// Radios and connections that change as a test says.
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

class FakeTelephony : public port::Telephony {
public:
    using Names = std::vector<port::SlotName>;
    using Number = std::optional<std::string>;

    // The answers of every slot.
    Answer<Names> slotsAnswer = answered(Names{"modem0", "modem1"});
    Answer<port::Card> cardAnswer = answered(port::Card{port::CardStatus::Ready, false});
    Answer<port::Imsi> imsiAnswer = answered(port::Imsi{"001", "01", "0123456789"});
    Answer<Number> numberAnswer = answered(Number("+15550100"));
    Answer<std::string> imeiAnswer = answered(std::string("490154203237518"));
    Answer<port::ServiceState> serviceAnswer = answered(port::ServiceState::InService);
    Answer<bool> roamingAnswer = answered(false);
    Answer<port::Subscriptions> subscriptionsAnswer = answered(port::Subscriptions{});
    Answer<bool> smsAnswer = answered(true);

    std::function<void()> before = [] {}; // runs in every question; may throw
    std::vector<std::string> questions;   // "card modem1"

    Answer<Names> slots() override
    {
        return tell("slots", slotsAnswer);
    }
    Answer<port::Card> card(const port::SlotName& slot) override
    {
        return tell("card " + slot, cardAnswer);
    }
    Answer<port::Imsi> imsi(const port::SlotName& slot) override
    {
        return tell("imsi " + slot, imsiAnswer);
    }
    Answer<Number> number(const port::SlotName& slot) override
    {
        return tell("number " + slot, numberAnswer);
    }
    Answer<std::string> imei(const port::SlotName& slot) override
    {
        return tell("imei " + slot, imeiAnswer);
    }
    Answer<port::ServiceState> service(const port::SlotName& slot) override
    {
        return tell("service " + slot, serviceAnswer);
    }
    Answer<bool> roaming(const port::SlotName& slot) override
    {
        return tell("roaming " + slot, roamingAnswer);
    }
    Answer<port::Subscriptions> subscriptions() override
    {
        return tell("subscriptions", subscriptionsAnswer);
    }
    Answer<bool> smsReady(const port::SlotName& slot) override
    {
        return tell("sms " + slot, smsAnswer);
    }

private:
    template <typename T>
    T tell(const std::string& question, const T& answer)
    {
        const std::lock_guard<std::mutex> lock(mutex_);
        questions.push_back(question);
        before();
        return answer;
    }

    std::mutex mutex_;
};

class FakeBackend : public port::Backend {
public:
    using Version = std::optional<std::string>;

    FakeTelephony fakeTelephony;
    FakeNetwork fakeNetwork; // and its switches
    Answer<port::FontSize> fontSizeAnswer = answered(port::FontSize::Normal);
    Answer<port::VolumeSize> storageAnswer = answered(port::VolumeSize{4096, 1024, 40, 5});
    std::function<Answer<Version>(const std::string&)> versionAnswer = [](const std::string&) {
        return answered(Version("1.0"));
    };
    std::function<Answer<std::string>(const std::string&)> textAnswer = [](const std::string& key) {
        return answered("value of " + key);
    };
    Answer<std::tm> nowAnswer = answered(std::tm{});

    std::string name() const override
    {
        return "fake";
    }
    port::FactAnswer read(port::Question fact) override
    {
        switch (fact) {
        case port::Question::FontSize:
            return port::factAnswer(fontSizeAnswer);
        case port::Question::SalesCode:
            return port::factAnswer(textAnswer(port::SALES_CODE));
        case port::Question::FlightMode:
            return port::factAnswer(fakeNetwork.get(&FakeNetwork::Answers::flightMode));
        case port::Question::PacketData:
            return port::factAnswer(fakeNetwork.get(&FakeNetwork::Answers::packetData));
        case port::Question::MobileData:
            return port::factAnswer(fakeNetwork.get(&FakeNetwork::Answers::mobileData));
        case port::Question::DataRoaming:
            return port::factAnswer(fakeNetwork.get(&FakeNetwork::Answers::dataRoaming));
        default:
            return port::notSupported("the fake has none");
        }
    }
    port::Telephony& telephony() override
    {
        return fakeTelephony;
    }
    port::Network& network() override
    {
        return fakeNetwork;
    }
    Answer<port::VolumeSize> internalStorage() override
    {
        return storageAnswer;
    }
    Answer<Version> packageVersion(const std::string& name) override
    {
        return versionAnswer(name);
    }
    Answer<std::string> configuration(const std::string& key) override
    {
        return textAnswer(key);
    }
    Answer<std::tm> now() override
    {
        return nowAnswer;
    }
    std::vector<coresystem_port::Service> findServices() override
    {
        return {};
    }
};

/// While it lives, this is the process's backend.
class FakedBackend : public FakeBackend {
public:
    FakedBackend()
    {
        port::substituteBackend(this);
    }
    ~FakedBackend() override
    {
        port::substituteBackend(nullptr);
    }
};

#endif
