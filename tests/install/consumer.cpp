// SPDX-License-Identifier: Apache-2.0
// An application outside the tree: it knows the installed package only. Exits 0 when every library
// of the package answers as it should.
#include <CoreSystem.h>
#include <coresystem_port.h>
#include <coreutil/AESCrypto.h>
#include <coreutil/CoreLogger.h>
#include <coreutil/CoreMutex.h>
#include <coreutil/CoreMutexLock.h>
#include <coreutil/CoreUtil.h>

#include <cstdio>
#include <cstdlib>
#include <string>

namespace {

bool expect(const char* what, const std::string& wanted, const std::string& got)
{
    if (got == wanted)
        return true;
    std::fprintf(stderr, "%s: wanted \"%s\", got \"%s\"\n", what, wanted.c_str(), got.c_str());
    return false;
}

std::string take(char* text)
{
    const std::string copy = text != nullptr ? text : "(null)";
    std::free(text);
    return copy;
}

std::string countryOf(const char* mcc)
{
    char* name = nullptr;
    CoreSystem::GetInstance()->GetCountryNameFromMcc(mcc, &name);
    return take(name);
}

std::string deviceName()
{
    char* name = nullptr;
    CoreSystem::GetInstance()->GetDeviceName(&name);
    return take(name);
}

// Through the cipher module, which the utility library finds by its own place.
std::string throughTheCipher(const std::string& text)
{
    std::string back;
    AESCrypto* const cipher = AESCrypto::GetInstance();
    return cipher->Decrypt(cipher->Encrypt(text), back) ? back : cipher->GetProblem();
}

} // namespace

int main()
{
    const CoreMutexLock lock("consumer");
    CoreLogger::GetInstance()->SetLogTag("consumer");

    bool good = expect("country of 450", "Korea, South", countryOf("450"));
    good &= expect("device name", "Consumer's phone", deviceName());
    good &= expect("backend", "simulator", coresystem_port::backendName());
    good &= expect("origin of the device name", "device.toml:5",
                   coresystem_port::lastOrigin(coresystem_port::Question::DeviceName).source);
    telephony_handle_list_s slots = {0, nullptr};
    good &= expect("a handle list", "none of this device",
                   CoreSystem::GetInstance()->InitHandleList(&slots) && slots.count > 0
                       ? "of some slots"
                       : "none of this device");
    good &= expect("number", "42", CoreUtil::GetInstance()->intToStr(42));
    good &= expect("cipher", "a line", throughTheCipher("a line"));
    return good ? EXIT_SUCCESS : EXIT_FAILURE;
}
