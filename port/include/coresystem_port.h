// SPDX-License-Identifier: Apache-2.0
/// \file
/// Information about the port itself: which backend answers, where an answer came from, what is
/// missing.
///
/// Facts about the device are asked of CoreSystem, not here. Every function may be called from any
/// thread and none throws anything but std::bad_alloc.
#ifndef CORESYSTEM_PORT_H
#define CORESYSTEM_PORT_H

#include <functional>
#include <memory>
#include <string>
#include <vector>

#define CORESYSTEM_PORT_API __attribute__((visibility("default")))

namespace coresystem_port {

/// The questions that the platform is asked.
enum class Question {
    DeviceName,
    PlatformId,
    PlatformName,
    PlatformVersion,
    ModelName,
    Language,
    FontSize,
    FlightMode,
    DataRoaming,
    PacketData,
    MobileData,
    Cellular,
    Wifi,
    Bluetooth,
    SalesCode,
    CurrentTime,
    Storage,
    PackageVersion, ///< of the package that was asked for last
    SimSlots,
    SimCard, ///< this and what follows: of the slot that was asked last
    SimIdentity,
    PhoneNumber,
    Imei,
    NetworkService,
    Roaming,
    SmsReadiness,
    Subscriptions,
    DeviceSerial,
    Ethernet,
    Connectivity,
    Ssid,
    OperatorName,
    OperatorMcc,
    OperatorMnc,
    AccessTechnology,
    SignalStrength,
    PowerState,
    PinTries,
    Iccid,
};

/// Where an answer came from, or why there was none.
struct Origin {
    bool available = false;
    std::string source; ///< the service or file that served the answer; empty when there was none
    std::string reason; ///< why there was no answer; empty when there was one
    bool isMissing = false; ///< there was none because this device has no such thing
};

/// The origin of the last answer to a question in this process; neither source nor reason when it
/// was not asked yet.
CORESYSTEM_PORT_API Origin lastOrigin(Question question);

/// Collects where answers come from: of those that are given on this thread while it lives, so that
/// a call and its origins belong together whatever other threads ask. One inside another is told
/// too. It must end on the thread that made it, the inner one first.
class CORESYSTEM_PORT_API Origins {
public:
    Origins();
    ~Origins();
    Origins(const Origins&) = delete;
    Origins& operator=(const Origins&) = delete;

    /// The origin of the last answer to a question since; neither source nor reason when it was not
    /// asked.
    Origin of(Question question) const;

private:
    friend struct OriginsAccess;
    struct Collected;
    std::unique_ptr<Collected> collected_;
};

/// Tells, while it lives, whenever something that the backend answers may have changed.
class CORESYSTEM_PORT_API Changes {
public:
    /// `changed` is called on a thread of the port's own, one call at a time, after the connection
    /// events of the change were sent on their way; once for several changes that come together.
    /// It may ask anything, and must not throw, nor set or remove a listener.
    explicit Changes(std::function<void()> changed);
    /// Waits for a call that runs; not from inside one.
    ~Changes();
    Changes(const Changes&) = delete;
    Changes& operator=(const Changes&) = delete;

    /// False when changes cannot be watched here: then it never tells.
    bool areWatched() const;

private:
    struct Observed;
    std::unique_ptr<Observed> observed_;
};

/// The backend that answers: "linux" (this machine's services) or "simulator" (a device file).
CORESYSTEM_PORT_API std::string backendName();

/// The device file that the simulator reads; empty with another backend.
CORESYSTEM_PORT_API std::string deviceFile();

/// The mistake in the device file now, as FILE:LINE:COLUMN: text where a place is known; empty
/// when it is good or another backend answers.
CORESYSTEM_PORT_API std::string deviceFileProblem();

/// An answer of the backend itself.
struct Answer {
    enum class Kind { Text, Number, Switch };

    std::string word; ///< as a device file says it: "connected", "75", "true"; "not_supported"
                      ///< where this device has no such thing; empty when there is no answer
    Origin origin;    ///< "not_supported" has a reason, and no source
    Kind kind = Kind::Text; ///< of the word of an answer
};

/// Asks the backend, and not CoreSystem, which puts several of them together or knows none of them:
/// for a plain fact (docs/facts.md); for Cellular, Wifi, Bluetooth, Ethernet, Connectivity or Ssid;
/// for what askModem() tells, of the modem over which data goes, else of the first one with
/// service, else of the first one. Waits at most 2 seconds. Other questions have no answer
/// here.
CORESYSTEM_PORT_API Answer ask(Question question);

/// Asks the backend about the modem of one SIM slot, for OperatorName, OperatorMcc, OperatorMnc,
/// AccessTechnology, SignalStrength, PowerState, PinTries or Iccid. The answers are in the order of
/// the questions, and of one moment. `modem` is a name as CoreSystem::GetCpNameList() gives it; of
/// another one nothing is known. Waits at most 2 seconds for Iccid, and as long for all others.
CORESYSTEM_PORT_API std::vector<Answer> askModem(const std::string& modem,
                                                 const std::vector<Question>& questions);

/// Something that the backend draws on.
struct Service {
    std::string name;
    bool found = false;
    std::string state;       ///< "running", "starts on demand", or why it is not found
    std::string serves;      ///< what it answers
    std::string consequence; ///< what its absence takes away
};

/// Looks for everything that the backend draws on. Waits for an unresponsive bus at most 2 seconds.
CORESYSTEM_PORT_API std::vector<Service> findServices();

/// Options of captureDevice().
struct CaptureOptions {
    bool reveal = false;               ///< who the device and its user are, too
    std::vector<std::string> packages; ///< those whose versions are wanted
};

/// The device as the backend tells of it now, as the text of a device file: each fact with a
/// comment where it came from, each that is missing with the reason. What identifies the device or
/// its user is as many zeros unless it is to be revealed. May take as long as the slowest service.
CORESYSTEM_PORT_API std::string captureDevice(const CaptureOptions& options);

/// Where log lines go.
enum class LogSink {
    Automatic,     ///< the journal when its socket is there, else standard error
    StandardError, ///< standard error, whatever is there
    None,          ///< nowhere: lines are not even formatted
};

/// Sets where the log lines of this process go from now on; Automatic at start.
CORESYSTEM_PORT_API void setLogSink(LogSink sink);

/// Where LogSink::Automatic leads now: "journal" or "standard error".
CORESYSTEM_PORT_API std::string automaticLogSink();

} // namespace coresystem_port

#endif
