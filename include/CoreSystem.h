// SPDX-License-Identifier: Apache-2.0
/// \file
/// The public interface of the library: one class that answers questions about the device.
#ifndef CORESYSTEM_CORE_SYSTEM_H
#define CORESYSTEM_CORE_SYSTEM_H

#include <ctime>
#include <string>
#include <vector>

#include <TelCall.h>
#include <TelNetwork.h>
#include <TelSim.h>
#include <telephony.h>

#include "IConnectionStateListener.h"

#if defined(__GNUC__)
#define CORESYSTEM_API __attribute__((visibility("default")))
#else
#define CORESYSTEM_API
#endif

/// Answers questions about the device the application runs on.
///
/// Take the one instance from GetInstance() and call its methods:
///
///     char* name = nullptr;
///     if (CoreSystem::GetInstance()->GetDeviceName(&name) == 0)
///         puts(name);
///     free(name);
///
/// Nothing is cached: every answer is read from the platform at the moment of the call.
///
/// Strings. A string handed back through a `char**` is `malloc` memory that the caller releases
/// with `free`, unless its method says otherwise. No method tests the address of an output slot: it
/// must be valid.
///
/// Results. An `int` result is the platform's error code, unchanged: 0 is success, a negative code
/// a failure. No method throws.
///
/// Threads. Every method may be called from any thread at any time.
class CoreSystem {
public:
    /// The one instance, made by the first call and never destroyed; null if allocation failed.
    CORESYSTEM_API static CoreSystem* GetInstance();

    /// \name Identity of the device
    /// \{

    /// The name that the user gave the device.
    /// \param[out] deviceName the name; null on failure.
    /// \return 0 or a system settings error: -22 invalid parameter, -5 the name cannot be read, -13
    ///         permission denied, -1073741822 not supported.
    CORESYSTEM_API int GetDeviceName(char** deviceName);

    /// The platform's identifier of this device.
    /// \param[out] tizenId a copy of the identifier; left as it was on failure.
    /// \return 0 or a system information error: -22 unknown key, -5 cannot be read, -13 permission
    ///         denied, -12 out of memory. A failure also writes an error line to the log.
    CORESYSTEM_API int GetTizenIdN(char** tizenId);

    /// The name of the platform that the device runs.
    /// \param[out] platformName the name; null on failure.
    /// \return 0 or a system information error, as GetTizenIdN().
    CORESYSTEM_API int GetPlatformName(char** platformName);

    /// The version of the platform that the device runs.
    /// \param[out] swVersion the version; null on failure.
    /// \return 0 or a system information error, as GetTizenIdN().
    CORESYSTEM_API int GetSWVersion(char** swVersion);

    /// The device's model.
    /// \param[out] modelName the model; null on failure.
    /// \return 0 or a system information error, as GetTizenIdN().
    CORESYSTEM_API int GetModelName(char** modelName);

    /// The serial number of the device's board, which the device daemon tells on the system bus.
    /// Blocks until the daemon replies: the bus library waits 25 seconds for the reply, and without
    /// end for a bus that accepts the connection and never speaks. The connection is the bus
    /// library's shared one (`g_bus_get_sync`), which ends the process when the bus goes away while
    /// it runs its default GLib main loop; a process that is to outlive the bus calls
    /// `g_dbus_connection_set_exit_on_close` on it.
    /// \param[out] id the serial number; null on failure. Although it is const, the caller releases
    ///             it with `free`.
    /// \return 0, 1 no connection to the system bus, 2 no reply, an error reply or one without a
    ///         text, 3 connecting took too long. A failure also writes error lines to the log.
    CORESYSTEM_API int GetDeviceUniqueID(const char** id);

    /// \}
    /// \name Display language
    /// \{

    /// The display language as a short code.
    /// \param[out] languageCode without conversion the language part of the setting in upper case
    ///             ("EN" for en_US.UTF-8; the whole value when it has no "_"); with conversion its
    ///             ISO 639-2 code in lower case ("eng"), or left as it was when the table has no
    ///             such language.
    /// \param convertToISO639 whether to convert to ISO 639-2.
    /// \return 0, or the system settings error of the read (see GetDeviceName()); after a failed
    ///         read `languageCode` is that of the default language, "EN" or "eng".
    CORESYSTEM_API int GetDeviceLanguageCode(char** languageCode, bool convertToISO639);

    /// \}
    /// \name Settings and status
    /// A switch that cannot be read is off.
    /// \{

    /// Whether all radios are switched off together.
    CORESYSTEM_API bool IsFlightMode();
    /// Whether data over the cellular network is allowed abroad.
    CORESYSTEM_API bool IsDataRoamingEnabled();
    /// Whether data over the cellular network is switched on.
    CORESYSTEM_API bool IsMobileData();

    /// The sales code of the device's country-specific configuration.
    /// \return the code, which the caller releases with `free`; null when the device has none.
    CORESYSTEM_API char* GetCSC();

    /// \}
    /// \name Packages and storage
    /// \{

    /// The version of an installed package.
    /// \param packageId the package's name, compared exactly.
    /// \param[out] version a copy of the version text; left as it was on failure.
    /// \return 0 or a package error: -18153359 no such package, -22 null name, -5 the packages
    ///         cannot be read, -13 permission denied. A failure also writes an error line to the
    ///         log.
    CORESYSTEM_API int GetPackageVersion(const char* packageId, char** version);

    /// Whether more than `requiredMegabytes` (of 1,048,576 bytes) of the internal storage are free
    /// for applications; false for exactly as much, for a NaN, and when the storage cannot be read.
    CORESYSTEM_API bool IsSystemMemoryAvailable(double requiredMegabytes);

    /// \}
    /// \name Connections
    /// \{

    /// Whether the device has a data connection: over the cellular network, over Wi-Fi when
    /// `checkWifi`, over Bluetooth when `checkBT`. A network that can be had and is not connected
    /// does not count, nor does one that cannot be read.
    CORESYSTEM_API bool IsNetworkConnected(bool checkWifi, bool checkBT);

    /// Sets the one listener that is told of connection changes, in place of the one before; null
    /// ends it.
    ///
    /// The listener stays the caller's, who keeps it alive until null was set. On an ordinary Linux
    /// machine no call of it runs on another thread any more when setting null returns; on a device
    /// make sure of that before it is destroyed. Each call writes one plain line to the log.
    /// \param userData is passed on to every call of the listener, unchanged.
    CORESYSTEM_API void SetConnectionEventListener(IConnectionStateListener* listener,
                                                   void* userData);

    /// \}
    /// \name SIM cards
    ///
    /// Slots are 0-based. Each question goes through the slots in order, and asks the platform
    /// anew: a card that was inserted, removed or unlocked since shows at once. A locked card is no
    /// available one. On the device they need the privilege
    /// "http://tizen.org/privilege/telephony"; without it they answer as if there were no card.
    /// \{

    /// Whether any slot holds an available card. Writes an error line for each slot before it that
    /// does not.
    CORESYSTEM_API bool IsSimAvailable();

    /// The same question without error lines, asked of every slot.
    CORESYSTEM_API bool IsSimExist();

    /// Mobile country code (ITU E.212), three digits, of the first available card.
    /// \param[out] mcc a copy; left as it was on failure, so set it to null before.
    /// \return 0, or 4 for any failure: no telephony service, no available card, or the card cannot
    ///         be read.
    CORESYSTEM_API int GetMCCFromSim(char** mcc);

    /// Mobile network code (ITU E.212), two or three digits as the platform gives them, of the
    /// first available card. Out-parameter and result as GetMCCFromSim().
    CORESYSTEM_API int GetMNCFromSim(char** mnc);

    /// The first available card's own phone number. It never reaches the log.
    /// \param[out] phoneNumber a copy; left as it was on failure, so set it to null before.
    /// \return 0, or -39841791 (SIM not available) when no card tells its number, which many do
    ///         not. Also 0, with `phoneNumber` left as it was, when there is no telephony service:
    ///         callers rely on it as it is.
    CORESYSTEM_API int GetPhoneNumberFromSim(char** phoneNumber);

    /// \}
    /// \name Modem and network
    /// \{

    /// The IMEI (3GPP TS 23.003) of the first modem that tells it.
    /// \param[out] imei the IMEI. When no modem tells one, a made-up text of 15 characters: the
    ///             local time zone's offset from UTC in seconds, "-" for west, filled up with "0"
    ///             at the end ("324000000000000" for UTC+9).
    /// \return always 0.
    CORESYSTEM_API int GetIMEI(char** imei);

    /// Whether the card in a slot is abroad. Each call writes an error line to the log, also a good
    /// one.
    /// \param slot 0-based.
    /// \param[out] roaming the answer; left as it was when `slot` is not in service or not there.
    /// \return whether `roaming` was answered.
    CORESYSTEM_API bool GetRoamingStatus(int slot, bool* roaming);

    /// \}
    /// \name The platform's telephony, as it is
    ///
    /// Thin wrappers: one or two calls of the platform under the lock of all SIM access. Nothing is
    /// checked, so every argument must be valid unless its method says otherwise. A `bool` result
    /// is true when the platform answered 0; the out-parameters are written by the platform only.
    ///
    /// Each call with a modem's name opens a handle on that modem which is never closed, and so
    /// does each question about a card's MCC or MNC; on an ordinary Linux machine one takes less
    /// than 200 bytes. A null name is the first modem's.
    /// \{

    /// Fills `list` with one handle a slot; release it with DeinitHandleList().
    CORESYSTEM_API bool InitHandleList(telephony_handle_list_s* list);

    /// The names of all modems by slot, ended by null; null when the telephony service is not
    /// there. The list and its names are the platform's: do not free them.
    CORESYSTEM_API char** GetCpNameList();

    /// Releases what InitHandleList() filled.
    CORESYSTEM_API bool DeinitHandleList(telephony_handle_list_s* list);

    /// Whether the card in `slot` has finished initialising.
    /// \param slot below the number of names of GetCpNameList(); false when it is negative or there
    ///             is no list.
    /// \param[out] status how far it has come, also when the answer is false.
    CORESYSTEM_API bool IsAvaliableState(int slot, TelSimCardStatus_t* status);

    /// The subscription that serves by default.
    CORESYSTEM_API bool GetMainSimSubscription(char* cpName, TelNetworkDefaultSubs_t* subscription);

    /// The subscription that serves data by default.
    CORESYSTEM_API bool GetDefaultDataSubscription(char* cpName,
                                                   TelNetworkDefaultDataSubs_t* subscription);

    /// The subscription preferred for calls.
    CORESYSTEM_API bool GetCallPreferredSubscription(char* cpName,
                                                     TelCallPreferredVoiceSubs_t* subscription);

    /// Whether text messages can be sent and received: `ready` is 1 or 0.
    CORESYSTEM_API bool CheckSmsEnabled(char* cpName, int* ready);

    /// The parts of a card's IMSI (ITU E.212), as digits: MCC, MNC and MSIN. The three strings are
    /// written on success only; a failure writes an error line.
    CORESYSTEM_API bool GetSimInfo(const char* cpName, std::string* mcc, std::string* mnc,
                                   std::string* msin);

    /// The phone number of the card in one slot.
    /// \param handle one element of a list's handles.
    /// \param[out] number the platform's own string, which the caller frees.
    CORESYSTEM_API bool GetPhoneNumber(telephony_data** handle, char** number);

    /// \}
    /// \name Countries
    ///
    /// Conversions between mobile country codes (MCC, ITU E.212), ISO 3166-1 alpha-2 codes in lower
    /// case and alpha-3 codes in upper case, English country names, international calling codes
    /// (ITU E.164, digits only) and service locales ("en_GB"), all from tables compiled into the
    /// library.
    ///
    /// Keys are compared exactly: no trimming, no case folding. A null or empty key writes an error
    /// line to the log and leaves the output slot as it was; a key that the tables do not hold
    /// writes an error line and stores null. Where several rows share a key, the first in table
    /// order answers, unless the method says otherwise.
    /// \{

    /// Whether the MCC table holds `mcc`; false for null and "".
    CORESYSTEM_API bool IsValidMcc(const char* mcc);
    /// Same as IsValidMcc(const char*).
    CORESYSTEM_API bool IsValidMcc(char* mcc);

    /// MCC to alpha-2: "450" to "kr".
    CORESYSTEM_API void GetCountryCodeFromMcc(const char* mcc, char** countryCode);
    /// MCC to English country name: "450" to "Korea, South".
    CORESYSTEM_API void GetCountryNameFromMcc(const char* mcc, char** countryName);
    /// Alpha-2 to MCC: "kr" to "450".
    CORESYSTEM_API void GetMccFromCountryCode(const char* countryCode, char** mcc);
    /// Service locale to MCC: "ko_KR" to "450".
    CORESYSTEM_API void GetMccFromServiceCountryCode(const char* serviceCountryCode, char** mcc);
    /// MCC to service locale: "450" to "ko_KR".
    CORESYSTEM_API void GetServiceCountryCodeFromMcc(const char* mcc, char** serviceCountryCode);
    /// MCC to calling code: "450" to "82".
    CORESYSTEM_API void GetCountryCallingCodeFromMcc(const char* mcc, char** countryCallingCode);
    /// MCC to alpha-3: "450" to "KOR".
    CORESYSTEM_API void GetAlpha3CountryCodeFromMcc(const char* mcc, char** alpha3CountryCode);
    /// Calling code to MCC: "82" to "450", "1" to "544" (the first of thirty).
    CORESYSTEM_API void GetMccFromCountryCallingCode(const char* countryCallingCode, char** mcc);

    /// Calling code to English country name, through its first MCC: "590" to "Guadeloupe (France)".
    /// A calling code without an MCC leaves the slot as it was.
    CORESYSTEM_API void GetCountryNameFromCountryCallingCode(const char* countryCallingCode,
                                                             char** countryName);

    /// Calling code to alpha-2, through its first MCC; of several rows with that MCC the last
    /// answers: "590" to "mq". A calling code without an MCC leaves the slot as it was. \param[out]
    /// countryNameAlpha2 a constant of the library: neither freed nor modified by the caller.
    CORESYSTEM_API void GetCountryNameAlpha2FromCountryCallingCode(const char* countryCallingCode,
                                                                   char** countryNameAlpha2);

    /// False for null and "", true for every other string, listed or not: callers rely on it as it
    /// is.
    CORESYSTEM_API bool IsMoSupportMcc(const char* mcc);

    /// \}

private:
    friend struct CoreSystemInternals; // the library's own tests

    CoreSystem();
    virtual ~CoreSystem();
    CoreSystem(const CoreSystem&) = delete;
    CoreSystem& operator=(const CoreSystem&) = delete;

    int GetTagStartPosition(const std::string& value, const std::string& tag);
    std::string GetValueFromPosition(const std::string& value, int start, int end);
    void GetISO639LangCodeFromDeviceLang(const std::string& upperCode, const char** iso639);

    // The platform's font size, 0 small to 4 giant, and its settings error code.
    int GetFontSize(int* fontSize);
    // Local time, broken down, and the platform's alarm error code.
    int GetCurrentTime(struct tm* currentTime);
    // Whether the platform knows the package.
    bool IsPackageInstalled(const char* packageName);

    // States as the connection enumerations number them.
    int GetCellularNetworkState();
    int GetWifiNetworkState();
    int GetBTNetworkState();

    // Whether slots 0 and 1 both hold an available card.
    bool IsDualSimAvailable();
    // As GetMCCFromSim(char**): the IMSI in one piece.
    int GetIMSIFromSim(char** imsi);

    // The answer of every slot that has one, in slot order, appended as `strdup` copies that the
    // caller frees. `count` is how many were appended; it is left as it was without telephony.
    void GetMCCFromSim(std::vector<char*>& mccs, int* count);
    void GetMNCFromSim(std::vector<char*>& mncs, int* count);
    void GetIMSIFromSim(std::vector<char*>& imsis, int* count);
    void GetPhoneNumberFromSim(std::vector<char*>& phoneNumbers, int* count);

    static CoreSystem* instance_;
};

#endif
