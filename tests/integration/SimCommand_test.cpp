// SPDX-License-Identifier: Apache-2.0
// The command `coresystem` asks the library, the port and the real ModemManager, each a process
// away.
#include <gmock/gmock.h>

#include "support/ModemsOnBusTest.h"
#include "support/Program.h"

using testing::HasSubstr;
using testing::Not;

namespace {

class SimCommandTest : public ModemsOnBusTest {
protected:
    void addTwo()
    {
        AtModem::State korean;
        korean.imsi = "450050123456789";
        korean.network = "45005";
        korean.number = "+821055500100";
        addInService("a", korean);
        AtModem::State american;
        american.imei = "356938035643809";
        american.imsi = "310260123456789";
        american.mncLength = 3;
        american.number = "";
        american.network = "45005";
        american.registration = 5;
        addInService("b", american);
    }

    static std::string outputOfCommand(const std::string& arguments)
    {
        return outputOf("env -u CORESYSTEM_DEVICE TZ=UTC0 " COMMAND " " + arguments +
                        "; echo \"[$?]\"");
    }
};

TEST_F(SimCommandTest, TwoModemsAreShownEachForItself)
{
    addTwo();
    const std::string network = "slot  operator  its MCC  its MNC  technology  signal %\n"
                                "0     45005     450      05       lte         64\n"
                                "1     45005     450      05       lte         64\n";
    EXPECT_TRUE(modems->waitUntil(
        [&] { return outputOfCommand("sim").find(network) != std::string::npos; }));
    EXPECT_EQ("backend: linux (this machine's services)\n"
              "\n"
              "slot  modem       SIM    MCC  MNC  MSIN        number         country              "
              "     network  SMS\n"
              "0     /virtual/a  ready  450  05   ********89  ***********00  Korea, South         "
              "     home     ready\n"
              "1     /virtual/b  ready  310  260  *******89   -              United States of "
              "America  roaming  ready\n"
              "\n" +
                  network +
                  "\n"
                  "slot  power  PIN tries  ICCID\n"
                  "0     on     3          *****************12\n"
                  "1     on     3          *****************12\n"
                  "\n"
                  "Not available\n"
                  "  slot 1  number  the SIM card holds no number\n"
                  "\n"
                  "Default slots\n"
                  "  network  unknown\n"
                  "  data     unknown\n"
                  "  calls    unknown\n"
                  "\n"
                  "What identifies the subscriber is masked; --reveal shows it.\n"
                  "[0]\n",
              outputOfCommand("sim"));
    EXPECT_THAT(outputOfCommand("sim --reveal"),
                HasSubstr("  450  05   0123456789  +821055500100  "));
    EXPECT_EQ("490154203237518\n[0]\n", outputOfCommand("get imei"));
    EXPECT_EQ("Korea, South\n[0]\n", outputOfCommand("get sim_country"));
}

TEST_F(SimCommandTest, KilledDaemonIsNamedAndNothingIsMadeUp)
{
    addTwo();
    modems->kill();
    EXPECT_THAT(outputOfCommand("sim"),
                testing::AllOf(HasSubstr("no SIM slot is known: org.freedesktop.ModemManager1"),
                               HasSubstr("[3]"), Not(HasSubstr("450"))));
    EXPECT_THAT(outputOfCommand("get imei"),
                HasSubstr("; applications are told 000000000000000\n[3]"));
    EXPECT_THAT(outputOfCommand("get sim_mcc"),
                HasSubstr("sim_mcc is not available: org.freedesktop.ModemManager1"));
}

std::string factsOf(const std::string& environment)
{
    return outputOf("env " + environment +
                    " " COMMAND " info --reveal --json | "
                    "sed '/\"backend\"/d; /\"device_file\"/d; /\"sources\"/,$d'; env " +
                    environment +
                    " " COMMAND " sim --reveal --json 2>/dev/null | sed -n '/\"slots\"/,$p' | "
                    "sed '/\"reasons\": {/,/}/d; /\"reason\"/d' || true");
}

// A machine that was captured answers like the machine: every fact that an application may ask.
class CaptureOnBusTest : public ModemsOnBusTest {
protected:
    void expectAgreement() const
    {
        const std::string file = tree.path("/captured.toml");
        const std::string machine = factsOf("-u CORESYSTEM_DEVICE");
        outputOf("env -u CORESYSTEM_DEVICE " COMMAND " device capture --force --reveal -o " + file);
        EXPECT_EQ(machine, factsOf("CORESYSTEM_DEVICE=" + file));
        EXPECT_THAT(machine, HasSubstr("sim_available"));
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
