// SPDX-License-Identifier: Apache-2.0
#include "simulator/Capture.h"

#include <gmock/gmock.h>

#include "devicefile/DeviceFile.h"
#include "devicefile/DeviceText.h"
#include "support/DeviceFileTest.h"
#include "support/FakeBackend.h"

using port::CardStatus;
using port::simulator::capture;
using testing::AllOf;
using testing::HasSubstr;
using testing::Not;

namespace {

const char EVERYTHING[] =
    "device = { platform_id = '5d3f0a9c71e84b62a0c4d8e6f1b27390', platform_name = 'Tizen', "
    "platform_version = '2.3.1', model_name = \"A \\\"model\\\"\\n\", serial = 'R38DUAL0001' }\n"
    "settings = { device_name = 'Küchentelefon', language = 'ko_KR.UTF-8', sales_code = '', "
    "font_size = 'huge', flight_mode = false, data_roaming = false, mobile_data = true, "
    "packet_data = true, utc_offset = -12600 }\n"
    "slot = [\n"
    "{ sim = 'available', card_changed = true, mcc = '310', mnc = '260', msin = '123456789', "
    "number = '+12025550143', imei = '356938035643809', service = 'in_service', roaming = true, "
    "operator = \"R\\u00e9seau\", operator_mcc = '208', operator_mnc = '01', "
    "access_technology = 'lte', signal = 0, power = 'low', iccid = '8999900000000000010', "
    "pin_retries = 2, sms = true, cp_name = 'modem' },\n"
    "{ init_status = 'sim_spck_required', imei = '490154203237518', service = 'emergency_only', "
    "roaming = false, pin_retries = 3, sms = false, cp_name = 'cp1' },\n"
    "{ denied = true, cp_name = 'cp2' },\n"
    "{ sim = 'available', mcc = '262', mnc = '01', msin = '0123456789', number = 'null', "
    "pin_retries = 0, cp_name = 'cp3' } ]\n"
    "subscriptions = { network = 0, data = 1, voice = 'ask_always' }\n"
    "network = { cellular = 'call_only_available', wifi = 'connected', "
    "wifi_connection = 'configuration', ssid = \"Caf\\u00e9\", bluetooth = 'not_supported', "
    "ethernet = 'connected', connectivity = 'portal' }\n"
    "storage = { block_size = 4096, fragment_size = 1024, blocks = 4194304, "
    "available_blocks = 9223372036854775807 }\n"
    "packages = { 'org.example.clock' = '1.2.3' }\n";

// The values that a good device file says, by their paths.
std::map<std::string, std::string> valuesOf(const std::string& text)
{
    for (const auto& problem : port::devicefile::readDevice(text, "captured").problems)
        ADD_FAILURE() << describe("captured", problem) << "\n" << text;
    std::map<std::string, std::string> values;
    const auto entries = port::devicefile::listEntries(text, "captured");
    for (const auto& entry : entries.value())
        values[entry.path()] = port::devicefile::getValue(text, "captured", entry.path()).value();
    return values;
}

class CaptureTest : public DeviceFileTest {
protected:
    static std::string captured(FakeBackend& fake)
    {
        const std::string text = capture(fake, {});
        valuesOf(text);
        return text;
    }
};

TEST_F(CaptureTest, EveryKeyOfADeviceFileIsCaptured)
{
    describe(EVERYTHING);
    ASSERT_EQ("", backend->deviceFileProblem());
    const std::string text = "schema = 1\n" + std::string(EVERYTHING);
    EXPECT_EQ(valuesOf(text),
              valuesOf(capture(*backend, {true, {"org.example.clock", "org.example.radio"}})));
}

TEST_F(CaptureTest, EachFactTellsWhereItCameFrom)
{
    describe("[settings]\nlanguage = \"de_DE\"\n");
    const std::string text = capture(*backend, {});
    EXPECT_THAT(text, HasSubstr("\nlanguage = \"de_DE\" # " + line(3) + "\n"));
    EXPECT_THAT(text,
                HasSubstr("\n# no sales_code: " + line(2) + ": [settings] has no sales_code"));
    EXPECT_THAT(text, HasSubstr("\n# no [storage]: "));
}

TEST_F(CaptureTest, ServiceThatDoesNotAnswerIsNoServiceWithoutModem)
{
    FakeBackend fake;
    fake.fakeTelephony.slotsAnswer = port::notAvailable("nobody\nanswers");
    EXPECT_THAT(captured(fake), AllOf(HasSubstr("\ntelephony_init = \"TELEPHONY_ERROR_"
                                                "OPERATION_FAILED\" # nobody answers\n"),
                                      HasSubstr("\ntel_init = \"null\""),
                                      HasSubstr("\ntel_get_cp_name_list = \"null\"")));
    fake.fakeTelephony.slotsAnswer = port::denied("not yours");
    EXPECT_THAT(captured(fake), HasSubstr("\"TELEPHONY_ERROR_PERMISSION_DENIED\" # not yours\n"));
    fake.fakeTelephony.slotsAnswer = port::notSupported("a tablet");
    EXPECT_THAT(captured(fake), HasSubstr("\ntelephony = false # a tablet\n"));
    fake.fakeTelephony.slotsAnswer = answered(FakeTelephony::Names());
    EXPECT_THAT(captured(fake), Not(HasSubstr("[fault]")));
}

TEST_F(CaptureTest, EveryCardStatusComesBack)
{
    for (int number = 0; number <= static_cast<int>(CardStatus::Unknown); ++number) {
        FakeBackend fake;
        fake.fakeTelephony.cardAnswer =
            answered(port::Card{static_cast<CardStatus>(number), false});
        tree.write("/d.toml", captured(fake));
        const auto card = backend->telephony().card("modem0");
        ASSERT_TRUE(card) << number << card.error().reason;
        EXPECT_EQ(number, static_cast<int>(card.value().value.status));
    }
}

TEST_F(CaptureTest, RadioThatFailsIsNotOneThatIsOffOrMissing)
{
    FakeBackend fake;
    fake.fakeNetwork.change([](FakeNetwork::Answers& answers) {
        answers.flightMode = answered(true);
        answers.wifi = port::denied("not yours");
        answers.cellular = port::notAvailable("no answer");
        answers.bluetooth = port::notSupported("no such radio");
    });
    EXPECT_THAT(
        captured(fake),
        AllOf(HasSubstr("\nconnection_get_wifi_state = \"CONNECTION_ERROR_PERMISSION_DENIED\""),
              HasSubstr("\nconnection_get_cellular_state = "
                        "\"CONNECTION_ERROR_OPERATION_FAILED\" # no answer\n"),
              HasSubstr("\nbluetooth = \"not_supported\" # no such radio\n")));
}

TEST_F(CaptureTest, BadTextsStayReadable)
{
    FakeBackend fake;
    fake.fakeTelephony.slotsAnswer =
        port::Sourced<FakeTelephony::Names>{{"a\xff\x01\n\"b"}, std::string(2000, 'x')};
    fake.fakeTelephony.imeiAnswer = port::notAvailable("\x1b[31m" + std::string(2000, '\xfe'));
    fake.fontSizeAnswer = answered(static_cast<port::FontSize>(77));
    EXPECT_THAT(captured(fake), HasSubstr("font_size: a device file cannot say what test tells"));
}

} // namespace
