// SPDX-License-Identifier: Apache-2.0
#include "Telephony.h"

#include <algorithm>
#include <set>

#include "ModemManager.h"
#include "NetworkManager.h"

namespace port::linux_backend {

// One of a modem's SIM slots.
class Slot {
public:
    Slot(SlotName name, Modem modem, std::size_t index)
        : name_(std::move(name)), modem_(std::move(modem)), index_(index)
    {
    }

    const SlotName& name() const
    {
        return name_;
    }
    const Modem& modem() const
    {
        return modem_;
    }
    bool isActive() const
    {
        return modem_.activeSim() == index_;
    }
    const std::string& sim() const
    {
        return modem_.sims()[index_];
    }

private:
    SlotName name_;
    Modem modem_;
    std::size_t index_;
};

namespace {

// The status of a card, and the error for whoever wants to read it.
struct Finding {
    CardStatus status;
    const char* reason;
};

constexpr Finding READY = {CardStatus::Ready, "the SIM card is ready"};
constexpr Finding ABSENT = {CardStatus::Absent, "there is no SIM card"};
constexpr Finding NO_PROFILE = {CardStatus::Absent, "the eSIM holds no profile"};
constexpr Finding UNUSABLE = {CardStatus::Error, "the SIM card cannot be used"};
constexpr Finding MODEM_FAILED = {CardStatus::Unknown, "the modem failed"};
constexpr Finding UNKNOWN = {CardStatus::Unknown, "the modem's state is not known"};
constexpr Finding NOT_READY = {CardStatus::Initializing, "the SIM card is not ready yet"};
constexpr Finding POWERED_OFF = {CardStatus::PoweredOff, "the modem is switched off"};
constexpr Finding PIN_REQUIRED = {CardStatus::PinRequired,
                                  "the SIM card is locked: it wants a PIN"};
constexpr Finding PUK_REQUIRED = {CardStatus::PukRequired,
                                  "the SIM card is locked: it wants a PUK"};
constexpr Finding BLOCKED = {CardStatus::Blocked, "the SIM card is locked for good"};
constexpr Finding NETWORK_LOCKED = {CardStatus::NetworkLocked, "the modem is locked to a network"};
constexpr Finding NOT_IN_USE = {CardStatus::Unknown, "the modem uses another of its SIM slots"};

Finding findingOfFailure(std::uint32_t reason)
{
    switch (reason) {
    case MM_MODEM_STATE_FAILED_REASON_SIM_MISSING:
        return ABSENT;
    case MM_MODEM_STATE_FAILED_REASON_SIM_ERROR:
        return UNUSABLE;
    case MM_MODEM_STATE_FAILED_REASON_ESIM_WITHOUT_PROFILES:
        return NO_PROFILE;
    default:
        return MODEM_FAILED;
    }
}

Finding findingOfPuk(const Modem& modem)
{
    const Result<std::uint32_t> retries = modem.retriesLeft(MM_MODEM_LOCK_SIM_PUK);
    return retries && retries.value() == 0 ? BLOCKED : PUK_REQUIRED;
}

Finding findingOfLock(const Slot& slot, std::uint32_t lock, bool isLocked)
{
    if (lock == MM_MODEM_LOCK_SIM_PIN)
        return PIN_REQUIRED;
    if (lock == MM_MODEM_LOCK_SIM_PUK)
        return findingOfPuk(slot.modem());
    if (lock > MM_MODEM_LOCK_PH_NETSUB_PUK)
        return UNKNOWN;
    if (lock >= MM_MODEM_LOCK_PH_SP_PIN)
        return NETWORK_LOCKED;
    // None, or a second PIN, which guards only some of the card's files: on its way out of a lock.
    if (isLocked)
        return NOT_READY;
    return slot.sim().empty() ? ABSENT : READY;
}

Result<Finding> findingOfState(const Slot& slot, std::int32_t state)
{
    if (state == MM_MODEM_STATE_FAILED) {
        const Result<std::uint32_t> reason = slot.modem().failedReason();
        return reason ? Result<Finding>(findingOfFailure(reason.value())) : reason.error();
    }
    const Result<std::uint32_t> power = slot.modem().powerState();
    if (power && power.value() == MM_MODEM_POWER_STATE_OFF)
        return POWERED_OFF;
    if (state == MM_MODEM_STATE_INITIALIZING)
        return NOT_READY;
    if (state < MM_MODEM_STATE_LOCKED || state > MM_MODEM_STATE_CONNECTED)
        return UNKNOWN;
    const Result<std::uint32_t> lock = slot.modem().lock();
    if (!lock)
        return lock.error();
    return findingOfLock(slot, lock.value(), state == MM_MODEM_STATE_LOCKED);
}

Finding findingOutOfUse(const Slot& slot)
{
    return slot.sim().empty() ? ABSENT : NOT_IN_USE;
}

Result<Finding> findingOf(const Slot& slot)
{
    if (!slot.isActive())
        return findingOutOfUse(slot);
    const Result<std::int32_t> state = slot.modem().state();
    return state ? findingOfState(slot, state.value()) : state.error();
}

// Why the slot has no card that can be read; nothing when it has one.
std::optional<Error> obstacleOf(const Slot& slot)
{
    const Result<Finding> finding = findingOf(slot);
    if (!finding)
        return finding.error();
    if (finding.value().status != CardStatus::Ready)
        return noSim(finding.value().reason);
    return std::nullopt;
}

Result<Card> cardOf(const Slot& slot)
{
    const Result<Finding> finding = findingOf(slot);
    if (!finding)
        return finding.error();
    Card card;
    card.status = finding.value().status;
    return card;
}

bool isDigits(const std::string& text, std::size_t least, std::size_t most)
{
    return text.size() >= least && text.size() <= most &&
           text.find_first_not_of("0123456789") == std::string::npos;
}

// The length of the operator's identifier is what tells how long the MNC is.
Result<Imsi> imsiIn(const Properties& sim)
{
    const Result<std::string> network = sim.text(MM_SIM_PROPERTY_OPERATORIDENTIFIER);
    const Result<std::string> whole = sim.text(MM_SIM_PROPERTY_IMSI);
    if (!network || !whole)
        return network ? whole.error() : network.error();
    const std::string& code = network.value();
    if (!isDigits(code, 5, 6))
        return notAvailable("OperatorIdentifier is no MCC and MNC");
    const std::string& imsi = whole.value();
    const std::string msin = imsi.size() > code.size() ? imsi.substr(code.size()) : "";
    if (imsi.compare(0, code.size(), code) != 0 || !isDigits(msin, 1, 10))
        return notAvailable("Imsi does not fit OperatorIdentifier");
    return Imsi{code.substr(0, 3), code.substr(3), msin};
}

bool isDialable(const std::string& number)
{
    return !number.empty() && number.size() <= 80 &&
           number.find_first_not_of("+0123456789*#") == std::string::npos;
}

Result<std::optional<std::string>> numberOf(const Slot& slot)
{
    if (const auto obstacle = obstacleOf(slot))
        return *obstacle;
    const Result<std::vector<std::string>> numbers = slot.modem().ownNumbers();
    if (!numbers)
        return numbers.error();
    const auto first = std::find_if(numbers.value().begin(), numbers.value().end(), isDialable);
    return first == numbers.value().end() ? std::nullopt : std::optional<std::string>(*first);
}

// Also without its check digit, or with the version of the software (3GPP TS 23.003, 6.2).
Result<std::string> imeiOf(const Slot& slot)
{
    const Result<std::string> identifier = slot.modem().equipmentIdentifier();
    if (identifier && !isDigits(identifier.value(), 14, 16))
        return notAvailable("EquipmentIdentifier is no IMEI");
    return identifier;
}

// A modem in such a state says nothing of its registration, or that it does not know it.
bool isOffTheNetwork(const Modem& modem)
{
    const Result<std::int32_t> state = modem.state();
    return state &&
           (state.value() == MM_MODEM_STATE_FAILED || state.value() == MM_MODEM_STATE_LOCKED ||
            state.value() == MM_MODEM_STATE_DISABLED);
}

Result<Registration> registrationOf(const Slot& slot)
{
    if (!slot.isActive())
        return noSim(findingOutOfUse(slot).reason);
    const Result<std::uint32_t> state = slot.modem().registration();
    const auto known = state ? findRegistration(state.value()) : std::nullopt;
    if (known)
        return *known;
    if (isOffTheNetwork(slot.modem()))
        return *findRegistration(MM_MODEM_3GPP_REGISTRATION_STATE_IDLE);
    return state ? notAvailable("the modem's registration is not known") : state.error();
}

Result<ServiceState> serviceOf(const Slot& slot)
{
    const Result<Registration> registration = registrationOf(slot);
    return registration ? Result<ServiceState>(registration.value().service) : registration.error();
}

Result<bool> isRoaming(const Slot& slot)
{
    const Result<Registration> registration = registrationOf(slot);
    return registration ? Result<bool>(registration.value().roaming) : registration.error();
}

// Messages may be available once the modem is registered, and not before.
Result<bool> isSmsReady(const Slot& slot)
{
    const Result<std::int32_t> state = slot.modem().state();
    if (!state)
        return state.error();
    return slot.isActive() && state.value() >= MM_MODEM_STATE_REGISTERED &&
           slot.modem().hasMessaging();
}

// Why there is no card to be asked, readable or not; nothing when there is one.
std::optional<Error> absenceOf(const Slot& slot)
{
    if (slot.isActive() && !slot.sim().empty())
        return std::nullopt;
    return noSim(findingOutOfUse(slot).reason);
}

ModemReport::Use useOf(const Slot& slot)
{
    const Result<std::int32_t> state = slot.modem().state();
    if (!state || !slot.isActive() || state.value() < MM_MODEM_STATE_REGISTERED)
        return ModemReport::Use::None;
    return state.value() == MM_MODEM_STATE_CONNECTED ? ModemReport::Use::Data
                                                     : ModemReport::Use::Service;
}

Result<std::string> mccOf(const Modem& modem)
{
    const Result<std::string> code = modem.operatorCode();
    if (code && !isDigits(code.value(), 5, 6))
        return notAvailable("OperatorCode is no MCC and MNC");
    return code ? code.value().substr(0, 3) : code;
}

Result<std::string> mncOf(const Modem& modem)
{
    const Result<std::string> mcc = mccOf(modem);
    return mcc ? modem.operatorCode().value().substr(3) : mcc;
}

static_assert(MM_MODEM_ACCESS_TECHNOLOGY_POTS ==
                      1U << static_cast<unsigned>(AccessTechnology::Pots) &&
                  MM_MODEM_ACCESS_TECHNOLOGY_5GNR ==
                      1U << static_cast<unsigned>(AccessTechnology::FiveGNr) &&
                  MM_MODEM_ACCESS_TECHNOLOGY_LTE_NB_IOT ==
                      1U << static_cast<unsigned>(AccessTechnology::LteNbIot),
              "access technologies are numbered as ModemManager's bits are");

// Takes the newest of several: 5G that leans on LTE is 5G.
Result<AccessTechnology> technologyOf(const Modem& modem)
{
    const Result<std::uint32_t> all = modem.accessTechnologies();
    if (!all)
        return all.error();
    if (all.value() == MM_MODEM_ACCESS_TECHNOLOGY_ANY)
        return notAvailable("the access technology is not known");
    if ((all.value() & MM_MODEM_ACCESS_TECHNOLOGY_5GNR) != 0)
        return AccessTechnology::FiveGNr;
    for (auto bit = static_cast<int>(AccessTechnology::LteNbIot); bit >= 0; --bit)
        if ((all.value() & (1U << static_cast<unsigned>(bit))) != 0)
            return static_cast<AccessTechnology>(bit);
    return notAvailable("the access technology is not known");
}

// A modem that has not measured says 0, and that this is not recent.
Result<int> signalOf(const Modem& modem)
{
    const auto signal = modem.signal();
    if (!signal)
        return signal.error();
    const auto [perCent, isRecent] = signal.value();
    if (perCent > 100 || (perCent == 0 && !isRecent))
        return notAvailable("the signal is not known");
    return static_cast<int>(perCent);
}

Result<PowerState> powerOf(const Modem& modem)
{
    const Result<std::uint32_t> power = modem.powerState();
    if (!power)
        return power.error();
    switch (power.value()) {
    case MM_MODEM_POWER_STATE_OFF:
        return PowerState::Off;
    case MM_MODEM_POWER_STATE_LOW:
        return PowerState::Low;
    case MM_MODEM_POWER_STATE_ON:
        return PowerState::On;
    default:
        return notAvailable("the modem's power state is not known");
    }
}

Result<int> pinTriesOf(const Slot& slot)
{
    if (const auto absence = absenceOf(slot))
        return *absence;
    const Result<std::uint32_t> tries = slot.modem().retriesLeft(MM_MODEM_LOCK_SIM_PIN);
    if (!tries)
        return tries.error();
    if (tries.value() > 10)
        return notAvailable("the tries left for the PIN are not known");
    return static_cast<int>(tries.value());
}

SlotName nameOf(const Modem& modem, std::size_t index, std::set<SlotName>& taken)
{
    SlotName name = modem.device();
    if (modem.sims().size() > 1)
        name += "#" + std::to_string(index + 1);
    while (!taken.insert(name).second) // two modems on one device
        name += "@" + modem.path();
    return name;
}

std::vector<Slot> slotsOf(const std::vector<Modem>& modems)
{
    std::vector<Slot> slots;
    std::set<SlotName> taken;
    for (const Modem& modem : modems)
        for (std::size_t i = 0; i < modem.sims().size(); ++i)
            slots.emplace_back(nameOf(modem, i, taken), modem, i);
    return slots;
}

Result<Slot> find(const Result<std::vector<Slot>>& slots, const SlotName& name)
{
    if (!slots)
        return slots.error();
    for (const Slot& slot : slots.value())
        if (slot.name() == name)
            return slot;
    return notAvailable(std::string(MODEM_MANAGER.name) + " knows no modem " + name);
}

std::string sourceOf(const SlotName& name)
{
    return std::string(MODEM_MANAGER.name) + " " + name;
}

template <typename T>
Result<Sourced<T>> sourced(const SlotName& name, const Result<T>& answer)
{
    if (!answer)
        return answer.error();
    return Sourced<T>{answer.value(), sourceOf(name)};
}

// Reads what a slot has only while its modem has a network.
template <typename T>
Result<Sourced<T>> ofNetwork(const Slot& slot, Result<T> (*read)(const Modem&))
{
    if (!slot.isActive())
        return noSim(findingOutOfUse(slot).reason);
    if (useOf(slot) == ModemReport::Use::None)
        return notAvailable("the modem is not registered with a network");
    return sourced(slot.name(), read(slot.modem()));
}

ModemReport reportOf(const Slot& slot)
{
    return {slot.name(),
            useOf(slot),
            ofNetwork<std::string>(slot, [](const Modem& modem) { return modem.operatorName(); }),
            ofNetwork(slot, mccOf),
            ofNetwork(slot, mncOf),
            ofNetwork(slot, technologyOf),
            ofNetwork(slot, signalOf),
            sourced(slot.name(), powerOf(slot.modem())),
            sourced(slot.name(), pinTriesOf(slot))};
}

Result<std::string> iccidIn(const Properties& sim)
{
    const Result<std::string> identifier = sim.text(MM_SIM_PROPERTY_SIMIDENTIFIER);
    if (identifier && !isDigits(identifier.value(), 18, 20))
        return notAvailable("SimIdentifier is no ICCID");
    return identifier;
}

// The SIM's object, which is among the others when it was asked for.
template <typename T>
Result<T> ofSim(const Objects& objects, const std::string& path,
                Result<T> (*read)(const Properties&))
{
    const auto found = objects->find(path);
    const auto sim = found != objects->end()
                         ? Object(path, found->second).properties(MM_DBUS_INTERFACE_SIM)
                         : notAvailable("the SIM card is gone");
    return sim ? read(sim.value()) : sim.error();
}

Result<std::vector<Slot>> slotsIn(const Result<Objects>& objects)
{
    const auto modems = modemsIn(objects);
    return modems ? Result<std::vector<Slot>>(slotsOf(modems.value())) : modems.error();
}

using Choice = std::function<std::vector<Deciding>(const Tree&)>;

Result<Slot> findIn(const Tree& tree, const SlotName& name)
{
    return find(slotsIn(std::make_shared<const Tree>(tree)), name);
}

// One property of a slot's modem.
Choice decidingOf(const SlotName& name, const char* interface, const char* property)
{
    return [=](const Tree& tree) -> std::vector<Deciding> {
        const auto slot = findIn(tree, name);
        if (!slot)
            return {};
        return {{slot.value().modem().path(), interface, property}};
    };
}

// All of a slot's SIM, unless something is in the way.
Choice decidingOfSim(const SlotName& name, std::optional<Error> (*obstacle)(const Slot&))
{
    return [=](const Tree& tree) -> std::vector<Deciding> {
        const auto slot = findIn(tree, name);
        if (!slot || obstacle(slot.value()))
            return {};
        return {{slot.value().sim(), MM_DBUS_INTERFACE_SIM, ""}};
    };
}

std::optional<int> slotOfModem(const std::vector<Slot>& slots, const std::string& modem)
{
    for (std::size_t i = 0; i < slots.size(); ++i)
        if (slots[i].modem().path() == modem && slots[i].isActive())
            return static_cast<int>(i);
    return std::nullopt;
}

} // namespace

template <typename T>
Result<Sourced<T>> LinuxTelephony::about(const SlotName& name, const char* interface,
                                         const char* property, Result<T> (*read)(const Slot&))
{
    const auto slots = slotsIn(bus_.look({MODEMS, decidingOf(name, interface, property)}));
    const Result<Slot> slot = find(slots, name);
    return slot ? sourced(name, read(slot.value())) : slot.error();
}

Result<Sourced<std::vector<SlotName>>> LinuxTelephony::slots()
{
    const auto slots = slotsIn(bus_.look(modems()));
    if (!slots)
        return slots.error();
    Sourced<std::vector<SlotName>> names{{}, MODEM_MANAGER.name};
    for (const Slot& slot : slots.value())
        names.value.push_back(slot.name());
    return names;
}

Result<Sourced<Card>> LinuxTelephony::card(const SlotName& name)
{
    return about(name, MM_DBUS_INTERFACE_MODEM, MM_MODEM_PROPERTY_STATE, cardOf);
}

template <typename T>
Result<Sourced<T>> LinuxTelephony::aboutSim(const SlotName& name,
                                            std::optional<Error> (*obstacle)(const Slot&),
                                            Result<T> (*read)(const Properties&))
{
    const auto objects = bus_.look({MODEMS, decidingOfSim(name, obstacle)});
    const Result<Slot> slot = find(slotsIn(objects), name);
    if (!slot)
        return slot.error();
    if (const auto error = obstacle(slot.value()))
        return *error;
    return sourced(name, ofSim(objects.value(), slot.value().sim(), read));
}

Result<Sourced<Imsi>> LinuxTelephony::imsi(const SlotName& name)
{
    return aboutSim(name, obstacleOf, imsiIn);
}

Result<Fact> LinuxTelephony::iccid(const SlotName& name)
{
    return aboutSim(name, absenceOf, iccidIn);
}

Result<Sourced<std::optional<std::string>>> LinuxTelephony::number(const SlotName& name)
{
    return about(name, MM_DBUS_INTERFACE_MODEM, MM_MODEM_PROPERTY_OWNNUMBERS, numberOf);
}

Result<Fact> LinuxTelephony::imei(const SlotName& name)
{
    return about(name, MM_DBUS_INTERFACE_MODEM, MM_MODEM_PROPERTY_EQUIPMENTIDENTIFIER, imeiOf);
}

Result<Sourced<ServiceState>> LinuxTelephony::service(const SlotName& name)
{
    return about(name, MM_DBUS_INTERFACE_MODEM, MM_MODEM_PROPERTY_STATE, serviceOf);
}

Result<Sourced<bool>> LinuxTelephony::roaming(const SlotName& name)
{
    return about(name, MM_DBUS_INTERFACE_MODEM, MM_MODEM_PROPERTY_STATE, isRoaming);
}

Result<Sourced<bool>> LinuxTelephony::smsReady(const SlotName& name)
{
    return about(name, MM_DBUS_INTERFACE_MODEM, MM_MODEM_PROPERTY_STATE, isSmsReady);
}

Result<std::vector<ModemReport>> LinuxTelephony::reports()
{
    const auto slots = slotsIn(bus_.look(modems()));
    if (!slots)
        return slots.error();
    std::vector<ModemReport> all;
    for (const Slot& slot : slots.value())
        all.push_back(reportOf(slot));
    return all;
}

Result<Sourced<Subscriptions>> LinuxTelephony::subscriptions()
{
    const auto replies = bus_.look({modems(), {NETWORKS, nullptr}});
    const auto slots = slotsIn(replies.front());
    if (!slots)
        return slots.error();
    Sourced<Subscriptions> subscriptions{{}, MODEM_MANAGER.name};
    const Result<NetworkView> view = NetworkView::from(replies.back());
    const auto modem = view ? view.value().primaryModem() : std::nullopt;
    if (modem)
        subscriptions.value.data = slotOfModem(slots.value(), *modem);
    if (subscriptions.value.data)
        subscriptions.source += std::string(", ") + NETWORK_MANAGER.name;
    return subscriptions;
}

} // namespace port::linux_backend
