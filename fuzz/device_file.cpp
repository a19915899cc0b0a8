// SPDX-License-Identifier: Apache-2.0
// Any bytes as a device file: the reader takes them or says where they are wrong.
#include <regex>
#include <set>
#include <string>

#include "Fuzz.h"
#include "simulator/DeviceFile.h"

using namespace port::simulator;

namespace {

// On one line, with the place in the file, and without what a terminal would act on.
void checkReason(const std::string& reason)
{
    static const std::regex form("FILE:[0-9]+:[0-9]+: [^\\x00-\\x1f\\x7f]+");
    require(std::regex_match(reason, form), "the message is one line with its place", reason);
}

// What the simulator builds on.
void checkDevice(const Device& device)
{
    std::set<std::string> modems;
    for (const Section& slot : device.slots)
        require(modems.insert(slot.get<std::string>("cp_name").value().value).second,
                "every slot has a name of its own");
    for (const SectionRow* row = beginSections(); row != endSections(); ++row)
        if (row->form != Form::List)
            for (const std::string& key : keyNames(*row))
                device.section(std::string(row->name)).find(key);
}

} // namespace

int LLVMFuzzerTestOneInput(const unsigned char* data, std::size_t size)
{
    const std::string text(reinterpret_cast<const char*>(data), size);
    const auto device = parseDevice(text, "FILE");
    if (device)
        checkDevice(device.value());
    else
        checkReason(device.error().reason);
    return 0;
}
