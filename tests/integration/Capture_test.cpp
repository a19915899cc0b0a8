// SPDX-License-Identifier: Apache-2.0
// A machine that was captured answers like the machine: every fact that an application may ask.
#include <gmock/gmock.h>

#include "support/ModemsOnBus.h"
#include "support/Program.h"

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

class CaptureOnBusTest : public ModemsOnBusTest {
protected:
    void expectAgreement() const
    {
        const std::string file = tree.path("/captured.toml");
        const std::string machine = factsOf("-u CORESYSTEM_DEVICE");
        outputOf("env -u CORESYSTEM_DEVICE " COMMAND " device capture --force --reveal -o " + file);
        EXPECT_EQ(machine, factsOf("CORESYSTEM_DEVICE=" + file));
        EXPECT_THAT(machine, testing::HasSubstr("sim_available"));
    }

    const TemporaryTree tree;
};

TEST_F(CaptureOnBusTest, ModemsAnswerAlikeFromTheFile)
{
    expectAgreement(); // no modem
    AtModem::State roaming;
    roaming.imsi = "310260123456789";
    roaming.mncLength = 3;
    roaming.registration = 5;
    addInService("a", roaming);
    AtModem::State locked;
    locked.imei = "356938035643809";
    locked.pin = "1234";
    modems->add("b", locked);
    expectAgreement();
    modems->kill();
    expectAgreement(); // no service
}

} // namespace
