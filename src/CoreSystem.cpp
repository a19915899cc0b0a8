// SPDX-License-Identifier: Apache-2.0
#include "CoreSystem.h"

#include <algorithm>
#include <cstdlib>
#include <cstring>
#include <ctime>
#include <new>

#include <app_alarm.h>
#include <package_info.h>
#include <package_manager.h>
#include <runtime_info.h>
#include <storage.h>
#include <system_info.h>
#include <system_settings.h>
#include <vconf.h>

#include <CoreUtil.h>

#include "ConnectionManager.h"
#include "DBusManager.h"
#include "Log.h"
#include "SimManager.h"
#include "Singleton.h"
#include "tables/LanguageCodeTable.h"
#include "tables/MccCountryTable.h"

using namespace coresystem;

namespace {

const char* const DEFAULT_LANGUAGE = "en_us";

bool isEmpty(const char* text)
{
    return text == nullptr || *text == '\0';
}

// Hands the platform's own string to the caller, null after a failed read.
int readPlatformString(const char* key, char** slot, const LogSite& site, const char* resultFormat)
{
    char* value = nullptr;
    const int result = system_info_get_platform_string(key, &value);
    *slot = value;
    DEBUG_LINE_AT(site, resultFormat, *slot);
    return result;
}

// Reads a switch. No result code is looked at, a read that fails leaves it off: frozen 1.
template <class Key>
bool readSwitch(int (*read)(Key, bool*), Key key, const LogSite& site, const char* on,
                const char* off)
{
    bool isOn = false;
    read(key, &isOn);
    DEBUG_LINE_AT(site, "%s", isOn ? on : off);
    return isOn;
}

// Null for a number that is no font size.
const char* lineOfFontSize(int fontSize)
{
    switch (fontSize) {
    case SYSTEM_SETTINGS_FONT_SIZE_SMALL:
        return "FontSize is small";
    case SYSTEM_SETTINGS_FONT_SIZE_NORMAL:
        return "FontSize is normal";
    case SYSTEM_SETTINGS_FONT_SIZE_LARGE:
        return "FontSize is large";
    case SYSTEM_SETTINGS_FONT_SIZE_HUGE:
        return "FontSize is huge";
    case SYSTEM_SETTINGS_FONT_SIZE_GIANT:
        return "FontSize is giant";
    default:
        return nullptr;
    }
}

// ASCII only, whatever the locale.
char toUpperCase(char character)
{
    return character >= 'a' && character <= 'z' ? static_cast<char>(character - 32) : character;
}

typedef void (SimManager::*CountrySearch)(const char* key, char** slot);

// Hands a country question to its search; an empty key leaves the slot as the caller set it.
inline void forwardCountryQuestion(CountrySearch search, const char* key, char** slot,
                                   const LogSite& site, const char* resultFormat,
                                   const char* emptyKeyError)
{
    if (isEmpty(key)) {
        writeErrorLine(site, emptyKeyError);
        return;
    }
    char* answer = nullptr;
    (SimManager::GetInstance()->*search)(key, &answer);
    *slot = answer;
    DEBUG_LINE_AT(site, resultFormat, *slot);
}

// The first step of both chained calling-code questions. Its answer is never released: frozen 2,
// callers have lived with that small leak and nothing may start to free it.
__attribute__((noinline)) const char* keptMccOfCallingCode(const char* countryCallingCode)
{
    char* mcc = nullptr;
    SimManager::GetInstance()->GetMccFromCountryCallingCode(countryCallingCode, &mcc);
    return mcc;
}

// The code of an identity question without a handle list.
const int NO_HANDLES = 4;

// A SIM identity question: how one slot is read, and what the walks over the slots make of it. The
// texts and the differences between the rows are frozen 3.
struct SimRead {
    int (SimManager::*read)(telephony_handle_list_s list, int slot, char** value);
    int codeWithoutHandles;
    bool freesIntermediate; // the manager's copy; kept where false
    bool showsValue;        // IMSI and phone number are nobody's to log
    const char* found;      // takes the value where it is shown; null for no line
    const char* added;      // takes the value where it is shown, and the count
};

const SimRead MCC_READ = {
    &SimManager::GetMCCFromSim, NO_HANDLES, false, true, "GetMCCFromSim mcc: [%s]",
    "ADD MCC: [%s] count: [%d]"};
const SimRead MNC_READ = {
    &SimManager::GetMNCFromSim, NO_HANDLES, false, true, "GetMNCFromSim mcc: [%s]",
    "ADD MNC: [%s] count: [%d]"};
const SimRead IMSI_READ = {
    &SimManager::GetIMSIFromSim, NO_HANDLES, true, false, "GetIMSIFromSim IMSI exist",
    "ADD IMSI count: [%d]"};
const SimRead PHONE_NUMBER_READ = {&SimManager::GetPhoneNumberFromSim, 0, true, false, nullptr,
                                   "ADD PhoneNumber count: [%d]"};

char* copyOf(const char* text)
{
    return text != nullptr ? strdup(text) : nullptr;
}

void writeFoundLine(const SimRead& row, const LogSite& site, const char* value)
{
    if (row.showsValue)
        DEBUG_LINE_AT(site, row.found, value);
    else if (row.found != nullptr)
        DEBUG_LINE_AT(site, "%s", row.found);
}

// Hands the value of the first slot that yields one to the caller.
int readFirstSlot(const SimRead& row, const LogSite& site, char** value)
{
    telephony_handle_list_s list = {0, nullptr};
    if (!SimManager::GetInstance()->SuccessToInitTelephonyHandle(&list))
        return row.codeWithoutHandles;
    int result = row.codeWithoutHandles;
    char* intermediate = nullptr;
    for (int slot = 0; static_cast<unsigned int>(slot) < list.count; ++slot) {
        intermediate = nullptr;
        result = (SimManager::GetInstance()->*row.read)(list, slot, &intermediate);
        if (result == 0) {
            *value = copyOf(intermediate);
            writeFoundLine(row, site, *value);
            break;
        }
    }
    SimManager::GetInstance()->DeleteTelephonyHandle(list);
    if (row.freesIntermediate)
        std::free(intermediate);
    return result;
}

// Appends the value of every slot that yields one.
void readAllSlots(const SimRead& row, const LogSite& site, std::vector<char*>& values, int* count)
{
    telephony_handle_list_s list = {0, nullptr};
    if (!SimManager::GetInstance()->SuccessToInitTelephonyHandle(&list))
        return;
    *count = 0;
    for (int slot = 0; static_cast<unsigned int>(slot) < list.count; ++slot) {
        char* intermediate = nullptr;
        if ((SimManager::GetInstance()->*row.read)(list, slot, &intermediate) != 0)
            continue;
        values.push_back(copyOf(intermediate));
        ++*count;
        if (row.showsValue)
            DEBUG_LINE_AT(site, row.added, values.back(), *count);
        else
            DEBUG_LINE_AT(site, row.added, *count);
        if (row.freesIntermediate)
            std::free(intermediate);
    }
    SimManager::GetInstance()->DeleteTelephonyHandle(list);
}

const std::size_t IMEI_LENGTH = 15; // 3GPP TS 23.003

// The first one that a modem tells, as the platform allocated it; null when none does.
char* imeiOfFirstModem(const telephony_handle_list_s& list, const LogSite& site)
{
    for (int slot = 0; static_cast<unsigned int>(slot) < list.count; ++slot) {
        char* imei = nullptr;
        if (telephony_modem_get_imei(list.handle[slot], &imei) == TELEPHONY_ERROR_NONE &&
            imei != nullptr) {
            DEBUG_LINE_AT(site, "Slot%d IMEI exist", slot);
            return imei;
        }
    }
    return nullptr;
}

int offsetFromUtc()
{
    tzset(); // localtime_r() need not notice another zone by itself
    const std::time_t now = std::time(nullptr);
    std::tm local = {};
    localtime_r(&now, &local);
    return static_cast<int>(local.tm_gmtoff);
}

// Made of the zone alone, so that it stays the same as long as the zone does: frozen 4.
char* fallbackImei()
{
    try {
        std::string text = CoreUtil::GetInstance()->intToStr(offsetFromUtc());
        while (text.size() < IMEI_LENGTH)
            text += '0';
        return strdup(text.c_str());
    } catch (const std::bad_alloc&) {
        return nullptr; // no exception crosses the interface
    }
}

} // namespace

CORESYSTEM_DEFINE_GET_INSTANCE(CoreSystem);

CoreSystem::CoreSystem()
{
    DEBUG_LINE("CoreSystem()");
}

CoreSystem::~CoreSystem() {}

int CoreSystem::GetDeviceName(char** deviceName)
{
    DEBUG_LINE("CoreSystem::GetDeviceName");
    char* value = nullptr;
    const int result = system_settings_get_value_string(SYSTEM_SETTINGS_KEY_DEVICE_NAME, &value);
    *deviceName = value;
    DEBUG_LINE("deviceName : %s, ret : %d", *deviceName, result);
    return result;
}

int CoreSystem::GetTizenIdN(char** tizenId)
{
    DEBUG_LINE("CoreSystem::GetTizenID"); // without the N: frozen 5
    char* value = nullptr;
    const int result = system_info_get_platform_string("tizen.org/system/tizenid", &value);
    if (result != SYSTEM_INFO_ERROR_NONE) {
        ERROR_LINE("system_info_get_platform_string failed [%d]", result);
        return result;
    }
    *tizenId = value != nullptr ? strdup(value) : nullptr;
    std::free(value);
    DEBUG_LINE("TizenID : %s", *tizenId);
    return result;
}

int CoreSystem::GetPlatformName(char** platformName)
{
    DEBUG_LINE("CoreSystem::GetPlatformName");
    return readPlatformString("tizen.org/system/platform.name", platformName, LOG_SITE,
                              "platformName : %s");
}

int CoreSystem::GetSWVersion(char** swVersion)
{
    DEBUG_LINE("CoreSystem::GetSWVersion");
    // A feature key, unlike its neighbours: frozen 6.
    return readPlatformString("tizen.org/feature/platform.version", swVersion, LOG_SITE,
                              "SW version : %s");
}

int CoreSystem::GetModelName(char** modelName)
{
    DEBUG_LINE("CoreSystem::GetModelName");
    return readPlatformString("tizen.org/system/model_name", modelName, LOG_SITE,
                              "Model Name : %s");
}

int CoreSystem::GetDeviceLanguageCode(char** languageCode, bool convertToISO639)
{
    DEBUG_LINE("CoreSystem::GetDeviceLanguageCode");
    char* setting = nullptr;
    const int result =
        system_settings_get_value_string(SYSTEM_SETTINGS_KEY_LOCALE_LANGUAGE, &setting);
    DEBUG_LINE("GetDeviceLanguageCode ret : %d", result);
    if (result != SYSTEM_SETTINGS_ERROR_NONE)
        setting = nullptr; // whatever a failed read left there is not ours

    try {
        const std::string value(setting != nullptr ? setting : DEFAULT_LANGUAGE);
        const int separator = GetTagStartPosition(value, "_");
        // Without a separator the length becomes the largest there is: the whole value, frozen 7.
        std::string language = GetValueFromPosition(value, 0, separator - 1);
        std::transform(language.begin(), language.end(), language.begin(), toUpperCase);

        if (!convertToISO639) {
            *languageCode = strdup(language.c_str());
            DEBUG_LINE("GetDeviceLanguageCode[notconvert] : %s", *languageCode);
        } else {
            const char* iso639 = nullptr;
            GetISO639LangCodeFromDeviceLang(language, &iso639);
            if (iso639 != nullptr) {
                *languageCode = strdup(iso639);
                DEBUG_LINE("GetDeviceLanguageCode[convertToISO639] : %s ", *languageCode);
            }
        }
    } catch (const std::bad_alloc&) {
        // No exception crosses the interface; the slot stays as the caller set it.
    }
    std::free(setting);
    return result; // the code of the read, also when the default language answered: frozen 8
}

int CoreSystem::GetTagStartPosition(const std::string& value, const std::string& tag)
{
    DEBUG_LINE("CoreSystem::GetTagStartPosition");
    const int position = static_cast<int>(value.find(tag)); // npos becomes -1
    DEBUG_LINE("[TAG: %s] tag pos %d", tag.c_str(), position);
    return position;
}

std::string CoreSystem::GetValueFromPosition(const std::string& value, int start, int end)
{
    DEBUG_LINE("CoreSystem::GetValueFromPosition");
    if (start < 0 || static_cast<std::size_t>(start) > value.size())
        return std::string();
    const long long length = static_cast<long long>(end) - start + 1;
    return value.substr(static_cast<std::size_t>(start), static_cast<std::size_t>(length));
}

void CoreSystem::GetISO639LangCodeFromDeviceLang(const std::string& upperCode, const char** iso639)
{
    DEBUG_LINE("success to get capital : %s", upperCode.c_str());
    *iso639 = nullptr;
    const std::size_t row = findFirst(LanguageCodeTable::UPPER_CASE,
                                      LanguageCodeTable::UPPER_CASE_INDEX, upperCode.c_str());
    if (row < LanguageCodeTable::ROWS) {
        *iso639 = LanguageCodeTable::ISO639_2.cells[row];
        DEBUG_LINE("success to get ISO639Lang : %s", *iso639);
    }
}

bool CoreSystem::IsValidMcc(char* mcc)
{
    DEBUG_LINE("CoreSystem::IsValidMcc");
    if (isEmpty(mcc)) {
        ERROR_LINE("mcc is empty. IsValidMcc finish.");
        return false;
    }
    return SimManager::GetInstance()->IsValidMcc(mcc);
}

bool CoreSystem::IsValidMcc(const char* mcc)
{
    return IsValidMcc(const_cast<char*>(mcc));
}

void CoreSystem::GetCountryCodeFromMcc(const char* mcc, char** countryCode)
{
    DEBUG_LINE("CoreSystem::GetCountryCodeFromMcc");
    forwardCountryQuestion(&SimManager::GetCountryCodeFromMcc, mcc, countryCode, LOG_SITE,
                           "countrycode : %s",
                           LOG_PREFIX "mcc is empty. GetCountryCodeFromMcc finish.");
}

void CoreSystem::GetCountryNameFromMcc(const char* mcc, char** countryName)
{
    DEBUG_LINE("CoreSystem::GetCountryNameFromMcc");
    forwardCountryQuestion(&SimManager::GetCountryNameFromMcc, mcc, countryName, LOG_SITE,
                           "countryName : %s",
                           LOG_PREFIX "mcc is empty. GetCountryNameFromMcc finish.");
}

void CoreSystem::GetMccFromCountryCode(const char* countryCode, char** mcc)
{
    DEBUG_LINE("CoreSystem::GetMccFromCountryCode");
    forwardCountryQuestion(&SimManager::GetMccFromCountryCode, countryCode, mcc, LOG_SITE,
                           "mcc : %s",
                           LOG_PREFIX "countryCode is empty. GetMccFromCountryCode finish.");
}

void CoreSystem::GetMccFromServiceCountryCode(const char* serviceCountryCode, char** mcc)
{
    DEBUG_LINE("CoreSystem::GetMccFromServiceCountryCode");
    forwardCountryQuestion(
        &SimManager::GetMccFromServiceCountryCode, serviceCountryCode, mcc, LOG_SITE, "mcc : %s",
        LOG_PREFIX "serviceCountryCode is empty. GetMccFromServiceCountryCode finish.");
}

void CoreSystem::GetServiceCountryCodeFromMcc(const char* mcc, char** serviceCountryCode)
{
    DEBUG_LINE("CoreSystem::GetServiceCountryCodeFromMcc");
    forwardCountryQuestion(&SimManager::GetServiceCountryCodeFromMcc, mcc, serviceCountryCode,
                           LOG_SITE, "serviceCountryCode : %s",
                           LOG_PREFIX "mcc is empty. GetServiceCountryCodeFromMcc finish.");
}

void CoreSystem::GetCountryCallingCodeFromMcc(const char* mcc, char** countryCallingCode)
{
    DEBUG_LINE("CoreSystem::GetCountryCallingCodeFromMcc");
    forwardCountryQuestion(&SimManager::GetCountryCallingCodeFromMcc, mcc, countryCallingCode,
                           LOG_SITE, "countryCallingCode : %s",
                           LOG_PREFIX "mcc is empty. GetCountryCallingCodeFromMcc finish.");
}

void CoreSystem::GetAlpha3CountryCodeFromMcc(const char* mcc, char** alpha3CountryCode)
{
    DEBUG_LINE("CoreSystem::GetAlpha3CountryCodeFromMcc");
    forwardCountryQuestion(&SimManager::GetAlpha3CountryCodeFromMcc, mcc, alpha3CountryCode,
                           LOG_SITE, "alpha3CountryCode : %s",
                           LOG_PREFIX "mcc is empty. GetAlpha3CountryCodeFromMcc finish.");
}

void CoreSystem::GetMccFromCountryCallingCode(const char* countryCallingCode, char** mcc)
{
    DEBUG_LINE("CoreSystem::GetMccFromCountryCallingCode");
    forwardCountryQuestion(
        &SimManager::GetMccFromCountryCallingCode, countryCallingCode, mcc, LOG_SITE, "mcc : %s",
        LOG_PREFIX "countryCallingCode is empty. GetMccFromCountryCallingCode finish.");
}

void CoreSystem::GetCountryNameFromCountryCallingCode(const char* countryCallingCode,
                                                      char** countryName)
{
    DEBUG_LINE("CoreSystem::GetCountryNameFromCountryCallingCode");
    if (isEmpty(countryCallingCode)) {
        ERROR_LINE("countryCallingCode is empty. GetCountryNameFromCountryCallingCode finish.");
        return;
    }
    const char* const mcc = keptMccOfCallingCode(countryCallingCode);
    DEBUG_LINE("CoreSystem::GetCountryCallingCodeFromMcc"); // names the inverse step: frozen 9
    if (isEmpty(mcc)) {
        ERROR_LINE("mcc is empty. GetCountryNameFromCountryCallingCode finish.");
        return;
    }
    char* name = nullptr;
    SimManager::GetInstance()->GetCountryNameFromMcc(mcc, &name);
    *countryName = name;
    DEBUG_LINE("countryName : %s", *countryName);
}

void CoreSystem::GetCountryNameAlpha2FromCountryCallingCode(const char* countryCallingCode,
                                                            char** countryNameAlpha2)
{
    DEBUG_LINE("CoreSystem::GetCountryNameAlpha2FromCountryCallingCode");
    if (isEmpty(countryCallingCode)) {
        ERROR_LINE(
            "countryCallingCode is empty. GetCountryNameAlpha2FromCountryCallingCode finish.");
        return;
    }
    const char* const mcc = keptMccOfCallingCode(countryCallingCode);
    if (isEmpty(mcc)) {
        ERROR_LINE("mcc is empty. GetCountryNameAlpha2FromCountryCallingCode finish.");
        return;
    }
    // The last row answers, unlike every other search, and the slot gets the table's own cell:
    // frozen 10.
    const std::size_t row = findLast(MccCountryTable::MCC, MccCountryTable::MCC_INDEX, mcc);
    *countryNameAlpha2 = row < MccCountryTable::ROWS
                             ? const_cast<char*>(MccCountryTable::ALPHA2.cells[row])
                             : nullptr;
    DEBUG_LINE("countryNameAlpha2 : %s", *countryNameAlpha2);
}

bool CoreSystem::IsMoSupportMcc(const char* mcc)
{
    if (isEmpty(mcc)) {
        ERROR_LINE("mcc is empty. IsMoSupportMcc finish.");
        return false;
    }
    return SimManager::GetInstance()->IsMoSupportMcc(mcc);
}

bool CoreSystem::IsSimAvailable()
{
    DEBUG_LINE("CoreSystem IsSimAvailable()");
    telephony_handle_list_s list = {0, nullptr};
    if (!SimManager::GetInstance()->SuccessToInitTelephonyHandle(&list))
        return false;
    bool available = false;
    for (int slot = 0; !available && static_cast<unsigned int>(slot) < list.count; ++slot)
        available = SimManager::GetInstance()->IsSimAvailable(list, slot);
    SimManager::GetInstance()->DeleteTelephonyHandle(list);
    return available;
}

bool CoreSystem::IsDualSimAvailable()
{
    DEBUG_LINE("CoreSystem IsDualSimAvailable()");
    telephony_handle_list_s list = {0, nullptr};
    if (!SimManager::GetInstance()->SuccessToInitTelephonyHandle(&list))
        return false;
    if (list.count < 2) {
        ERROR_LINE("[Single Sim Device] Not support Dual Sim.");
        return false; // the list stays as it is, unlike on the other ways out: frozen 11
    }
    const bool both = SimManager::GetInstance()->IsSimAvailable(list, 0) &&
                      SimManager::GetInstance()->IsSimAvailable(list, 1);
    DEBUG_LINE(both ? "DualSimAvailable." : "NO DualSim MODE");
    SimManager::GetInstance()->DeleteTelephonyHandle(list);
    return both;
}

bool CoreSystem::IsSimExist()
{
    return SimManager::GetInstance()->IsSimExist();
}

int CoreSystem::GetMCCFromSim(char** mcc)
{
    DEBUG_LINE("CoreSystem::GetMCCFromSim");
    return readFirstSlot(MCC_READ, LOG_SITE, mcc);
}

int CoreSystem::GetMNCFromSim(char** mnc)
{
    DEBUG_LINE("GetMCCFromSim [Vector]TYPE"); // another method's: frozen 12
    return readFirstSlot(MNC_READ, LOG_SITE, mnc);
}

int CoreSystem::GetIMSIFromSim(char** imsi)
{
    DEBUG_LINE("CoreSystem::GetIMSIFromSim");
    return readFirstSlot(IMSI_READ, LOG_SITE, imsi);
}

int CoreSystem::GetPhoneNumberFromSim(char** phoneNumber)
{
    DEBUG_LINE("CoreSystem::GetPhoneNumberFromSim");
    return readFirstSlot(PHONE_NUMBER_READ, LOG_SITE, phoneNumber);
}

void CoreSystem::GetMCCFromSim(std::vector<char*>& mccs, int* count)
{
    DEBUG_LINE("GetMCCFromSim [Vector]TYPE");
    readAllSlots(MCC_READ, LOG_SITE, mccs, count);
}

void CoreSystem::GetMNCFromSim(std::vector<char*>& mncs, int* count)
{
    DEBUG_LINE("GetMNCFromSim [Vector]TYPE");
    readAllSlots(MNC_READ, LOG_SITE, mncs, count);
}

void CoreSystem::GetIMSIFromSim(std::vector<char*>& imsis, int* count)
{
    DEBUG_LINE("GetIMSIFromSim [Vector]TYPE");
    readAllSlots(IMSI_READ, LOG_SITE, imsis, count);
}

void CoreSystem::GetPhoneNumberFromSim(std::vector<char*>& phoneNumbers, int* count)
{
    DEBUG_LINE("GetPhoneNumberListFromSim [Vector]TYPE"); // "List" in this one only: frozen 13
    readAllSlots(PHONE_NUMBER_READ, LOG_SITE, phoneNumbers, count);
}

int CoreSystem::GetIMEI(char** imei)
{
    DEBUG_LINE("CoreSystem::GetIMEI");
    char* value = nullptr;
    telephony_handle_list_s list = {0, nullptr};
    if (SimManager::GetInstance()->SuccessToInitTelephonyHandle(&list)) {
        DEBUG_LINE("GetTelephonyHandle. handle count : %d", static_cast<int>(list.count));
        value = imeiOfFirstModem(list, LOG_SITE);
        SimManager::GetInstance()->DeleteTelephonyHandle(list);
    } else {
        ERROR_LINE("telephony_init Failed. Start to get IMEI from current time");
    }
    *imei = value != nullptr ? value : fallbackImei();
    return 0;
}

bool CoreSystem::GetRoamingStatus(int slot, bool* roaming)
{
    DEBUG_LINE("CoreSystem::GetRoamingStatus");
    if (!SimManager::GetInstance()->GetRoamingStatus(slot, roaming)) {
        DEBUG_LINE("GetRoamingStatus Failed");
        return false;
    }
    DEBUG_LINE(*roaming ? "GetRoamingStatus : [Roaming]" : "GetRoamingStatus : [Not Roaming]");
    return true;
}

bool CoreSystem::InitHandleList(telephony_handle_list_s* list)
{
    return SimManager::GetInstance()->InitHandleList(list);
}

char** CoreSystem::GetCpNameList()
{
    return SimManager::GetInstance()->GetCpNameList();
}

bool CoreSystem::DeinitHandleList(telephony_handle_list_s* list)
{
    return SimManager::GetInstance()->DeinitHandleList(list);
}

bool CoreSystem::IsAvaliableState(int slot, TelSimCardStatus_t* status)
{
    return SimManager::GetInstance()->IsAvaliableState(slot, status);
}

bool CoreSystem::GetMainSimSubscription(char* cpName, TelNetworkDefaultSubs_t* subscription)
{
    return SimManager::GetInstance()->GetMainSimSubscription(cpName, subscription);
}

bool CoreSystem::GetDefaultDataSubscription(char* cpName, TelNetworkDefaultDataSubs_t* subscription)
{
    return SimManager::GetInstance()->GetDefaultDataSubscription(cpName, subscription);
}

bool CoreSystem::GetCallPreferredSubscription(char* cpName,
                                              TelCallPreferredVoiceSubs_t* subscription)
{
    return SimManager::GetInstance()->GetCallPreferredSubscription(cpName, subscription);
}

bool CoreSystem::CheckSmsEnabled(char* cpName, int* ready)
{
    return SimManager::GetInstance()->CheckSmsEnabled(cpName, ready);
}

bool CoreSystem::GetSimInfo(const char* cpName, std::string* mcc, std::string* mnc,
                            std::string* msin)
{
    return SimManager::GetInstance()->GetSimInfo(cpName, mcc, mnc, msin);
}

bool CoreSystem::GetPhoneNumber(telephony_data** handle, char** number)
{
    return SimManager::GetInstance()->GetPhoneNumber(handle, number);
}

bool CoreSystem::IsFlightMode()
{
    DEBUG_LINE("CoreSystem::IsFlightMode");
    return readSwitch(&runtime_info_get_value_bool, RUNTIME_INFO_KEY_FLIGHT_MODE_ENABLED, LOG_SITE,
                      "FlightMode ON", "FlightMode OFF");
}

bool CoreSystem::IsDataRoamingEnabled()
{
    DEBUG_LINE("CoreSystem::IsDataRoamingEnabled");
    return readSwitch(&runtime_info_get_value_bool, RUNTIME_INFO_KEY_DATA_ROAMING_ENABLED, LOG_SITE,
                      "DataRoaming ON", "DataRoaming OFF");
}

bool CoreSystem::IsMobileData()
{
    DEBUG_LINE("CoreSystem::IsMobileData");
    return readSwitch(&system_settings_get_value_bool, SYSTEM_SETTINGS_KEY_3G_DATA_NETWORK_ENABLED,
                      LOG_SITE, "MobileData ON", "MobileData OFF");
}

char* CoreSystem::GetCSC()
{
    DEBUG_LINE("CoreSystem::GetCSC");
    return vconf_get_str(VCONFKEY_CSC_SALESCODE);
}

int CoreSystem::GetFontSize(int* fontSize)
{
    DEBUG_LINE("CoreSystem::GetFontSize");
    int value = 0;
    const int result = system_settings_get_value_int(SYSTEM_SETTINGS_KEY_FONT_SIZE, &value);
    *fontSize = value; // also after a failed read: frozen 14
    const char* const line = lineOfFontSize(value);
    if (line != nullptr)
        DEBUG_LINE("%s", line);
    return result;
}

int CoreSystem::GetCurrentTime(struct tm* currentTime)
{
    DEBUG_LINE("CoreSystem::GetCurrentTime");
    struct tm now = {};
    const int result = alarm_get_current_time(&now);
    *currentTime = now; // also after a failed read: frozen 15
    DEBUG_LINE("currentTime : day %d,  %d:%d:%d", now.tm_mday, now.tm_hour, now.tm_min, now.tm_sec);
    return result;
}

int CoreSystem::GetPackageVersion(const char* packageId, char** version)
{
    DEBUG_LINE("CoreSystem::GetPackageVersion");
    package_info_h info = nullptr;
    int result = package_info_create(packageId, &info);
    if (result != PACKAGE_MANAGER_ERROR_NONE) {
        ERROR_LINE("package_info_create failed [%d]", result);
        return result;
    }
    char* text = nullptr;
    result = package_info_get_version(info, &text);
    if (result != PACKAGE_MANAGER_ERROR_NONE) {
        ERROR_LINE("package_info_get_version failed [%d]", result);
        return result; // the handle stays: frozen 16
    }
    package_info_destroy(info);
    *version = copyOf(text); // the platform's own text is never released: frozen 17
    DEBUG_LINE("packageVersion : %s", *version);
    return PACKAGE_MANAGER_ERROR_NONE;
}

bool CoreSystem::IsPackageInstalled(const char* packageName)
{
    if (isEmpty(packageName)) {
        ERROR_LINE("PackageName is empty. IsPackageInstalled finish.");
        return false;
    }
    // Only the result code counts, not the size: it tells whether there is such a package.
    const int result = package_manager_get_package_size_info(packageName, nullptr, nullptr);
    if (result == PACKAGE_MANAGER_ERROR_NONE) {
        DEBUG_LINE("Package [%s] is installed", packageName);
        return true;
    }
    if (result == PACKAGE_MANAGER_ERROR_NO_SUCH_PACKAGE)
        ERROR_LINE("No Such Package [%s]", packageName);
    else
        ERROR_LINE("Other Error Case.. [package_manager_error_e] code is %d", result);
    return false;
}

bool CoreSystem::IsSystemMemoryAvailable(double requiredMegabytes)
{
    DEBUG_LINE("CoreSystem IsSystemMemoryAvailable");
    struct statvfs fs = {};
    if (storage_get_internal_memory_size(&fs) < 0) {
        ERROR_LINE("Fail to get internal memory size");
        return false;
    }
    // Multiplied as doubles: the fields have 32 bits on a device, and volumes are larger than that.
    const double available = static_cast<double>(fs.f_bsize) * static_cast<double>(fs.f_bavail);
    const double total = static_cast<double>(fs.f_frsize) * static_cast<double>(fs.f_blocks);
    const double availableMegabytes = available / 1048576.0;
    DEBUG_LINE("Total Memory : %lf byte, Avail Memory : %lf byte", total, available);
    DEBUG_LINE("[convert] Avail Memory : %lf mb(%lf gb) ", availableMegabytes,
               availableMegabytes / 1024.0);
    if (availableMegabytes > requiredMegabytes) {
        DEBUG_LINE("Avail Memory is upper %lf", requiredMegabytes);
        return true;
    }
    DEBUG_LINE("Total mem under %lf", requiredMegabytes);
    return false;
}

bool CoreSystem::IsNetworkConnected(bool checkWifi, bool checkBT)
{
    DEBUG_LINE("CoreSystem IsNetworkConnected");
    return ConnectionManager::GetInstance()->IsNetworkConnected(checkWifi, checkBT);
}

int CoreSystem::GetCellularNetworkState()
{
    DEBUG_LINE("CoreSystem GetCellularNetworkState");
    return ConnectionManager::GetInstance()->GetCellularNetworkState();
}

int CoreSystem::GetWifiNetworkState()
{
    DEBUG_LINE("CoreSystem GetWifiNetworkState");
    return ConnectionManager::GetInstance()->GetWifiNetworkState();
}

int CoreSystem::GetBTNetworkState()
{
    DEBUG_LINE("CoreSystem GetBTNetworkState");
    return ConnectionManager::GetInstance()->GetBTNetworkState();
}

void CoreSystem::SetConnectionEventListener(IConnectionStateListener* listener, void* userData)
{
    DEBUG_LINE("CoreSystem SetConnectionEventListener");
    ConnectionManager::GetInstance()->SetConnectionEventListener(listener, userData);
}

int CoreSystem::GetDeviceUniqueID(const char** id)
{
    DEBUG_LINE("CoreSystem::GetDeviceUniqueID");
    const int result = DBusManager::GetInstance()->GetDeviceUniqueID(const_cast<char**>(id));
    DEBUG_LINE("DeviceUniqueID : %s", *id);
    return result;
}
