// SPDX-License-Identifier: Apache-2.0
// Any bytes as a device file: the reader takes them or says where they are wrong.
#include <algorithm>
#include <cstdio>
#include <set>
#include <string>

#include "Fuzz.h"
#include "devicefile/DeviceFile.h"

using namespace port::devicefile;

namespace {

// On one line, with the place in the file, and without what a terminal would act on.
void checkReason(const std::string& reason)
{
    unsigned line = 0;
    unsigned column = 0;
    int text = 0;
    std::sscanf(reason.c_str(), "FILE:%u:%u: %n", &line, &column, &text);
    const bool isOneLine = std::none_of(reason.begin(), reason.end(), [](unsigned char byte) {
        return byte < 0x20 || byte == 0x7f;
    });
    require(line > 0 && column > 0 && text > 0 && isOneLine,
            "the message is one line with its place", reason);
}

// Checks the properties that the simulator relies on.
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
