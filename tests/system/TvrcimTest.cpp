// The command-line tool as a person or a script uses it: a process of its own, its output and its exit code.
#include "tests/support/Eventually.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>
#include <nlohmann/json.hpp>

#include <algorithm>
#include <csignal>
#include <cstdio>
#include <cstdlib>
#include <fcntl.h>
#include <filesystem>
#include <fstream>
#include <poll.h>
#include <string>
#include <sys/wait.h>
#include <unistd.h>
#include <utility>
#include <vector>

using testing::HasSubstr;

namespace
{

struct Answer
{
    int exitCode;
    std::string out;
    std::string err;
};

std::string textOf(const std::string& file)
{
    std::ifstream stream(file);
    return {std::istreambuf_iterator<char>(stream), {}};
}

/// Runs the tool with arguments as a shell would read them.
Answer tvrcim(const std::string& arguments)
{
    const std::string errors = testing::TempDir() + "tvrcim-" + std::to_string(getpid()) + ".err";
    const std::string command = std::string(TVR_TVRCIM) + " " + arguments + " 2>" + errors;
    FILE* pipe = popen(command.c_str(), "r");
    EXPECT_TRUE(pipe);
    std::string out;
    char buffer[4096];
    while (std::size_t size = fread(buffer, 1, sizeof(buffer), pipe))
        out.append(buffer, size);
    const int status = pclose(pipe);
    const Answer run{WIFEXITED(status) ? WEXITSTATUS(status) : -1, out, textOf(errors)};
    std::remove(errors.c_str());
    return run;
}

nlohmann::json json(const std::string& arguments)
{
    const Answer run = tvrcim(arguments + " --format json");
    EXPECT_EQ(run.exitCode, 0) << run.err;
    return nlohmann::json::parse(run.out);
}

TEST(Tvrcim, ShowsTheHostAsATree)
{
    const Answer run = tvrcim("host");
    ASSERT_EQ(run.exitCode, 0) << run.err;
    EXPECT_EQ(run.err, "");
    for (const char* expected : {"Computer system", "2 products, 2 cards, 2 chips, 4 connectors, 4 PCI devices",
                                 "Card  TVR FCHBA:TV3202:TV32B71155", "TVRHBA_CardContainsChip",
                                 "WWPN             1000027A51320241", "PCI device  1000027A51160210:0xE200"})
        EXPECT_THAT(run.out, HasSubstr(expected));
}

TEST(Tvrcim, NamesThatItPrintsLeadToTheirInstances)
{
    const Answer names = tvrcim("enum TVRHBA_PCIDevice --names");
    ASSERT_EQ(names.exitCode, 0) << names.err;
    const std::string first = names.out.substr(0, names.out.find('\n'));
    const nlohmann::json device = json("get '" + first + "'");
    EXPECT_EQ(device["properties"]["ElementName"], "Tavrin:FCAdapter0") << device;
    EXPECT_EQ(json("refs '" + first + "' --class TVRHBA_SystemDevice").size(), 1u);
}

TEST(Tvrcim, FollowsAssociations)
{
    const std::string card = "'TVRHBA_Card.CreationClassName=\"TVRHBA_Card\",Tag=\"TV16A02417\"'";
    EXPECT_EQ(json("assoc " + card + " --class TVRHBA_CardContainsConnector").size(), 2u);
    EXPECT_EQ(json("assoc " + card + " --result-class CIM_Chip --names").size(), 1u);
    EXPECT_EQ(json("assoc " + card + " --result-class CIM_Chip --role PartComponent --names").size(), 0u);
}

TEST(Tvrcim, PlaysTheServersThatItKnows)
{
    for (const std::string server : {"strict", "small-footprint", "open-group"})
    {
        const std::string profiles = " enum TVRHBA_RegisteredProfile --namespace ";
        EXPECT_GE(json("--server " + server + profiles + "root/PG_InterOp").size(), 13u) << server;
        EXPECT_EQ(tvrcim("--server " + server + profiles + "root/interop").exitCode, server == "open-group" ? 1 : 0);
        EXPECT_THAT(tvrcim("--server " + server + " enum TVRHBA_Card --namespace root/PG_InterOp").err,
                    HasSubstr("CIM_ERR_INVALID_CLASS"));
    }
}

TEST(Tvrcim, KnowsAllClasses)
{
    EXPECT_EQ(json("classes").size(), 159u);
    EXPECT_EQ(json("classes --all").size(), 278u);
    EXPECT_THAT(tvrcim("class TVRHBA_Chip --format mof").out, HasSubstr("uint32 BoardTemperature;"));
}

TEST(Tvrcim, ErrorsNameTheStatusOrTheArgument)
{
    const std::string wrongScenario = testing::TempDir() + "wrong-" + std::to_string(getpid()) + ".json";
    std::ofstream(wrongScenario) << R"({"adapters": [{"name": 5}]})";
    const struct
    {
        std::string arguments;
        int exitCode;
        std::string expected;
    } rows[] = {
        {"get 'TVRHBA_Card.CreationClassName=\"TVRHBA_Card\",Tag=\"none\"'", 1, "CIM_ERR_NOT_FOUND"},
        {"call 'TVRHBA_Card.CreationClassName=\"TVRHBA_Card\",Tag=\"TV16A02417\"' NoSuchMethod", 1,
         "CIM_ERR_METHOD_NOT_FOUND"},
        {"create TVRHBA_Card Tag=x CreationClassName=y", 1, "CIM_ERR_NOT_SUPPORTED"},
        {"enum NoSuchClass", 1, "CIM_ERR_INVALID_CLASS"},
        {"get 'TVRHBA_Card.Tag=\"x'", 2, "Tag"},
        {"set 'TVRHBA_Card.CreationClassName=\"a\",Tag=\"b\"' NoSuchProperty=1", 2, "NoSuchProperty"},
        {"enum TVRHBA_Card --format xml", 2, "xml"},
        {"enum", 2, "CLASS"},
        {"host --module /nonexistent.so", 2, "/nonexistent.so"},
        {"host --scenario " + wrongScenario, 2, "/adapters/0/name"},
        {"host --scenario " + wrongScenario, 2, wrongScenario},
    };
    for (const auto& row : rows)
    {
        const Answer run = tvrcim(row.arguments);
        EXPECT_EQ(run.exitCode, row.exitCode) << row.arguments << "\n" << run.err;
        EXPECT_THAT(run.err, HasSubstr(row.expected)) << row.arguments;
        EXPECT_EQ(run.out, "") << row.arguments;
    }
    std::remove(wrongScenario.c_str());
}

// --- the end by a signal -------------------------------------------------------------------------------

/// A folder that the tool takes for that of temporary files; it must be empty in the end.
class TemporaryFolder
{
public:
    TemporaryFolder()
    {
        EXPECT_TRUE(mkdtemp(_path.data()));
        setenv("TMPDIR", _path.c_str(), 1);
    }
    ~TemporaryFolder()
    {
        unsetenv("TMPDIR");
        std::filesystem::remove_all(_path);
    }
    bool empty() const { return std::filesystem::is_empty(_path); }

private:
    std::string _path = testing::TempDir() + "tvrcim-XXXXXX";
};

std::size_t semaphoresOf(pid_t process)
{
    const std::string ending = "_" + std::to_string(process);
    return static_cast<std::size_t>(
        std::ranges::count_if(std::filesystem::directory_iterator("/dev/shm"), std::filesystem::directory_iterator(),
                              [&](const std::filesystem::directory_entry& entry)
                              {
                                  const std::string name = entry.path().filename();
                                  return name.starts_with("sem.TVR") && name.ends_with(ending);
                              }));
}

/// The tool at work, with its output in a pipe that holds a page.
class Running
{
public:
    explicit Running(std::vector<const char*> words)
    {
        words.insert(words.begin(), TVR_TVRCIM);
        words.push_back(nullptr);
        int ends[2];
        EXPECT_EQ(pipe2(ends, O_CLOEXEC), 0);
        fcntl(ends[1], F_SETPIPE_SZ, 4096);
        _process = fork();
        if (_process == 0)
        {
            dup2(ends[1], STDOUT_FILENO);
            execv(words[0], const_cast<char* const*>(words.data()));
            _exit(127);
        }
        close(ends[1]);
        _output = ends[0];
    }
    ~Running()
    {
        close(_output);
        if (_process > 0)
        {
            kill(_process, SIGKILL);
            waitpid(_process, nullptr, 0);
        }
    }
    Running(const Running&) = delete;
    Running& operator=(const Running&) = delete;

    pid_t process() const { return _process; }
    bool awaitOutput() const
    {
        pollfd ready{_output, POLLIN, 0};
        return poll(&ready, 1, 20000) == 1;
    }
    /// Its exit code after the signal; -1 when that killed it.
    int endBy(int signal)
    {
        kill(_process, signal);
        return exitCode();
    }

    /// Its exit code after all of its output.
    int readAll()
    {
        char buffer[4096];
        while (read(_output, buffer, sizeof buffer) > 0)
            continue;
        return exitCode();
    }

private:
    int exitCode()
    {
        int status = 0;
        waitpid(std::exchange(_process, -1), &status, 0);
        return WIFEXITED(status) ? WEXITSTATUS(status) : -1;
    }

    pid_t _process;
    int _output;
};

/// A signal finds the tool between two operations, or inside one that never ends: what it says about itself in the
/// system is gone afterwards all the same.
TEST(Tvrcim, EndsCleanlyBySignals)
{
    for (const int signal : {SIGHUP, SIGINT, SIGTERM})
    {
        const TemporaryFolder temporary;
        Running tool({"enum", "CIM_ManagedElement", "--format", "json"});
        ASSERT_TRUE(tool.awaitOutput()); // more of it than the pipe holds
        const pid_t process = tool.process();
        EXPECT_GT(semaphoresOf(process), 0u);
        EXPECT_FALSE(temporary.empty());
        EXPECT_EQ(tool.endBy(signal), 128 + signal);
        EXPECT_EQ(semaphoresOf(process), 0u);
        EXPECT_TRUE(temporary.empty());
    }
}

TEST(Tvrcim, EndsCleanlyInAnOperationThatHangs)
{
    const std::string scenario = testing::TempDir() + "hanging-" + std::to_string(getpid()) + ".json";
    std::ofstream(scenario) << R"({"faults": [{"function": "HBA_GetNumberOfAdapters", "gate": "never opened"}]})";
    const TemporaryFolder temporary;
    Running tool({"--scenario", scenario.c_str(), "enum", "TVRHBA_Card"});
    const pid_t process = tool.process();
    ASSERT_TRUE(test_support::eventually([&] { return semaphoresOf(process) > 0; }));
    EXPECT_EQ(tool.endBy(SIGTERM), 128 + SIGTERM);
    EXPECT_EQ(semaphoresOf(process), 0u);
    EXPECT_TRUE(temporary.empty());
    std::remove(scenario.c_str());
}

/// A signal that whoever started the tool ignores, as nohup does, does not end it.
TEST(Tvrcim, IgnoredSignalsStayIgnored)
{
    std::signal(SIGHUP, SIG_IGN);
    Running tool({"enum", "CIM_ManagedElement", "--format", "json"});
    std::signal(SIGHUP, SIG_DFL);
    ASSERT_TRUE(tool.awaitOutput());
    kill(tool.process(), SIGHUP);
    EXPECT_EQ(tool.readAll(), 0);
}

} // namespace
