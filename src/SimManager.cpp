// SPDX-License-Identifier: Apache-2.0
#include "SimManager.h"

#include <cstring>
#include <new>

#include <ITapiCall.h>
#include <ITapiNetText.h>
#include <ITapiNetwork.h>
#include <ITapiSim.h>
#include <tapi_common.h>

#include <CoreMutex.h>
#include <CoreMutexLock.h>

#include "Log.h"
#include "PlatformEnum.h"
#include "Singleton.h"
#include "tables/Alpha3CountryTable.h"
#include "tables/CallingCodeTable.h"
#include "tables/MccCountryTable.h"
#include "tables/MoSupportMccTable.h"
#include "tables/ServiceCountryTable.h"

using namespace coresystem;

namespace {

// The texts of one converter's lines, and where they are logged from.
struct ConversionLines {
    LogSite site;
    const char* entry;   // takes the key
    const char* success; // takes the value
    const char* failure; // begins with LOG_PREFIX
};

// The one search behind all converters: the value of the first row whose key equals.
template <class Keys, class KeyIndex, class Values>
inline void convert(const Keys& keys, const KeyIndex& index, const Values& values, const char* key,
                    char** slot, const ConversionLines& lines)
{
    DEBUG_LINE_AT(lines.site, lines.entry, key);
    const std::size_t row = findFirst(keys, index, key);
    if (row < Keys::rows) {
        *slot = strdup(values.cells[row]);
        DEBUG_LINE_AT(lines.site, lines.success, *slot);
        return;
    }
    writeErrorLine(lines.site, lines.failure);
    *slot = nullptr;
}

const char* const SIM_ACCESS = "CORE_MUTEX_NAME_SIM_ACCESS";

// The code of an identity read that fails, whatever the platform said.
const int READ_FAILED = 4;

// Runs one platform call under the SIM access lock and nothing else.
template <class Call>
int callUnderLock(CoreMutex& mutex, Call call)
{
    mutex.Lock();
    const int result = call();
    mutex.Unlock();
    return result;
}

TapiHandle* openModemOfSlot(int slot)
{
    char** const names = tel_get_cp_name_list(); // the platform's: neither released nor measured
    return names != nullptr ? tel_init(names[slot]) : nullptr;
}

// Reads the IMSI parts of an available card and lets `use` take what it needs of them.
template <class Use>
bool useImsiOfSlot(SimManager& sim, const telephony_handle_list_s& list, int slot, Use use)
{
    if (!sim.IsSimAvailable(list, slot))
        return false;
    TapiHandle* const modem = openModemOfSlot(slot);
    if (modem == nullptr)
        return false;
    TelSimImsiInfo_t imsi = {};
    CoreMutex mutex(SIM_ACCESS);
    const bool wasRead =
        callUnderLock(mutex, [&] { return tel_get_sim_imsi(modem, &imsi); }) == TAPI_API_SUCCESS;
    if (wasRead)
        use(imsi);
    tel_deinit(modem);
    return wasRead;
}

int failRead(char** slot, int code, const LogSite& site, const char* failure)
{
    *slot = nullptr;
    writeErrorLine(site, failure);
    return code;
}

// A field that a longer text than foreseen fills to its end has no NUL.
template <std::size_t size>
std::size_t lengthOf(const char (&field)[size])
{
    return strnlen(field, size);
}

template <std::size_t size>
char* append(char* end, const char (&field)[size])
{
    std::memcpy(end, field, lengthOf(field));
    return end + lengthOf(field);
}

template <std::size_t size>
char* copyOf(const char (&field)[size])
{
    char text[size + 1];
    *append(text, field) = '\0';
    return strdup(text);
}

// The MCC and the MNC are read alike.
struct ImsiPart {
    char (TelSimImsiInfo_t::*field)[4];
    const char* entry;   // takes the slot, 1-based
    const char* success; // takes the value
    const char* failure; // begins with LOG_PREFIX
};

const ImsiPart MCC_PART = {&TelSimImsiInfo_t::szMcc, "GetMCCFromSim : slot %d", "Mcc: [%s]",
                           LOG_PREFIX "fail to get MCC"};
const ImsiPart MNC_PART = {&TelSimImsiInfo_t::szMnc, "GetMNCFromSim : slot %d", "Mnc: [%s]",
                           LOG_PREFIX "fail to get MNC"};

int readImsiPart(SimManager& sim, const telephony_handle_list_s& list, int slot, char** value,
                 const ImsiPart& part, const LogSite& site)
{
    DEBUG_LINE_AT(site, part.entry, slot + 1);
    const bool wasRead = useImsiOfSlot(sim, list, slot, [&](const TelSimImsiInfo_t& imsi) {
        *value = copyOf(imsi.*part.field);
        DEBUG_LINE_AT(site, part.success, *value);
    });
    return wasRead ? 0 : failRead(value, READ_FAILED, site, part.failure);
}

// The three parts as they stand: no digit is added or cut.
char* joinedCopy(const TelSimImsiInfo_t& imsi)
{
    char joined[sizeof imsi.szMcc + sizeof imsi.szMnc + sizeof imsi.szMsin + 1];
    *append(append(append(joined, imsi.szMcc), imsi.szMnc), imsi.szMsin) = '\0';
    return strdup(joined);
}

const char* nameOfSimState(int state)
{
    switch (state) {
    case TELEPHONY_SIM_STATE_UNAVAILABLE:
        return "TELEPHONY_SIM_STATE_UNAVAILABLE";
    case TELEPHONY_SIM_STATE_LOCKED:
        return "TELEPHONY_SIM_STATE_LOCKED";
    case TELEPHONY_SIM_STATE_AVAILABLE:
        return "TELEPHONY_SIM_STATE_AVAILABLE";
    case TELEPHONY_SIM_STATE_UNKNOWN:
        return "TELEPHONY_SIM_STATE_UNKNOWN";
    default:
        return "-";
    }
}

bool isInService(telephony_h handle)
{
    telephony_network_service_state_e state = TELEPHONY_NETWORK_SERVICE_STATE_OUT_OF_SERVICE;
    return telephony_network_get_service_state(handle, &state) == TELEPHONY_ERROR_NONE &&
           numberOf(state) == TELEPHONY_NETWORK_SERVICE_STATE_IN_SERVICE;
}

// Asks a modem by its name. The handle is passed on as obtained, null or not, and stays open:
// frozen 18.
template <class Answer>
bool askModem(const char* cpName, int (*ask)(TapiHandle*, Answer*), Answer* answer)
{
    const CoreMutexLock lock(SIM_ACCESS);
    return ask(tel_init(cpName), answer) == TAPI_API_SUCCESS;
}

} // namespace

CORESYSTEM_DEFINE_GET_INSTANCE(SimManager);

SimManager::SimManager()
{
    DEBUG_LINE("SimManager()");
}

SimManager::~SimManager() {}

bool SimManager::IsValidMcc(const char* mcc)
{
    DEBUG_LINE("IsValidMcc [mcc : %s]", mcc);
    if (findFirst(MccCountryTable::MCC, MccCountryTable::MCC_INDEX, mcc) < MccCountryTable::ROWS) {
        DEBUG_LINE("mcc is valid");
        return true;
    }
    ERROR_LINE("mcc is invalid");
    return false;
}

void SimManager::GetCountryCodeFromMcc(const char* mcc, char** countryCode)
{
    // The entry text names another method: frozen 19.
    convert(MccCountryTable::MCC, MccCountryTable::MCC_INDEX, MccCountryTable::ALPHA2, mcc,
            countryCode,
            {LOG_SITE, "GetMccToCountryCode [mcc : %s]", "success to get countrycode : %s",
             LOG_PREFIX "fail to get countrycode"});
}

void SimManager::GetCountryNameFromMcc(const char* mcc, char** countryName)
{
    convert(MccCountryTable::MCC, MccCountryTable::MCC_INDEX, MccCountryTable::NAME, mcc,
            countryName,
            {LOG_SITE, "GetCountryNameFromMcc [mcc : %s]", "success to get countryName : %s",
             LOG_PREFIX "fail to get countryName"});
}

void SimManager::GetMccFromCountryCode(const char* countryCode, char** mcc)
{
    convert(MccCountryTable::ALPHA2, MccCountryTable::ALPHA2_INDEX, MccCountryTable::MCC,
            countryCode, mcc,
            {LOG_SITE, "GetMccFromCountryCode [countryCode : %s]", "success to get mcc : %s",
             LOG_PREFIX "fail to get mcc"});
}

void SimManager::GetMccFromServiceCountryCode(const char* serviceCountryCode, char** mcc)
{
    convert(ServiceCountryTable::LOCALE, ServiceCountryTable::LOCALE_INDEX,
            ServiceCountryTable::MCC, serviceCountryCode, mcc,
            {LOG_SITE, "GetMccFromServiceCountryCode [serviceCountryCode : %s]",
             "success to get mcc : %s", LOG_PREFIX "fail to get mcc"});
}

void SimManager::GetServiceCountryCodeFromMcc(const char* mcc, char** serviceCountryCode)
{
    // The "!! " of the success text is frozen 20.
    convert(ServiceCountryTable::MCC, ServiceCountryTable::MCC_INDEX, ServiceCountryTable::LOCALE,
            mcc, serviceCountryCode,
            {LOG_SITE, "GetServiceCountryCodeFromMcc [mcc : %s]",
             "!! success to get serviceCountryCode : %s",
             LOG_PREFIX "fail to get serviceCountryCode"});
}

void SimManager::GetMccFromCountryCallingCode(const char* countryCallingCode, char** mcc)
{
    convert(CallingCodeTable::CALLING_CODE, CallingCodeTable::CALLING_CODE_INDEX,
            CallingCodeTable::MCC, countryCallingCode, mcc,
            {LOG_SITE, "GetMccFromCountryCallingCode [countryCallingCode : %s]",
             "success to get mcc : %s", LOG_PREFIX "fail to get mcc"});
}

void SimManager::GetCountryCallingCodeFromMcc(const char* mcc, char** countryCallingCode)
{
    convert(CallingCodeTable::MCC, CallingCodeTable::MCC_INDEX, CallingCodeTable::CALLING_CODE, mcc,
            countryCallingCode,
            {LOG_SITE, "GetCountryCallingCodeFromMcc [mcc : %s]",
             "success to get countryCallingCode : %s",
             LOG_PREFIX "fail to get countryCallingCode"});
}

void SimManager::GetAlpha3CountryCodeFromMcc(const char* mcc, char** alpha3CountryCode)
{
    convert(Alpha3CountryTable::MCC, Alpha3CountryTable::MCC_INDEX, Alpha3CountryTable::ALPHA3, mcc,
            alpha3CountryCode,
            {LOG_SITE, "GetAlpha3CountryCodeFromMcc [mcc : %s]",
             "success to get alpha3CountryCode : %s", LOG_PREFIX "fail to get alpha3CountryCode"});
}

bool SimManager::IsMoSupportMcc(const char* mcc)
{
    DEBUG_LINE("IsMoSupportMcc [mcc : %s]", mcc);
    bool result = false;
    for (std::size_t row = 0; row < MoSupportMccTable::ROWS; ++row) {
        // Inverted on purpose: the first row that differs answers true.
        if (std::strcmp(mcc, MoSupportMccTable::MCC.cells[row]) != 0) {
            result = true;
            break;
        }
    }
    DEBUG_LINE("IsMOSupportMcc? : %s", result ? "true" : "false");
    return result;
}

bool SimManager::SuccessToInitTelephonyHandle(telephony_handle_list_s* list)
{
    DEBUG_LINE("SuccessToInitTelephonyHandle");
    telephony_handle_list_s own = {0, nullptr};
    if (telephony_init(&own) != TELEPHONY_ERROR_NONE || own.count == 0) {
        ERROR_LINE("telephony_init Failed.");
        return false; // a list of no slots is not released either: frozen 21
    }
    DEBUG_LINE("Success! telephony_init, handle count : %d", static_cast<int>(own.count));
    *list = own;
    return true;
}

void SimManager::DeleteTelephonyHandle(telephony_handle_list_s list)
{
    DEBUG_LINE("DeleteTelephonyHandle");
    telephony_deinit(&list);
}

bool SimManager::IsSimAvailable(telephony_handle_list_s list, int slot)
{
    DEBUG_LINE("IsSimAvailable : slot %d", slot + 1);
    DEBUG_LINE("GetTelephonyHandle, handle count : %d", static_cast<int>(list.count));
    telephony_sim_state_e state = TELEPHONY_SIM_STATE_UNKNOWN;
    CoreMutex mutex(SIM_ACCESS);
    const int result =
        callUnderLock(mutex, [&] { return telephony_sim_get_state(list.handle[slot], &state); });
    if (result == TELEPHONY_ERROR_NONE && numberOf(state) == TELEPHONY_SIM_STATE_AVAILABLE) {
        DEBUG_LINE("SIM is available");
        return true;
    }
    ERROR_LINE("Sim is not available");
    return false;
}

bool SimManager::GetSimState(telephony_h* handle, telephony_sim_state_e* state)
{
    const CoreMutexLock lock(SIM_ACCESS);
    const int result = telephony_sim_get_state(*handle, state);
    DEBUG_LINE("SIM STATE[%d]", result);
    return result != TELEPHONY_ERROR_NONE; // true is failure: frozen 22
}

bool SimManager::IsSimExist()
{
    const CoreMutexLock lock(SIM_ACCESS);
    bool exists = false;
    telephony_handle_list_s list = {0, nullptr};
    if (telephony_init(&list) == TELEPHONY_ERROR_NONE) {
        for (unsigned int slot = 0; slot < list.count; ++slot) {
            telephony_sim_state_e state = TELEPHONY_SIM_STATE_UNKNOWN;
            const int result = telephony_sim_get_state(list.handle[slot], &state);
            DEBUG_LINE("RESULT sim_get_state[%d] : %d | %x", static_cast<int>(slot), result,
                       static_cast<unsigned int>(result)); // the result twice: frozen 23
            if (result != TELEPHONY_ERROR_NONE)
                continue;
            DEBUG_LINE("SIM STATE[%d] : %s", static_cast<int>(slot),
                       nameOfSimState(numberOf(state)));
            exists = exists || numberOf(state) == TELEPHONY_SIM_STATE_AVAILABLE;
        }
    }
    telephony_deinit(&list); // also of a list that was never filled: frozen 24
    return exists;
}

int SimManager::GetMCCFromSim(telephony_handle_list_s list, int slot, char** mcc)
{
    return readImsiPart(*this, list, slot, mcc, MCC_PART, LOG_SITE);
}

int SimManager::GetMNCFromSim(telephony_handle_list_s list, int slot, char** mnc)
{
    return readImsiPart(*this, list, slot, mnc, MNC_PART, LOG_SITE);
}

int SimManager::GetIMSIFromSim(telephony_handle_list_s list, int slot, char** imsi)
{
    const LogSite site = LOG_SITE;
    DEBUG_LINE("GetIMSIFromSim : slot %d", slot + 1);
    const bool wasRead = useImsiOfSlot(*this, list, slot, [&](const TelSimImsiInfo_t& parts) {
        // Whatever the parts hold: frozen 25.
        DEBUG_LINE_AT(site, "Mcc exist");
        DEBUG_LINE_AT(site, "Mnc exist");
        DEBUG_LINE_AT(site, "Msin exist");
        *imsi = joinedCopy(parts);
        DEBUG_LINE_AT(site, "imsi exist"); // the IMSI itself is nobody's to log
    });
    return wasRead ? 0 : failRead(imsi, READ_FAILED, site, LOG_PREFIX "fail to get imsi");
}

int SimManager::GetPhoneNumberFromSim(telephony_handle_list_s list, int slot, char** number)
{
    DEBUG_LINE("GetPhoneNumberFromSim : slot %d", slot + 1);
    // A full stop here, a comma in IsSimAvailable(): frozen 26.
    DEBUG_LINE("GetTelephonyHandle. handle count : %d", static_cast<int>(list.count));
    if (IsSimAvailable(list, slot)) {
        char* ofPlatform = nullptr;
        CoreMutex mutex(SIM_ACCESS);
        const int result = callUnderLock(mutex, [&] {
            return telephony_sim_get_subscriber_number(list.handle[slot], &ofPlatform);
        });
        if (result == TELEPHONY_ERROR_NONE && ofPlatform != nullptr) {
            *number = strdup(ofPlatform); // the platform's own string is never released: frozen 27
            DEBUG_LINE("phoneNumber exist");
            return 0;
        }
    }
    return failRead(number, TELEPHONY_ERROR_SIM_NOT_AVAILABLE, LOG_SITE,
                    LOG_PREFIX "fail to get phoneNumber");
}

bool SimManager::GetRoamingStatus(int slot, bool* roaming)
{
    const CoreMutexLock lock(SIM_ACCESS);
    ERROR_LINE("SimManager::GetRoamingStatus()"); // an entry line that is always written: frozen 28
    bool answered = false;
    telephony_handle_list_s list = {0, nullptr};
    if (telephony_init(&list) == TELEPHONY_ERROR_NONE) {
        DEBUG_LINE("telephony_init success");
        const bool exists = slot >= 0 && static_cast<unsigned int>(slot) < list.count;
        if (exists && isInService(list.handle[slot])) {
            DEBUG_LINE("telephony_network_service_state : [In Service]");
            if (telephony_network_get_roaming_status(list.handle[slot], roaming) ==
                TELEPHONY_ERROR_NONE) {
                DEBUG_LINE("telephony_network_get_roaming_status success");
                answered = true;
            }
        }
    }
    telephony_deinit(&list); // also of a list that was never filled: frozen 24
    return answered;
}

bool SimManager::InitHandleList(telephony_handle_list_s* list)
{
    const CoreMutexLock lock(SIM_ACCESS);
    return telephony_init(list) == TELEPHONY_ERROR_NONE;
}

char** SimManager::GetCpNameList()
{
    const CoreMutexLock lock(SIM_ACCESS);
    return tel_get_cp_name_list();
}

bool SimManager::DeinitHandleList(telephony_handle_list_s* list)
{
    const CoreMutexLock lock(SIM_ACCESS);
    return telephony_deinit(list) == TELEPHONY_ERROR_NONE;
}

bool SimManager::IsAvaliableState(int slot, TelSimCardStatus_t* status)
{
    const CoreMutexLock lock(SIM_ACCESS);
    TapiHandle* const modem = slot >= 0 ? openModemOfSlot(slot) : nullptr;
    if (modem == nullptr)
        return false;
    int cardChanged = 0;
    if (tel_get_sim_init_info(modem, status, &cardChanged) != TAPI_API_SUCCESS)
        return false; // the handle stays open on every way out: frozen 29
    DEBUG_LINE("SIM_INIT_INFO[%x, %d]", static_cast<unsigned int>(numberOf(*status)), cardChanged);
    return numberOf(*status) == TAPI_SIM_STATUS_SIM_INIT_COMPLETED;
}

bool SimManager::GetMainSimSubscription(char* cpName, TelNetworkDefaultSubs_t* subscription)
{
    return askModem(cpName, &tel_get_network_default_subscription, subscription);
}

bool SimManager::GetCallPreferredSubscription(char* cpName,
                                              TelCallPreferredVoiceSubs_t* subscription)
{
    return askModem(cpName, &tel_get_call_preferred_voice_subscription, subscription);
}

bool SimManager::GetDefaultDataSubscription(char* cpName, TelNetworkDefaultDataSubs_t* subscription)
{
    return askModem(cpName, &tel_get_network_default_data_subscription, subscription);
}

bool SimManager::CheckSmsEnabled(char* cpName, int* ready)
{
    return askModem(cpName, &tel_check_sms_device_status, ready);
}

bool SimManager::GetSimInfo(const char* cpName, std::string* mcc, std::string* mnc,
                            std::string* msin)
{
    const CoreMutexLock lock(SIM_ACCESS);
    TapiHandle* const modem = tel_init(cpName);
    if (modem == nullptr) {
        ERROR_LINE("Failed to get TapiHandle");
        return false;
    }
    TelSimImsiInfo_t imsi = {};
    if (tel_get_sim_imsi(modem, &imsi) != TAPI_API_SUCCESS) {
        ERROR_LINE("Failed to get IMSI");
        return false;
    }
    try {
        mcc->assign(imsi.szMcc, lengthOf(imsi.szMcc));
        mnc->assign(imsi.szMnc, lengthOf(imsi.szMnc));
        msin->assign(imsi.szMsin, lengthOf(imsi.szMsin));
    } catch (const std::bad_alloc&) { // only where short strings are allocated  GCOV_EXCL_LINE
        return false;                 // no exception crosses the interface      GCOV_EXCL_LINE
    }
    return true; // the handle stays open: frozen 29
}

bool SimManager::GetPhoneNumber(telephony_data** handle, char** number)
{
    const CoreMutexLock lock(SIM_ACCESS);
    if (telephony_sim_get_subscriber_number(*handle, number) != TELEPHONY_ERROR_NONE) {
        ERROR_LINE("Failed to get phone number");
        return false;
    }
    return true;
}
