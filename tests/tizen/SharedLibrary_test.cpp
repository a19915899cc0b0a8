// SPDX-License-Identifier: Apache-2.0
// The shared library as a device loads it. What it asks of the device is answered by the fake,
// which the loader finds under the names of the device's libraries.
#include <ctime>

#include <dlfcn.h>
#include <gmock/gmock.h>
#include <sys/statvfs.h>

#include <CoreSystem.h>
#include <ITapiSim.h>
#include <storage.h>

#include "support/FakePlatform.h"

using namespace fake;
using testing::ElementsAre;
using testing::EndsWith;

namespace {

class SharedLibrary : public testing::Test {
protected:
    SharedLibrary()
    {
        platform().reset();
    }
    ~SharedLibrary() override
    {
        platform().reset();
    }

    CoreSystem& library = *CoreSystem::GetInstance();
};

std::string fileOf(const void* address)
{
    Dl_info info = {};
    return dladdr(address, &info) != 0 ? info.dli_fname : "";
}

bool isEnough(CoreSystem& library, unsigned long blockSize, unsigned long free, double megabytes)
{
    struct statvfs volume = {};
    volume.f_bsize = blockSize;
    volume.f_frsize = blockSize;
    volume.f_blocks = free;
    volume.f_bavail = free;
    platform().answer("storage_get_internal_memory_size()", 0, volume);
    return library.IsSystemMemoryAvailable(megabytes);
}

// The table of an application's listener, by place, and what was called with which arguments.
Texts slotCalls;

template <int place, class... Arguments>
void slot(void* self, Arguments... arguments)
{
    slotCalls.push_back(callText(std::to_string(place).c_str(), self != nullptr, arguments...));
}

struct RawListener {
    void (*const* table)();
};

template <class Function>
void (*entry(Function* function))()
{
    return reinterpret_cast<void (*)()>(function);
}

// The program would not have started if the loader had not found all names.
TEST_F(SharedLibrary, AsksTheFakeInPlaceOfTheDevice)
{
    EXPECT_THAT(fileOf(dlsym(RTLD_DEFAULT, "telephony_init")), EndsWith("/libfake_platform.so"));
    EXPECT_THAT(fileOf(dlsym(RTLD_DEFAULT, "_ZN10CoreSystem11GetInstanceEv")),
                EndsWith("/libcoresystem.so.1"));
}

TEST_F(SharedLibrary, TypesAreThoseOfA32BitDevice)
{
    EXPECT_EQ(sizeof(void*), 4u);
    EXPECT_EQ(sizeof(std::time_t), 4u);
    EXPECT_EQ(sizeof(statvfs::f_bavail), 4u);
    EXPECT_EQ(sizeof(telephony_handle_list_s), 8u);
    EXPECT_EQ(sizeof(TelSimImsiInfo_t), 19u);
    EXPECT_EQ(sizeof(wifi_device_state_e), 4u);
    EXPECT_EQ(sizeof(bool), 1u);
#if _GLIBCXX_USE_CXX11_ABI == 0
    EXPECT_EQ(sizeof(std::string), 4u); // one pointer to shared characters
#endif
}

TEST_F(SharedLibrary, NumberOfMegabytesArrivesWhole)
{
    EXPECT_TRUE(isEnough(library, 4096, 768, 2.999999));
    EXPECT_FALSE(isEnough(library, 4096, 768, 3));
}

// Both factors fill their 32 bits: the product needs 64.
TEST_F(SharedLibrary, ProductOf32BitFieldsIsNotCut)
{
    EXPECT_TRUE(isEnough(library, 0x80000000, 0xFFFFFFFF, 8796093020159.0));
    EXPECT_FALSE(isEnough(library, 0x80000000, 0xFFFFFFFF, 8796093020160.0));
}

// Numbers of 8 bytes behind those of 4, through two lists of variable arguments.
TEST_F(SharedLibrary, NumbersReachTheLog)
{
    platform().debugMode = 1;
    isEnough(library, 4096, 768, 2.5);
    EXPECT_THAT(platform().trace(),
                testing::Contains(testing::HasSubstr(
                    "Total Memory : 3145728.000000 byte, Avail Memory : 3145728.000000 byte")));
}

TEST_F(SharedLibrary, StringsOfTheApplicationAreFilled)
{
    TelSimImsiInfo_t imsi = {"450", "05", "8173926450"};
    platform().answer("tel_init(cp0)", 0);
    platform().answer("tel_get_sim_imsi(modem cp0)", 0, imsi);
    std::string mcc = "an old text, longer than any that stands in the object itself";
    std::string mnc;
    std::string msin;
    EXPECT_TRUE(library.GetSimInfo("cp0", &mcc, &mnc, &msin));
    EXPECT_EQ(mcc, "450");
    EXPECT_EQ(mnc, "05");
    EXPECT_EQ(msin, "8173926450");
}

TEST_F(SharedLibrary, HandlesOfAllSlotsAreHandedOut)
{
    platform().answer("telephony_init()", 0, 2u);
    platform().answer("telephony_deinit(list of 2)", 0);
    telephony_handle_list_s list = {};
    EXPECT_TRUE(library.InitHandleList(&list));
    EXPECT_EQ(list.count, 2u);
    platform().answer("telephony_sim_get_subscriber_number(slot 1)", 0, std::string("+4912345"));
    char* number = nullptr;
    EXPECT_TRUE(library.GetPhoneNumber(list.handle + 1, &number));
    EXPECT_STREQ(number, "+4912345");
    std::free(number);
    EXPECT_TRUE(library.DeinitHandleList(&list));
}

TEST_F(SharedLibrary, ListenerIsCalledByThePlacesOfItsTable)
{
    void (*const table[])() = {
        entry(&slot<0, int, void*>),  entry(&slot<1, int, void*, void*>),
        entry(&slot<2, bool, void*>), entry(&slot<3, bool, void*>),
        entry(&slot<4, bool, void*>),
    };
    RawListener raw = {table};
    for (const char* const call :
         {"wifi_initialize()", "wifi_set_device_state_changed_cb()",
          "wifi_set_connection_state_changed_cb()", "runtime_info_set_changed_cb(0)",
          "runtime_info_set_changed_cb(1)", "runtime_info_set_changed_cb(9)"})
        platform().answer(call, 0);
    platform().answer("runtime_info_get_value_bool(0)", 0, true);
    platform().answer("runtime_info_get_value_bool(9)", 0, false);
    platform().answer("runtime_info_get_value_int(1)", 0, 2);
    library.SetConnectionEventListener(reinterpret_cast<IConnectionStateListener*>(&raw), nullptr);

    const auto& callbacks = platform().callbacks;
    slotCalls.clear();
    callbacks.wifiDevice(WIFI_DEVICE_STATE_ACTIVATED, nullptr);
    callbacks.wifiConnection(WIFI_CONNECTION_STATE_FAILURE, nullptr, nullptr);
    for (const int key : {0, 9, 1})
        callbacks.runtime.at(key).first(static_cast<runtime_info_key_e>(key), nullptr);
    EXPECT_THAT(slotCalls, ElementsAre("0(1, 1, 0)", "1(1, -1, 0, 0)", "2(1, 1, 0)", "3(1, 0, 0)",
                                       "4(1, 1, 0)"));
}

} // namespace
