// SPDX-License-Identifier: Apache-2.0
// A backend that answers what a test says. A program that is linked with
// -Wl,--wrap=_ZN4port7backendEv asks it in place of the machine or a device file.
#ifndef TESTS_SUPPORT_FAKE_BACKEND_H
#define TESTS_SUPPORT_FAKE_BACKEND_H

#include <functional>
#include <mutex>
#include <string>
#include <vector>

#include "backend/Backend.h"
#include "support/Answer.h"
#include "support/FakeNetwork.h"

class FakeTelephony : public port::Telephony {
public:
    using Names = std::vector<port::SlotName>;
    using Number = std::optional<std::string>;

    // What every slot answers.
    Answer<Names> slotsAnswer = answered(Names{"modem0", "modem1"});
    Answer<port::Card> cardAnswer = answered(port::Card{port::CardStatus::Ready, false});
    Answer<port::Imsi> imsiAnswer = answered(port::Imsi{"001", "01", "0123456789"});
    Answer<Number> numberAnswer = answered(Number("+15550100"));
    Answer<std::string> imeiAnswer = answered(std::string("490154203237518"));
    Answer<port::Service> serviceAnswer = answered(port::Service::InService);
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
    Answer<port::Service> service(const port::SlotName& slot) override
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

// One answer for each of the other interfaces.
class FakeStorage : public port::Storage {
public:
    Answer<port::VolumeSize> internalAnswer = answered(port::VolumeSize{4096, 1024, 40, 5});

    Answer<port::VolumeSize> internal() override
    {
        return internalAnswer;
    }
};

class FakePackages : public port::Packages {
public:
    using Version = std::optional<std::string>;

    std::function<Answer<Version>(const std::string&)> versionAnswer = [](const std::string&) {
        return answered(Version("1.0"));
    };

    Answer<Version> version(const std::string& name) override
    {
        return versionAnswer(name);
    }
};

class FakeConfiguration : public port::Configuration {
public:
    std::function<Answer<std::string>(const std::string&)> textAnswer = [](const std::string& key) {
        return answered("value of " + key);
    };

    Answer<std::string> text(const std::string& key) override
    {
        return textAnswer(key);
    }
};

class FakeClock : public port::Clock {
public:
    Answer<std::tm> nowAnswer = answered(std::tm{});

    Answer<std::tm> now() override
    {
        return nowAnswer;
    }
};

class FakeSettings : public port::Settings {
public:
    Answer<port::FontSize> fontSizeAnswer = answered(port::FontSize::Normal);

    Answer<port::FontSize> fontSize() override
    {
        return fontSizeAnswer;
    }
};

class FakeBackend : public port::Backend {
public:
    FakeTelephony fakeTelephony;
    FakeSettings fakeSettings;
    FakeNetwork fakeNetwork;
    FakeStorage fakeStorage;
    FakePackages fakePackages;
    FakeConfiguration fakeConfiguration;
    FakeClock fakeClock;

    std::string name() const override
    {
        return "fake";
    }
    port::DeviceInfo& deviceInfo() override
    {
        return deviceInfo_;
    }
    port::Settings& settings() override
    {
        return fakeSettings;
    }
    port::Telephony& telephony() override
    {
        return fakeTelephony;
    }
    port::Network& network() override
    {
        return fakeNetwork;
    }
    port::Storage& storage() override
    {
        return fakeStorage;
    }
    port::Packages& packages() override
    {
        return fakePackages;
    }
    port::Configuration& configuration() override
    {
        return fakeConfiguration;
    }
    port::Clock& clock() override
    {
        return fakeClock;
    }
    std::vector<coresystem_port::Service> findServices() override
    {
        return {};
    }

private:
    port::DeviceInfo deviceInfo_;
};

/// While it lives, this is the process's backend.
class FakedBackend : public FakeBackend {
public:
    FakedBackend();
    ~FakedBackend() override;
};

#endif
