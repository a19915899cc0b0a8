// SPDX-License-Identifier: Apache-2.0
// Shared by the tests with the packaged ModemManager: it, and the telephony that asks it.
#ifndef TESTS_SUPPORT_MODEMS_ON_BUS_TEST_H
#define TESTS_SUPPORT_MODEMS_ON_BUS_TEST_H

#include <gmock/gmock.h>

#include "linux/Telephony.h"
#include "support/ModemsOnBus.h"

/// Skipped where it cannot be had.
class ModemsOnBusTest : public testing::Test {
protected:
    void SetUp() override
    {
        if (!ModemsOnBus::obstacle().empty())
            GTEST_SKIP() << ModemsOnBus::obstacle();
        modems = std::make_unique<ModemsOnBus>();
    }
    bool comesIntoService(const port::SlotName& slot)
    {
        return modems->waitUntil([&] {
            const auto service = telephony.service(slot);
            return service && service.value().value == port::ServiceState::InService;
        });
    }
    /// Plugs a modem in, switches it on and waits until it is in service.
    void addInService(const std::string& id, const AtModem::State& state)
    {
        modems->add(id, state);
        modems->enable(id);
        ASSERT_TRUE(comesIntoService("/virtual/" + id));
    }

    std::unique_ptr<ModemsOnBus> modems;
    port::linux_backend::Bus bus;
    port::linux_backend::LinuxTelephony telephony{bus};
};

#endif
