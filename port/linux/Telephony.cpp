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

// What is known about a card, and what to tell whoever wants to read it.
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
    if (slot.modem().isPoweredOff())
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

// The SIM's object, which is among the others when it was asked for.
Result<Imsi> imsiOf(const Objects& objects, const std::string& path)
{
    const auto found = objects->find(path);
    const auto sim = found != objects->end()
                         ? Object(path, found->second).properties(MM_DBUS_INTERFACE_SIM)
                         : notAvailable("the SIM card is gone");
    return sim ? imsiIn(sim.value()) : sim.error();
}

Result<std::vector<Slot>> slotsIn(const Result<Objects>& objects)
{
    const auto modems = modemsIn(objects);
    return modems ? Result<std::vector<Slot>>(slotsOf(modems.value())) : modems.error();
}

// One property of a slot's modem; of its SIM all.
std::function<std::vector<Deciding>(const Tree&)>
decidingOf(const SlotName& name, const char* interface, const char* property)
{
    return [=](const Tree& tree) -> std::vector<Deciding> {
        const auto slot = find(slotsIn(std::make_shared<const Tree>(tree)), name);
        if (!slot)
            return {};
        const bool isSim = *property == '\0';
        if (isSim && obstacleOf(slot.value()))
            return {};
        return {{isSim ? slot.value().sim() : slot.value().modem().path(), interface, property}};
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

Result<Sourced<Imsi>> LinuxTelephony::imsi(const SlotName& name)
{
    const auto objects = bus_.look({MODEMS, decidingOf(name, MM_DBUS_INTERFACE_SIM, "")});
    const Result<Slot> slot = find(slotsIn(objects), name);
    if (!slot)
        return slot.error();
    if (const auto obstacle = obstacleOf(slot.value()))
        return *obstacle;
    return sourced(name, imsiOf(objects.value(), slot.value().sim()));
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
