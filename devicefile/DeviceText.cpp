// SPDX-License-Identifier: Apache-2.0
#include "DeviceText.h"

#include <algorithm>
#include <functional>
#include <map>
#include <memory>
#include <set>
#include <sstream>

#include "Closest.h"
#include "DeviceFile.h"
#include "DevicePath.h"
#include "Schema.h"
#include "TextDocument.h"

namespace port::devicefile {
namespace {

bool isListOfTables(const toml::node& node)
{
    const toml::array* const list = node.as_array();
    return list != nullptr && (list->empty() || list->is_homogeneous(toml::node_type::table));
}

std::string below(const std::string& path, const std::string& key)
{
    return path.empty() ? key : path + "." + key;
}

std::string element(const std::string& path, std::size_t index)
{
    return path + "[" + std::to_string(index) + "]";
}

using Visitor = std::function<void(const std::string& path, const toml::node& node)>;

// Calls for every value and for every list of tables, deep in both.
void visitValues(const std::string& path, const toml::node& node, const Visitor& visit)
{
    if (const toml::table* const table = node.as_table()) {
        for (const auto& [name, child] : *table)
            visitValues(below(path, writtenKey(std::string(name.str()))), child, visit);
        return;
    }
    visit(path, node);
    if (isListOfTables(node))
        for (std::size_t i = 0; i < node.as_array()->size(); ++i)
            visitValues(element(path, i), *node.as_array()->get(i), visit);
}

std::string formatted(const toml::node& node, toml::format_flags flags)
{
    std::ostringstream stream;
    stream << toml::toml_formatter{node, flags};
    return stream.str();
}

std::string inQuotes(const std::string& text)
{
    return formatted(toml::value<std::string>{text}, toml::format_flags::allow_unicode_strings);
}

// In the quotes that the old one has, where it can be.
std::string inQuotesLike(std::string_view old, const std::string& text)
{
    const bool isLiteral = old.substr(0, 1) == "'" && old.substr(0, 3) != "'''";
    const auto needsEscape = [](unsigned char c) { return c == '\'' || c < ' ' || c == 0x7F; };
    if (isLiteral && std::none_of(text.begin(), text.end(), needsEscape))
        return "'" + text + "'";
    return inQuotes(text);
}

// Whether a text is one value of TOML and nothing else, on one line.
bool isValue(const std::string& text)
{
    if (text.size() > LINE_LIMIT) // bounds how deep it nests
        return false;
    try {
        const toml::table table = parseToml("v=" + text);
        return text.find('\n') == std::string::npos && table.size() == 1 &&
               table.get("v")->source().end.column == charactersOf(text) + 3;
    } catch (const TomlError&) { // plain text then
        return false;
    }
}

const toml::node* childOf(const toml::node& node, const std::string& word)
{
    if (const toml::table* const table = node.as_table())
        return table->get(word);
    const toml::array* const list = node.as_array();
    const auto index = indexOf(word);
    return list != nullptr && index && *index < list->size() ? list->get(*index) : nullptr;
}

// How far a path leads.
struct Walk {
    const toml::node* node; // the last one that is there
    std::size_t steps = 0;
};

Walk follow(const toml::table& root, const DevicePath& path)
{
    Walk walk{&root};
    while (walk.steps < path.size()) {
        const toml::node* const child = childOf(*walk.node, path[walk.steps]);
        if (child == nullptr)
            break;
        walk.node = child;
        ++walk.steps;
    }
    return walk;
}

const toml::node* find(const toml::table& root, const DevicePath& path)
{
    const Walk walk = follow(root, path);
    return walk.steps == path.size() ? walk.node : nullptr;
}

bool isInList(const DevicePath& path)
{
    const SectionRow* const section = findSection(path.front());
    return section != nullptr && section->form == Form::List && path.size() > 2;
}

// The content as text: every value, and the length of each list.
using Values = std::map<std::string, std::string>;

Values valuesOf(const toml::table& root)
{
    Values values;
    visitValues("", root, [&values](const std::string& path, const toml::node& node) {
        values[path] = isListOfTables(node) ? std::to_string(node.as_array()->size())
                                            : formatted(node, toml::format_flags::none);
    });
    return values;
}

// Takes what a path leads to out of the values.
Values extract(Values& values, const std::string& path)
{
    Values taken;
    for (auto row = values.begin(); row != values.end();) {
        const std::string& name = row->first;
        const bool isBelow = name.compare(0, path.size(), path) == 0 &&
                             (name.size() == path.size() || name[path.size()] == '.');
        if (isBelow)
            taken[name.substr(path.size())] = row->second;
        row = isBelow ? values.erase(row) : std::next(row);
    }
    return taken;
}

// The path as valuesOf() has it.
std::string shownPath(const DevicePath& path)
{
    const bool hasIndex = isInList(path);
    std::string shown = writtenKey(path.front());
    for (std::size_t i = 1; i < path.size(); ++i)
        shown.append(hasIndex && i == 1 ? "[" + path[i] + "]" : "." + writtenKey(path[i]));
    return shown;
}

using Text = Result<std::string>;

// One change in a text, with all that is known of it.
class Editing {
public:
    Editing(const std::string& text, DevicePath path, std::optional<std::string> value)
        : document_(text), path_(std::move(path)), value_(std::move(value)),
          walk_(follow(document_.root(), path_))
    {
    }

    // The text that stands there now.
    std::string_view old() const
    {
        return isThere() && !walk_.node->is_table() ? document_.textOf(*walk_.node) : "";
    }

    /// `value`: as it is to be written.
    Text make() const
    {
        if (!value_ && !isThere())
            return notAvailable("it is not there");
        const Text changed = !value_ ? removed() : isThere() ? replaced() : added();
        if (!changed || isRight(changed.value()))
            return changed;
        return notAvailable("the file is written in a way that this cannot be done in; edit it by "
                            "hand");
    }

private:
    bool isThere() const
    {
        return walk_.steps == path_.size();
    }

    // A section or a list of sections, rather than a value.
    static bool isSection(const toml::node& node)
    {
        return (node.is_table() && !node.as_table()->is_inline()) || isListOfTables(node);
    }

    Text replaced() const
    {
        if (isSection(*walk_.node))
            return notAvailable("it is a section");
        return document_.withValue(*walk_.node, *value_);
    }

    Text removed() const
    {
        const toml::node& parent =
            *find(document_.root(), DevicePath(path_.begin(), path_.end() - 1));
        if (!parent.is_table() || isSection(*walk_.node))
            return notAvailable("it is a section");
        return document_.withoutKey(*parent.as_table(), path_.back());
    }

    Text added() const
    {
        const bool needsKeyOnly = walk_.steps + 1 == path_.size();
        if (walk_.node->is_table() && needsKeyOnly)
            return document_.withKey(*walk_.node->as_table(), path_.back(), *value_);
        if (walk_.steps == 0)
            return addedSection();
        if (isListOfTables(*walk_.node) && walk_.steps + 2 == path_.size())
            return addedElement(*walk_.node->as_array());
        return notAvailable("there is no " + shownPath({path_.begin(), path_.end() - 1}));
    }

    Text addedSection() const
    {
        if (path_.size() != (isInList(path_) ? 3 : 2))
            return notAvailable("there is no " + shownPath({path_.begin(), path_.end() - 1}));
        if (isInList(path_) && path_[1] != "0")
            return notAvailable("the first one is " + element(path_.front(), 0));
        return document_.withSection(header(), path_.back(), *value_);
    }

    Text addedElement(const toml::array& list) const
    {
        if (path_[1] != std::to_string(list.size()))
            return notAvailable("the next one would be " + element(path_.front(), list.size()));
        return document_.withElement(list, header(), path_.back(), *value_);
    }

    std::string header() const
    {
        const std::string name = writtenKey(path_.front());
        return isInList(path_) ? "[[" + name + "]]" : "[" + name + "]";
    }

    // Whether the text says just what it is to say.
    bool isRight(const std::string& text) const
    {
        if (text.empty())
            return false;
        Values before = valuesOf(document_.root());
        Values after = valuesOf(parseToml(text));
        const std::string path = shownPath(path_);
        extract(before, path);
        const Values taken = extract(after, path);
        if (value_ && !isThere() && isInList(path_) && walk_.steps < 2)
            before[path_.front()] = std::to_string(std::stoul(path_[1]) + 1); // one more now
        return before == after && taken == wanted();
    }

    Values wanted() const
    {
        Values values;
        if (value_) {
            values = valuesOf(parseToml("v=" + *value_));
            values = extract(values, "v");
        }
        return values;
    }

    const TextDocument document_;
    const DevicePath path_;
    const std::optional<std::string> value_;
    const Walk walk_;
};

using Mistakes = std::multiset<std::string>;

Mistakes mistakesOf(const std::string& text, const std::string& file)
{
    Mistakes mistakes;
    for (const Problem& problem : readDevice(text, file).problems)
        mistakes.insert(problem.text);
    if (text.size() > SIZE_LIMIT)
        mistakes.insert("the file would have more than " + std::to_string(SIZE_LIMIT) + " bytes");
    return mistakes;
}

// A mistake that was not there before; empty when there is none.
std::string newMistake(const Mistakes& before, const Mistakes& after)
{
    std::vector<std::string> more;
    std::set_difference(after.begin(), after.end(), before.begin(), before.end(),
                        std::back_inserter(more));
    return more.empty() ? "" : more.front();
}

// The same value in quotes and, where it can be, as it is: what its key does not want is a mistake.
Text setValue(const std::string& text, const std::string& file, const DevicePath& path,
              const std::string& value)
{
    const std::string old(Editing(text, path, value).old());
    const std::string inQuotes = inQuotesLike(old, value);
    if (parseToml("v=" + inQuotes)["v"].value<std::string>() != value)
        return notAvailable("the value is no UTF-8");
    Text best = Editing(text, path, inQuotes).make();
    if (!best || !isValue(value))
        return best;
    Text plain = Editing(text, path, value).make();
    const bool isBetter =
        plain && mistakesOf(plain.value(), file).size() < mistakesOf(best.value(), file).size();
    return isBetter ? plain : best;
}

Text applied(const std::string& text, const std::string& file, const Edit& change)
{
    const Result<DevicePath> path = parsePath(change.path);
    if (!path)
        return path.error();
    try {
        return change.value ? setValue(text, file, path.value(), *change.value)
                            : Editing(text, path.value(), {}).make();
    } catch (const TomlError& error) { // of a value that is no UTF-8, say
        return notAvailable(error.what());
    }
}

// The paths that a file may have; in a list those of the same index.
std::vector<std::string> knownPaths(const DevicePath& like)
{
    const std::string index = "[" + (like.size() > 2 ? like[1] : "0") + "].";
    std::vector<std::string> paths;
    for (const SectionRow* row = beginSections(); row != endSections(); ++row)
        for (const std::string& key : keyNames(*row))
            paths.push_back(
                std::string(row->name).append(row->form == Form::List ? index : ".").append(key));
    return paths;
}

bool isKnown(const DevicePath& path)
{
    const SectionRow* const section = findSection(path.front());
    const std::size_t key = section != nullptr && section->form == Form::List ? 2 : 1;
    return section != nullptr && path.size() > key && findKey(*section, path[key]) != nullptr;
}

Error cannot(const Edit& change, const std::string& why)
{
    return notAvailable(change.path + " cannot be " + (change.value ? "set" : "removed") + ": " +
                        why);
}

Error missing(const std::string& file, const std::string& path, const DevicePath& words)
{
    const std::string meant = isKnown(words) ? "" : similar(path, knownPaths(words));
    return notAvailable(file + " has no " + path +
                        (meant.empty() ? "" : "; did you mean \"" + meant + "\"?"));
}

// Why a text cannot be worked on; empty when it can be.
std::string refusal(const std::string& text, const std::string& file)
{
    const Reading reading = readDevice(text, file);
    return reading.isToml ? "" : describe(file, reading.problems.front());
}

decltype(Entry::value) contentOf(const TextDocument& document, const toml::node& node)
{
    if (const auto text = node.value_exact<std::string>())
        return *text;
    if (const auto flag = node.value_exact<bool>())
        return *flag;
    if (const auto number = node.value_exact<std::int64_t>())
        return *number;
    return std::string(document.textOf(node));
}

std::string plainText(const decltype(Entry::value)& value)
{
    if (const auto* const text = std::get_if<std::string>(&value))
        return *text;
    if (const auto* const flag = std::get_if<bool>(&value))
        return *flag ? "true" : "false";
    return std::to_string(std::get<std::int64_t>(value));
}

class EntryList {
public:
    explicit EntryList(const std::string& text) : document_(text)
    {
        for (const auto& [name, node] : document_.root())
            addSection(writtenKey(std::string(name.str())), node);
    }

    std::vector<Entry> sorted()
    {
        std::stable_sort(places_.begin(), places_.end(), [](const Row& left, const Row& right) {
            return left.first < right.first;
        });
        std::vector<Entry> entries;
        for (Row& row : places_)
            entries.push_back(std::move(row.second));
        return entries;
    }

private:
    using Row = std::pair<toml::source_position, Entry>;

    void addSection(const std::string& name, const toml::node& node)
    {
        if (isListOfTables(node))
            for (std::size_t i = 0; i < node.as_array()->size(); ++i)
                addSection(element(name, i), *node.as_array()->get(i));
        else if (node.is_table())
            visitValues("", node, [&](const std::string& key, const toml::node& value) {
                if (!isListOfTables(value))
                    add(name, key, value);
            });
        else
            add("", name, node);
    }

    void add(const std::string& section, const std::string& key, const toml::node& node)
    {
        const toml::source_position place = node.source().begin;
        places_.push_back({place, {section, key, contentOf(document_, node), place.line}});
    }

    const TextDocument document_;
    std::vector<Row> places_;
};

} // namespace

Result<std::vector<Entry>> listEntries(const std::string& text, const std::string& file)
{
    if (const std::string why = refusal(text, file); !why.empty())
        return notAvailable(why);
    return EntryList(text).sorted();
}

Result<std::string> getValue(const std::string& text, const std::string& file,
                             const std::string& path)
{
    const Result<DevicePath> words = parsePath(path);
    if (!words)
        return notAvailable(path + ": " + words.error().reason);
    if (const std::string why = refusal(text, file); !why.empty())
        return notAvailable(why);
    const TextDocument document(text);
    const toml::node* const node = find(document.root(), words.value());
    if (node == nullptr)
        return missing(file, path, words.value());
    if (node->is_table() && !node->as_table()->is_inline())
        return notAvailable(path + " is a section");
    return plainText(contentOf(document, *node));
}

Result<std::string> changeText(const std::string& text, const std::string& file,
                               const std::vector<Edit>& changes)
{
    if (const std::string why = refusal(text, file); !why.empty())
        return notAvailable(why);
    std::string changed = text;
    for (const Edit& change : changes) {
        const Text next = applied(changed, file, change);
        if (!next)
            return cannot(change, next.error().reason);
        changed = next.value();
    }
    // At last only: two changes may be right together.
    const std::string why = newMistake(mistakesOf(text, file), mistakesOf(changed, file));
    if (why.empty())
        return changed;
    return changes.size() == 1 ? cannot(changes.front(), why) : notAvailable(why);
}

} // namespace port::devicefile
