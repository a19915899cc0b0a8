// SPDX-License-Identifier: Apache-2.0
// A recording fake of everything the library imports: the platform's C functions and the utility
// library. It is linked with the library's objects in place of both.
//
// Records all calls as one ordered sequence of events; a call whose answer was not set fails the
// test, and so does a log line that breaks the rules that hold for every line. A function that only
// answers takes one row in platform_replies.def.
#ifndef CORESYSTEM_TESTS_SUPPORT_FAKE_PLATFORM_H
#define CORESYSTEM_TESTS_SUPPORT_FAKE_PLATFORM_H

#include <any>
#include <cstring>
#include <ctime>
#include <functional>
#include <map>
#include <memory>
#include <mutex>
#include <optional>
#include <set>
#include <sstream>
#include <string>
#include <vector>

#include <gtest/gtest.h>
#include <package_info.h>
#include <runtime_info.h>
#include <tapi_common.h>
#include <telephony.h>
#include <wifi.h>

#include "FailingAllocation.h"

namespace fake {

struct LogLine {
    int id = 0;
    int priority = 0;
    std::string tag;
    std::string format;
    std::string file;
    std::string function;
    int line = 0;
    std::string text;  // as written, without the prefix
    std::string plain; // the text; of a debug line the deciphered body
};

struct Event {
    enum class Kind { CALL, LOCK, UNLOCK, LOG, LOGGER, CIPHER };
    Kind kind;
    // CALL   "function(argument, argument)"
    // LOCK   "lock NAME", UNLOCK "unlock NAME" of a scoped lock; "NAME.Lock()", "NAME.Unlock()" of
    //        an explicit one
    // LOG    "debug FILE FUNCTION: PLAIN", likewise "error" and "notice"; where the format is not
    //        the plain text itself, "error FILE FUNCTION: PLAIN <- FORMAT"
    // LOGGER "GetDebugMode"; CIPHER "Encrypt(PLAIN)"
    std::string text;
    LogLine line; // of LOG only
};

typedef std::vector<std::string> Texts;

// Operations on it may be called from any thread; the settings are for one thread at a time.
class FakePlatform {
public:
    void reset(); // the bus and the ledger, too
    void forgetEvents();

    // \name What it answers
    // A value is written into the caller's slot whatever the result is; without one the slot stays
    // as it was. A std::string becomes malloc memory that is entered in the ledger; an enumeration
    // may be given as any int, listed or not.
    void answer(const std::string& call, int result, std::any value = {});

    int debugMode = 0;
    std::optional<std::string> tag;
    bool cipherThrows = false;
    bool numberTextThrows = false;
    int logResult = 0;
    std::optional<std::time_t> now; // the machine's clock tells it otherwise
    int cardChanged = 0;            // what tel_get_sim_init_info() tells beside the status
    // Called after each event outside LOGGER and CIPHER, on the thread of the event.
    std::function<void(const Event&)> onEvent;

    // The callback that is registered now; null for none.
    struct Callbacks {
        wifi_device_state_changed_cb wifiDevice = nullptr;
        void* wifiDeviceData = nullptr;
        wifi_connection_state_changed_cb wifiConnection = nullptr;
        void* wifiConnectionData = nullptr;
        std::map<int, std::pair<runtime_info_changed_cb, void*>> runtime; // by key
    };
    Callbacks callbacks;

    // The handles that nobody has released yet, sorted: "connection", "list of COUNT", "modem
    // NAME", "package NAME".
    Texts liveHandles() const;
    // The modem names that tel_get_cp_name_list() gives, ended by null; none gives null.
    void setModems(const std::optional<Texts>& names);

    // \name What happened
    std::vector<Event> events() const;
    // The calls, locks and log lines.
    Texts trace() const;
    // The operations of the logger, or of the cipher.
    Texts texts(Event::Kind kind) const;
    std::vector<LogLine> lines() const;

    // \name For the fake functions
    void record(Event::Kind kind, const std::string& text, const LogLine& line = {});
    // Records a call and gives the result that was set for it.
    template <class... Arguments>
    int call(const char* function, const Arguments&... arguments);
    // The same for a function that hands a value out through `slot`.
    template <class Value, class... Arguments>
    int reply(const char* function, Value* slot, const Arguments&... arguments);
    telephony_handle_list_s openList(unsigned int count);
    void closeList(const telephony_handle_list_s& list);
    void addHandle(const std::string& handle);
    void removeHandle(const std::string& handle);
    char** modemNames();

private:
    struct Answer {
        int result;
        std::any value;
    };
    Answer answerTo(const std::string& call);

    mutable std::mutex mutex_;
    std::vector<Event> events_;
    std::map<std::string, Answer> answers_;
    std::multiset<std::string> handles_;
    std::map<const telephony_h*, std::unique_ptr<telephony_h[]>> lists_;
    std::optional<Texts> modems_;
    std::vector<char*> modemPointers_;
};

FakePlatform& platform();

// Whether one of the logger's buffers holds the text.
bool isInFormatBuffer(const std::string& text);
void clearFormatBuffers();

// The fake cipher, and its inverse.
std::string encipher(const std::string& plain);
std::string decipher(const std::string& enciphered);

// \name The text of a call
inline void writeArgument(std::ostream& out, const char* text)
{
    out << (text != nullptr ? text : "null");
}
// "slot 0", "slot 1", ... of a handle of a list, "modem NAME" of a handle of tel_init(); "no slot"
// and "no modem" of null.
void writeArgument(std::ostream& out, telephony_h handle);
void writeArgument(std::ostream& out, TapiHandle* handle);
// "package NAME" of a handle of package_info_create().
void writeArgument(std::ostream& out, package_info_h handle);
template <class Value>
void writeArgument(std::ostream& out, const Value& value)
{
    out << value;
}
template <class... Arguments>
std::string callText(const char* function, const Arguments&... arguments)
{
    std::ostringstream out;
    [[maybe_unused]] const char* separator = "";
    out << function << '(';
    ((out << separator, writeArgument(out, arguments), separator = ", "), ...);
    out << ')';
    return out.str();
}

template <class... Arguments>
int FakePlatform::call(const char* function, const Arguments&... arguments)
{
    const AllocationPause pause;
    return answerTo(callText(function, arguments...)).result;
}

// Whether the value suits the slot; it is stored if so.
template <class Value>
bool store(const std::any& value, Value* slot)
{
    if constexpr (std::is_same_v<Value, char*>) {
        if (const auto* const text = std::any_cast<std::string>(&value)) {
            *slot = ledger().handOut(*text);
            return true;
        }
    }
    if constexpr (std::is_enum_v<Value>) {
        static_assert(sizeof(Value) == sizeof(int), "the platform's enumerations are int-sized");
        if (const auto* const number = std::any_cast<int>(&value)) {
            std::memcpy(slot, number, sizeof *number);
            return true;
        }
    }
    const auto* const plain = std::any_cast<Value>(&value);
    if (plain != nullptr)
        *slot = *plain;
    return plain != nullptr;
}

template <class Value, class... Arguments>
int FakePlatform::reply(const char* function, Value* slot, const Arguments&... arguments)
{
    const AllocationPause pause;
    const std::string call = callText(function, arguments...);
    const Answer answer = answerTo(call);
    if (answer.value.has_value() && !store(answer.value, slot))
        ADD_FAILURE() << "the answer to " << call << " has another type than its slot";
    return answer.result;
}

} // namespace fake

#endif
