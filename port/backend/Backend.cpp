// SPDX-License-Identifier: Apache-2.0
#include "Backend.h"

#include <atomic>
#include <cstdlib>

namespace {

std::unique_ptr<port::Backend> chooseBackend()
{
    const char* const deviceFile = secure_getenv("CORESYSTEM_DEVICE");
    if (deviceFile != nullptr && *deviceFile != '\0')
        return port::makeSimulatorBackend(deviceFile);
    return port::makeLinuxBackend();
}

std::atomic<port::Backend*> substitute{nullptr};

} // namespace

port::Backend& port::backend()
{
    if (Backend* const other = substitute)
        return *other;
    // Never destroyed: a thread may still ask while the process ends.
    static Backend& chosen = *chooseBackend().release();
    return chosen;
}

port::Backend* port::substituteBackend(Backend* other)
{
    return substitute.exchange(other);
}

std::string coresystem_port::backendName()
{
    return port::backend().name();
}

std::string coresystem_port::deviceFile()
{
    return port::backend().deviceFile();
}

std::string coresystem_port::deviceFileProblem()
{
    return port::backend().deviceFileProblem();
}

std::vector<coresystem_port::Service> coresystem_port::findServices()
{
    return port::backend().findServices();
}
