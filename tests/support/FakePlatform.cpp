// SPDX-License-Identifier: Apache-2.0
#include "FakePlatform.h"

#include <climits>
#include <cstdarg>
#include <cstdio>

#include <ITapiCall.h>
#include <ITapiNetText.h>
#include <ITapiNetwork.h>
#include <ITapiSim.h>
#include <app_alarm.h>
#include <dlog.h>
#include <net_connection.h>
#include <package_manager.h>
#include <storage.h>
#include <system_info.h>
#include <system_settings.h>
#include <vconf.h>

#include "FakeBus.h"

using namespace fake;

struct telephony_data {
    unsigned int of; // the slot
};

struct tapi_handle {
    std::string of; // the modem
};

struct package_info_s {
    std::string of; // the package
};

namespace {

const std::string PREFIX = "%s: %s(%d) > ";
const std::string BODY_BEGIN = "{#!@";
const std::string BODY_END = "#!@}";
const std::string DEBUG_FORMAT = PREFIX + BODY_BEGIN + "%s" + BODY_END;

std::string formatted(const char* format, va_list arguments)
{
    va_list copy;
    va_copy(copy, arguments);
    const int length = std::vsnprintf(nullptr, 0, format, copy);
    va_end(copy);
    std::string text(static_cast<std::size_t>(length) + 1, '\0');
    std::vsnprintf(text.data(), text.size(), format, arguments);
    text.pop_back();
    return text;
}

bool isDebugLine(const LogLine& line)
{
    return line.priority == DLOG_INFO && line.format == DEBUG_FORMAT;
}

// Every line begins with the prefix, so its first three arguments are known. Checks what holds for
// every line.
LogLine readLine(log_id_t id, int priority, const char* tag, const char* format, va_list arguments)
{
    LogLine line;
    line.id = id;
    line.priority = priority;
    line.tag = tag;
    line.format = format;
    EXPECT_TRUE(line.format.rfind(PREFIX, 0) == 0) << format;

    line.file = va_arg(arguments, const char*);
    line.function = va_arg(arguments, const char*);
    line.line = va_arg(arguments, int);
    line.text = formatted(format + PREFIX.size(), arguments);
    const std::size_t markers = BODY_BEGIN.size() + BODY_END.size();
    line.plain = isDebugLine(line)
                     ? decipher(line.text.substr(BODY_BEGIN.size(), line.text.size() - markers))
                     : line.text;
    EXPECT_EQ(line.id, LOG_ID_MAIN);
    EXPECT_GT(line.line, 0);
    EXPECT_EQ(line.file.find('/'), std::string::npos) << line.file;
    if (isDebugLine(line) && !line.plain.empty()) {
        EXPECT_EQ(line.text.find(line.plain), std::string::npos) << "plain text in the log";
    }
    return line;
}

std::string describe(const LogLine& line)
{
    std::string kind = "priority " + std::to_string(line.priority);
    if (isDebugLine(line))
        kind = "debug";
    else if (line.priority == DLOG_ERROR)
        kind = "error";
    else if (line.priority == DLOG_INFO)
        kind = "notice";
    const std::string text = kind + " " + line.file + " " + line.function + ": " + line.plain;
    const std::string format = line.format.substr(PREFIX.size());
    return isDebugLine(line) || format == line.plain ? text : text + " <- " + format;
}

// Never released: a handle that is used after its release is named all the same.
template <class Handle, class Key>
Handle* handleOf(const Key& key)
{
    static std::mutex mutex;
    static auto& handles = *new std::map<Key, Handle>;
    const std::lock_guard<std::mutex> lock(mutex);
    return &handles.try_emplace(key, Handle{key}).first->second;
}

char connectionHandle = 'c';

const char* nameOf(connection_h connection)
{
    if (connection == nullptr)
        return "no connection";
    return connection == &connectionHandle ? "connection" : "another connection";
}

std::string nameOf(const telephony_handle_list_s& list)
{
    return list.handle != nullptr ? "list of " + std::to_string(list.count) : "no list";
}

std::string nameOf(const TapiHandle* handle)
{
    return handle != nullptr ? "modem " + handle->of : "no modem";
}

} // namespace

void fake::writeArgument(std::ostream& out, telephony_h handle)
{
    out << (handle != nullptr ? "slot " + std::to_string(handle->of) : "no slot");
}

void fake::writeArgument(std::ostream& out, package_info_h handle)
{
    out << "package " << handle->of;
}

void fake::writeArgument(std::ostream& out, TapiHandle* handle)
{
    out << nameOf(handle);
}

FakePlatform& fake::platform()
{
    static FakePlatform& instance = *new FakePlatform;
    return instance;
}

void FakePlatform::reset()
{
    forgetEvents();
    answers_.clear();
    handles_.clear();
    lists_.clear();
    setModems(std::nullopt);
    callbacks = {};
    debugMode = 0;
    tag.reset();
    cipherThrows = false;
    numberTextThrows = false;
    logResult = 0;
    now.reset();
    cardChanged = 0;
    onEvent = nullptr;
    clearFormatBuffers();
    bus().reset();
    ledger().clear();
}

void FakePlatform::forgetEvents()
{
    const std::lock_guard<std::mutex> lock(mutex_);
    events_.clear();
}

void FakePlatform::answer(const std::string& call, int result, std::any value)
{
    const std::lock_guard<std::mutex> lock(mutex_);
    answers_[call] = {result, std::move(value)};
}

FakePlatform::Answer FakePlatform::answerTo(const std::string& call)
{
    record(Event::Kind::CALL, call);
    const std::lock_guard<std::mutex> lock(mutex_);
    const auto found = answers_.find(call);
    if (found != answers_.end())
        return found->second;
    ADD_FAILURE() << "no answer was set for " << call;
    return {-1, {}};
}

Texts FakePlatform::liveHandles() const
{
    const std::lock_guard<std::mutex> lock(mutex_);
    return Texts(handles_.begin(), handles_.end());
}

void FakePlatform::addHandle(const std::string& handle)
{
    const std::lock_guard<std::mutex> lock(mutex_);
    handles_.insert(handle);
}

void FakePlatform::removeHandle(const std::string& handle)
{
    const std::lock_guard<std::mutex> lock(mutex_);
    const auto found = handles_.find(handle);
    if (found != handles_.end())
        handles_.erase(found);
    else
        ADD_FAILURE() << handle << " was released but is not open";
}

// Each array is one allocation, so that its use after the release shows to the sanitizers; one that
// nobody releases belongs to the fake.
telephony_handle_list_s FakePlatform::openList(unsigned int count)
{
    auto handles = std::make_unique<telephony_h[]>(count);
    for (unsigned int slot = 0; slot < count; ++slot)
        handles[slot] = handleOf<telephony_data>(slot);
    const telephony_handle_list_s list = {count, handles.get()};
    addHandle(nameOf(list));
    const std::lock_guard<std::mutex> lock(mutex_);
    lists_[list.handle] = std::move(handles);
    return list;
}

void FakePlatform::closeList(const telephony_handle_list_s& list)
{
    std::unique_lock<std::mutex> lock(mutex_);
    const bool wasOpen = lists_.erase(list.handle) > 0;
    lock.unlock();
    if (wasOpen)
        removeHandle(nameOf(list));
    else
        ADD_FAILURE() << "a " << nameOf(list) << " was released that is not open";
}

void FakePlatform::setModems(const std::optional<Texts>& names)
{
    modems_ = names;
    modemPointers_.clear();
    if (modems_) {
        for (std::string& name : *modems_)
            modemPointers_.push_back(name.data());
        modemPointers_.push_back(nullptr);
    }
}

char** FakePlatform::modemNames()
{
    return modems_ ? modemPointers_.data() : nullptr;
}

void FakePlatform::record(Event::Kind kind, const std::string& text, const LogLine& line)
{
    {
        const std::lock_guard<std::mutex> lock(mutex_);
        events_.push_back({kind, text, line});
    }
    if (onEvent && kind != Event::Kind::LOGGER && kind != Event::Kind::CIPHER)
        onEvent({kind, text, line});
}

std::vector<Event> FakePlatform::events() const
{
    const std::lock_guard<std::mutex> lock(mutex_);
    return events_;
}

Texts FakePlatform::trace() const
{
    Texts trace;
    for (const Event& event : events())
        if (event.kind != Event::Kind::LOGGER && event.kind != Event::Kind::CIPHER)
            trace.push_back(event.text);
    return trace;
}

Texts FakePlatform::texts(Event::Kind kind) const
{
    Texts texts;
    for (const Event& event : events())
        if (event.kind == kind)
            texts.push_back(event.text);
    return texts;
}

std::vector<LogLine> FakePlatform::lines() const
{
    std::vector<LogLine> lines;
    for (const Event& event : events())
        if (event.kind == Event::Kind::LOG)
            lines.push_back(event.line);
    return lines;
}

// Hexadecimal digits with every bit turned: no plain text can survive it.
std::string fake::encipher(const std::string& plain)
{
    std::string text;
    for (const char character : plain) {
        char digits[3];
        std::snprintf(digits, sizeof digits, "%02x", static_cast<unsigned char>(~character));
        text += digits;
    }
    return text;
}

std::string fake::decipher(const std::string& enciphered)
{
    std::string plain;
    for (std::size_t i = 0; i + 1 < enciphered.size(); i += 2)
        plain += static_cast<char>(~std::stoi(enciphered.substr(i, 2), nullptr, 16));
    return plain;
}

// The platform.

extern "C" {

int __dlog_print(log_id_t id, int priority, const char* tag, const char* format, ...)
{
    const AllocationPause pause;
    va_list arguments;
    va_start(arguments, format);
    const LogLine line = readLine(id, priority, tag, format, arguments);
    va_end(arguments);
    platform().record(Event::Kind::LOG, describe(line), line);
    return platform().logResult;
}

#define REPLY(name, parameters, ...)                 \
    int name parameters                              \
    {                                                \
        return platform().reply(#name, __VA_ARGS__); \
    }
#include "platform_replies.def"

int telephony_init(telephony_handle_list_s* list)
{
    const AllocationPause pause;
    unsigned int count = UINT_MAX;
    const int result = platform().reply("telephony_init", &count);
    if (count != UINT_MAX)
        *list = platform().openList(count);
    return result;
}

int telephony_deinit(telephony_handle_list_s* list)
{
    const AllocationPause pause;
    const int result = platform().call("telephony_deinit", nameOf(*list));
    if (list->handle != nullptr)
        platform().closeList(*list);
    *list = {0, nullptr};
    return result;
}

char** tel_get_cp_name_list(void)
{
    const AllocationPause pause;
    platform().record(Event::Kind::CALL, "tel_get_cp_name_list()");
    return platform().modemNames();
}

// The answer says whether there is such a modem: 0 opens it.
TapiHandle* tel_init(const char* cp_name)
{
    const AllocationPause pause;
    if (platform().call("tel_init", cp_name) != 0)
        return nullptr;
    TapiHandle* const handle =
        handleOf<tapi_handle>(std::string(cp_name != nullptr ? cp_name : "null"));
    platform().addHandle(nameOf(handle));
    return handle;
}

int tel_deinit(TapiHandle* handle)
{
    const AllocationPause pause;
    const int result = platform().call("tel_deinit", handle);
    platform().removeHandle(nameOf(handle));
    return result;
}

int tel_get_sim_init_info(TapiHandle* handle, TelSimCardStatus_t* status, int* card_changed)
{
    const AllocationPause pause;
    const int result = platform().reply("tel_get_sim_init_info", status, handle);
    *card_changed = platform().cardChanged;
    return result;
}

int runtime_info_set_changed_cb(runtime_info_key_e key, runtime_info_changed_cb callback,
                                void* user_data)
{
    platform().callbacks.runtime[key] = {callback, user_data};
    return platform().call("runtime_info_set_changed_cb", key);
}

int runtime_info_unset_changed_cb(runtime_info_key_e key)
{
    platform().callbacks.runtime.erase(key);
    return platform().call("runtime_info_unset_changed_cb", key);
}

int wifi_initialize(void)
{
    return platform().call("wifi_initialize");
}

int wifi_set_device_state_changed_cb(wifi_device_state_changed_cb callback, void* user_data)
{
    platform().callbacks.wifiDevice = callback;
    platform().callbacks.wifiDeviceData = user_data;
    return platform().call("wifi_set_device_state_changed_cb");
}

int wifi_unset_device_state_changed_cb(void)
{
    platform().callbacks.wifiDevice = nullptr;
    return platform().call("wifi_unset_device_state_changed_cb");
}

int wifi_set_connection_state_changed_cb(wifi_connection_state_changed_cb callback, void* user_data)
{
    platform().callbacks.wifiConnection = callback;
    platform().callbacks.wifiConnectionData = user_data;
    return platform().call("wifi_set_connection_state_changed_cb");
}

int wifi_unset_connection_state_changed_cb(void)
{
    platform().callbacks.wifiConnection = nullptr;
    return platform().call("wifi_unset_connection_state_changed_cb");
}

// The answer says whether a handle is made: 0 makes it.
int connection_create(connection_h* connection)
{
    const AllocationPause pause;
    const int result = platform().call("connection_create");
    if (result == 0) {
        *connection = &connectionHandle;
        platform().addHandle(nameOf(*connection));
    }
    return result;
}

int connection_destroy(connection_h connection)
{
    const AllocationPause pause;
    if (connection == &connectionHandle)
        platform().removeHandle(nameOf(connection));
    return platform().call("connection_destroy", nameOf(connection));
}

char* vconf_get_str(const char* key)
{
    char* value = nullptr;
    platform().reply("vconf_get_str", &value, key);
    return value;
}

// The answer says whether there is such a package: 0 makes a handle.
int package_info_create(const char* package_id, package_info_h* info)
{
    const AllocationPause pause;
    const int result = platform().call("package_info_create", package_id);
    if (result == 0) {
        *info = handleOf<package_info_s>(std::string(package_id));
        platform().addHandle("package " + (*info)->of);
    }
    return result;
}

int package_info_destroy(package_info_h info)
{
    const AllocationPause pause;
    const int result = platform().call("package_info_destroy", info);
    platform().removeHandle("package " + info->of);
    return result;
}

int package_manager_get_package_size_info(const char* package_id,
                                          package_manager_size_info_receive_cb callback,
                                          void* user_data)
{
    EXPECT_EQ(callback, nullptr);
    EXPECT_EQ(user_data, nullptr);
    return platform().call("package_manager_get_package_size_info", package_id);
}

// The program's own calls of time() come here (the linker's --wrap).
std::time_t __real_time(std::time_t* slot);

std::time_t __wrap_time(std::time_t* slot)
{
    if (!platform().now)
        return __real_time(slot);
    if (slot != nullptr)
        *slot = *platform().now;
    return *platform().now;
}

} // extern "C"
