// SPDX-License-Identifier: Apache-2.0
// A machine that was captured answers like the machine: every fact that an application may ask.
#include <gmock/gmock.h>

#include "linux/Telephony.h"
#include "support/ModemsOnBus.h"
#include "support/Program.h"

using port::ServiceState;

namespace {

std::string factsOf(const std::string& environment)
{
    return outputOf("env " + environment +
                    " " COMMAND " info --reveal --json | "
                    "sed '/\"backend\"/d; /\"device_file\"/d; /\"sources\"/,$d'; env " +
                    environment +
                    " " COMMAND " sim --reveal --json 2>/dev/null | sed -n '/\"slots\"/,$p' | "
                    "sed '/\"reasons\": {/,/}/d; /\"reason\"/d' || true");
}

class CaptureOnBusTest : public testing::Test {
protected:
    void SetUp() override
    {
        if (!ModemsOnBus::obstacle().empty())
            GTEST_SKIP() << ModemsOnBus::obstacle();
        modems = std::make_unique<ModemsOnBus>();
    }

    void add(const std::string& id, const AtModem::State& state, bool reachesNetwork = true)
    {
        modems->add(id, state);
        if (!reachesNetwork)
            return;
        modems->enable(id);
        ASSERT_TRUE(modems->waitUntil([&] {
            const auto service = telephony.service("/virtual/" + id);
            return service && service.value().value == ServiceState::InService;
        }));
    }

    void expectAgreement() const
    {
        const std::string file = tree.path("/captured.toml");
        const std::string machine = factsOf("-u CORESYSTEM_DEVICE");
        outputOf("env -u CORESYSTEM_DEVICE " COMMAND " device capture --force --reveal -o " + file);
        EXPECT_EQ(machine, factsOf("CORESYSTEM_DEVICE=" + file));
        EXPECT_THAT(machine, testing::HasSubstr("sim_available"));
    }

    const TemporaryTree tree;
    std::unique_ptr<ModemsOnBus> modems;
    port::linux_backend::Bus bus;
    port::linux_backend::LinuxTelephony telephony{bus};
};

TEST_F(CaptureOnBusTest, ModemsAnswerAlikeFromTheFile)
{
    expectAgreement(); // no modem
    AtModem::State roaming;
    roaming.imsi = "310260123456789";
    roaming.mncLength = 3;
    roaming.registration = 5;
    add("a", roaming);
    AtModem::State locked;
    locked.imei = "356938035643809";
    locked.pin = "1234";
    add("b", locked, false);
    expectAgreement();
    modems->kill();
    expectAgreement(); // no service
}

} // namespace
