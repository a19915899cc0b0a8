// SPDX-License-Identifier: Apache-2.0
// ModemManager: a modem for each slot.
#include <ModemManager/ModemManager.h>

#include "../../devicefile/Card.h"
#include "Service.h"

namespace port::played {
namespace {

using devicefile::Edit;

constexpr char ERROR[] = "org.freedesktop.ModemManager1.Error.";
constexpr char FIRMWARE[] = MM_DBUS_INTERFACE_MODEM_FIRMWARE;
constexpr int PUK_RETRIES = 10; // of a card that nobody tried yet (3GPP TS 31.101)

bool hasCard(const SlotFacts& slot)
{
    return slot.card && devicefile::isCardThere(*slot.card);
}

// ModemManager's view of each status in which a card cannot be used.
struct CardRow {
    CardStatus card;
    MMModemState state;
    MMModemLock lock;
    MMModemStateFailedReason reason;
};
constexpr CardRow CARDS[] = {
    {CardStatus::Absent, MM_MODEM_STATE_FAILED, MM_MODEM_LOCK_UNKNOWN,
     MM_MODEM_STATE_FAILED_REASON_SIM_MISSING},
    {CardStatus::Removed, MM_MODEM_STATE_FAILED, MM_MODEM_LOCK_UNKNOWN,
     MM_MODEM_STATE_FAILED_REASON_SIM_MISSING},
    {CardStatus::Error, MM_MODEM_STATE_FAILED, MM_MODEM_LOCK_UNKNOWN,
     MM_MODEM_STATE_FAILED_REASON_SIM_ERROR},
    {CardStatus::Crashed, MM_MODEM_STATE_FAILED, MM_MODEM_LOCK_UNKNOWN,
     MM_MODEM_STATE_FAILED_REASON_SIM_ERROR},
    {CardStatus::Initializing, MM_MODEM_STATE_INITIALIZING, MM_MODEM_LOCK_UNKNOWN,
     MM_MODEM_STATE_FAILED_REASON_NONE},
    {CardStatus::PinRequired, MM_MODEM_STATE_LOCKED, MM_MODEM_LOCK_SIM_PIN,
     MM_MODEM_STATE_FAILED_REASON_NONE},
    {CardStatus::PukRequired, MM_MODEM_STATE_LOCKED, MM_MODEM_LOCK_SIM_PUK,
     MM_MODEM_STATE_FAILED_REASON_NONE},
    {CardStatus::Blocked, MM_MODEM_STATE_LOCKED, MM_MODEM_LOCK_SIM_PUK,
     MM_MODEM_STATE_FAILED_REASON_NONE},
    {CardStatus::NetworkLocked, MM_MODEM_STATE_LOCKED, MM_MODEM_LOCK_PH_NET_PIN,
     MM_MODEM_STATE_FAILED_REASON_NONE},
    {CardStatus::SubsetLocked, MM_MODEM_STATE_LOCKED, MM_MODEM_LOCK_PH_NETSUB_PIN,
     MM_MODEM_STATE_FAILED_REASON_NONE},
    {CardStatus::ProviderLocked, MM_MODEM_STATE_LOCKED, MM_MODEM_LOCK_PH_SP_PIN,
     MM_MODEM_STATE_FAILED_REASON_NONE},
    {CardStatus::CorporateLocked, MM_MODEM_STATE_LOCKED, MM_MODEM_LOCK_PH_CORP_PIN,
     MM_MODEM_STATE_FAILED_REASON_NONE},
    {CardStatus::DeviceLocked, MM_MODEM_STATE_LOCKED, MM_MODEM_LOCK_PH_SIM_PIN,
     MM_MODEM_STATE_FAILED_REASON_NONE},
    {CardStatus::PoweredOff, MM_MODEM_STATE_DISABLED, MM_MODEM_LOCK_UNKNOWN,
     MM_MODEM_STATE_FAILED_REASON_NONE},
};

MMModemState stateOfReady(const Facts& facts, std::size_t index)
{
    const SlotFacts& slot = facts.slots[index];
    if (facts.connectedSlot() == index)
        return MM_MODEM_STATE_CONNECTED;
    if (slot.service == ServiceState::InService)
        return MM_MODEM_STATE_REGISTERED;
    if (!slot.isEnabled || !facts.isCellularOn())
        return MM_MODEM_STATE_DISABLED;
    return slot.service == ServiceState::OutOfService ? MM_MODEM_STATE_SEARCHING
                                                      : MM_MODEM_STATE_ENABLED;
}

CardRow rowOf(const Facts& facts, std::size_t index)
{
    const SlotFacts& slot = facts.slots[index];
    if (slot.isReady())
        return {CardStatus::Ready, stateOfReady(facts, index), MM_MODEM_LOCK_NONE,
                MM_MODEM_STATE_FAILED_REASON_NONE};
    for (const CardRow& row : CARDS)
        if (slot.card == row.card)
            return row;
    return {CardStatus::Unknown, MM_MODEM_STATE_UNKNOWN, MM_MODEM_LOCK_UNKNOWN,
            MM_MODEM_STATE_FAILED_REASON_NONE};
}

MMModem3gppRegistrationState registrationOf(const SlotFacts& slot, MMModemState state)
{
    if (slot.service == ServiceState::InService)
        return slot.isRoaming ? MM_MODEM_3GPP_REGISTRATION_STATE_ROAMING
                              : MM_MODEM_3GPP_REGISTRATION_STATE_HOME;
    if (slot.service == ServiceState::EmergencyOnly)
        return MM_MODEM_3GPP_REGISTRATION_STATE_EMERGENCY_ONLY;
    if (slot.service && state == MM_MODEM_STATE_SEARCHING)
        return MM_MODEM_3GPP_REGISTRATION_STATE_SEARCHING;
    const bool isOff = state == MM_MODEM_STATE_LOCKED || state == MM_MODEM_STATE_DISABLED;
    return slot.service && !isOff ? MM_MODEM_3GPP_REGISTRATION_STATE_IDLE
                                  : MM_MODEM_3GPP_REGISTRATION_STATE_UNKNOWN;
}

MMModemPowerState powerOf(const Facts& facts, const SlotFacts& slot)
{
    if (slot.card == CardStatus::PoweredOff || slot.power == PowerState::Off)
        return MM_MODEM_POWER_STATE_OFF;
    if (slot.power)
        return slot.power == PowerState::On ? MM_MODEM_POWER_STATE_ON : MM_MODEM_POWER_STATE_LOW;
    return facts.isCellularOn() ? MM_MODEM_POWER_STATE_ON : MM_MODEM_POWER_STATE_LOW;
}

Variant retriesOf(const SlotFacts& slot)
{
    if (!hasCard(slot))
        return interfaceOf(MM_DBUS_INTERFACE_MODEM).defaults.at(MM_MODEM_PROPERTY_UNLOCKRETRIES);
    const bool isPukGone = slot.card == CardStatus::Blocked;
    const int pin = devicefile::pinTriesOf(*slot.card, slot.pinRetries);
    const int puk = isPukGone ? 0 : slot.pukRetries.value_or(PUK_RETRIES);
    return share(g_variant_ref_sink(g_variant_new_parsed(
        "@a{uu} {%u: %u, %u: %u}", MM_MODEM_LOCK_SIM_PIN, pin, MM_MODEM_LOCK_SIM_PUK, puk)));
}

std::string identifierOf(const std::string& text)
{
    const Owned<char> hash(g_compute_checksum_for_string(G_CHECKSUM_SHA1, text.c_str(), -1));
    return hash.get();
}

// One modem of a scene.
class Modem {
public:
    Modem(const Scene& scene, std::size_t index)
        : facts_(scene.facts), slot_(scene.facts.slots[index]), row_(rowOf(scene.facts, index)),
          number_(scene.modems.numberOf(slot_)), port_(std::to_string(index))
    {
    }

    void show(World& world) const
    {
        Object modem{numbered(MM_DBUS_MODEM_PREFIX, number_), {this->modem()}, true};
        const bool hasFailed = row_.state == MM_MODEM_STATE_FAILED;
        // A modem without a card knows of a network only what the file says.
        if (!hasFailed || (slot_.service && slot_.service != ServiceState::OutOfService))
            modem.faces.push_back(network());
        if (!hasFailed)
            addAbilities(modem);
        modem.faces.push_back(voice());
        modem.faces.push_back(face(FIRMWARE));
        world.push_back(modem);
        if (hasCard(slot_))
            world.push_back({numbered(MM_DBUS_SIM_PREFIX, number_), {card()}, false});
        if (isConnected())
            world.push_back({numbered(MM_DBUS_BEARER_PREFIX, number_), {bearer()}, false});
    }

private:
    bool isConnected() const
    {
        return row_.state == MM_MODEM_STATE_CONNECTED;
    }
    bool isRegistered() const
    {
        return row_.state >= MM_MODEM_STATE_REGISTERED;
    }
    std::string port(const char* prefix) const
    {
        return prefix + port_;
    }

    Face modem() const
    {
        using Paths = std::vector<std::string>;
        const std::string bearer = numbered(MM_DBUS_BEARER_PREFIX, number_);
        return face(
            MM_DBUS_INTERFACE_MODEM,
            {{MM_MODEM_PROPERTY_SIM,
              pathOf(hasCard(slot_) ? numbered(MM_DBUS_SIM_PREFIX, number_) : std::string("/"))},
             {MM_MODEM_PROPERTY_BEARERS, texts(isConnected() ? Paths{bearer} : Paths(), "ao")},
             {MM_MODEM_PROPERTY_MODEL, textOf(facts_.modelName)},
             {MM_MODEM_PROPERTY_DEVICEIDENTIFIER, textOf(identifierOf(slot_.name))},
             {MM_MODEM_PROPERTY_DEVICE, textOf(slot_.name)},
             {MM_MODEM_PROPERTY_PRIMARYPORT, textOf(port("cdc-wdm"))},
             {MM_MODEM_PROPERTY_PORTS,
              share(g_variant_ref_sink(g_variant_new_parsed(
                  "[(%s, %u), (%s, %u)]", port("cdc-wdm").c_str(), MM_MODEM_PORT_TYPE_MBIM,
                  port("wwan").c_str(), MM_MODEM_PORT_TYPE_NET)))},
             {MM_MODEM_PROPERTY_EQUIPMENTIDENTIFIER, textOf(slot_.imei)},
             {MM_MODEM_PROPERTY_UNLOCKREQUIRED, value("u", row_.lock)},
             {MM_MODEM_PROPERTY_UNLOCKRETRIES, retriesOf(slot_)},
             {MM_MODEM_PROPERTY_STATE, value("i", row_.state)},
             {MM_MODEM_PROPERTY_STATEFAILEDREASON, value("u", row_.reason)},
             {MM_MODEM_PROPERTY_OWNNUMBERS,
              texts(slot_.isReady() && !slot_.number.empty() ? Paths{slot_.number} : Paths())},
             {MM_MODEM_PROPERTY_ACCESSTECHNOLOGIES, value("u", technologies())},
             {MM_MODEM_PROPERTY_SIGNALQUALITY,
              value("(ub)", isRegistered() ? slot_.signal.value_or(0) : 0,
                    isRegistered() && slot_.signal)},
             {MM_MODEM_PROPERTY_POWERSTATE, value("u", powerOf(facts_, slot_))}});
    }

    guint32 technologies() const
    {
        return isRegistered() && slot_.accessTechnology
                   ? 1U << static_cast<unsigned>(*slot_.accessTechnology)
                   : static_cast<guint32>(MM_MODEM_ACCESS_TECHNOLOGY_UNKNOWN);
    }

    Face network() const
    {
        MMModem3gppPacketServiceState packets = MM_MODEM_3GPP_PACKET_SERVICE_STATE_UNKNOWN;
        if (isRegistered())
            packets = facts_.cellular == CellularState::CallOnlyAvailable
                          ? MM_MODEM_3GPP_PACKET_SERVICE_STATE_DETACHED
                          : MM_MODEM_3GPP_PACKET_SERVICE_STATE_ATTACHED;
        return face(MM_DBUS_INTERFACE_MODEM_MODEM3GPP,
                    {{MM_MODEM_MODEM3GPP_PROPERTY_IMEI, textOf(slot_.isReady() ? slot_.imei : "")},
                     {MM_MODEM_MODEM3GPP_PROPERTY_REGISTRATIONSTATE,
                      value("u", registrationOf(slot_, row_.state))},
                     {MM_MODEM_MODEM3GPP_PROPERTY_OPERATORCODE,
                      textOf(isRegistered() ? slot_.operatorCode() : "")},
                     {MM_MODEM_MODEM3GPP_PROPERTY_OPERATORNAME,
                      textOf(isRegistered() ? slot_.operatorName : "")},
                     {MM_MODEM_MODEM3GPP_PROPERTY_ENABLEDFACILITYLOCKS,
                      value("u", row_.lock == MM_MODEM_LOCK_SIM_PIN ? MM_MODEM_3GPP_FACILITY_SIM
                                                                    : MM_MODEM_3GPP_FACILITY_NONE)},
                     {MM_MODEM_MODEM3GPP_PROPERTY_PACKETSERVICESTATE, value("u", packets)}});
    }

    void addAbilities(Object& modem) const
    {
        modem.faces.push_back(face(MM_DBUS_INTERFACE_MODEM_SIMPLE));
        if (slot_.hasMessages)
            modem.faces.push_back(face(MM_DBUS_INTERFACE_MODEM_MESSAGING));
        if (!slot_.isReady())
            return;
        for (const char* const interface :
             {MM_DBUS_INTERFACE_MODEM_MODEM3GPP_PROFILEMANAGER,
              MM_DBUS_INTERFACE_MODEM_MODEM3GPP_USSD, MM_DBUS_INTERFACE_MODEM_LOCATION,
              MM_DBUS_INTERFACE_MODEM_TIME, MM_DBUS_INTERFACE_MODEM_SIGNAL})
            modem.faces.push_back(face(interface));
    }

    Face voice() const
    {
        return face(MM_DBUS_INTERFACE_MODEM_VOICE,
                    {{MM_MODEM_VOICE_PROPERTY_EMERGENCYONLY,
                      value("b", !isRegistered() && slot_.service != ServiceState::InService)}});
    }

    Face card() const
    {
        const bool isReady = slot_.isReady();
        const bool isWhole = isReady && !slot_.mcc.empty() && !slot_.mnc.empty();
        return face(
            MM_DBUS_INTERFACE_SIM,
            {{MM_SIM_PROPERTY_ACTIVE, value("b", TRUE)},
             {MM_SIM_PROPERTY_SIMTYPE, value("u", MM_SIM_TYPE_PHYSICAL)},
             {MM_SIM_PROPERTY_SIMIDENTIFIER, textOf(slot_.iccid)},
             {MM_SIM_PROPERTY_IMSI,
              textOf(isWhole && !slot_.msin.empty() ? slot_.mcc + slot_.mnc + slot_.msin : "")},
             {MM_SIM_PROPERTY_OPERATORIDENTIFIER, textOf(isWhole ? slot_.mcc + slot_.mnc : "")}});
    }

    Face bearer() const
    {
        return face(MM_DBUS_INTERFACE_BEARER,
                    {{MM_BEARER_PROPERTY_INTERFACE, textOf(port("wwan"))},
                     {MM_BEARER_PROPERTY_CONNECTED, value("b", TRUE)},
                     {MM_BEARER_PROPERTY_BEARERTYPE, value("u", MM_BEARER_TYPE_DEFAULT)}});
    }

    const Facts& facts_;
    const SlotFacts& slot_;
    CardRow row_;
    const int number_;
    const std::string port_; // stays the kernel's when the modem comes anew
};

World modemWorld(const Scene& scene)
{
    World world;
    for (std::size_t i = 0; i < scene.facts.slots.size(); ++i)
        Modem(scene, i).show(world);
    world.push_back({MM_DBUS_PATH,
                     {face(MM_DBUS_INTERFACE,
                           {{"Version", textOf(versionText(MM_MAJOR_VERSION, MM_MINOR_VERSION,
                                                           MM_MICRO_VERSION))}})},
                     false});
    return world;
}

Outcome wrongState(const std::string& text)
{
    return Outcome::refuse(std::string(ERROR) + "Core.WrongState", text);
}

std::size_t slotAt(const Request& request)
{
    const int number = std::stoi(request.path.substr(request.path.rfind('/') + 1));
    const auto& slots = request.scene.facts.slots;
    std::size_t i = 0;
    while (request.scene.modems.numberOf(slots[i]) != number)
        ++i;
    return i;
}

const SlotFacts& slotOf(const Request& request)
{
    return request.scene.facts.slots[slotAt(request)];
}

// Whether another slot has service.
bool isServedElsewhere(const Facts& facts, std::size_t index)
{
    for (std::size_t i = 0; i < facts.slots.size(); ++i)
        if (i != index && facts.slots[i].service == ServiceState::InService)
            return true;
    return false;
}

Outcome enable(const Request& request)
{
    gboolean on = FALSE;
    g_variant_get(request.arguments, "(b)", &on);
    const Facts& facts = request.scene.facts;
    const std::size_t index = slotAt(request);
    const CardRow row = rowOf(facts, index);
    const std::string verb = on != FALSE ? "enable" : "disable";
    if (row.state == MM_MODEM_STATE_FAILED)
        return wrongState("modem in failed state");
    if (row.state == MM_MODEM_STATE_LOCKED && on == FALSE)
        return {};
    if (!facts.slots[index].isReady() || (on != FALSE && !facts.isCellularOn()))
        return wrongState("Cannot " + verb + " modem: device " +
                          (row.state == MM_MODEM_STATE_LOCKED ? "locked" : "not ready"));
    if ((row.state > MM_MODEM_STATE_DISABLED) == (on != FALSE))
        return {};
    std::vector<Edit> changes = {
        set(slotKey(index, "service"), on != FALSE ? "in_service" : "out_of_service"),
        on != FALSE ? unset(slotKey(index, "enabled")) : set(slotKey(index, "enabled"), "false")};
    if (facts.isCellularOn() && !isServedElsewhere(facts, index))
        changes.push_back(set("network.cellular", on != FALSE ? "available" : "out_of_service"));
    return Outcome::change(std::move(changes));
}

Outcome setPower(const Request& request)
{
    guint32 state = 0;
    g_variant_get(request.arguments, "(u)", &state);
    const bool isOff = slotOf(request).card == CardStatus::PoweredOff;
    std::vector<Edit> changes = {unset(slotKey(slotAt(request), "power"))};
    if (isOff)
        changes.push_back(set(slotKey(slotAt(request), "sim"), "available"));
    if (state == MM_MODEM_POWER_STATE_ON)
        return isOff || slotOf(request).power ? Outcome::change(std::move(changes)) : Outcome();
    return Outcome::refuse(std::string(ERROR) + "Core.Unsupported",
                           "Requested power transition is not supported by this modem");
}

Outcome listBearers(const Request& request)
{
    GVariant* const bearers = request.value(MM_MODEM_PROPERTY_BEARERS);
    return Outcome::answer(g_variant_new("(@ao)", bearers));
}

// The card is told of in one way: the newer word takes the place of the older interface's.
std::vector<Edit> cardBecomes(std::size_t slot, const char* card)
{
    return {set(slotKey(slot, "sim"), card), unset(slotKey(slot, "init_status"))};
}

// One wrong code: `retries` goes down, and at its end the card is in another state.
Outcome countDown(std::size_t slot, const char* key, int retries, const char* atEnd)
{
    std::vector<Edit> changes = {set(slotKey(slot, key), std::to_string(retries - 1).c_str())};
    if (retries <= 1)
        changes = cardBecomes(slot, atEnd);
    Outcome outcome = Outcome::refuse(std::string(ERROR) + "MobileEquipment.IncorrectPassword",
                                      "Incorrect password");
    outcome.changes = std::move(changes);
    return outcome;
}

Outcome unlock(std::size_t slot, std::vector<Edit> more)
{
    std::vector<Edit> changes = cardBecomes(slot, "available");
    changes.push_back(unset(slotKey(slot, "pin_retries")));
    changes.insert(changes.end(), more.begin(), more.end());
    return Outcome::change(std::move(changes));
}

Outcome sendPin(const Request& request)
{
    const char* pin = nullptr;
    g_variant_get(request.arguments, "(&s)", &pin);
    const SlotFacts& slot = slotOf(request);
    if (slot.card != CardStatus::PinRequired)
        return wrongState("Cannot send PIN: device is not SIM-PIN locked");
    if (!slot.pin.empty() && slot.pin != pin)
        return countDown(slotAt(request), "pin_retries",
                         slot.pinRetries.value_or(devicefile::PIN_TRIES), "puk");
    return unlock(slotAt(request), {});
}

bool isPin(const std::string& text)
{
    return text.size() >= 4 && text.size() <= 8 &&
           text.find_first_not_of("0123456789") == std::string::npos;
}

Outcome sendPuk(const Request& request)
{
    const char* puk = nullptr;
    const char* pin = nullptr;
    g_variant_get(request.arguments, "(&s&s)", &puk, &pin);
    const SlotFacts& slot = slotOf(request);
    if (slot.card != CardStatus::PukRequired)
        return wrongState("Cannot send PUK: device is not SIM-PUK locked");
    if (!isPin(pin) || (!slot.puk.empty() && slot.puk != puk))
        return countDown(slotAt(request), "puk_retries", slot.pukRetries.value_or(PUK_RETRIES),
                         "blocked");
    return unlock(slotAt(request), {set(slotKey(slotAt(request), "pin"), pin),
                                    unset(slotKey(slotAt(request), "puk_retries"))});
}

Outcome status(const Request& request)
{
    return Outcome::answer(g_variant_new_parsed(
        "({'state': <%u>},)",
        static_cast<guint32>(rowOf(request.scene.facts, slotAt(request)).state)));
}

template <const char* const& TEXT>
Outcome constant(const Request&)
{
    return Outcome::answer(g_variant_new_parsed(TEXT));
}

const char* const NO_PATHS = "(@ao [],)";
const char* const NO_LOCATION = "(@a{uv} {},)";
const char* const NO_PROFILES = "(@aa{sv} [],)";
const char* const NO_FIRMWARE = "('', @aa{sv} [])";

Outcome refuseAsUnsupported(const Request& request)
{
    return Outcome::refuse(std::string(ERROR) + "Core.Unsupported",
                           "Operation not supported: " + request.member);
}

GVariant* modemStateTale(GVariant* before, GVariant* after)
{
    return g_variant_new("(iiu)", g_variant_get_int32(before), g_variant_get_int32(after),
                         MM_MODEM_STATE_CHANGE_REASON_UNKNOWN);
}

bool hasTelephony(const Facts& facts)
{
    return facts.hasTelephony;
}

} // namespace

const Role& modemManager()
{
    static const Role service = {
        "ModemManager",
        MM_DBUS_SERVICE,
        MM_DBUS_PATH,
        modemWorld,
        hasTelephony,
        {
            {MM_DBUS_INTERFACE, "ScanDevices", nothing},
            {MM_DBUS_INTERFACE, "SetLogging", nothing},
            {MM_DBUS_INTERFACE_MODEM, "Enable", enable},
            {MM_DBUS_INTERFACE_MODEM, "SetPowerState", setPower},
            {MM_DBUS_INTERFACE_MODEM, "ListBearers", listBearers},
            {MM_DBUS_INTERFACE_MODEM_SIMPLE, "GetStatus", status},
            {MM_DBUS_INTERFACE_MODEM_MESSAGING, "List", constant<NO_PATHS>},
            {MM_DBUS_INTERFACE_MODEM_VOICE, "ListCalls", constant<NO_PATHS>},
            {MM_DBUS_INTERFACE_MODEM_LOCATION, "GetLocation", constant<NO_LOCATION>},
            {MM_DBUS_INTERFACE_MODEM_MODEM3GPP_PROFILEMANAGER, "List", constant<NO_PROFILES>},
            {FIRMWARE, "List", constant<NO_FIRMWARE>},
            {MM_DBUS_INTERFACE_SIM, "SendPin", sendPin},
            {MM_DBUS_INTERFACE_SIM, "SendPuk", sendPuk},
        },
        {},
        {{MM_DBUS_INTERFACE_MODEM, MM_MODEM_PROPERTY_STATE, "StateChanged", false, modemStateTale}},
        {},
        refuseAsUnsupported,
        true,
    };
    return service;
}

} // namespace port::played
