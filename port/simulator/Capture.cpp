// SPDX-License-Identifier: Apache-2.0
#include "Capture.h"

#include <cctype>
#include <optional>
#include <sstream>
#include <type_traits>

#include "../../devicefile/Schema.h"
#include "../../devicefile/Toml.h"
#include "../common/GLibTypes.h"

namespace port::simulator {
namespace {

using coresystem_port::CaptureOptions;
using devicefile::findKey;
using devicefile::findSection;
using devicefile::Form;
using devicefile::Name;
using devicefile::NOT_SUPPORTED;
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

// As many characters, and nobody's.
std::string masked(const std::string& text)
{
    std::string zeros;
    for (const char byte : text) {
        const auto code = static_cast<unsigned char>(byte);
        if (code < 0x80)
            zeros += std::isalnum(code) != 0 ? '0' : byte;
        else if (code >= 0xC0) // else it goes on a character of UTF-8's
            zeros += '0';
    }
    return zeros;
}

// One section of the file, as it grows.
class Lines {
public:
    explicit Lines(const char* section, Form form = Form::Section) : section_(section)
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
    void add(const char* key, const Result<Sourced<T>>& answer)
    {
        if (!answer)
            addError(key, answer.error());
        else if (const auto text = textOf(key, answer.value().value))
            put(key, *text, answer.value().source);
        else
            putAbsent(key, "a device file cannot say what " + answer.value().source + " tells");
    }

    // A fact that tells who the device or its user is.
    void addIdentity(const char* key, const Result<Fact>& answer, const CaptureOptions& options)
    {
        if (!answer || options.reveal)
            add(key, answer);
        else
            put(key, inQuotes(masked(answer.value().value)), answer.value().source + ", masked");
    }

private:
    void addError(const char* key, const Error& error)
    {
        if (error.kind == Error::Kind::NotSupported && findName(key, NOT_SUPPORTED) != nullptr)
            put(key, "\"not_supported\"", error.reason);
        else
            putAbsent(key, error.reason);
    }

    // The last of several.
    const Name* findName(const char* key, std::int64_t value) const
    {
        const Name* found = nullptr;
        for (const Name& row : findKey(*findSection(section_), key)->names)
            if (row.value == value)
                found = &row;
        return found;
    }

    template <typename T>
    std::optional<std::string> textOf(const char* key, const T& value) const
    {
        if constexpr (std::is_same_v<T, std::string>) {
            return inQuotes(value);
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
        DeviceInfo& info = backend_.deviceInfo();
        device_.addIdentity("platform_id", info.platformId(), options_);
        device_.add("platform_name", info.platformName());
        device_.add("platform_version", info.platformVersion());
        device_.add("model_name", info.modelName());
        device_.addIdentity("serial", info.serial(), options_);
        return device_.text();
    }

    std::string settings()
    {
        Lines lines("settings");
        Network& network = backend_.network();
        const auto name = backend_.settings().deviceName();
        lines.addIdentity("device_name", name, options_);
        lines.add("language", backend_.settings().language());
        lines.add("sales_code", backend_.configuration().text("db/csc/salescode"));
        lines.add("font_size", backend_.settings().fontSize());
        lines.add("flight_mode", network.flightMode());
        lines.add("data_roaming", network.dataRoaming());
        lines.add("mobile_data", network.mobileData());
        lines.add("packet_data", network.packetData());
        lines.add("utc_offset", part(backend_.clock().now(), &std::tm::tm_gmtoff));
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
        Lines lines("slot", Form::List);
        lines.put("cp_name", inQuotes(name), "the modem");
        const auto card = telephony.card(name);
        if (!card && card.error().kind == Error::Kind::Denied) {
            lines.put("denied", "true", card.error().reason);
            return lines.text();
        }
        addCard(lines, card);
        addIdentity(lines, telephony.imsi(name));
        addNumber(lines, telephony.number(name));
        lines.addIdentity("imei", telephony.imei(name), options_);
        lines.add("service", telephony.service(name));
        lines.add("roaming", telephony.roaming(name));
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
            if (row.value == static_cast<std::int64_t>(status))
                return true;
        return false;
    }

    void addIdentity(Lines& lines, const Result<Sourced<Imsi>>& imsi)
    {
        lines.add("mcc", part(imsi, &Imsi::mcc));
        lines.add("mnc", part(imsi, &Imsi::mnc));
        lines.addIdentity("msin", part(imsi, &Imsi::msin), options_);
    }

    void addNumber(Lines& lines, const Result<Sourced<std::optional<std::string>>>& number)
    {
        if (!number)
            lines.putAbsent("number", number.error().reason);
        else if (!number.value().value)
            lines.putAbsent("number", "the card holds none");
        else if (number.value().value->empty())
            lines.put("number", "\"null\"", number.value().source);
        else
            lines.addIdentity("number", Fact{*number.value().value, number.value().source},
                              options_);
    }

    std::string subscriptions()
    {
        const auto all = backend_.telephony().subscriptions();
        if (!all)
            return "";
        Lines lines("subscriptions");
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
        Lines lines("network");
        Network& network = backend_.network();
        addRadio(lines, "cellular", network.cellular(), "connection_get_cellular_state");
        addRadio(lines, "wifi", network.wifi(), "connection_get_wifi_state");
        lines.add("wifi_connection", network.wifiConnection());
        addRadio(lines, "bluetooth", network.bluetooth(), "connection_get_bt_state");
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
        const auto size = backend_.storage().internal();
        if (!size)
            return absentSection("storage", size.error().reason);
        Lines lines("storage");
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
        Lines lines("packages");
        for (const std::string& name : options_.packages) {
            const auto version = backend_.packages().version(name);
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
    Lines device_{"device"};
    Lines faults_{"fault"};
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
