// SPDX-License-Identifier: Apache-2.0
#include <algorithm>
#include <cerrno>
#include <filesystem>
#include <fstream>
#include <memory>
#include <mutex>
#include <set>
#include <vector>

#include <gmock/gmock.h>
#include <sys/stat.h>
#include <unistd.h>

#include "backend/Backend.h"
#include "coresystem_port.h"
#include "devicefile/DeviceFile.h"
#include "support/CapturedStandardError.h"
#include "support/TemporaryTree.h"
#include "support/Together.h"

using port::Fact;
using port::Result;
using testing::AllOf;
using testing::HasSubstr;
using testing::StartsWith;

namespace {

namespace fs = std::filesystem;

class SimulatorTest : public testing::Test {
protected:
    SimulatorTest()
    {
        coresystem_port::setLogSink(coresystem_port::LogSink::None);
    }

    void describe(const std::string& text) const
    {
        tree.write("/d.toml", text);
    }

    // The mistake in the device file, without its own path; every answer must name it.
    std::string problem()
    {
        const Result<Fact> answer = backend->get<port::Question::ModelName>();
        EXPECT_FALSE(answer);
        EXPECT_EQ(port::Error::Kind::NotAvailable, answer.error().kind);
        EXPECT_EQ(backend->deviceFileProblem(), answer.error().reason);
        EXPECT_THAT(answer.error().reason, StartsWith(path));
        return answer.error().reason.substr(path.size());
    }

    std::string problemOf(const std::string& text)
    {
        describe(text);
        return problem();
    }

    std::string model()
    {
        const Result<Fact> answer = backend->get<port::Question::ModelName>();
        return answer ? answer.value().value : "error: " + answer.error().reason;
    }

    const TemporaryTree tree;
    const std::string path = tree.path("/d.toml");
    const std::unique_ptr<port::Backend> backend = port::makeSimulatorBackend(path);
};

TEST_F(SimulatorTest, EveryKeyIsAnsweredWithItsLine)
{
    describe(
        "schema = 1\n[device]\nplatform_id = 'a'\nplatform_name = 'b'\nplatform_version = 'c'\n"
        "model_name = 'd'\n[settings]\ndevice_name = 'e'\nlanguage = 'f'\n");
    const struct {
        Result<Fact> answer;
        std::string value;
        int line;
    } answers[] = {
        {backend->get<port::Question::PlatformId>(), "a", 3},
        {backend->get<port::Question::PlatformName>(), "b", 4},
        {backend->get<port::Question::PlatformVersion>(), "c", 5},
        {backend->get<port::Question::ModelName>(), "d", 6},
        {backend->get<port::Question::DeviceName>(), "e", 8},
        {backend->get<port::Question::Language>(), "f", 9},
    };
    for (const auto& row : answers) {
        ASSERT_TRUE(row.answer) << row.answer.error().reason;
        EXPECT_EQ(row.value, row.answer.value().value);
        EXPECT_EQ(path + ":" + std::to_string(row.line), row.answer.value().source);
    }
    EXPECT_EQ("", backend->deviceFileProblem());
}

TEST_F(SimulatorTest, AbsentKeyIsNotAvailableAndNoProblemOfTheFile)
{
    describe("schema = 1\n");
    EXPECT_EQ("error: " + path + ": [device] has no model_name", model());
    EXPECT_EQ(path + ": [settings] has no language",
              backend->get<port::Question::Language>().error().reason);
    EXPECT_EQ("", backend->deviceFileProblem());
}

TEST_F(SimulatorTest, TextsAreTakenAsTheyStand)
{
    describe("schema = 1\ndevice.model_name = \"Ger\xc3\xa4t \\u00e9 \\\"x\\\" \"\n");
    EXPECT_EQ("Ger\xc3\xa4t \xc3\xa9 \"x\" ", model());
    describe("\xef\xbb\xbfschema = 1\r\n[device]\r\nmodel_name = ''\r\n");
    EXPECT_EQ("", model());
}

TEST_F(SimulatorTest, UnknownNamesAreNamedWithTheirPlace)
{
    EXPECT_EQ(":3:1: unknown key \"colour\" in [device]",
              problemOf("schema = 1\n[device]\ncolour = 'red'\n"));
    EXPECT_EQ(":2:2: unknown key \"telephony\"", problemOf("schema = 1\n[telephony]\n"));
    EXPECT_EQ(":2:1: unknown key \"model_name\"", problemOf("schema = 1\nmodel_name = 'x'\n"));
    EXPECT_EQ(":2:9: unknown key \"sub\" in [device]", problemOf("schema = 1\n[device.sub]\n"));
    EXPECT_EQ(":2:1: unknown key \"a\\nb\\u0001\"",
              problemOf("schema = 1\n\"a\\nb\\u0001\" = 1\n"));
}

TEST_F(SimulatorTest, WrongTypesAreNamedWithTheirPlace)
{
    for (const char* const value : {"5", "1.5", "true", "['x']", "{}", "1979-05-27"})
        EXPECT_EQ(":3:14: \"model_name\" must be a text in quotes",
                  problemOf("schema = 1\n[device]\nmodel_name = " + std::string(value) + "\n"))
            << value;
    EXPECT_EQ(":2:10: [device] must be a section", problemOf("schema = 1\ndevice = 'x'\n"));
    EXPECT_EQ(":2:1: [device] must be a section", problemOf("schema = 1\n[[device]]\n"));
    EXPECT_EQ(":3:14: \"model_name\" must not hold a NUL",
              problemOf("schema = 1\n[device]\nmodel_name = \"a\\u0000b\"\n"));
}

TEST_F(SimulatorTest, OtherSchemasAreRefused)
{
    for (const char* const other : {"2", "0", "-1", "1.0", "'1'", "true"})
        EXPECT_EQ(":1:10: this version reads schema = 1 only",
                  problemOf("schema = " + std::string(other) + "\n"))
            << other;
    EXPECT_EQ(":1:1: schema = 1 is missing", problemOf("[device]\nmodel_name = 'x'\n"));
    EXPECT_EQ(":1:1: schema = 1 is missing", problemOf(""));
    EXPECT_EQ(":1:1: schema = 1 is missing", problemOf("# only a comment"));
}

TEST_F(SimulatorTest, MalformedTextIsNamedWithItsPlace)
{
    const std::string start = "schema = 1\n[device]\n";
    EXPECT_THAT(problemOf(start + "model_name = 'half"), StartsWith(":3:19: "));
    EXPECT_THAT(problemOf(start + "model_na"), StartsWith(":3:9: "));
    EXPECT_EQ(":3:14: Encountered invalid utf-8 sequence",
              problemOf(start + "model_name = '\xff'\n"));
    EXPECT_EQ(
        ":4:14: Error while parsing key-value pair: cannot redefine existing string 'model_name'",
        problemOf(start + "model_name = 'x'\nmodel_name = 'x'\n"));
    EXPECT_THAT(problemOf(start + "[device]\n"),
                AllOf(StartsWith(":3:"), HasSubstr("cannot redefine")));
    EXPECT_THAT(problemOf(std::string("schema = 1\n\0", 12)), StartsWith(":2:1: "));
    EXPECT_THAT(problemOf(std::string(4096, '\0')), StartsWith(":1:1: "));
}

TEST_F(SimulatorTest, DeepNestingIsRefused)
{
    std::string dots = "a";
    for (int i = 0; i < 300000; ++i)
        dots += ".a";
    const std::string tooLong = ": a line longer than 1024 bytes";
    EXPECT_EQ(":2:1" + tooLong, problemOf("schema = 1\n" + dots + " = 1\n"));
    EXPECT_EQ(":1:1" + tooLong, problemOf("[" + dots + "]\n"));
    EXPECT_EQ(":2:1" + tooLong, problemOf("schema = 1\na = " + std::string(100000, '[')));
    EXPECT_THAT(problemOf("schema = 1\na = " + std::string(1000, '[')),
                StartsWith(":2:13: values nested deeper than 8"));
}

// The parser takes for granted that none of these comes.
TEST_F(SimulatorTest, TextTheParserMustNotMeetIsRefused)
{
    const std::string inQuotes = ": a letter outside ASCII, which stands in quotes only";
    const std::string header = ": a section header begins with a name";
    const std::string behind = ": a letter outside ASCII behind a backslash";
    for (const auto& [text, problemThere] : std::vector<std::pair<std::string, std::string>>{
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
         })
        EXPECT_EQ(problemThere, problemOf(text)) << text;
    for (const char* const text :
         {"\"\u00e9\" = '\u00e9' # \u00e9\n", "a = \"\"\"\\n\u00e9\\\n  e\"\"\"\n",
          "a = ['[#', \"\\\"\", '''\n[\u00e9''']\n", "[ 'a' ]\r\n[[b]] # [\n"})
        EXPECT_THAT(problemOf(text), HasSubstr("schema = 1 is missing")) << text;
}

TEST_F(SimulatorTest, DeepestFileThatIsReadDoesNoHarm)
{
    std::string keys = "a";
    while (keys.size() < 1000)
        keys += ".a";
    std::string text = "schema = 1\n[" + keys + "]\n" + keys + " = [\n";
    for (int i = 0; i < 3; ++i)
        text += "{ " + keys + " = [\n";
    EXPECT_THAT(problemOf(text + "]}]}]}]\n"), HasSubstr("unknown key \"a\""));
    std::string many = "schema = 1\n";
    for (int i = 0; many.size() < 1000 * 1000; ++i)
        many += "[x" + std::to_string(i) + "." + keys.substr(0, 901) + "]\n";
    EXPECT_THAT(problemOf(many), HasSubstr("unknown key \"x0\""));
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
}

TEST_F(SimulatorTest, HugeFileIsRefusedUnread)
{
    describe("schema = 1\n");
    fs::resize_file(path, 100 * 1000 * 1000);
    EXPECT_EQ(": larger than 1048576 bytes", problem());
}

TEST_F(SimulatorTest, FileWithoutReadPermissionIsNamed)
{
    describe("schema = 1\n");
    fs::permissions(path, fs::perms::none);
    const uid_t user = geteuid();
    ASSERT_EQ(0, seteuid(user == 0 ? 65534 : user)); // root may read everything
    EXPECT_EQ(": Permission denied", problem());
    ASSERT_EQ(0, seteuid(user));
}

TEST_F(SimulatorTest, EditIsSeenByTheNextCall)
{
    describe("schema = 1\n[device]\nmodel_name = 'one'\n");
    EXPECT_EQ("one", model());
    describe("schema = 1\n[device]\nmodel_name = 'two'\n"); // of the same size
    EXPECT_EQ("two", model());
    describe("schema = 1\n[device]\nmodel_name = 'three'\n");
    EXPECT_EQ("three", model());
}

TEST_F(SimulatorTest, EditThatKeepsSizeAndTimesIsSeen)
{
    describe("schema = 1\n[device]\nmodel_name = 'one'\n");
    EXPECT_EQ("one", model());
    const auto time = fs::last_write_time(path);
    describe("schema = 1\n[device]\nmodel_name = 'two'\n");
    fs::last_write_time(path, time);
    EXPECT_EQ("two", model());
}

TEST_F(SimulatorTest, FileMovedOverItIsSeen)
{
    describe("schema = 1\n[device]\nmodel_name = 'one'\n");
    EXPECT_EQ("one", model());
    fs::rename(tree.write("/next.toml", "schema = 1\n[device]\nmodel_name = 'two'\n"), path);
    EXPECT_EQ("two", model());
}

// A parse makes a device: as many are met as were parsed, while none is let go.
TEST_F(SimulatorTest, TextsThatTakeTurnsAreParsedOnceEachWhicheverThreadsMeetThem)
{
    constexpr std::size_t TEXTS = port::devicefile::VERSIONS_KEPT;
    port::devicefile::DeviceFile file(path);
    std::mutex mutex;
    std::set<std::shared_ptr<const port::devicefile::Device>> parsed;
    together(8, [&](int thread) {
        for (std::size_t turn = 0; turn < 20 * TEXTS; ++turn) {
            if (thread == 0) {
                tree.write("/next", "schema = 1\ndevice.model_name = 'm" +
                                        std::to_string(turn % TEXTS) + "'\n");
                fs::rename(tree.path("/next"), path);
            }
            const auto device = file.device();
            const std::lock_guard<std::mutex> lock(mutex);
            if (device)
                parsed.insert(device.value());
        }
    });
    EXPECT_EQ(TEXTS, parsed.size());
}

TEST_F(SimulatorTest, TextsOfLongAgoAreLetGo)
{
    port::devicefile::DeviceFile file(path);
    std::vector<std::weak_ptr<const port::devicefile::Device>> parsed;
    for (std::size_t turn = 0; turn < 3 * port::devicefile::VERSIONS_KEPT; ++turn) {
        describe("schema = 1\ndevice.model_name = '" + std::to_string(turn) + "'\n");
        parsed.push_back(file.device().value());
    }
    const auto isKept = [](const auto& device) { return !device.expired(); };
    EXPECT_EQ(port::devicefile::VERSIONS_KEPT,
              static_cast<std::size_t>(std::count_if(parsed.begin(), parsed.end(), isKept)));
}

TEST_F(SimulatorTest, DeletedFileIsNoLongerAnswered)
{
    describe("schema = 1\n[device]\nmodel_name = 'one'\n");
    EXPECT_EQ("one", model());
    tree.remove("/d.toml");
    EXPECT_EQ(": No such file or directory", problem());
    describe("schema = 1\n[device]\nmodel_name = 'one'\n");
    EXPECT_EQ("one", model());
}

TEST_F(SimulatorTest, EachProblemIsWrittenToTheLogOnce)
{
    coresystem_port::setLogSink(coresystem_port::LogSink::StandardError);
    const auto linesOf = [this](const std::string& text) {
        CapturedStandardError log;
        describe(text);
        for (int i = 0; i < 3; ++i)
            model();
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

TEST_F(SimulatorTest, ThreadsMeetingAProblemWriteOneLine)
{
    coresystem_port::setLogSink(coresystem_port::LogSink::StandardError);
    CapturedStandardError log;
    together(8, [this](int) {
        for (int i = 0; i < 20; ++i)
            EXPECT_FALSE(backend->get<port::Question::Language>());
    });
    const std::string lines = log.take();
    EXPECT_EQ(1, std::count(lines.begin(), lines.end(), '\n')) << lines;
}

TEST_F(SimulatorTest, BackendTellsOfItself)
{
    EXPECT_EQ("simulator", backend->name());
    EXPECT_EQ(path, backend->deviceFile());
    EXPECT_EQ(path + ": No such file or directory", backend->findServices().at(0).state);
    EXPECT_FALSE(backend->findServices().at(0).found);
    describe("schema = 1\n");
    EXPECT_TRUE(backend->findServices().at(0).found);
}

} // namespace
