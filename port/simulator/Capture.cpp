// SPDX-License-Identifier: Apache-2.0
#include "Capture.h"

#include <cctype>
#include <optional>
#include <sstream>
#include <type_traits>

#include "../../devicefile/Schema.h"
#include "../../devicefile/Toml.h"
#include "../backend/ModemAnswers.h"
#include "../common/GLibTypes.h"
#include "../facts/Facts.h"
#include "../facts/Privacy.h"

namespace port::simulator {
namespace {

using coresystem_port::CaptureOptions;
using devicefile::findKey;
using devicefile::findSection;
using devicefile::Form;
using devicefile::Meaning;
using devicefile::Name;
using devicefile::Type;

std::string validUtf8(const std::string& text)
{
    return Owned<char>(g_utf8_make_valid(text.data(), static_cast<gssize>(text.size()))).get();
}

// In quotes and on one line, whatever it holds.
std::string inQuotes(const std::string& text)
{
    const toml::value<std::string> value{validUtf8(text)};
    std::ostringstream stream;
    stream << toml::toml_formatter{value, toml::format_flags::none};
    return stream.str();
}

// On one line, whose length is bounded.
std::string inComment(const std::string& text)
{
    constexpr std::size_t LIMIT = 300;
    std::string line = validUtf8(text.substr(0, LIMIT));
    for (char& byte : line)
        if (std::iscntrl(static_cast<unsigned char>(byte)) != 0)
            byte = ' ';
    return " # " + line + "\n";
}

// One section of the file, as it grows.
class Lines {
public:
    /// Masks what identifies the device or its user, unless it is to be revealed.
    explicit Lines(const char* section, bool reveal, Form form = Form::Section)
        : section_(section), reveal_(reveal)
    {
        const std::string name(section);
        text_ = form == Form::List ? "\n[[" + name + "]]\n" : "\n[" + name + "]\n";
    }

    const std::string& text() const
    {
        return text_;
    }

    void put(const std::string& key, const std::string& value, const std::string& comment)
    {
        text_ += key + " = " + value + inComment(comment);
        isEmpty_ = false;
    }

    void putAbsent(const std::string& key, const std::string& reason)
    {
        text_ += "# no " + key + ":" + inComment(reason).substr(2);
    }

    bool isEmpty() const
    {
        return isEmpty_;
    }

    // A fact under the name that the file has for its kind; absent when there is none.
    template <typename T>
    void add(const std::string& key, const Result<Sourced<T>>& answer)
    {
        if (!answer)
            addError(key, answer.error());
        else if (const auto text = textOf(key, answer.value().value))
            put(key, *text, answer.value().source + (isMasked(key) ? ", masked" : ""));
        else
            putAbsent(key, "a device file cannot say what " + answer.value().source + " tells");
    }

    // All plain facts of the section.
    void addPlain(Backend& backend)
    {
#define FACT(number, question, section, key, ...) \
    if (section_ == (section))                    \
        add(key, backend.get<Question::question>());
#include "../facts/facts.def"
    }

private:
    bool isMasked(const std::string& key) const
    {
        return !reveal_ && isPrivate(section_, key);
    }

    void addError(const std::string& key, const Error& error)
    {
        if (error.kind == Error::Kind::NotSupported &&
            findName(key, Meaning::Kind::NotSupported) != nullptr)
            put(key, "\"not_supported\"", error.reason);
        else
            putAbsent(key, error.reason);
    }

    // The last of several.
    const Name* findName(const std::string& key, Meaning meaning) const
    {
        const Name* found = nullptr;
        for (const Name& row : findKey(*findSection(section_), key)->names)
            if (row.meaning == meaning)
                found = &row;
        return found;
    }

    template <typename T>
    std::optional<std::string> textOf(const std::string& key, const T& value) const
    {
        if constexpr (std::is_same_v<T, std::string>) {
            return inQuotes(isMasked(key) ? zeroed(value) : value);
        } else if constexpr (std::is_same_v<T, bool>) {
            return value ? "true" : "false";
        } else if constexpr (std::is_enum_v<T>) {
            const Name* const name = findName(key, static_cast<std::int64_t>(value));
            return name != nullptr ? std::optional(inQuotes(std::string(name->name)))
                                   : std::nullopt;
        } else {
            return std::to_string(value);
        }
    }

    std::string section_;
    bool reveal_;
    std::string text_;
    bool isEmpty_ = true;
};

// A part of an answer, with the answer's source.
template <typename T, typename Whole>
Result<Sourced<T>> part(const Result<Sourced<Whole>>& answer, T Whole::*member)
{
    if (!answer)
        return answer.error();
    return Sourced<T>{answer.value().value.*member, answer.value().source};
}

class Capture {
public:
    Capture(Backend& backend, const CaptureOptions& options) : backend_(backend), options_(options)
    {
    }

    std::string text()
    {
        std::string all = "# A device as the backend " + backend_.name() + " tells of it.\n";
        if (!options_.reveal)
            all += "# What identifies it or its user is masked: made of zeros.\n";
        all += "schema = 1\n";
        const std::string slots = this->slots(); // which may tell of [device], and of [fault]
        all += device() + settings() + slots + subscriptions() + network() + storage() + packages();
        return all + (faults_.isEmpty() ? "" : faults_.text());
    }

private:
    std::string device()
    {
        device_.addPlain(backend_);
        return device_.text();
    }

    std::string settings()
    {
        Lines lines("settings", options_.reveal);
        lines.addPlain(backend_);
        lines.add("utc_offset", part(backend_.now(), &std::tm::tm_gmtoff));
        return lines.text();
    }

    std::string slots()
    {
        const auto names = backend_.telephony().slots();
        std::string all;
        if (!names)
            addMissingTelephony(names.error());
        else
            for (const SlotName& name : names.value().value)
                all += slot(name);
        return all;
    }

    // A device file without a slot describes a service that knows no modem, which is another thing.
    void addMissingTelephony(const Error& error)
    {
        if (error.kind == Error::Kind::NotSupported) {
            device_.put("telephony", "false", error.reason);
            return;
        }
        faults_.put("telephony_init",
                    error.kind == Error::Kind::Denied ? "\"TELEPHONY_ERROR_PERMISSION_DENIED\""
                                                      : "\"TELEPHONY_ERROR_OPERATION_FAILED\"",
                    error.reason);
        for (const char* const call : {"tel_get_cp_name_list", "tel_init"})
            faults_.put(call, "\"null\"", error.reason);
    }

    std::string slot(const SlotName& name)
    {
        Telephony& telephony = backend_.telephony();
        Lines lines("slot", options_.reveal, Form::List);
        lines.put("cp_name", inQuotes(name), "the modem");
        const auto card = telephony.card(name);
        if (!card && card.error().kind == Error::Kind::Denied) {
            lines.put("denied", "true", card.error().reason);
            return lines.text();
        }
        addCard(lines, card);
        addIdentity(lines, telephony.imsi(name));
        addNumber(lines, telephony.number(name));
        lines.add("imei", telephony.imei(name));
        lines.add("service", telephony.service(name));
        lines.add("roaming", telephony.roaming(name));
        eachAnswer(
            reportOf(telephony, name),
            [&lines](Question, const char* key, const auto& answer) { lines.add(key, answer); });
        lines.add("iccid", telephony.iccid(name));
        lines.add("sms", telephony.smsReady(name));
        return lines.text();
    }

    // The states that have no name of their own have one of the older interface.
    static void addCard(Lines& lines, const Result<Sourced<Card>>& card)
    {
        const auto status = part(card, &Card::status);
        const bool isPlain = !status || isAnyOf("sim", status.value().value);
        lines.add(isPlain ? "sim" : "init_status", status);
        if (card && card.value().value.changed)
            lines.put("card_changed", "true", card.value().source);
    }

    static bool isAnyOf(const char* key, CardStatus status)
    {
        for (const Name& row : findKey(*findSection("slot"), key)->names)
            if (row.meaning == static_cast<std::int64_t>(status))
                return true;
        return false;
    }

    static void addIdentity(Lines& lines, const Result<Sourced<Imsi>>& imsi)
    {
        lines.add("mcc", part(imsi, &Imsi::mcc));
        lines.add("mnc", part(imsi, &Imsi::mnc));
        lines.add("msin", part(imsi, &Imsi::msin));
    }

    static void addNumber(Lines& lines, const Result<Sourced<std::optional<std::string>>>& number)
    {
        if (!number)
            lines.putAbsent("number", number.error().reason);
        else if (!number.value().value)
            lines.putAbsent("number", "the card holds none");
        else if (number.value().value->empty())
            lines.put("number", "\"null\"", number.value().source);
        else
            lines.add("number", Result<Fact>(Fact{*number.value().value, number.value().source}));
    }

    std::string subscriptions()
    {
        const auto all = backend_.telephony().subscriptions();
        if (!all)
            return "";
        Lines lines("subscriptions", options_.reveal);
        const Subscriptions& known = all.value().value;
        addDefault(lines, "network", known.network, all.value().source);
        addDefault(lines, "data", known.data, all.value().source);
        lines.add("voice", part(all, &Subscriptions::voice));
        return lines.text();
    }

    static void addDefault(Lines& lines, const char* key, std::optional<int> slot,
                           const std::string& source)
    {
        const Type* const type = findKey(*findSection("subscriptions"), key);
        if (slot && *slot <= type->most)
            lines.put(key, std::to_string(*slot), source);
        else
            lines.putAbsent(key, slot ? "a device file cannot say slot " + std::to_string(*slot)
                                      : "unknown to " + source);
    }

    std::string network()
    {
        Lines lines("network", options_.reveal);
        Network& network = backend_.network();
        addRadio(lines, "cellular", network.cellular(), "connection_get_cellular_state");
        addRadio(lines, "wifi", network.wifi(), "connection_get_wifi_state");
        lines.add("wifi_connection", network.wifiConnection());
        lines.add("ssid", network.ssid());
        addRadio(lines, "bluetooth", network.bluetooth(), "connection_get_bt_state");
        lines.add("ethernet", network.ethernet());
        const auto connectivity = network.connectivity();
        if (connectivity)
            lines.add("connectivity", connectivity);
        else // without its key a device file's links tell it
            lines.put("connectivity", "\"unknown\"", connectivity.error().reason);
        return lines.text();
    }

    // An absent key is no failure in flight mode, and never a refusal.
    template <typename State>
    void addRadio(Lines& lines, const char* key, const Result<Sourced<State>>& state,
                  const char* call)
    {
        lines.add(key, state);
        if (state || state.error().kind == Error::Kind::NotSupported)
            return;
        const bool isRefused = state.error().kind == Error::Kind::Denied;
        faults_.put(call,
                    isRefused ? "\"CONNECTION_ERROR_PERMISSION_DENIED\""
                              : "\"CONNECTION_ERROR_OPERATION_FAILED\"",
                    state.error().reason);
    }

    static std::string absentSection(const std::string& name, const std::string& reason)
    {
        return "\n# no [" + name + "]:" + inComment(reason).substr(2);
    }

    std::string storage()
    {
        const auto size = backend_.internalStorage();
        if (!size)
            return absentSection("storage", size.error().reason);
        Lines lines("storage", options_.reveal);
        lines.add("block_size", part(size, &VolumeSize::blockSize));
        lines.add("fragment_size", part(size, &VolumeSize::fragmentSize));
        lines.add("blocks", part(size, &VolumeSize::blocks));
        lines.add("available_blocks", part(size, &VolumeSize::availableBlocks));
        return lines.text();
    }

    std::string packages()
    {
        if (options_.packages.empty())
            return "";
        Lines lines("packages", options_.reveal);
        for (const std::string& name : options_.packages) {
            const auto version = backend_.packageVersion(name);
            if (!version) // with the section, what it does not name were not installed
                return absentSection("packages", version.error().reason);
            if (version.value().value)
                lines.put(inQuotes(name), inQuotes(*version.value().value), version.value().source);
            else
                lines.putAbsent(inQuotes(name), "not installed");
        }
        return lines.text();
    }

    Backend& backend_;
    const CaptureOptions& options_;
    Lines device_{"device", options_.reveal};
    Lines faults_{"fault", options_.reveal};
};

} // namespace

std::string capture(Backend& backend, const CaptureOptions& options)
{
    return Capture(backend, options).text();
}

} // namespace port::simulator

std::string coresystem_port::captureDevice(const CaptureOptions& options)
{
    return port::simulator::capture(port::backend(), options);
}
