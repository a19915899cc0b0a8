// SPDX-License-Identifier: Apache-2.0
/// \file
/// The public interface of the library: one class that answers questions about the device.
#ifndef CORESYSTEM_CORE_SYSTEM_H
#define CORESYSTEM_CORE_SYSTEM_H

#include <string>

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

    /// \}
    /// \name Display language
    /// \{

    /// The display language as a short code.
    /// \param[out] languageCode without conversion the language part of the setting in upper case
    /// ("EN"
    ///             for en_US.UTF-8; the whole value when it has no "_"); with conversion its ISO
    ///             639-2 code in lower case ("eng"), or left as it was when the table has no such
    ///             language.
    /// \param convertToISO639 whether to convert to ISO 639-2.
    /// \return 0, or the system settings error of the read (see GetDeviceName()); after a failed
    /// read
    ///         `languageCode` is that of the default language, "EN" or "eng".
    CORESYSTEM_API int GetDeviceLanguageCode(char** languageCode, bool convertToISO639);

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

    static CoreSystem* instance_;
};

#endif
