// SPDX-License-Identifier: Apache-2.0
// The same device through both backends: what a device file says must be answered alike when real
// services on a bus, and files, say the same.
#include <cstdlib>
#include <map>
#include <memory>

#include <gmock/gmock.h>

#include "backend/Backend.h"
#include "coresystem_port.h"
#include "devicefile/Toml.h"
#include "linux/DeviceInfo.h"
#include "linux/Settings.h"
#include "support/PrivateBus.h"
#include "support/ScriptedService.h"
#include "support/Together.h"

using port::Fact;
using port::Question;
using port::Result;
using testing::IsEmpty;
using testing::MatchesRegex;
using testing::Not;

namespace {

// A device's facts by their key in a device file; "machine" is what its identifier stems from.
using Facts = std::map<std::string, std::string>;

// A device that one backend shows.
class Stage {
public:
    virtual ~Stage() = default;
    virtual void show(const Facts& facts) = 0;
    virtual Result<Fact> read(Question question) = 0;
};

std::string quoted(const std::string& value)
{
    std::ostringstream text;
    text << toml::toml_formatter{toml::value<std::string>(value), toml::format_flags::none};
    return text.str();
}

class SimulatorStage : public Stage {
public:
    void show(const Facts& facts) override
    {
        std::string text = "schema = 1\n";
        for (const auto& [key, value] : facts) {
            if (key == "machine")
                text += "device.platform_id = " + quoted(identifierOf(value)) + "\n";
            else
                text += (key == "language" || key == "device_name" ? "settings." : "device.") +
                        key + " = " + quoted(value) + "\n";
        }
        tree_.write("/device.toml", text);
    }
    Result<Fact> read(Question question) override
    {
        return port::answerOf<std::string>(backend_->read(question));
    }

private:
    // Any identifier of the right form that differs from machine to machine.
    static std::string identifierOf(const std::string& machine)
    {
        std::string id = machine;
        id[12] = '4';
        id[16] = 'a';
        return id;
    }

    TemporaryTree tree_;
    const std::unique_ptr<port::Backend> backend_ =
        port::makeSimulatorBackend(tree_.path("/device.toml"));
};

class LinuxStage : public Stage {
public:
    LinuxStage()
    {
        for (const char* const variable : {"LC_ALL", "LC_MESSAGES", "LANG"})
            unsetenv(variable);
        bus_.start();
        hostname1_ = std::make_unique<ScriptedService>(bus_.address(), "org.freedesktop.hostname1");
        locale1_ = std::make_unique<ScriptedService>(bus_.address(), "org.freedesktop.locale1");
    }

    void show(const Facts& facts) override
    {
        hostname1_->answer("({'PrettyHostname': <" + text(facts, "device_name") +
                           ">, 'HardwareModel': <" + text(facts, "model_name") + ">},)");
        locale1_->answer("({'Locale': <['LC_TIME=xx_XX', " + text(facts, "language", "LANG=") +
                         "]>},)");
        std::string release;
        for (const auto& [key, variable] :
             {std::pair("platform_name", "NAME="), std::pair("platform_version", "VERSION_ID=")})
            if (facts.count(key) != 0)
                release += std::string(variable) + "'" + facts.at(key) + "'\n";
        tree_.write("/etc/os-release", release);
        const auto machine = facts.find("machine");
        tree_.write("/etc/machine-id", machine != facts.end() ? machine->second : "");
    }
    Result<Fact> read(Question question) override
    {
        switch (question) {
        case Question::PlatformId:
            return deviceInfo_.platformId();
        case Question::PlatformName:
            return deviceInfo_.platformName();
        case Question::PlatformVersion:
            return deviceInfo_.platformVersion();
        case Question::ModelName:
            return deviceInfo_.modelName();
        case Question::DeviceName:
            return settings_.deviceName();
        default:
            return settings_.language();
        }
    }

private:
    static std::string text(const Facts& facts, const std::string& key,
                            const std::string& before = "")
    {
        const auto found = facts.find(key);
        GVariant* const value = g_variant_ref_sink(
            g_variant_new_string((found != facts.end() ? before + found->second : "").c_str()));
        char* const printed = g_variant_print(value, FALSE);
        const std::string result = printed;
        g_free(printed);
        g_variant_unref(value);
        return result;
    }

    PrivateBus bus_;
    TemporaryTree tree_;
    std::unique_ptr<ScriptedService> hostname1_;
    std::unique_ptr<ScriptedService> locale1_;
    port::linux_backend::Bus client_;
    port::linux_backend::LinuxDeviceInfo deviceInfo_{client_, tree_.root()};
    port::linux_backend::LinuxSettings settings_{client_};
};

// The facts that both can show. The identifier is none of them: the linux backend's is a hash.
Facts factsOf(const std::string& deviceFile)
{
    constexpr std::pair<const char*, const char*> SHOWN[] = {{"device", "platform_name"},
                                                             {"device", "platform_version"},
                                                             {"device", "model_name"},
                                                             {"settings", "device_name"},
                                                             {"settings", "language"}};
    Facts facts = {{"machine", "4f2d9c0b6a714e8d95c3b17e20fd86aa"}};
    const toml::table file = toml::parse_file(std::string(DEVICE_FILES "/") + deviceFile);
    for (const auto& [section, key] : SHOWN)
        if (const auto value = file[section][key].value<std::string>())
            facts[key] = *value;
    return facts;
}

struct Asked {
    const char* key;
    Result<Fact> answer;
};

std::vector<Asked> askEverything(Stage& stage)
{
    return {{"platform_name", stage.read(Question::PlatformName)},
            {"platform_version", stage.read(Question::PlatformVersion)},
            {"model_name", stage.read(Question::ModelName)},
            {"device_name", stage.read(Question::DeviceName)},
            {"language", stage.read(Question::Language)}};
}

void expectAnswers(Stage& stage, const Facts& facts)
{
    for (const auto& [key, answer] : askEverything(stage)) {
        ASSERT_TRUE(answer) << key << ": " << answer.error().reason;
        EXPECT_EQ(facts.at(key), answer.value().value);
        EXPECT_THAT(answer.value().source, Not(IsEmpty())) << key;
    }
}

template <typename Backend>
class ContractTest : public testing::Test {
protected:
    ContractTest()
    {
        coresystem_port::setLogSink(coresystem_port::LogSink::None);
    }
    Backend stage;
};

using Backends = testing::Types<SimulatorStage, LinuxStage>;
struct BackendName {
    template <typename Backend>
    static std::string GetName(int)
    {
        return std::is_same_v<Backend, LinuxStage> ? "Linux" : "Simulator";
    }
};
TYPED_TEST_SUITE(ContractTest, Backends, BackendName);

TYPED_TEST(ContractTest, SampleDevicesAreAnsweredAsDescribed)
{
    for (const char* const file : {"dual_sim.toml", "tablet.toml", "names.toml"}) {
        const Facts facts = factsOf(file);
        this->stage.show(facts);
        expectAnswers(this->stage, facts);
    }
}

TYPED_TEST(ContractTest, AbsentFactIsNotAvailableWithAReason)
{
    for (const char* const key : {"platform_name", "platform_version", "model_name", "language"}) {
        Facts facts = factsOf("dual_sim.toml");
        facts.erase(key);
        this->stage.show(facts);
        for (const auto& [asked, answer] : askEverything(this->stage)) {
            EXPECT_EQ(std::string(asked) != key, static_cast<bool>(answer)) << asked;
            if (!answer) {
                EXPECT_EQ(port::Error::Kind::NotAvailable, answer.error().kind);
                EXPECT_THAT(answer.error().reason, Not(IsEmpty()));
            }
        }
    }
}

TYPED_TEST(ContractTest, NothingIsCached)
{
    Facts facts = factsOf("dual_sim.toml");
    for (const char* const next : {"one", "two", "six"}) {
        for (const char* const key :
             {"platform_name", "platform_version", "model_name", "device_name", "language"})
            facts[key] = next;
        this->stage.show(facts);
        expectAnswers(this->stage, facts);
    }
}

TYPED_TEST(ContractTest, IdentifierHasOneFormAndTellsDevicesApart)
{
    std::string last;
    for (const char* const machine :
         {"4f2d9c0b6a714e8d95c3b17e20fd86aa", "5f2d9c0b6a714e8d95c3b17e20fd86aa"}) {
        this->stage.show({{"machine", machine}});
        const Result<Fact> first = this->stage.read(Question::PlatformId);
        const Result<Fact> second = this->stage.read(Question::PlatformId);
        ASSERT_TRUE(first && second);
        EXPECT_EQ(first.value().value, second.value().value);
        EXPECT_NE(last, first.value().value);
        EXPECT_THAT(first.value().value,
                    MatchesRegex("[0-9a-f]{12}4[0-9a-f]{3}[89ab][0-9a-f]{15}"));
        last = first.value().value;
    }
    this->stage.show({});
    EXPECT_FALSE(this->stage.read(Question::PlatformId));
}

TYPED_TEST(ContractTest, ThreadsMayAskAtOnce)
{
    const Facts facts = factsOf("dual_sim.toml");
    this->stage.show(facts);
    together(8, [&](int) {
        for (int round = 0; round < 10; ++round)
            expectAnswers(this->stage, facts);
    });
}

using Kind = coresystem_port::Answer::Kind;

// A value of a device file as the port tells it.
std::pair<std::string, Kind> told(const toml::node_view<const toml::node>& value)
{
    if (value.is_boolean())
        return {*value.value<bool>() ? "true" : "false", Kind::Switch};
    if (value.is_integer())
        return {std::to_string(*value.value<int>()), Kind::Number};
    return {value.value_or("no value"), Kind::Text};
}

TEST(PortsOwnAnswersTest, EveryPlainFactIsToldInTheWordsOfTheDeviceFile)
{
    const auto device = port::makeSimulatorBackend(DEVICE_FILES "/dual_sim.toml");
    port::substituteBackend(device.get());
    const toml::table file = toml::parse_file(DEVICE_FILES "/dual_sim.toml");
    const auto expectAnswer = [&](Question question, const char* section, const char* key) {
        const auto answer = coresystem_port::ask(question);
        EXPECT_EQ(told(file[section][key]), std::make_pair(answer.word, answer.kind)) << key;
        EXPECT_THAT(answer.origin.source, Not(IsEmpty())) << key;
    };
#define FACT(number, question, section, key, ...) expectAnswer(Question::question, section, key);
#include "facts/facts.def"
    const auto other = coresystem_port::ask(Question::Storage);
    port::substituteBackend(nullptr);
    EXPECT_EQ("", other.word);
    EXPECT_EQ("the port has no answer of its own to this question", other.origin.reason);
}

} // namespace
