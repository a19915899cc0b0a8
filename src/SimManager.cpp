// SPDX-License-Identifier: Apache-2.0
#include "SimManager.h"

#include <cstring>

#include "Log.h"
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
template <class Keys, class Values>
inline void convert(const Keys& keys, const Values& values, const char* key, char** slot,
                    const ConversionLines& lines)
{
    DEBUG_LINE_AT(lines.site, lines.entry, key);
    const std::size_t row = findFirst(keys, key);
    if (row < Keys::rows) {
        *slot = strdup(values.cells[row]);
        DEBUG_LINE_AT(lines.site, lines.success, *slot);
        return;
    }
    writeErrorLine(lines.site, lines.failure);
    *slot = nullptr;
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
    if (findFirst(MccCountryTable::MCC, mcc) < MccCountryTable::ROWS) {
        DEBUG_LINE("mcc is valid");
        return true;
    }
    ERROR_LINE("mcc is invalid");
    return false;
}

void SimManager::GetCountryCodeFromMcc(const char* mcc, char** countryCode)
{
    // The entry text names another method: meant.
    convert(MccCountryTable::MCC, MccCountryTable::ALPHA2, mcc, countryCode,
            {LOG_SITE, "GetMccToCountryCode [mcc : %s]", "success to get countrycode : %s",
             LOG_PREFIX "fail to get countrycode"});
}

void SimManager::GetCountryNameFromMcc(const char* mcc, char** countryName)
{
    convert(MccCountryTable::MCC, MccCountryTable::NAME, mcc, countryName,
            {LOG_SITE, "GetCountryNameFromMcc [mcc : %s]", "success to get countryName : %s",
             LOG_PREFIX "fail to get countryName"});
}

void SimManager::GetMccFromCountryCode(const char* countryCode, char** mcc)
{
    convert(MccCountryTable::ALPHA2, MccCountryTable::MCC, countryCode, mcc,
            {LOG_SITE, "GetMccFromCountryCode [countryCode : %s]", "success to get mcc : %s",
             LOG_PREFIX "fail to get mcc"});
}

void SimManager::GetMccFromServiceCountryCode(const char* serviceCountryCode, char** mcc)
{
    convert(ServiceCountryTable::LOCALE, ServiceCountryTable::MCC, serviceCountryCode, mcc,
            {LOG_SITE, "GetMccFromServiceCountryCode [serviceCountryCode : %s]",
             "success to get mcc : %s", LOG_PREFIX "fail to get mcc"});
}

void SimManager::GetServiceCountryCodeFromMcc(const char* mcc, char** serviceCountryCode)
{
    // The "!! " of the success text is meant.
    convert(ServiceCountryTable::MCC, ServiceCountryTable::LOCALE, mcc, serviceCountryCode,
            {LOG_SITE, "GetServiceCountryCodeFromMcc [mcc : %s]",
             "!! success to get serviceCountryCode : %s",
             LOG_PREFIX "fail to get serviceCountryCode"});
}

void SimManager::GetMccFromCountryCallingCode(const char* countryCallingCode, char** mcc)
{
    convert(CallingCodeTable::CALLING_CODE, CallingCodeTable::MCC, countryCallingCode, mcc,
            {LOG_SITE, "GetMccFromCountryCallingCode [countryCallingCode : %s]",
             "success to get mcc : %s", LOG_PREFIX "fail to get mcc"});
}

void SimManager::GetCountryCallingCodeFromMcc(const char* mcc, char** countryCallingCode)
{
    convert(CallingCodeTable::MCC, CallingCodeTable::CALLING_CODE, mcc, countryCallingCode,
            {LOG_SITE, "GetCountryCallingCodeFromMcc [mcc : %s]",
             "success to get countryCallingCode : %s",
             LOG_PREFIX "fail to get countryCallingCode"});
}

void SimManager::GetAlpha3CountryCodeFromMcc(const char* mcc, char** alpha3CountryCode)
{
    convert(Alpha3CountryTable::MCC, Alpha3CountryTable::ALPHA3, mcc, alpha3CountryCode,
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
