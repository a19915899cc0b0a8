// SPDX-License-Identifier: Apache-2.0
// Any change of any text of a device file: what is not the value that is changed stays as it is.
//
// The input is a path, a line ending, "=" and a value or "-" for none, a line ending, and the text.
#include <algorithm>
#include <set>
#include <sstream>
#include <string>
#include <utility>
#include <vector>

#include "Fuzz.h"
#include "devicefile/DeviceFile.h"
#include "devicefile/DevicePath.h"
#include "devicefile/DeviceText.h"
#include "devicefile/Toml.h"

using namespace port::devicefile;

namespace {

const char FILE_NAME[] = "FILE";

// A leaf by the names on the way to it, as it is written.
using Leaf = std::pair<std::vector<std::string>, std::string>;

void collect(const toml::node& node, std::vector<std::string>& way, std::multiset<Leaf>& leaves)
{
    if (const toml::table* const table = node.as_table()) {
        for (const auto& [key, value] : *table) {
            way.emplace_back(key.str());
            collect(value, way, leaves);
            way.pop_back();
        }
    } else if (const toml::array* const list = node.as_array()) {
        for (std::size_t i = 0; i < list->size(); ++i) {
            way.push_back(std::to_string(i));
            collect(*list->get(i), way, leaves);
            way.pop_back();
        }
    } else {
        std::ostringstream written;
        node.visit([&](const auto& value) { written << value; });
        leaves.emplace(way, written.str());
    }
}

// The leaves of a text that are not the value of a path.
std::multiset<Leaf> others(const std::string& text, const DevicePath& path)
{
    std::multiset<Leaf> all;
    std::vector<std::string> way;
    collect(parseToml(text), way, all);
    std::multiset<Leaf> others;
    for (const Leaf& leaf : all)
        if (leaf.first.size() < path.size() ||
            !std::equal(path.begin(), path.end(), leaf.first.begin()))
            others.insert(leaf);
    return others;
}

std::size_t sameAtTheBeginning(const std::string& one, const std::string& other)
{
    const auto end = std::mismatch(
        one.begin(), one.begin() + static_cast<std::ptrdiff_t>(std::min(one.size(), other.size())),
        other.begin());
    return static_cast<std::size_t>(end.first - one.begin());
}

std::size_t sameAtTheEnd(const std::string& one, const std::string& other)
{
    return sameAtTheBeginning({one.rbegin(), one.rend()}, {other.rbegin(), other.rend()});
}

// Whether one is the other with one run of bytes more.
bool isLongerByOneRun(const std::string& longer, const std::string& shorter)
{
    return sameAtTheBeginning(longer, shorter) + sameAtTheEnd(longer, shorter) >= shorter.size() &&
           longer.size() >= shorter.size();
}

// Before the line that the value begins in nothing changes, and nothing behind it when it was one
// line.
void checkSpan(const std::string& before, const std::string& after, std::size_t line)
{
    std::size_t begin = 0;
    for (std::size_t i = 1; i < line; ++i)
        begin = before.find('\n', begin) + 1;
    require(sameAtTheBeginning(before, after) >= begin, "lines before the value stay", after);
}

void checkChange(const std::string& before, const std::string& after, const Edit& change)
{
    const DevicePath path = parsePath(change.path).value();
    const auto was = getValue(before, FILE_NAME, change.path);
    const auto is = getValue(after, FILE_NAME, change.path);
    require(others(before, path) == others(after, path), "every other value stays", after);
    require(static_cast<bool>(is) == change.value.has_value(), "the key is there or gone", after);
    if (!was || !is)
        require(isLongerByOneRun(was ? before : after, was ? after : before),
                "a key comes and goes as one run of bytes", after);
    if (!is)
        return;
    const auto again = changeText(after, FILE_NAME, {{change.path, is.value()}});
    require(again && getValue(again.value(), FILE_NAME, change.path).value() == is.value(),
            "a value that is got can be set", after);
    const auto entries = listEntries(before, FILE_NAME);
    if (was)
        for (const Entry& entry : entries.value())
            if (parsePath(entry.path()) && parsePath(entry.path()).value() == path)
                checkSpan(before, after, entry.line);
}

std::string takeLine(std::string& text)
{
    const std::size_t end = std::min(text.find('\n'), text.size());
    const std::string line = text.substr(0, end);
    text.erase(0, std::min(end + 1, text.size()));
    return line;
}

} // namespace

int LLVMFuzzerTestOneInput(const unsigned char* data, std::size_t size)
{
    std::string text(reinterpret_cast<const char*>(data), size);
    Edit change{takeLine(text), std::nullopt};
    const std::string value = takeLine(text);
    if (value.rfind('=', 0) == 0)
        change.value = value.substr(1);
    const auto changed = changeText(text, FILE_NAME, {change});
    if (changed)
        checkChange(text, changed.value(), change);
    else
        require(!changed.error().reason.empty(), "what cannot be changed has a reason");
    return 0;
}
