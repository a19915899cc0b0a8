// SPDX-License-Identifier: Apache-2.0
// The serial number, asked for through the facade.
#include "support/FakeBus.h"
#include "support/PlatformTest.h"

using namespace fake;
using testing::StrEq;

namespace {

const std::string SERIAL_METHOD = "GetDeviceUniqueID";

// The slot's content after a question that begins with `preset` in it.
const char* ask(int expectedCode, const char* preset = nullptr)
{
    const char* slot = preset;
    EXPECT_EQ(coreSystem().GetDeviceUniqueID(&slot), expectedCode);
    return slot;
}

void release(const char* serial)
{
    std::free(const_cast<char*>(serial));
}

// The lines of the facade around whatever the manager writes.
struct FacadeCall {
    std::string name;
    int code;
    std::function<void()> arrange;
    std::string result;
};

const FacadeCall SERIAL_CALLS[] = {
    {"Answered", 0, [] { bus().answerText("R38N50A4ZB"); }, "R38N50A4ZB"},
    {"Refused", 1, [] { bus().refuseConnection({}); }, "(null)"},
    {"Unanswered", 2, [] { bus().answerNothing({}); }, "(null)"},
    {"TimedOut", 3,
     [] {
         bus().refuseConnection(FakeBus::Error{G_IO_ERROR, 24, "Time"});
     },
     "(null)"},
};

class SerialTest : public PlatformTest {
protected:
    SerialTest()
    {
        bus().reset();
        platform().debugMode = 1;
    }
    ~SerialTest() override
    {
        bus().reset();
    }
};

TEST_F(SerialTest, FacadeWritesItsLinesAroundTheManagers)
{
    const Texts entry = Texts{CORE_SYSTEM.debug(SERIAL_METHOD, "CoreSystem::GetDeviceUniqueID")} +
                        D_BUS_MANAGER.access() +
                        Texts{D_BUS_MANAGER.debug(SERIAL_METHOD, "DBusManager::GetDeviceUniqueID")};
    for (const FacadeCall& call : SERIAL_CALLS) {
        bus().reset();
        platform().forgetEvents();
        call.arrange();
        release(ask(call.code));
        const Texts trace = platform().trace();
        ASSERT_GT(trace.size(), entry.size()) << call.name;
        EXPECT_EQ(Texts(trace.begin(), trace.begin() + static_cast<long>(entry.size())), entry);
        EXPECT_EQ(trace.back(),
                  CORE_SYSTEM.debug(SERIAL_METHOD, "DeviceUniqueID : " + call.result));
    }
}

TEST_F(SerialTest, FacadesLinesCarryItsOwnTag)
{
    bus().answerText("R38N50A4ZB");
    release(ask(0));
    for (const LogLine& line : platform().lines())
        EXPECT_EQ(line.tag, line.file == "CoreSystem.cpp" ? "CoreSystem" : "Logger") << line.plain;
    EXPECT_EQ(platform().lines().front().tag, "CoreSystem");
    EXPECT_EQ(platform().lines().back().tag, "CoreSystem");
}

TEST_F(SerialTest, SerialIsTheManagersCopy)
{
    bus().answerText("R38N50A4ZB");
    const char* const serial = ask(0, "preset");
    EXPECT_THAT(serial, StrEq("R38N50A4ZB"));
    EXPECT_EQ(ledger().live(), Texts{"copy: R38N50A4ZB"});
    release(serial);
}

TEST_F(SerialTest, EveryFailureGivesNull)
{
    for (const FacadeCall& call : SERIAL_CALLS)
        if (call.code != 0) {
            bus().reset();
            call.arrange();
            EXPECT_EQ(ask(call.code, "preset"), nullptr) << call.name;
        }
}

} // namespace
