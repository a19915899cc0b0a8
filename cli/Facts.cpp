// SPDX-License-Identifier: Apache-2.0
#include "Facts.h"

#include <algorithm>
#include <cstdlib>
#include <iterator>

#include <coresystem_port.h>

#include "Session.h"

namespace {

using coresystem_port::Question;

int readLanguageCode(CoreSystem& library, char** slot)
{
    return library.GetDeviceLanguageCode(slot, false);
}

int readLanguageCodeIso(CoreSystem& library, char** slot)
{
    return library.GetDeviceLanguageCode(slot, true);
}

template <int (CoreSystem::*method)(char**)>
int read(CoreSystem& library, char** slot)
{
    return (library.*method)(slot);
}

struct FactRow {
    const char* name;
    Question question;
    int (*read)(CoreSystem& library, char** slot);
    const char* toldOnFailure; // what applications get when the platform does not answer
};

constexpr FactRow FACTS[] = {
    {"device_name", Question::DeviceName, read<&CoreSystem::GetDeviceName>, nullptr},
    {"tizen_id", Question::PlatformId, read<&CoreSystem::GetTizenIdN>, nullptr},
    {"platform_name", Question::PlatformName, read<&CoreSystem::GetPlatformName>, nullptr},
    {"sw_version", Question::PlatformVersion, read<&CoreSystem::GetSWVersion>, nullptr},
    {"model_name", Question::ModelName, read<&CoreSystem::GetModelName>, nullptr},
    {"language_code", Question::Language, readLanguageCode, "EN"},
    {"language_code_iso639_2", Question::Language, readLanguageCodeIso, "eng"},
};

struct Answer {
    int code;
    std::optional<std::string> text;
};

Answer ask(const FactRow& row)
{
    char* slot = nullptr;
    const int code = row.read(cli::library(), &slot);
    Answer answer{code, std::nullopt};
    if (slot != nullptr)
        answer.text = slot;
    std::free(slot);
    return answer;
}

std::string reasonOfFailure(const FactRow& row, int code)
{
    std::string reason = coresystem_port::lastOrigin(row.question).reason;
    if (reason.empty())
        reason = "the platform answered with error " + std::to_string(code);
    if (row.toldOnFailure != nullptr)
        reason += std::string("; applications are told ") + row.toldOnFailure;
    return reason;
}

// The read succeeded, yet the library left the slot empty.
std::string reasonOfSilence(const FactRow& row)
{
    if (row.read != readLanguageCodeIso)
        return "out of memory";
    char* slot = nullptr;
    readLanguageCode(cli::library(), &slot);
    const std::string language = slot != nullptr ? slot : "";
    std::free(slot);
    return "the language table has no ISO 639-2 code for \"" + language + "\"";
}

const FactRow& rowOf(const std::string& name)
{
    return *std::find_if(std::begin(FACTS), std::end(FACTS),
                         [&](const FactRow& row) { return row.name == name; });
}

} // namespace

std::vector<std::string> cli::factNames()
{
    std::vector<std::string> names;
    for (const FactRow& row : FACTS)
        names.push_back(row.name);
    return names;
}

cli::Fact cli::askFact(const std::string& name)
{
    const FactRow& row = rowOf(name);
    const Answer answer = ask(row);
    // After a failed read the slot holds a default or nothing, never the device's own answer.
    if (answer.code != 0)
        return {name, std::nullopt, "", reasonOfFailure(row, answer.code)};
    if (!answer.text)
        return {name, std::nullopt, "", reasonOfSilence(row)};
    return {name, answer.text, coresystem_port::lastOrigin(row.question).source, ""};
}
