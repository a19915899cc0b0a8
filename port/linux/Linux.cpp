// SPDX-License-Identifier: Apache-2.0
// This machine's real services.
#include "../backend/Backend.h"
#include "../common/GLibTypes.h"
#include "BlueZ.h"
#include "Bus.h"
#include "Clock.h"
#include "Configuration.h"
#include "DeviceInfo.h"
#include "Environment.h"
#include "Files.h"
#include "Hostname1.h"
#include "Locale1.h"
#include "ModemManager.h"
#include "Network.h"
#include "NetworkManager.h"
#include "Packages.h"
#include "Settings.h"
#include "Storage.h"
#include "Telephony.h"

namespace port::linux_backend {
namespace {

using coresystem_port::Service;

class LinuxBackend : public Backend {
public:
    std::string name() const override
    {
        return "linux";
    }

    FactAnswer read(port::Question fact) override
    {
        switch (fact) {
#define FACT(number, question, ...) \
    case port::Question::question:  \
        return factAnswer(ask(PlainFact<port::Question::question>()));
#include "../facts/facts.def"
        default:
            return notSupported("no plain fact");
        }
    }

    Telephony& telephony() override
    {
        return telephony_;
    }
    Network& network() override
    {
        return network_;
    }
    Result<Sourced<VolumeSize>> internalStorage() override
    {
        return storage_.internal();
    }
    Result<Sourced<std::optional<std::string>>> packageVersion(const std::string& name) override
    {
        return packages_.version(name);
    }
    Result<Fact> configuration(const std::string& key) override
    {
        return configuration_.text(key);
    }
    Result<Sourced<std::tm>> now() override
    {
        return localTime(std::time(nullptr));
    }

    std::vector<Service> findServices() override
    {
        std::vector<Service> found = findOnBus({
            {HOSTNAME1, "device name, model name",
             "the device name is the kernel's host name, the model DMI's or the device tree's"},
            {LOCALE1, "language", "the language is that of LC_ALL, LC_MESSAGES or LANG"},
            {MODEM_MANAGER, "SIM cards, IMEI, roaming, the cellular network", "no telephony"},
            {NETWORK_MANAGER,
             "Wi-Fi, flight mode, mobile data, packet data, data roaming, the SIM card for data",
             "Wi-Fi and flight mode are the kernel's, nothing is known of cellular data"},
            {BLUEZ, "Bluetooth", "no Bluetooth"},
        });
        const std::vector<Service> onDisk = {
            file(OS_RELEASE, "platform name, platform version", "no platform name and version"),
            file(MACHINE_ID, "platform id", "no platform id"),
            file(HARDWARE_MODEL, "model name", "the model is hostname1's only"),
            probe(*SERIAL_NUMBER.begin(), deviceInfo_.serial(), "device serial",
                  "no device serial"),
            probe(DPKG_STATUS, packages_.version(""), "installed packages", "no package is known"),
        };
        found.insert(found.end(), onDisk.begin(), onDisk.end());
        found.push_back(
            probe("vconf.ini", configuration_.text(SALES_CODE), "sales code", "no sales code"));
        found.push_back(probe("GSettings", settings_.fontSize(), "font size", "no font size"));
        return found;
    }

private:
    // The source of each plain fact.
    Result<Fact> ask(PlainFact<port::Question::PlatformId>)
    {
        return deviceInfo_.platformId();
    }
    Result<Fact> ask(PlainFact<port::Question::PlatformName>)
    {
        return deviceInfo_.platformName();
    }
    Result<Fact> ask(PlainFact<port::Question::PlatformVersion>)
    {
        return deviceInfo_.platformVersion();
    }
    Result<Fact> ask(PlainFact<port::Question::ModelName>)
    {
        return deviceInfo_.modelName();
    }
    Result<Fact> ask(PlainFact<port::Question::DeviceSerial>)
    {
        return deviceInfo_.serial();
    }
    Result<Fact> ask(PlainFact<port::Question::DeviceName>)
    {
        return settings_.deviceName();
    }
    Result<Fact> ask(PlainFact<port::Question::Language>)
    {
        return settings_.language();
    }
    Result<Fact> ask(PlainFact<port::Question::SalesCode>)
    {
        return configuration_.text(SALES_CODE);
    }
    Result<Sourced<FontSize>> ask(PlainFact<port::Question::FontSize>)
    {
        return settings_.fontSize();
    }
    Result<Sourced<bool>> ask(PlainFact<port::Question::FlightMode>)
    {
        return network_.flightMode();
    }
    Result<Sourced<bool>> ask(PlainFact<port::Question::DataRoaming>)
    {
        return network_.dataRoaming();
    }
    Result<Sourced<bool>> ask(PlainFact<port::Question::MobileData>)
    {
        return network_.mobileData();
    }
    Result<Sourced<bool>> ask(PlainFact<port::Question::PacketData>)
    {
        return network_.packetData();
    }

    struct BusService {
        BusObject object;
        const char* serves;
        const char* consequence;
    };

    std::vector<Service> findOnBus(const std::vector<BusService>& services)
    {
        std::vector<BusObject> objects;
        objects.reserve(services.size());
        for (const BusService& service : services)
            objects.push_back(service.object);
        const std::vector<Result<std::string>> states = bus_.statesOf(objects);
        std::vector<Service> found;
        for (std::size_t i = 0; i < services.size(); ++i)
            found.push_back({objects[i].name, static_cast<bool>(states[i]),
                             states[i] ? states[i].value() : states[i].error().reason,
                             services[i].serves, services[i].consequence});
        return found;
    }

    static Service file(Places places, const char* serves, const char* consequence)
    {
        const Result<Fact> read = readFirst("", places);
        if (read)
            return {read.value().source, true, "readable", serves, consequence};
        return {*places.begin(), false, read.error().reason, serves, consequence};
    }

    // Something that only an answer tells of.
    template <typename T>
    static Service probe(const char* name, const Result<T>& answer, const char* serves,
                         const char* consequence)
    {
        return {answer ? answer.value().source : name, static_cast<bool>(answer),
                answer ? "readable" : answer.error().reason, serves, consequence};
    }

    Bus bus_{HOSTNAME1.name, LOCALE1.name, MODEM_MANAGER.name, NETWORK_MANAGER.name, BLUEZ.name};
    LinuxDeviceInfo deviceInfo_{bus_, ""};
    LinuxSettings settings_{bus_};
    LinuxTelephony telephony_{bus_};
    LinuxNetwork network_{bus_, ""};
    LinuxStorage storage_{dataFolder()};
    LinuxPackages packages_{""};
    LinuxConfiguration configuration_{configurationFiles()};
};

} // namespace
} // namespace port::linux_backend

std::unique_ptr<port::Backend> port::makeLinuxBackend()
{
    return std::make_unique<linux_backend::LinuxBackend>();
}
