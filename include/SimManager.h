// SPDX-License-Identifier: Apache-2.0
// Internal: the singleton that answers SIM and country questions. Never installed.
#ifndef CORESYSTEM_SIM_MANAGER_H
#define CORESYSTEM_SIM_MANAGER_H

#include <string>

#include <TelCall.h>
#include <TelNetwork.h>
#include <TelSim.h>
#include <telephony.h>

/// SIM and country questions, reached through GetInstance() on every call.
///
/// The country operations search constant tables. They touch no platform service, take no lock,
/// keep no state and may run on any thread. Keys are compared exactly: no trimming, no case
/// folding, no check of length or digits; none may be null. The first row in table order that
/// matches answers.
///
/// A converter writes a `strdup` copy into its slot, which the caller frees with `free`, or null
/// and an error line when no row matches.
///
/// The SIM operations ask the platform at every call and keep nothing. Slots are 0-based. They may
/// run on any thread; reads of SIM and network data are serialised by the named mutex
/// "CORE_MUTEX_NAME_SIM_ACCESS", held around the one platform call or for the whole operation, as
/// each says.
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

    /// \name Handle lists
    /// Fill a list, use its handles, release it on every way out. No lock is taken.
    /// \{

    /// True when the telephony service reports at least one slot; `list` is untouched otherwise,
    /// and there is nothing to release.
    bool SuccessToInitTelephonyHandle(telephony_handle_list_s* list);
    void DeleteTelephonyHandle(telephony_handle_list_s list);

    /// \}
    /// \name SIM state
    /// \{

    /// True when the card in `slot` of `list` is available, neither locked nor in transition.
    /// Locked around the platform call. `slot` is below the list's count.
    bool IsSimAvailable(telephony_handle_list_s list, int slot);
    /// True when the state could NOT be read; otherwise it is in `state`. Locked throughout.
    bool GetSimState(telephony_h* handle, telephony_sim_state_e* state);
    /// True when the card of at least one slot is available. Locked throughout.
    bool IsSimExist();

    /// \}
    /// \name SIM identity (ITU E.212)
    ///
    /// Each stores a `strdup` copy, which the caller frees with `free`, and returns 0; or it stores
    /// null, writes an error line and returns 4, or -39841791 for the phone number. `slot` is below
    /// the list's count. Locked around the platform call.
    /// \{
    int GetMCCFromSim(telephony_handle_list_s list, int slot, char** mcc);
    int GetMNCFromSim(telephony_handle_list_s list, int slot, char** mnc);
    int GetIMSIFromSim(telephony_handle_list_s list, int slot, char** imsi);
    int GetPhoneNumberFromSim(telephony_handle_list_s list, int slot, char** number);
    /// \}

    /// True when `slot` is in service and the platform told whether it is roaming; `roaming` is
    /// untouched when it is not asked. False for a slot that the device does not have. Locked
    /// throughout.
    bool GetRoamingStatus(int slot, bool* roaming);

    /// \name The platform's telephony, as it is
    ///
    /// One or two platform calls each, locked throughout; true when the platform answered 0. What
    /// they open on a modem by its name stays open: nothing releases it.
    /// \{
    bool InitHandleList(telephony_handle_list_s* list);
    char** GetCpNameList();
    bool DeinitHandleList(telephony_handle_list_s* list);
    bool IsAvaliableState(int slot, TelSimCardStatus_t* status);
    bool GetMainSimSubscription(char* cpName, TelNetworkDefaultSubs_t* subscription);
    bool GetCallPreferredSubscription(char* cpName, TelCallPreferredVoiceSubs_t* subscription);
    bool GetDefaultDataSubscription(char* cpName, TelNetworkDefaultDataSubs_t* subscription);
    bool CheckSmsEnabled(char* cpName, int* ready);
    bool GetSimInfo(const char* cpName, std::string* mcc, std::string* mnc, std::string* msin);
    bool GetPhoneNumber(telephony_data** handle, char** number);
    /// \}

private:
    friend struct CoreSystemInternals;

    SimManager();
    virtual ~SimManager();
    SimManager(const SimManager&) = delete;
    SimManager& operator=(const SimManager&) = delete;

    static SimManager* instance_;
};

#endif
