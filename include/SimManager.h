// SPDX-License-Identifier: Apache-2.0
// Internal: the singleton that answers SIM and country questions. Never installed.
#ifndef CORESYSTEM_SIM_MANAGER_H
#define CORESYSTEM_SIM_MANAGER_H

/// SIM and country questions, reached through GetInstance() on every call.
///
/// The country operations search constant tables. They touch no platform service, take no lock,
/// keep no state and may run on any thread. Keys are compared exactly: no trimming, no case
/// folding, no check of length or digits; none may be null. The first row in table order that
/// matches answers.
///
/// A converter writes a `strdup` copy into its slot, which the caller frees with `free`, or null
/// and an error line when no row matches.
class SimManager {
public:
    /// The one instance, made by the first call; null if allocation failed. Any thread.
    static SimManager* GetInstance();

    /// True when `mcc` (ITU E.212) has a row in the MCC table; nothing else makes an MCC valid.
    bool IsValidMcc(const char* mcc);

    /// MCC to ISO 3166-1 alpha-2, lower case.
    void GetCountryCodeFromMcc(const char* mcc, char** countryCode);
    /// MCC to English country name.
    void GetCountryNameFromMcc(const char* mcc, char** countryName);
    /// ISO 3166-1 alpha-2, lower case, to MCC.
    void GetMccFromCountryCode(const char* countryCode, char** mcc);
    /// Service locale ("en_GB") to MCC.
    void GetMccFromServiceCountryCode(const char* serviceCountryCode, char** mcc);
    /// MCC to service locale.
    void GetServiceCountryCodeFromMcc(const char* mcc, char** serviceCountryCode);
    /// International calling code without "+" (ITU E.164) to MCC.
    void GetMccFromCountryCallingCode(const char* countryCallingCode, char** mcc);
    /// MCC to international calling code.
    void GetCountryCallingCodeFromMcc(const char* mcc, char** countryCallingCode);
    /// MCC to ISO 3166-1 alpha-3, upper case.
    void GetAlpha3CountryCodeFromMcc(const char* mcc, char** alpha3CountryCode);

    /// True as soon as one row of the MO support table differs from `mcc`, so for every string
    /// there is.
    bool IsMoSupportMcc(const char* mcc);

private:
    friend struct CoreSystemInternals;

    SimManager();
    virtual ~SimManager();
    SimManager(const SimManager&) = delete;
    SimManager& operator=(const SimManager&) = delete;

    static SimManager* instance_;
};

#endif
