// SPDX-License-Identifier: Apache-2.0
// The platform's C functions over a device file.
#include <cstdlib>
#include <cstring>
#include <thread>

#include <dlog.h>
#include <gmock/gmock.h>
#include <system_info.h>
#include <system_settings.h>

#include "coresystem_port.h"
#include "shim/Call.h"
#include "support/CapturedStandardError.h"
#include "support/TemporaryTree.h"

using coresystem_port::lastOrigin;
using coresystem_port::Question;
using testing::HasSubstr;
using testing::MatchesRegex;

namespace {

bool noMemory = false;

} // namespace

// The linker sends every strdup here.
extern "C" char* __real_strdup(const char* text);
extern "C" char* __wrap_strdup(const char* text)
{
    return noMemory ? nullptr : __real_strdup(text);
}

namespace {

const TemporaryTree& tree()
{
    static const TemporaryTree only;
    return only;
}

// The backend is chosen once per process: every test uses the same path.
class ShimTest : public testing::Test {
protected:
    ShimTest()
    {
        setenv("CORESYSTEM_DEVICE", tree().path("/device.toml").c_str(), 1);
        coresystem_port::setLogSink(coresystem_port::LogSink::StandardError);
        describe("[device]\nplatform_id = 'id'\n[settings]\ndevice_name = 'phone'\n");
    }
    ~ShimTest() override
    {
        noMemory = false;
        tree().remove("/device.toml");
    }

    void describe(const std::string& facts)
    {
        tree().write("/device.toml", "schema = 1\n" + facts);
    }
};

char* const UNTOUCHED = reinterpret_cast<char*>(1);

// The result of a call that must leave its slot alone.
template <typename Call>
int failure(Call call)
{
    char* untouched = UNTOUCHED;
    const int result = call(&untouched);
    EXPECT_EQ(UNTOUCHED, untouched);
    return result;
}

int failedInformation(const char* key)
{
    return failure([key](char** slot) { return system_info_get_platform_string(key, slot); });
}

// The result of a read that must leave its value alone. An application may be built against headers
// with more keys than these.
template <typename Key, typename Value>
__attribute__((no_sanitize("undefined"))) int failedRead(int (*read)(Key, Value*), int key,
                                                         Value before)
{
    Value value = before;
    Key number{};
    std::memcpy(&number, &key, sizeof number);
    const int result = read(number, &value);
    EXPECT_EQ(before, value);
    return result;
}

int failedSetting(int key)
{
    return failedRead(system_settings_get_value_string, key, UNTOUCHED);
}

TEST_F(ShimTest, EachCallHandsOutACopyOfItsOwn)
{
    char* first = nullptr;
    char* second = nullptr;
    ASSERT_EQ(0, system_info_get_platform_string("tizen.org/system/tizenid", &first));
    ASSERT_EQ(0, system_info_get_platform_string("tizen.org/system/tizenid", &second));
    EXPECT_NE(first, second);
    std::strcpy(first, "xx");
    EXPECT_STREQ("id", second);
    free(first);
    free(second);
}

TEST_F(ShimTest, NullArgumentsAreInvalid)
{
    EXPECT_EQ(-22, failedInformation(nullptr));
    EXPECT_EQ(-22, system_info_get_platform_string("tizen.org/system/tizenid", nullptr));
    EXPECT_EQ(-22, system_settings_get_value_string(SYSTEM_SETTINGS_KEY_DEVICE_NAME, nullptr));
}

TEST_F(ShimTest, UnknownInformationKeysAreInvalid)
{
    for (const char* const key :
         {"", "tizen.org/system/tizenid ", "TIZEN.ORG/SYSTEM/TIZENID",
          "tizen.org/system/platform.version", "http://tizen.org/system/tizenid"})
        EXPECT_EQ(-22, failedInformation(key)) << key;
}

TEST_F(ShimTest, OtherKeysAreInvalidOrOfNoDevice)
{
    const auto text = failedSetting;
    const auto flag = [](int key) { return failedRead(system_settings_get_value_bool, key, true); };
    const auto number = [](int key) { return failedRead(system_settings_get_value_int, key, 77); };
    constexpr int MAX = SYSTEM_SETTINGS_KEY_MAX;
    constexpr int NAME = SYSTEM_SETTINGS_KEY_DEVICE_NAME;
    constexpr int SIZE = SYSTEM_SETTINGS_KEY_FONT_SIZE;
    constexpr int DATA = SYSTEM_SETTINGS_KEY_3G_DATA_NETWORK_ENABLED;
    const struct {
        std::function<int(int)> read;
        std::vector<int> ofAnotherType;
        std::vector<int> ofNoDevice;
    } rows[] = {
        {text,
         {SIZE, DATA, SYSTEM_SETTINGS_KEY_LOCK_STATE, 30, 31, 32, -2147483647},
         {SYSTEM_SETTINGS_KEY_INCOMING_CALL_RINGTONE, SYSTEM_SETTINGS_KEY_FONT_TYPE,
          SYSTEM_SETTINGS_KEY_LOCALE_COUNTRY, SYSTEM_SETTINGS_KEY_LOCALE_TIMEZONE,
          SYSTEM_SETTINGS_KEY_SOUND_NOTIFICATION}},
        {flag, {SIZE, NAME}, {5, 7, 14, 17, 18, 19, 20, 22, 23, 24}},
        {number, {DATA, NAME}, {9, 16, 25, 27, 28}},
    };
    for (const auto& [read, ofAnotherType, ofNoDevice] : rows) {
        for (const int key : {-1, MAX, 1000})
            EXPECT_EQ(SYSTEM_SETTINGS_ERROR_INVALID_PARAMETER, read(key)) << key;
        for (const int key : ofAnotherType)
            EXPECT_EQ(SYSTEM_SETTINGS_ERROR_INVALID_PARAMETER, read(key)) << key;
        for (const int key : ofNoDevice)
            EXPECT_EQ(SYSTEM_SETTINGS_ERROR_NOT_SUPPORTED, read(key)) << key;
    }
}

TEST_F(ShimTest, AbsentFactIsAnIoErrorWithAReason)
{
    describe("");
    for (const auto& [key, question] :
         {std::pair("tizen.org/system/tizenid", Question::PlatformId),
          {"tizen.org/system/platform.name", Question::PlatformName},
          {"tizen.org/feature/platform.version", Question::PlatformVersion},
          {"tizen.org/system/model_name", Question::ModelName}}) {
        EXPECT_EQ(SYSTEM_INFO_ERROR_IO_ERROR, failedInformation(key)) << key;
        EXPECT_FALSE(lastOrigin(question).available);
        EXPECT_THAT(lastOrigin(question).reason, HasSubstr("[device] has no "));
        EXPECT_EQ("", lastOrigin(question).source);
    }
    for (const int key : {SYSTEM_SETTINGS_KEY_DEVICE_NAME, SYSTEM_SETTINGS_KEY_LOCALE_LANGUAGE})
        EXPECT_EQ(SYSTEM_SETTINGS_ERROR_IO_ERROR, failedSetting(key)) << key;
}

TEST_F(ShimTest, BackendsErrorsHaveThePlatformsNumbers)
{
    const auto code = [](const port::Error& error, const port::Codes& codes) {
        return failure([&](char** answer) {
            return port::Call("none", codes)
                .handOut(Question::Language, port::Result<port::Fact>(error), answer);
        });
    };
    EXPECT_EQ(-1, code(port::notAvailable("why"), {-1, -2}));
    EXPECT_EQ(-2, code(port::notSupported("why"), {-1, -2}));
    EXPECT_EQ(-13, code(port::denied("why"), {-1, -2}));
    EXPECT_EQ(-3, code(port::denied("why"), {-1, -2, -3}));
    EXPECT_EQ(-1, code(port::noSim("why"), {-1, -2, -3}));
    EXPECT_EQ(-4, code(port::noSim("why"), {-1, -2, -3, -4}));
    EXPECT_EQ("why", lastOrigin(Question::Language).reason);
}

TEST_F(ShimTest, NoExceptionLeavesAShim)
{
    const port::Codes codes{-6, -1};
    const port::Call call("none", codes);
    EXPECT_EQ(-12, call.run([]() -> int { throw std::bad_alloc(); }));
    EXPECT_EQ(-6, call.run([]() -> int { throw 1; }));
    EXPECT_EQ(-6, call.release([]() -> int { throw 1; }));
    EXPECT_EQ(nullptr, call.pointer([]() -> char* { throw 1; }));
    EXPECT_EQ(3, call.run([]() -> int { return 3; }));
}

TEST_F(ShimTest, OriginsBelongToTheScopeAndTheThread)
{
    const coresystem_port::Origins outer;
    port::recordOrigin(Question::Language, {true, "first", ""});
    {
        const coresystem_port::Origins inner;
        port::recordOrigin(Question::Wifi, {false, "", "no radio"});
        std::thread([] { port::recordOrigin(Question::Wifi, {true, "elsewhere", ""}); }).join();
        EXPECT_EQ("no radio", inner.of(Question::Wifi).reason);
        EXPECT_EQ("", inner.of(Question::Language).source);
    }
    EXPECT_EQ("no radio", outer.of(Question::Wifi).reason);
    EXPECT_EQ("first", outer.of(Question::Language).source);
    EXPECT_EQ("elsewhere", lastOrigin(Question::Wifi).source);
}

TEST_F(ShimTest, MissingMemoryIsNamed)
{
    noMemory = true;
    EXPECT_EQ(SYSTEM_INFO_ERROR_OUT_OF_MEMORY, failedInformation("tizen.org/system/tizenid"));
    EXPECT_EQ(SYSTEM_SETTINGS_ERROR_OUT_OF_MEMORY, failedSetting(SYSTEM_SETTINGS_KEY_DEVICE_NAME));
}

TEST_F(ShimTest, LogLineIsFormattedAndCounted)
{
    CapturedStandardError log;
    EXPECT_EQ(14,
              __dlog_print(LOG_ID_MAIN, DLOG_ERROR, "Weather", "%s: %d of %c", "cloud", 42, 'x'));
    EXPECT_EQ(0, __dlog_print(LOG_ID_MAIN, DLOG_INFO, "Weather", "%s", ""));
    EXPECT_THAT(log.take(), MatchesRegex("E/Weather \\([ 0-9]+\\): cloud: 42 of x\n"
                                         "I/Weather \\([ 0-9]+\\): \n"));
}

TEST_F(ShimTest, LongLogLineIsNotCut)
{
    CapturedStandardError log;
    const std::string text(5000, 'x');
    EXPECT_EQ(5000, __dlog_print(LOG_ID_MAIN, DLOG_INFO, "Weather", "%s", text.c_str()));
    EXPECT_THAT(log.take(), HasSubstr(text + "\n"));
}

TEST_F(ShimTest, LogWithoutAFormatIsInvalid)
{
    const char* const none = nullptr;
    EXPECT_EQ(DLOG_ERROR_INVALID_PARAMETER, __dlog_print(LOG_ID_MAIN, DLOG_INFO, "Weather", none));
}

TEST_F(ShimTest, LogTakesAnyNumberAndANullTag)
{
    CapturedStandardError log;
    int number = 77;
    const auto outside = static_cast<log_id_t>(number);
    for (const int priority : {-1, 0, 9, 1000})
        EXPECT_EQ(1, __dlog_print(outside, priority, nullptr, "x"));
    EXPECT_THAT(log.take(), MatchesRegex("(\\?/        \\([ 0-9]+\\): x\n){4}"));
}

TEST_F(ShimTest, LogThatGoesNowhereIsNoError)
{
    CapturedStandardError log;
    coresystem_port::setLogSink(coresystem_port::LogSink::None);
    EXPECT_EQ(0, __dlog_print(LOG_ID_MAIN, DLOG_INFO, "Weather", "x"));
    EXPECT_EQ("", log.take());
}

} // namespace
