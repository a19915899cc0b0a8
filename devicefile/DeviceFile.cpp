// SPDX-License-Identifier: Apache-2.0
#include "DeviceFile.h"

#include <algorithm>
#include <cctype>
#include <limits>
#include <optional>
#include <set>
#include <sstream>
#include <tuple>

#include <gio/gio.h>
#include <unistd.h>

#include "../port/backend/Telephony.h"
#include "../port/common/RegularFile.h"
#include "Closest.h"
#include "DevicePath.h"
#include "TextPlaces.h"
#include "Toml.h"

namespace port::devicefile {
namespace {

constexpr long SCHEMA = 1;

// In quotes and on one line, whatever it holds.
std::string inQuotes(std::string_view name)
{
    const toml::value<std::string> text{std::string(name)};
    std::ostringstream stream;
    stream << toml::toml_formatter{text, toml::format_flags::none};
    return stream.str();
}

// Suggests the known name that was meant by an unknown one. A text that is much longer
// than all of them was meant to be none, and costs much to compare.
constexpr std::size_t LONGEST_NAME = 64;

std::string hint(std::string_view name, const std::vector<std::string>& known)
{
    if (name.size() > LONGEST_NAME)
        return "";
    const std::string meant = similar(std::string(name), known);
    return meant.empty() ? "" : "; did you mean " + inQuotes(meant) + "?";
}

using Content = decltype(Value::content);

bool areDigits(std::string_view text)
{
    return text.find_first_not_of("0123456789") == std::string_view::npos;
}

// As a card holds it (3GPP TS 31.102, EF_MSISDN): at most 20 digits, * and #, after a plus sign.
bool isNumber(std::string_view text)
{
    if (text.substr(0, 1) == "+")
        text.remove_prefix(1);
    return !text.empty() && text.size() <= 20 &&
           text.find_first_not_of("0123456789*#") == std::string_view::npos;
}

// A name of two parts or more, as the bus wants it (D-Bus specification, "Error names").
bool isBusErrorName(const std::string& text)
{
    return g_dbus_is_interface_name(text.c_str()) != FALSE;
}

bool isFault(const Type& type)
{
    return type.kind == Type::Kind::Fault || type.kind == Type::Kind::BusFault;
}

bool isWithin(const Type& type, std::int64_t number)
{
    return type.least <= number && number <= type.most;
}

bool fits(const Type& type, const std::string& text)
{
    const auto size = static_cast<std::int64_t>(text.size());
    return size >= type.least && (type.most < type.least || size <= type.most);
}

std::vector<std::string> sectionNames()
{
    std::vector<std::string> names;
    for (const SectionRow* row = beginSections(); row != endSections(); ++row)
        names.emplace_back(row->name);
    return names;
}

std::vector<std::string> namesOf(const Type& type)
{
    std::vector<std::string> names;
    for (const Name& row : type.names)
        names.emplace_back(row.name);
    return names;
}

// "one of" that a person may write, in the order of the schema.
std::string listOf(const Names& names)
{
    std::string list;
    for (const Name& row : names)
        list += (list.empty() ? "" : ", ") + inQuotes(row.name);
    return list;
}

std::string rangeOf(const Type& type)
{
    if (type.most >= std::numeric_limits<int>::max())
        return "from " + std::to_string(type.least);
    return "from " + std::to_string(type.least) + " to " + std::to_string(type.most);
}

std::string countOf(const Type& type)
{
    return (type.least == type.most ? "" : std::to_string(type.least) + " to ") +
           std::to_string(type.most);
}

// Tells the writer of a key which values it takes.
std::string expected(const Type& type)
{
    switch (type.kind) {
    case Type::Kind::Text:
        if (type.most >= type.least)
            return "a text of " + countOf(type) + " bytes in quotes";
        return type.least > 0 ? "a text in quotes that is not empty" : "a text in quotes";
    case Type::Kind::Digits:
        return countOf(type) + " digits in quotes";
    case Type::Kind::Number:
        return "a phone number in quotes, or \"null\"";
    case Type::Kind::Switch:
        return "true or false";
    case Type::Kind::Whole:
        return "a whole number " + rangeOf(type);
    case Type::Kind::Changes:
        return "a table of paths and their values";
    case Type::Kind::Paths:
        return "a list of paths in quotes";
    case Type::Kind::BusFault:
        return listOf(type.names) + ", or an error name of D-Bus in quotes";
    case Type::Kind::Fault:
    case Type::Kind::Name:
        break;
    }
    return "one of " + listOf(type.names) +
           (type.most < type.least ? "" : ", or a whole number " + rangeOf(type));
}

std::optional<Meaning> meaningOf(const Names& names, std::string_view text)
{
    for (const Name& row : names)
        if (row.name == text)
            return row.meaning;
    return std::nullopt;
}

// A fault that is written as its error alone.
std::optional<Content> readFault(const Type& type, const std::string& text)
{
    const auto meaning = meaningOf(type.names, text);
    if (!meaning && !(type.kind == Type::Kind::BusFault && isBusErrorName(text)))
        return std::nullopt;
    return Fault{text, meaning.value_or(Meaning::Kind::BusError)};
}

std::optional<Content> readText(const Type& type, const std::string& text)
{
    switch (type.kind) {
    case Type::Kind::Digits:
        return areDigits(text) && isWithin(type, static_cast<std::int64_t>(text.size()))
                   ? std::optional<Content>(text)
                   : std::nullopt;
    case Type::Kind::Number:
        if (text == "null") // the platform succeeds without a number
            return std::string();
        return isNumber(text) ? std::optional<Content>(text) : std::nullopt;
    case Type::Kind::Name:
        return meaningOf(type.names, text);
    case Type::Kind::Fault:
    case Type::Kind::BusFault:
        return readFault(type, text);
    case Type::Kind::Text:
        return fits(type, text) ? std::optional<Content>(text) : std::nullopt;
    default:
        return std::nullopt;
    }
}

// Nothing when the node is not of the type.
std::optional<Content> readNode(const Type& type, const toml::node& node)
{
    if (const auto text = node.value_exact<std::string>())
        return readText(type, *text);
    if (const auto flag = node.value_exact<bool>(); flag && type.kind == Type::Kind::Switch)
        return *flag;
    if (const auto number = node.value_exact<std::int64_t>();
        number && (type.kind == Type::Kind::Whole || type.kind == Type::Kind::Name) &&
        isWithin(type, *number))
        return *number;
    return std::nullopt;
}

// None when it is no path.
DevicePath pathIn(std::string_view text)
{
    const auto path = parsePath(std::string(text));
    return path ? path.value() : DevicePath();
}

std::string noPath(std::string_view text)
{
    return inQuotes(text) + " must be a path like settings.flight_mode or slot.0.sim";
}

bool isWhole(const SectionRow& section, const DevicePath& path)
{
    return path.size() == (section.form == Form::List ? 3 : 2);
}

std::string writtenPath(const DevicePath& path)
{
    std::string text;
    for (const std::string& name : path)
        text += (text.empty() ? "" : ".") + writtenKey(name);
    return text;
}

// As changeText() takes it.
std::string plainText(const toml::node& node)
{
    if (const auto text = node.value_exact<std::string>())
        return *text;
    std::ostringstream stream;
    if (const toml::table* const table = node.as_table()) {
        toml::table inBraces(*table);
        inBraces.is_inline(true);
        stream << toml::toml_formatter{inBraces, toml::format_flags::none};
    } else {
        stream << toml::node_view<const toml::node>(node);
    }
    return stream.str();
}

// Reads the tables of a file into a device, past every mistake.
class Reader {
public:
    explicit Reader(const std::string& path) : path_(path) {}

    Reading read(const toml::table& root)
    {
        checkSchema(root);
        for (const SectionRow* row = beginSections(); row != endSections(); ++row)
            if (row->form != Form::List)
                device_.sections.emplace(row->name, Section(titleOf(*row), path_));
        for (const auto& [key, node] : root)
            if (key != "schema")
                readSection(key, node);
        std::stable_sort(problems_.begin(), problems_.end(), standsBefore);
        return {std::move(device_), std::move(problems_), true};
    }

private:
    // Tables are sorted by their keys, people read by lines.
    static bool standsBefore(const Problem& left, const Problem& right)
    {
        return std::tie(left.line, left.column) < std::tie(right.line, right.column);
    }

    void refuse(const toml::source_region& where, std::string text)
    {
        problems_.push_back({where.begin.line, where.begin.column, std::move(text)});
    }

    void checkSchema(const toml::table& root)
    {
        const toml::node* const schema = root.get("schema");
        if (schema == nullptr)
            problems_.push_back({1, 1, "schema = 1 is missing"});
        else if (schema->value_exact<std::int64_t>() != SCHEMA)
            refuse(schema->source(), "this version reads schema = 1 only");
    }

    // Who makes more mistakes than that wants another file, not a hint.
    bool isHinted() const
    {
        return problems_.size() < 100;
    }

    std::string unknownKey(const SectionRow& row, std::string_view key) const
    {
        return "unknown key " + inQuotes(key) + " in " + titleOf(row) +
               (isHinted() ? hint(key, keyNames(row)) : "");
    }

    static std::string titleOf(const SectionRow& row)
    {
        const std::string name(row.name);
        return row.form == Form::List ? "[[" + name + "]]" : "[" + name + "]";
    }

    std::string sourceOf(const toml::node& node) const
    {
        return path_ + ":" + std::to_string(node.source().begin.line);
    }

    void readSection(const toml::key& name, const toml::node& node)
    {
        const SectionRow* const row = findSection(name.str());
        if (row == nullptr)
            return refuse(name.source(), "unknown key " + inQuotes(name) +
                                             (isHinted() ? hint(name, sectionNames()) : ""));
        if (row->form == Form::List)
            return readList(*row, node);
        if (!node.is_table())
            return refuse(node.source(), titleOf(*row) + " must be a section");
        Section section(titleOf(*row), sourceOf(node));
        readKeys(*row, *node.as_table(), section);
        device_.sections.find(row->name)->second = std::move(section);
    }

    void readList(const SectionRow& row, const toml::node& node)
    {
        const toml::array* const list = node.as_array();
        if (list == nullptr)
            return refuse(node.source(), titleOf(row) + " must be a list of sections");
        for (const toml::node& element : *list) {
            if (row.name == "slot" && device_.slots.size() == SLOT_LIMIT)
                return refuse(element.source(),
                              "more than " + std::to_string(SLOT_LIMIT) + " slots");
            if (!element.is_table()) {
                refuse(element.source(), titleOf(row) + " must be a list of sections");
                continue;
            }
            if (row.name == "step") {
                readStep(row, *element.as_table());
                continue;
            }
            Section section(titleOf(row), sourceOf(element));
            readKeys(row, *element.as_table(), section);
            completeSlot(section, *element.as_table());
            device_.slots.push_back(std::move(section));
        }
    }

    void readStep(const SectionRow& row, const toml::table& table)
    {
        Step step;
        step.source = sourceOf(table);
        Section section(titleOf(row), step.source);
        for (const auto& [key, node] : table)
            if (key == "set" && node.is_table())
                readChanges({}, *node.as_table(), step);
            else if (key == "unset" && node.is_array())
                readRemovals(*node.as_array(), step);
            else if (std::optional<Value> value = readValue(row, key, node))
                section.set(std::string(key.str()), std::move(*value));
        if (const auto after = section.get<std::int64_t>("after_ms"))
            step.afterMs = after.value().value;
        if (const auto note = section.get<std::string>("note"))
            step.note = note.value().value;
        device_.steps.push_back(std::move(step));
    }

    // Each path is parsed by itself, which takes its time.
    bool isTooMuch(const toml::source_region& where)
    {
        if (++changes_ == STEP_LIMIT + 1)
            refuse(where, "more than " + std::to_string(STEP_LIMIT) + " changes in all steps");
        return changes_ > STEP_LIMIT;
    }

    // A key is a path, or a part of one that the table below it goes on with.
    void readChanges(const DevicePath& begun, const toml::table& table, Step& step)
    {
        for (const auto& [key, node] : table) {
            if (isTooMuch(key.source()))
                return;
            DevicePath path = begun;
            if (begun.empty())
                path = pathIn(key.str());
            else
                path.emplace_back(key.str());
            const SectionRow* const section = sectionOfStep(path, key.source());
            if (section == nullptr)
                continue;
            if (isWhole(*section, path))
                readChange(*section, path, key, node, step);
            else if (node.is_table())
                readChanges(path, *node.as_table(), step);
            else
                refuse(key.source(), noPath(key.str()));
        }
    }

    void readChange(const SectionRow& section, const DevicePath& path, const toml::key& key,
                    const toml::node& node, Step& step)
    {
        if (readValue(section, toml::key(path.back(), key.source()), node))
            step.changes.push_back({writtenPath(path), plainText(node)});
    }

    void readRemovals(const toml::array& list, Step& step)
    {
        for (const toml::node& node : list) {
            if (isTooMuch(node.source()))
                return;
            const DevicePath path = pathIn(node.value_or(std::string()));
            const SectionRow* const section = sectionOfStep(path, node.source());
            if (section == nullptr)
                continue;
            if (!isWhole(*section, path))
                refuse(node.source(), noPath(path.front()));
            else if (findKey(*section, path.back()) == nullptr)
                refuse(node.source(), unknownKey(*section, path.back()));
            else
                step.changes.push_back({writtenPath(path), std::nullopt});
        }
    }

    // The section that a step's path leads into; null after a refusal.
    const SectionRow* sectionOfStep(const DevicePath& path, const toml::source_region& where)
    {
        const SectionRow* const section = path.empty() ? nullptr : findSection(path.front());
        if (section == nullptr)
            refuse(where, path.empty()
                              ? noPath("")
                              : "unknown section " + inQuotes(path.front()) +
                                    (isHinted() ? hint(path.front(), sectionNames()) : ""));
        else if (section->name == "step")
            refuse(where, "a step cannot change a step");
        else
            return section;
        return nullptr;
    }

    // Check what must hold between a slot's keys, and between slots.
    void completeSlot(Section& slot, const toml::table& table)
    {
        // An IMSI has 15 digits at most (ITU E.212).
        if (lengthOf(slot, "mnc") == 3 && lengthOf(slot, "msin") > 9)
            refuse(table.get("msin")->source(),
                   "\"msin\" must be 1 to 9 digits in quotes after an mnc of three");
        if (slot.find("cp_name") == nullptr)
            slot.set("cp_name", {"cp" + std::to_string(device_.slots.size()), slot.source()});
        const auto* const written = table.get("cp_name");
        if (!modems_.insert(slot.get<std::string>("cp_name").value().value).second)
            refuse((written != nullptr ? *written : table).source(),
                   "every slot must have another cp_name");
    }

    static std::size_t lengthOf(const Section& section, const char* key)
    {
        const auto text = section.get<std::string>(key);
        return text ? text.value().value.size() : 0;
    }

    void readKeys(const SectionRow& row, const toml::table& table, Section& section)
    {
        for (const auto& [key, node] : table)
            if (std::optional<Value> value = readValue(row, key, node))
                section.set(std::string(key.str()), std::move(*value));
    }

    std::optional<Value> readValue(const SectionRow& row, const toml::key& key,
                                   const toml::node& node)
    {
        const Type* const type = findKey(row, key.str());
        std::optional<Content> content;
        if (type == nullptr)
            refuse(key.source(), unknownKey(row, key.str()));
        else if (isFault(*type) && node.is_table())
            content = readFaultTable(*type, key, *node.as_table());
        else
            content = readContent(*type, key, node);
        if (!content)
            return std::nullopt;
        return Value{std::move(*content), sourceOf(node)};
    }

    std::optional<Content> readContent(const Type& type, const toml::key& key,
                                       const toml::node& node)
    {
        std::optional<Content> content = readNode(type, node);
        const auto* const text = content ? std::get_if<std::string>(&*content) : nullptr;
        if (!content)
            refuse(node.source(),
                   inQuotes(key) + " must be " + expected(type) +
                       (isHinted() ? hint(node.value_or(std::string()), namesOf(type)) : ""));
        else if (text != nullptr && text->find('\0') != std::string::npos)
            refuse(node.source(), inQuotes(key) + " must not hold a NUL");
        else
            return content;
        return std::nullopt;
    }

    std::optional<Content> readFaultTable(const Type& type, const toml::key& name,
                                          const toml::table& table)
    {
        Fault fault;
        const std::size_t before = problems_.size();
        for (const auto& [key, node] : table)
            readFaultKey(type, key, node, fault);
        if (problems_.size() == before && fault.error.empty() && fault.delayMs == 0)
            refuse(table.source(), inQuotes(name) + " must have an error or a delay_ms");
        return problems_.size() == before ? std::optional<Content>(fault) : std::nullopt;
    }

    void readFaultKey(const Type& type, const toml::key& key, const toml::node& node, Fault& fault)
    {
        const Type* const own = key == "error" ? &type : findFaultKey(key.str());
        if (own == nullptr)
            return refuse(key.source(), "unknown key " + inQuotes(key) +
                                            " in a fault, which has error, delay_ms and call");
        const std::optional<Content> content = readContent(*own, key, node);
        if (!content)
            return;
        if (const auto* const read = std::get_if<Fault>(&*content)) {
            fault.error = read->error;
            fault.meaning = read->meaning;
        } else {
            (key == "call" ? fault.call : fault.delayMs) = std::get<Meaning>(*content).number;
        }
    }

    const std::string& path_;
    Device device_;
    std::vector<Problem> problems_;
    std::set<std::string> modems_;
    std::size_t changes_ = 0; // of all steps
};

// Keys with many dots nest tables, which the parser's objects release by recursion: a bound on the
// line keeps that from using up the stack.
std::vector<Problem> findLongLines(const std::string& text)
{
    std::vector<Problem> problems;
    std::size_t line = 1;
    for (std::size_t begin = 0, end = 0; begin < text.size(); begin = end + 1, ++line) {
        end = std::min(text.find('\n', begin), text.size());
        if (end - begin > LINE_LIMIT)
            problems.push_back(
                {line, 1, "a line longer than " + std::to_string(LINE_LIMIT) + " bytes"});
    }
    return problems;
}

} // namespace

std::string describe(const std::string& path, const Problem& problem)
{
    return path + ":" + std::to_string(problem.line) + ":" + std::to_string(problem.column) + ": " +
           problem.text;
}

namespace {

// How many words without quotes are told, each of which takes another look at the whole text.
constexpr std::size_t BARE_WORDS_LIMIT = 20;

// Words where a value is to be: "wifi = connected".
struct BareWord {
    std::size_t at = std::string::npos; // in the text; none without it
    std::size_t size = 0;
    std::size_t column = 0;
};

std::size_t beginOfLine(const std::string& text, std::size_t number)
{
    std::size_t begin = 0;
    for (std::size_t line = 1; line < number && begin < text.size(); ++line)
        begin = std::min(text.find('\n', begin), text.size() - 1) + 1;
    return begin;
}

// Up to a comment; what has quotes is another mistake.
BareWord bareWordOf(const std::string& text, std::size_t lineNumber)
{
    const std::size_t begin = beginOfLine(text, lineNumber);
    const std::string line = text.substr(begin, text.find('\n', begin) - begin);
    const std::size_t sign = line.find('=');
    const std::size_t at =
        sign == std::string::npos ? sign : line.find_first_not_of(" \t", sign + 1);
    if (at == std::string::npos || std::isalpha(static_cast<unsigned char>(line[at])) == 0)
        return {};
    std::string word = line.substr(at, line.find('#', at) - at);
    word.resize(word.find_last_not_of(" \t\r") + 1);
    const bool isPlain = std::none_of(word.begin(), word.end(), [](unsigned char c) {
        return c == '"' || c == '\'' || c == '\\' || std::iscntrl(c) != 0;
    });
    if (!isPlain)
        return {};
    return {begin + at, word.size(), charactersOf(line.substr(0, at)) + 1};
}

std::string putInQuotes(const std::string& word)
{
    return "put " + word + " in quotes: \"" + word + "\"";
}

// Adds what was found on the way to the mistakes of a reading, unless its line has a better one.
void addProblems(Reading& reading, const std::vector<Problem>& more)
{
    const std::vector<Problem> own = reading.problems;
    for (const Problem& problem : more)
        if (std::none_of(own.begin(), own.end(),
                         [&](const Problem& each) { return each.line == problem.line; }))
            reading.problems.push_back(problem);
    std::stable_sort(
        reading.problems.begin(), reading.problems.end(),
        [](const Problem& left, const Problem& right) { return left.line < right.line; });
}

} // namespace

Reading readDevice(const std::string& text, const std::string& path)
{
    if (std::vector<Problem> problems = findLongLines(text); !problems.empty())
        return {{}, std::move(problems), false};
    std::string repaired = text; // with quotes around words that lack them
    std::vector<Problem> problems;
    Reading reading;
    for (;;) {
        try {
            reading = Reader(path).read(parseToml(repaired, path));
            reading.isToml = problems.empty();
            break;
        } catch (const TomlError& error) {
            const BareWord bare = bareWordOf(repaired, error.line);
            if (bare.at == std::string::npos || problems.size() == BARE_WORDS_LIMIT) {
                reading.problems.push_back({error.line, error.column, error.what()});
                break;
            }
            const std::string word = repaired.substr(bare.at, bare.size);
            problems.push_back({error.line, bare.column, putInQuotes(word)});
            repaired.replace(bare.at, bare.size, '"' + word + '"');
        }
    }
    addProblems(reading, problems);
    return reading;
}

Result<Device> parseDevice(const std::string& text, const std::string& path)
{
    Reading reading = readDevice(text, path);
    if (!reading.problems.empty())
        return notAvailable(describe(path, reading.problems.front()));
    return std::move(reading.device);
}

Result<std::string> readDeviceText(const std::string& path)
{
    std::string text;
    std::string problem;
    if (!readRegularFile(path, SIZE_LIMIT, text, problem))
        return notAvailable(path + ": " + problem);
    return text;
}

class DeviceFile::Version {
public:
    explicit Version(std::string text) : text_(std::move(text)) {}

    const std::string& text() const
    {
        return text_;
    }

    pid_t process() const
    {
        return process_;
    }

    // Whoever asks first parses it, and whoever asks meanwhile waits for that.
    Result<std::shared_ptr<const Device>> device(const std::string& path)
    {
        const std::lock_guard<std::mutex> lock(mutex_);
        if (!device_) {
            const Result<Device> parsed = parseDevice(text_, path);
            if (parsed)
                device_ = std::make_shared<const Device>(parsed.value());
            else
                device_ = parsed.error();
        }
        return *device_;
    }

private:
    const std::string text_;
    const pid_t process_ = getpid();
    std::mutex mutex_;
    std::optional<Result<std::shared_ptr<const Device>>> device_;
};

Result<std::shared_ptr<const Device>> DeviceFile::device()
{
    const Result<std::shared_ptr<const Device>> now = read();
    report(now ? std::string() : now.error().reason);
    return now;
}

Result<std::shared_ptr<const Device>> DeviceFile::read()
{
    const Result<std::string> text = readDeviceText(path_);
    if (!text)
        return notAvailable(text.error().reason + elsewhere_);
    return versionOf(text.value())->device(path_);
}

// A text that a thread is at stays, so that there are at most as many more as there are threads. A
// forked child reads its own: the thread that was at one may be its parent's.
std::shared_ptr<DeviceFile::Version> DeviceFile::versionOf(const std::string& text)
{
    const std::lock_guard<ForkMutex> lock(mutex_);
    auto found = std::find_if(versions_.begin(), versions_.end(), [&text](const auto& version) {
        return version->process() == getpid() && version->text() == text;
    });
    if (found == versions_.end())
        found = versions_.insert(versions_.end(), std::make_shared<Version>(text));
    std::rotate(versions_.begin(), found, found + 1);
    for (std::size_t at = versions_.size(); at-- > VERSIONS_KEPT;)
        if (versions_[at].use_count() == 1)
            versions_.erase(versions_.begin() + static_cast<std::ptrdiff_t>(at));
    return versions_.front();
}

void DeviceFile::report(const std::string& problem)
{
    {
        const std::lock_guard<ForkMutex> lock(mutex_);
        if (problem == reported_)
            return;
        reported_ = problem;
    }
    if (!problem.empty() && onProblem_)
        onProblem_(problem);
}

} // namespace port::devicefile
