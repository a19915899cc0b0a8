// SPDX-License-Identifier: Apache-2.0
#include "AESCrypto.h"

#include <cstdlib>
#include <cstring>
#include <mutex>

#include <dlfcn.h>
#include <dlog.h>
#include <sys/stat.h>

#include "../common/OwnFile.h"
#include "../common/RegularFile.h"
#include "cipher/CipherModule.h"

#pragma weak __dlog_print

using coreutil::CipherModule;
using coreutil::Key;

namespace {

struct LoadedModule {
    const CipherModule* cipher = nullptr;
    std::string problem;
};

LoadedModule loadModule()
{
    LoadedModule loaded;
    // The module stands in a folder beside this library, wherever that is. Without that place there
    // is none: a relative path would be another file in each folder that the program goes to.
    const std::string self = port::ownFile();
    if (self.empty()) {
        loaded.problem = "the cipher cannot be loaded: the place of this library is not known";
        return loaded;
    }
    const std::string path = self.substr(0, self.rfind('/') + 1) + COREUTIL_CIPHER_MODULE;
    void* const library = dlopen(path.c_str(), RTLD_NOW | RTLD_LOCAL);
    if (library != nullptr)
        loaded.cipher = static_cast<const CipherModule*>(dlsym(library, "coreutilCipherModule"));
    if (loaded.cipher == nullptr)
        loaded.problem = std::string("the cipher cannot be loaded: ") + dlerror();
    return loaded;
}

// Loaded once and never unloaded.
const LoadedModule& cipherModule()
{
    static const LoadedModule& module = *new LoadedModule(loadModule());
    return module;
}

constexpr std::size_t KEY_FILE_LIMIT = 4096; // room for white space

bool parseKey(const CipherModule& cipher, std::string content, Key& key)
{
    if (content.size() == key.size()) {
        std::memcpy(key.data(), content.data(), key.size());
        return true;
    }
    content.resize(content.find_last_not_of(" \t\r\n") + 1);
    return content.size() == 2 * key.size() && cipher.parseHexKey(content, key);
}

// The key of a file, or the reason why there is none.
bool loadKey(const std::string& path, Key& key, std::string& problem)
{
    const LoadedModule& module = cipherModule();
    std::string content;
    if (module.cipher == nullptr)
        problem = module.problem;
    else if (!port::readRegularFile(path, KEY_FILE_LIMIT, content, problem))
        problem = "key file " + path + ": " + problem;
    else if (!parseKey(*module.cipher, content, key))
        problem = "key file " + path + ": a key is 32 bytes or 64 hexadecimal digits";
    return problem.empty();
}

std::string warningOf(const std::string& path)
{
    struct stat status = {};
    if (stat(path.c_str(), &status) != 0 || (status.st_mode & (S_IROTH | S_IWOTH)) == 0)
        return "";
    return "key file " + path + " may be " +
           ((status.st_mode & S_IROTH) != 0 ? "read" : "written") + " by every user";
}

// The platform's log, where the process has one.
void writeWarning(const std::string& warning)
{
    if (!warning.empty() && __dlog_print != nullptr)
        __dlog_print(LOG_ID_MAIN, DLOG_WARN, "coreutil", "%s", warning.c_str());
}

// Guarded by one mutex: debug mode is not where speed matters.
struct KeyState {
    std::mutex mutex;
    bool ready = false;
    bool configured = false;
    Key key{};
    std::string problem;
    std::string warning;
};

KeyState& keyState()
{
    static KeyState& state = *new KeyState;
    return state;
}

void chooseKey(KeyState& state)
{
    if (const char* const path = secure_getenv("CORESYSTEM_LOG_KEY");
        path != nullptr && *path != '\0') {
        state.configured = true;
        if (loadKey(path, state.key, state.problem))
            state.warning = warningOf(path);
        return;
    }
    const LoadedModule& module = cipherModule();
    if (module.cipher == nullptr)
        state.problem = module.problem;
    else if (!module.cipher->makeRandomKey(state.key))
        state.problem = "no random key can be made";
}

void useKey(KeyState& state, const Key& key, const std::string& warning)
{
    const std::lock_guard<std::mutex> lock(state.mutex);
    state.key = key;
    state.ready = true;
    state.configured = true;
    state.problem.clear();
    state.warning = warning;
}

// A copy of the key to work with, or the reason why there is none.
bool currentKey(Key& key, std::string& problem)
{
    KeyState& state = keyState();
    std::string warning;
    {
        const std::lock_guard<std::mutex> lock(state.mutex);
        if (!state.ready) {
            chooseKey(state);
            warning = state.warning;
            state.ready = true;
        }
        problem = state.problem;
        if (problem.empty())
            problem = cipherModule().problem;
        key = state.key;
    }
    writeWarning(warning); // the log may come back for a key
    return problem.empty();
}

} // namespace

const unsigned AESCrypto::KEY_SIZE;
static_assert(AESCrypto::KEY_SIZE == std::tuple_size<Key>::value, "what callers are told");

AESCrypto::AESCrypto() = default;

AESCrypto* AESCrypto::GetInstance()
{
    static AESCrypto instance;
    return &instance;
}

std::string AESCrypto::Encrypt(const std::string& plain)
{
    Key key;
    std::string problem;
    std::string text;
    if (!currentKey(key, problem))
        return "!" + problem;
    return cipherModule().cipher->encrypt(key, plain, text) ? text : "!the cipher failed";
}

bool AESCrypto::Decrypt(const std::string& enciphered, std::string& plain)
{
    Key key;
    std::string problem;
    return currentKey(key, problem) && cipherModule().cipher->decrypt(key, enciphered, plain);
}

void AESCrypto::SetKey(const unsigned char* bytes)
{
    Key key;
    std::memcpy(key.data(), bytes, key.size());
    useKey(keyState(), key, "");
}

bool AESCrypto::LoadKeyFile(const char* path, std::string& problem)
{
    Key key;
    std::string reason;
    if (!loadKey(path, key, reason)) {
        problem = reason;
        return false;
    }
    const std::string warning = warningOf(path);
    useKey(keyState(), key, warning);
    writeWarning(warning);
    return true;
}

std::string AESCrypto::GetProblem()
{
    Key key;
    std::string problem;
    currentKey(key, problem);
    return problem;
}

std::string AESCrypto::GetWarning()
{
    Key key;
    std::string problem;
    currentKey(key, problem);
    KeyState& state = keyState();
    const std::lock_guard<std::mutex> lock(state.mutex);
    return state.warning;
}

bool AESCrypto::HasConfiguredKey()
{
    Key key;
    std::string problem;
    currentKey(key, problem);
    KeyState& state = keyState();
    const std::lock_guard<std::mutex> lock(state.mutex);
    return state.configured;
}
