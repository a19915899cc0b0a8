// SPDX-License-Identifier: Apache-2.0
#include <algorithm>
#include <filesystem>
#include <mutex>

#include <sys/stat.h>
#include <unistd.h>

#include "devicefile/DeviceFile.h"
#include "devicefile/Toml.h"
#include "support/CapturedStandardError.h"
#include "support/DeviceFileTest.h"
#include "support/Together.h"

using port::Fact;
using port::Question;
using port::Result;
using port::devicefile::VERSIONS_KEPT;
using testing::AllOf;
using testing::HasSubstr;
using testing::StartsWith;

namespace {

namespace fs = std::filesystem;

class SimulatorTest : public DeviceFileTest {
protected:
    // The whole of the file.
    void write(const std::string& text) const
    {
        tree.write("/d.toml", text);
    }

    static std::string withModel(const std::string& model)
    {
        return "schema = 1\n[device]\nmodel_name = '" + model + "'\n";
    }

    // The mistake in the device file, without its own path; every answer must name it.
    std::string problem()
    {
        const Result<Fact> answer = backend->get<Question::ModelName>();
        EXPECT_FALSE(answer);
        EXPECT_EQ(port::Error::Kind::NotAvailable, answer.error().kind);
        EXPECT_EQ(backend->deviceFileProblem(), answer.error().reason);
        EXPECT_THAT(answer.error().reason, StartsWith(path));
        return answer.error().reason.substr(path.size());
    }

    std::string problemIn(const std::string& text)
    {
        write(text);
        return problem();
    }

    void expectProblems(const std::vector<std::pair<std::string, std::string>>& rows)
    {
        for (const auto& [text, expected] : rows)
            EXPECT_EQ(expected, problemIn(text)) << text.substr(0, 100);
    }

    std::string model()
    {
        const Result<Fact> answer = backend->get<Question::ModelName>();
        return answer ? answer.value().value : "error: " + answer.error().reason;
    }
};

TEST_F(SimulatorTest, TextsAreTakenAsTheyStand)
{
    describe("device.model_name = \"Ger\xc3\xa4t \\u00e9 \\\"x\\\" \"\n");
    EXPECT_EQ("Ger\xc3\xa4t \xc3\xa9 \"x\" ", model());
    write("\xef\xbb\xbfschema = 1\r\n[device]\r\nmodel_name = ''\r\n");
    EXPECT_EQ("", model());
}

TEST_F(SimulatorTest, MistakesAreNamedWithTheirPlace)
{
    expectProblems({
        {"schema = 1\n[device]\ncolour = 'red'\n", ":3:1: unknown key \"colour\" in [device]"},
        {"schema = 1\n[telephony]\n", ":2:2: unknown key \"telephony\""},
        {"schema = 1\nmodel_name = 'x'\n", ":2:1: unknown key \"model_name\""},
        {"schema = 1\n[device.sub]\n", ":2:9: unknown key \"sub\" in [device]"},
        {"schema = 1\n\"a\\nb\\u0001\" = 1\n", ":2:1: unknown key \"a\\nb\\u0001\""},
        {"schema = 1\ndevice = 'x'\n", ":2:10: [device] must be a section"},
        {"schema = 1\n[[device]]\n", ":2:1: [device] must be a section"},
        {"schema = 1\n[device]\nmodel_name = \"a\\u0000b\"\n",
         ":3:14: \"model_name\" must not hold a NUL"},
        {withModel("\xff"), ":3:14: Encountered invalid utf-8 sequence"},
        {withModel("x") + "model_name = 'x'\n", ":4:14: Error while parsing key-value pair: "
                                                "cannot redefine existing string 'model_name'"},
        {"[device]\nmodel_name = 'x'\n", ":1:1: schema = 1 is missing"},
        {"", ":1:1: schema = 1 is missing"},
        {"# only a comment", ":1:1: schema = 1 is missing"},
    });
    for (const std::string value : {"5", "1.5", "true", "['x']", "{}", "1979-05-27"})
        expectProblems({{"schema = 1\n[device]\nmodel_name = " + value + "\n",
                         ":3:14: \"model_name\" must be a text in quotes"}});
    for (const std::string other : {"2", "0", "-1", "1.0", "'1'", "true"})
        expectProblems({{"schema = " + other + "\n", ":1:10: this version reads schema = 1 only"}});
    for (const auto& [text, place] :
         {std::pair("schema = 1\n[device]\nmodel_name = 'half", ":3:19: "),
          {"schema = 1\n[device]\nmodel_na", ":3:9: "}})
        EXPECT_THAT(problemIn(text), StartsWith(place));
    EXPECT_THAT(problemIn("schema = 1\n[device]\n[device]\n"),
                AllOf(StartsWith(":3:"), HasSubstr("cannot redefine")));
    EXPECT_THAT(problemIn(std::string("schema = 1\n\0", 12)), StartsWith(":2:1: "));
    EXPECT_THAT(problemIn(std::string(4096, '\0')), StartsWith(":1:1: "));
}

TEST_F(SimulatorTest, DeepNestingIsRefused)
{
    std::string dots = "a";
    for (int i = 0; i < 300000; ++i)
        dots += ".a";
    const std::string tooLong = ": a line longer than 1024 bytes";
    expectProblems({{"schema = 1\n" + dots + " = 1\n", ":2:1" + tooLong},
                    {"[" + dots + "]\n", ":1:1" + tooLong},
                    {"schema = 1\na = " + std::string(100000, '['), ":2:1" + tooLong}});
    EXPECT_THAT(problemIn("schema = 1\na = " + std::string(1000, '[')),
                StartsWith(":2:13: values nested deeper than 8"));
}

// The parser takes for granted that none of these comes.
TEST_F(SimulatorTest, TextTheParserMustNotMeetIsRefused)
{
    const std::string inQuotes = ": a letter outside ASCII, which stands in quotes only";
    const std::string header = ": a section header begins with a name";
    const std::string behind = ": a letter outside ASCII behind a backslash";
    expectProblems({
        {"[#]", ":1:2" + header},
        {"[[ ]]", ":1:4" + header},
        {"# [\n[\t=]", ":2:3" + header},
        {"a = [\n[#\n]]\n[.b]", ":4:2" + header},
        {"a = '''\n[#]'''''\n[\u00e9]", ":3:2" + header},
        {"a = \"\"\"\\\"\"\"\"\"\n  [!]", ":2:4" + header},
        {"a = 1 # \u00e9\nb = 'x' \u00a0", ":2:9" + inQuotes},
        {"\xEF\xBB\xBF\u00e9 = 1", ":1:1" + inQuotes},
        {"a = '\u00e9' \u3000", ":1:9" + inQuotes},
        {"a = \"\"\"x\\ \n\n \u00e9\"\"\"", ":3:2" + behind},
        {"a = \"\"\"\\\u00e9\"\"\"", ":1:9" + behind},
    });
    for (const char* const text :
         {"\"\u00e9\" = '\u00e9' # \u00e9\n", "a = \"\"\"\\n\u00e9\\\n  e\"\"\"\n",
          "a = ['[#', \"\\\"\", '''\n[\u00e9''']\n", "[ 'a' ]\r\n[[b]] # [\n"})
        EXPECT_THAT(problemIn(text), HasSubstr("schema = 1 is missing")) << text;
}

TEST_F(SimulatorTest, DeepestFileThatIsReadDoesNoHarm)
{
    std::string keys = "a";
    while (keys.size() < 1000)
        keys += ".a";
    std::string text = "schema = 1\n[" + keys + "]\n" + keys + " = [\n";
    for (int i = 0; i < 3; ++i)
        text += "{ " + keys + " = [\n";
    EXPECT_THAT(problemIn(text + "]}]}]}]\n"), HasSubstr("unknown key \"a\""));
    std::string many = "schema = 1\n";
    for (int i = 0; many.size() < 1000 * 1000; ++i)
        many += "[x" + std::to_string(i) + "." + keys.substr(0, 901) + "]\n";
    EXPECT_THAT(problemIn(many), HasSubstr("unknown key \"x0\""));
}

TEST_F(SimulatorTest, FilesThatCannotBeReadAreNamed)
{
    EXPECT_EQ(": No such file or directory", problem());
    fs::create_directory(path);
    EXPECT_EQ(": Is a directory", problem());
    fs::remove(path);
    ASSERT_EQ(0, mkfifo(path.c_str(), 0600));
    EXPECT_EQ(": not a regular file", problem()); // and does not wait for a writer
    fs::remove(path);
    fs::create_symlink(path, path);
    EXPECT_EQ(": Too many levels of symbolic links", problem());
    fs::remove(path);
    fs::create_symlink("/dev/zero", path);
    EXPECT_EQ(": not a regular file", problem());
    fs::remove(path);
    describe("");
    fs::resize_file(path, 100 * 1000 * 1000);
    EXPECT_EQ(": larger than 1048576 bytes", problem());
    fs::permissions(path, fs::perms::none);
    const uid_t user = geteuid();
    ASSERT_EQ(0, seteuid(user == 0 ? 65534 : user)); // root may read everything
    EXPECT_EQ(": Permission denied", problem());
    ASSERT_EQ(0, seteuid(user));
}

TEST_F(SimulatorTest, EveryEditIsSeenByTheNextCall)
{
    write(withModel("one"));
    EXPECT_EQ("one", model());
    const auto time = fs::last_write_time(path);
    write(withModel("two")); // of the same size
    EXPECT_EQ("two", model());
    write(withModel("six"));
    fs::last_write_time(path, time);
    EXPECT_EQ("six", model());
    write(withModel("three"));
    EXPECT_EQ("three", model());
    fs::rename(tree.write("/next.toml", withModel("other")), path);
    EXPECT_EQ("other", model());
    tree.remove("/d.toml");
    EXPECT_EQ(": No such file or directory", problem());
    write(withModel("other"));
    EXPECT_EQ("other", model());
}

// A parse makes a device: as many are met as were parsed, while none is let go.
TEST_F(SimulatorTest, TextsThatTakeTurnsAreParsedOnceEachWhicheverThreadsMeetThem)
{
    port::devicefile::DeviceFile file(path);
    std::mutex mutex;
    std::set<std::shared_ptr<const port::devicefile::Device>> parsed;
    together(8, [&](int thread) {
        for (std::size_t turn = 0; turn < 20 * VERSIONS_KEPT; ++turn) {
            if (thread == 0)
                fs::rename(tree.write("/next", withModel(std::to_string(turn % VERSIONS_KEPT))),
                           path);
            const auto device = file.device();
            const std::lock_guard<std::mutex> lock(mutex);
            if (device)
                parsed.insert(device.value());
        }
    });
    EXPECT_EQ(VERSIONS_KEPT, parsed.size());
}

TEST_F(SimulatorTest, TextsOfLongAgoAreLetGo)
{
    port::devicefile::DeviceFile file(path);
    std::vector<std::weak_ptr<const port::devicefile::Device>> parsed;
    for (std::size_t turn = 0; turn < 3 * VERSIONS_KEPT; ++turn) {
        write(withModel(std::to_string(turn)));
        parsed.push_back(file.device().value());
    }
    const auto isKept = [](const auto& device) { return !device.expired(); };
    EXPECT_EQ(VERSIONS_KEPT,
              static_cast<std::size_t>(std::count_if(parsed.begin(), parsed.end(), isKept)));
}

TEST_F(SimulatorTest, EachProblemIsWrittenToTheLogOnceWhicheverThreadsMeetIt)
{
    coresystem_port::setLogSink(coresystem_port::LogSink::StandardError);
    const auto linesOf = [this](const std::string& text) {
        CapturedStandardError log;
        write(text);
        together(8, [this](int) {
            for (int i = 0; i < 3; ++i)
                model();
        });
        const std::string lines = log.take();
        return lines.substr(0, lines.find('(')) +
               lines.substr(std::min(lines.find(')'), lines.size()));
    };
    const std::string missing = "E/coresystem-port): " + path + ":1:1: schema = 1 is missing\n";
    EXPECT_EQ(missing, linesOf(""));
    EXPECT_EQ("", linesOf("# the same problem"));
    EXPECT_EQ("E/coresystem-port): " + path + ":1:10: this version reads schema = 1 only\n",
              linesOf("schema = 2"));
    EXPECT_EQ(missing, linesOf(""));
    EXPECT_EQ("", linesOf("schema = 1\n"));
    EXPECT_EQ(missing, linesOf(""));
}

TEST_F(SimulatorTest, BackendTellsOfItself)
{
    EXPECT_EQ("simulator", backend->name());
    EXPECT_EQ(path, backend->deviceFile());
    EXPECT_EQ(path + ": No such file or directory", backend->findServices().at(0).state);
    EXPECT_FALSE(backend->findServices().at(0).found);
    describe("");
    EXPECT_TRUE(backend->findServices().at(0).found);
}

using ToldAs = coresystem_port::Answer::Kind;

// A value of a device file as the port tells it.
std::pair<std::string, ToldAs> told(const toml::node_view<const toml::node>& value)
{
    if (value.is_boolean())
        return {*value.value<bool>() ? "true" : "false", ToldAs::Switch};
    if (value.is_integer())
        return {std::to_string(*value.value<int>()), ToldAs::Number};
    return {value.value_or("no value"), ToldAs::Text};
}

TEST(PortsOwnAnswersTest, EveryPlainFactIsToldInTheWordsOfTheDeviceFile)
{
    const auto device = port::makeSimulatorBackend(DEVICE_FILES "/dual_sim.toml");
    port::substituteBackend(device.get());
    const toml::table file = toml::parse_file(DEVICE_FILES "/dual_sim.toml");
    const auto expectTold = [&](Question question, const char* section, const char* key) {
        const auto answer = coresystem_port::ask(question);
        EXPECT_EQ(told(file[section][key]), std::make_pair(answer.word, answer.kind)) << key;
        EXPECT_NE("", answer.origin.source) << key;
    };
#define FACT(number, question, section, key, ...) expectTold(Question::question, section, key);
#include "facts/facts.def"
    const auto other = coresystem_port::ask(Question::Storage);
    port::substituteBackend(nullptr);
    EXPECT_EQ("", other.word);
    EXPECT_EQ("the port has no answer of its own to this question", other.origin.reason);
}

} // namespace
