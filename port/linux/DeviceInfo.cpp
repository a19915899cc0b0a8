// SPDX-License-Identifier: Apache-2.0
#include "DeviceInfo.h"

#include <algorithm>
#include <array>
#include <iterator>
#include <string_view>

#include "../common/GLibTypes.h"
#include "Files.h"
#include "Hostname1.h"

namespace port::linux_backend {
namespace {

constexpr std::size_t ID_SIZE = 16;
using Id = std::array<guint8, ID_SIZE>;

// Names this application to the hash of the machine id; drawn at random once, never changed.
constexpr Id APPLICATION_ID = {0x6f, 0x1c, 0x7e, 0x52, 0x0b, 0x94, 0x4d, 0x3a,
                               0xa8, 0x27, 0xe1, 0x5d, 0x93, 0x40, 0xc6, 0x7b};

bool parseId(const std::string& text, Id& id)
{
    if (text.size() != 2 * ID_SIZE)
        return false;
    for (std::size_t i = 0; i < ID_SIZE; ++i) {
        const int high = g_ascii_xdigit_value(text[2 * i]);
        const int low = g_ascii_xdigit_value(text[2 * i + 1]);
        if (high < 0 || low < 0)
            return false;
        id[i] = static_cast<guint8>(high * 16 + low);
    }
    return id != Id{}; // all zeros is no id
}

// The machine id itself must not leave the machine: it is answered only as a keyed hash, by the
// rule of sd_id128_get_machine_app_specific(3) (HMAC-SHA256, cut to 128 bits, marked as a version 4
// UUID).
Id applicationSpecific(const Id& machineId)
{
    std::array<guint8, 32> digest{};
    gsize size = digest.size();
    const Owned<GHmac> hmac(g_hmac_new(G_CHECKSUM_SHA256, machineId.data(), machineId.size()));
    g_hmac_update(hmac.get(), APPLICATION_ID.data(), static_cast<gssize>(APPLICATION_ID.size()));
    g_hmac_get_digest(hmac.get(), digest.data(), &size);

    Id id{};
    std::copy_n(digest.begin(), id.size(), id.begin());
    id[6] = static_cast<guint8>((id[6] & 0x0f) | 0x40);
    id[8] = static_cast<guint8>((id[8] & 0x3f) | 0x80);
    return id;
}

std::string toHex(const Id& id)
{
    constexpr char DIGITS[] = "0123456789abcdef";
    std::string text;
    for (const guint8 byte : id) {
        text += DIGITS[byte >> 4];
        text += DIGITS[byte & 0xf];
    }
    return text;
}

// Firmware's texts for "the maker gave no number", in small letters.
constexpr std::string_view NO_SERIALS[] = {
    "to be filled by o.e.m.",
    "default string",
    "system serial number",
    "chassis serial number",
    "serial number",
    "not specified",
    "not applicable",
    "not available",
    "n/a",
    "none",
    "null",
    "unknown",
    "invalid",
    "oem",
    "o.e.m.",
    "empty",
    "0123456789",
    "1234567890",
    "123456789",
    "12345678",
};

std::string inSmallLetters(std::string text)
{
    std::transform(text.begin(), text.end(), text.begin(),
                   [](char letter) { return g_ascii_tolower(letter); });
    return text;
}

// "0000000", "XXXX", "-" and the like.
bool repeatsOneCharacter(const std::string& text)
{
    return text.find_first_not_of(text.front()) == std::string::npos;
}

std::string problemOfSerial(const std::string& text)
{
    const std::string small = inSmallLetters(text);
    const bool isNone =
        repeatsOneCharacter(small) ||
        std::find(std::begin(NO_SERIALS), std::end(NO_SERIALS), small) != std::end(NO_SERIALS);
    return isNone ? "holds what firmware says in place of a serial number" : "";
}

} // namespace

Result<Fact> LinuxDeviceInfo::platformId()
{
    const Result<Fact> file = readFirst(root_, MACHINE_ID);
    if (!file)
        return file;
    Id machineId{};
    if (!parseId(file.value().value, machineId))
        return notAvailable(file.value().source + " holds no machine id");
    return Fact{toHex(applicationSpecific(machineId)), file.value().source + " (hashed)"};
}

Result<Fact> LinuxDeviceInfo::osRelease(const char* variable)
{
    const Result<Fact> file = readFirst(root_, OS_RELEASE);
    if (!file)
        return file;
    const std::optional<std::string> value = osReleaseVariable(file.value().value, variable);
    if (!value)
        return notAvailable(file.value().source + " has no " + variable);
    return Fact{*value, file.value().source + " " + variable};
}

Result<Fact> LinuxDeviceInfo::platformName()
{
    return osRelease("NAME");
}

Result<Fact> LinuxDeviceInfo::platformVersion()
{
    return osRelease("VERSION_ID");
}

Result<Fact> LinuxDeviceInfo::modelName()
{
    const Result<Fact> model = bus_.textProperty(HOSTNAME1, {"HardwareModel"});
    return model ? model : orElse(model.error(), readFirst(root_, HARDWARE_MODEL));
}

Result<Fact> LinuxDeviceInfo::serial()
{
    return readFirst(root_, SERIAL_NUMBER, &problemOfSerial);
}

} // namespace port::linux_backend
