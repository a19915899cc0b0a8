// SPDX-License-Identifier: Apache-2.0
#include "CoreSystem.h"

#include <algorithm>
#include <cstdlib>
#include <cstring>
#include <new>

#include <system_info.h>
#include <system_settings.h>

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

// The first step of both chained calling-code questions. Its answer is never released: meant,
// callers have lived with that small leak and nothing may start to free it.
__attribute__((noinline)) const char* keptMccOfCallingCode(const char* countryCallingCode)
{
    char* mcc = nullptr;
    SimManager::GetInstance()->GetMccFromCountryCallingCode(countryCallingCode, &mcc);
    return mcc;
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
    DEBUG_LINE("CoreSystem::GetTizenID"); // without the N: meant
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
    // A feature key, unlike its neighbours: meant.
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
        // Without a separator the length works out as the largest there is: the whole value, meant.
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
    return result; // the code of the read, also when the default language answered: meant
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
    const std::size_t row = findFirst(LanguageCodeTable::UPPER_CASE, upperCode.c_str());
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
    DEBUG_LINE("CoreSystem::GetCountryCallingCodeFromMcc"); // names the inverse step: meant
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
    // meant.
    const std::size_t row = findLast(MccCountryTable::MCC, mcc);
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
