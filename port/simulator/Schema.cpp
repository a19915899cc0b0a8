// SPDX-License-Identifier: Apache-2.0
#include "Schema.h"

#include <algorithm>
#include <iterator>

#include "../backend/Network.h"
#include "../backend/Settings.h"
#include "../backend/Telephony.h"

namespace port::simulator {
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
    name("in_service", Service::InService),
    name("out_of_service", Service::OutOfService),
    name("emergency_only", Service::EmergencyOnly),
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
    {"not_supported", NOT_SUPPORTED},
};

constexpr Name LINK_STATES[] = {
    name("deactivated", LinkState::Deactivated),
    name("disconnected", LinkState::Disconnected),
    name("connected", LinkState::Connected),
    {"not_supported", NOT_SUPPORTED},
};

constexpr Name WIFI_CONNECTIONS[] = {
    name("failure", WifiConnection::Failure),
    name("disconnected", WifiConnection::Disconnected),
    name("association", WifiConnection::Association),
    name("configuration", WifiConnection::Configuration),
    name("connected", WifiConnection::Connected),
    {"not_supported", NOT_SUPPORTED},
};

constexpr std::int64_t ANY = std::numeric_limits<std::int64_t>::max();

constexpr Type TEXT{Type::Kind::Text};
constexpr Type SOME_TEXT{Type::Kind::Text, 1};
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

constexpr SectionRow SECTIONS[] = {
    {"device", Form::Section},        {"settings", Form::Section}, {"slot", Form::List},
    {"subscriptions", Form::Section}, {"network", Form::Section},  {"storage", Form::Section},
    {"packages", Form::Free},
};

struct KeyRow {
    std::string_view section;
    std::string_view key; // in a free section: any
    Type type;
};

constexpr KeyRow KEYS[] = {
    {"device", "platform_id", TEXT},
    {"device", "platform_name", TEXT},
    {"device", "platform_version", TEXT},
    {"device", "model_name", TEXT},
    {"device", "serial", TEXT},
    {"device", "telephony", SWITCH},

    {"settings", "device_name", TEXT},
    {"settings", "language", TEXT},
    {"settings", "sales_code", TEXT},
    {"settings", "font_size", oneOf(FONT_SIZES, 5, std::numeric_limits<int>::max())},
    {"settings", "flight_mode", SWITCH},
    {"settings", "data_roaming", SWITCH},
    {"settings", "mobile_data", SWITCH},
    {"settings", "packet_data", SWITCH},
    {"settings", "utc_offset", whole(-86399, 86399)}, // seconds east of UTC

    {"slot", "sim", oneOf(CARDS)},
    {"slot", "init_status", oneOf(CARD_STATUSES)},
    {"slot", "card_changed", SWITCH},
    {"slot", "mcc", digits(3, 3)},
    {"slot", "mnc", digits(2, 3)},
    {"slot", "msin", digits(1, 10)},
    {"slot", "number", NUMBER},
    {"slot", "imei", digits(14, 16)},
    {"slot", "service", oneOf(SERVICES)},
    {"slot", "roaming", SWITCH},
    {"slot", "sms", SWITCH},
    {"slot", "cp_name", SOME_TEXT},
    {"slot", "denied", SWITCH},

    {"subscriptions", "network", oneOf(UNKNOWN_SLOT, 0, 1)},
    {"subscriptions", "data", oneOf(UNKNOWN_SLOT, 0, 1)},
    {"subscriptions", "voice", oneOf(VOICES)},

    {"network", "cellular", oneOf(CELLULAR_STATES)},
    {"network", "wifi", oneOf(LINK_STATES)},
    {"network", "wifi_connection", oneOf(WIFI_CONNECTIONS)},
    {"network", "bluetooth", oneOf(LINK_STATES)},

    {"storage", "block_size", whole(0, ANY)},
    {"storage", "fragment_size", whole(0, ANY)},
    {"storage", "blocks", whole(0, ANY)},
    {"storage", "available_blocks", whole(0, ANY)},

    {"packages", "", TEXT},
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

} // namespace port::simulator
