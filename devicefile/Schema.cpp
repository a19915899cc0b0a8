// SPDX-License-Identifier: Apache-2.0
#include "Schema.h"

#include <algorithm>
#include <array>
#include <iterator>
#include <limits>

#include "../port/backend/Network.h"
#include "../port/backend/Telephony.h"
#include "../port/facts/Facts.h"
#include "ErrorNames.h"

namespace port::devicefile {
namespace {

template <typename Enumeration>
constexpr Name name(std::string_view text, Enumeration value)
{
    return {text, static_cast<std::int64_t>(value)};
}

constexpr Name FONT_SIZES[] = {
    name("small", FontSize::Small), name("normal", FontSize::Normal),
    name("large", FontSize::Large), name("huge", FontSize::Huge),
    name("giant", FontSize::Giant),
};

// A slot's card, as people say it.
constexpr Name CARDS[] = {
    name("available", CardStatus::Ready),
    name("locked", CardStatus::PinRequired),
    name("pin", CardStatus::PinRequired),
    name("puk", CardStatus::PukRequired),
    name("blocked", CardStatus::Blocked),
    name("network_locked", CardStatus::NetworkLocked),
    name("absent", CardStatus::Absent),
    name("removed", CardStatus::Removed),
    name("error", CardStatus::Error),
    name("powered_off", CardStatus::PoweredOff),
    name("initializing", CardStatus::Initializing),
    name("unknown", CardStatus::Unknown),
};

// The same as the older telephony interface says it.
constexpr Name CARD_STATUSES[] = {
    name("card_error", CardStatus::Error),
    name("card_not_present", CardStatus::Absent),
    name("sim_initializing", CardStatus::Initializing),
    name("sim_init_completed", CardStatus::Ready),
    name("sim_pin_required", CardStatus::PinRequired),
    name("sim_puk_required", CardStatus::PukRequired),
    name("card_blocked", CardStatus::Blocked),
    name("sim_nck_required", CardStatus::NetworkLocked),
    name("sim_nsck_required", CardStatus::SubsetLocked),
    name("sim_spck_required", CardStatus::ProviderLocked),
    name("sim_cck_required", CardStatus::CorporateLocked),
    name("card_removed", CardStatus::Removed),
    name("sim_lock_required", CardStatus::DeviceLocked),
    name("card_crashed", CardStatus::Crashed),
    name("card_poweroff", CardStatus::PoweredOff),
    name("unknown", CardStatus::Unknown),
};

constexpr Name SERVICES[] = {
    name("in_service", ServiceState::InService),
    name("out_of_service", ServiceState::OutOfService),
    name("emergency_only", ServiceState::EmergencyOnly),
};

// As ModemManager says it.
constexpr Name ACCESS_TECHNOLOGIES[] = {
    name("pots", AccessTechnology::Pots),
    name("gsm", AccessTechnology::Gsm),
    name("gsm-compact", AccessTechnology::GsmCompact),
    name("gprs", AccessTechnology::Gprs),
    name("edge", AccessTechnology::Edge),
    name("umts", AccessTechnology::Umts),
    name("hsdpa", AccessTechnology::Hsdpa),
    name("hsupa", AccessTechnology::Hsupa),
    name("hspa", AccessTechnology::Hspa),
    name("hspa-plus", AccessTechnology::HspaPlus),
    name("1xrtt", AccessTechnology::OneXrtt),
    name("evdo0", AccessTechnology::Evdo0),
    name("evdoa", AccessTechnology::EvdoA),
    name("evdob", AccessTechnology::EvdoB),
    name("lte", AccessTechnology::Lte),
    name("5gnr", AccessTechnology::FiveGNr),
    name("lte-cat-m", AccessTechnology::LteCatM),
    name("lte-nb-iot", AccessTechnology::LteNbIot),
};

constexpr Name POWER_STATES[] = {
    name("off", PowerState::Off),
    name("low", PowerState::Low),
    name("on", PowerState::On),
};

constexpr Name UNKNOWN_SLOT[] = {{"unknown", -1}};

constexpr Name VOICES[] = {
    name("unknown", Subscriptions::Voice::Unknown),
    name("current_network", Subscriptions::Voice::CurrentNetwork),
    name("ask_always", Subscriptions::Voice::AskAlways),
    name("slot0", Subscriptions::Voice::Slot1),
    name("slot1", Subscriptions::Voice::Slot2),
};

constexpr Name CELLULAR_STATES[] = {
    name("out_of_service", CellularState::OutOfService),
    name("flight_mode", CellularState::FlightMode),
    name("roaming_off", CellularState::RoamingOff),
    name("call_only_available", CellularState::CallOnlyAvailable),
    name("available", CellularState::Available),
    name("connected", CellularState::Connected),
    {"not_supported", Meaning::Kind::NotSupported},
};

constexpr Name LINK_STATES[] = {
    name("deactivated", LinkState::Deactivated),
    name("disconnected", LinkState::Disconnected),
    name("connected", LinkState::Connected),
    {"not_supported", Meaning::Kind::NotSupported},
};

constexpr Name WIFI_CONNECTIONS[] = {
    name("failure", WifiConnection::Failure),
    name("disconnected", WifiConnection::Disconnected),
    name("association", WifiConnection::Association),
    name("configuration", WifiConnection::Configuration),
    name("connected", WifiConnection::Connected),
    {"not_supported", Meaning::Kind::NotSupported},
};

constexpr Name CONNECTIVITIES[] = {
    name("unknown", Connectivity::Unknown), name("none", Connectivity::None),
    name("portal", Connectivity::Portal),   name("limited", Connectivity::Limited),
    name("full", Connectivity::Full),
};

// A call that hands out a pointer or a list may also succeed without.
constexpr Name OR_NULL[] = {{"null", Meaning::Kind::Nothing}};
constexpr Name OR_EMPTY[] = {{"empty", Meaning::Kind::Nothing}};

// The rows of several lists, one after the other.
template <std::size_t... Counts>
constexpr auto joined(const Name (&... lists)[Counts])
{
    std::array<Name, (Counts + ...)> all{};
    std::size_t count = 0;
    const auto append = [&](const auto& list) {
        for (const Name& name : list)
            all[count++] = name;
    };
    (append(lists), ...);
    return all;
}

template <const auto&... Lists>
constexpr auto JOINED = joined(Lists...);

constexpr Name SERIAL_FAULTS[] = {{"not_a_string", Meaning::Kind::NotAString}};
constexpr Name SERVICE_FAULTS[] = {
    name("absent", ServiceFault::Absent),
    name("silent", ServiceFault::Silent),
    name("slow", ServiceFault::Slow),
    name("crashing", ServiceFault::Crashing),
};
constexpr Name BUS_FAULTS[] = {name("no_bus", BusFault::NoBus)};

constexpr std::int64_t ANY = std::numeric_limits<std::int64_t>::max();

constexpr Type TEXT{Type::Kind::Text};
constexpr Type SOME_TEXT{Type::Kind::Text, 1};
constexpr Type SSID{Type::Kind::Text, 1, 32}; // IEEE 802.11, 9.4.2.2
constexpr Type SWITCH{Type::Kind::Switch};
constexpr Type NUMBER{Type::Kind::Number};

constexpr Type digits(std::int64_t least, std::int64_t most)
{
    return {Type::Kind::Digits, least, most};
}

constexpr Type whole(std::int64_t least, std::int64_t most)
{
    return {Type::Kind::Whole, least, most};
}

template <std::size_t Count>
constexpr Type oneOf(const Name (&names)[Count], std::int64_t least = 0, std::int64_t most = -1)
{
    return {Type::Kind::Name, least, most, {names, Count}};
}

template <typename Rows>
constexpr Type fault(const Rows& names, Type::Kind kind = Type::Kind::Fault)
{
    return {kind, 0, -1, {std::data(names), std::size(names)}};
}

constexpr SectionRow SECTIONS[] = {
    {"device", Form::Section},  {"settings", Form::Section},
    {"slot", Form::List},       {"subscriptions", Form::Section},
    {"network", Form::Section}, {"storage", Form::Section},
    {"packages", Form::Free},   {"fault", Form::Section},
    {"service", Form::Section}, {"step", Form::List},
};

struct KeyRow {
    std::string_view section;
    std::string_view key; // in a free section: any
    Type type;
};

constexpr KeyRow KEYS[] = {
#define FACT(number, question, section, key, value, type, privacy, words) {section, key, type},
#define KEY(section, key, type, privacy, words) {section, key, type},
#include "../port/facts/facts.def"

    // How the services misbehave that are played for a program that is run on the device.
    {"service", "ModemManager", fault(SERVICE_FAULTS)},
    {"service", "NetworkManager", fault(SERVICE_FAULTS)},
    {"service", "bluez", fault(SERVICE_FAULTS)},
    {"service", "hostname1", fault(SERVICE_FAULTS)},
    {"service", "locale1", fault(SERVICE_FAULTS)},

    // A scenario; nothing of it is said of the device until it is played.
    {"step", "after_ms", whole(0, 24 * 60 * 60 * 1000)}, // since the step before it
    {"step", "note", TEXT},
    {"step", "set", {Type::Kind::Changes}},
    {"step", "unset", {Type::Kind::Paths}},

// The calls of the platform by their own names, and what is asked over the bus.
#define FAULT(call, ...) {"fault", #call, fault(JOINED<__VA_ARGS__>)},
    PLATFORM_FAULTS(FAULT){"fault", "GetSerial", fault(SERIAL_FAULTS, Type::Kind::BusFault)},
    {"fault", "g_bus_get_sync", oneOf(BUS_FAULTS)}, // of who starts the application
};

// Beside "error", in a fault's table.
constexpr struct {
    std::string_view key;
    Type type;
} FAULT_KEYS[] = {
    {"delay_ms", whole(1, 60000)},
    {"call", whole(1, ANY)},
};

} // namespace

const SectionRow* beginSections()
{
    return std::begin(SECTIONS);
}

const SectionRow* endSections()
{
    return std::end(SECTIONS);
}

const SectionRow* findSection(std::string_view name)
{
    const auto* const found =
        std::find_if(std::begin(SECTIONS), std::end(SECTIONS),
                     [name](const SectionRow& row) { return row.name == name; });
    return found != std::end(SECTIONS) ? found : nullptr;
}

const Type* findKey(const SectionRow& section, std::string_view key)
{
    for (const KeyRow& row : KEYS)
        if (row.section == section.name && (row.key == key || section.form == Form::Free))
            return &row.type;
    return nullptr;
}

const Type* findFaultKey(std::string_view key)
{
    for (const auto& row : FAULT_KEYS)
        if (row.key == key)
            return &row.type;
    return nullptr;
}

std::vector<std::string> keyNames(const SectionRow& section)
{
    std::vector<std::string> names;
    for (const KeyRow& row : KEYS)
        if (row.section == section.name && section.form != Form::Free)
            names.emplace_back(row.key);
    return names;
}

std::vector<std::string> faultKeyNames()
{
    std::vector<std::string> names;
    for (const auto& row : FAULT_KEYS)
        names.emplace_back(row.key);
    return names;
}

} // namespace port::devicefile
