// The command-line tool as a person or a script uses it: a process of its own, its output and its exit code.
#include "tests/support/Eventually.h"
#include "tests/support/Semaphores.h"
#include "tests/system/Tool.h"

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
#include <functional>
#include <map>
#include <poll.h>
#include <pty.h>
#include <string>
#include <sys/wait.h>
#include <unistd.h>
#include <utility>
#include <vector>

using namespace system_test;
using test_support::semaphoresOf;
using testing::HasSubstr;

namespace
{

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
    for (const char* expected :
         {"2 products, 2 cards, 2 chips, 4 connectors, 4 FC ports, 3 transceivers,",
          "6 volumes, 1 disk, 2 tape drives, 2 devices, 1 controller, 1 virtual volume, 4 PCI devices",
          "│   attention  FC port 1000027A51160211: LINK DOWN\n├── Driver  tvrfc  12.0.0.1\n",
          "│   └── Card  TVR FCHBA:TV1602:TV16A02417\n",
          "│       ├── Chip  TVR HBA ASIC:TV1602:TV16A02417  47 °C, warning at 85 °C, critical at 95 °C\n",
          "│       │   └── FC port  1000027A51160210  up, 8 Gbit/s, N port, fabric 1000063D2000A001\n",
          "│       │       │   device            /sys/class/fc_host/host5\n",
          "│       │       ├── Transceiver  OPT8-SW-850  OPTENNA, serial number OP8G440017, 38.5 °C\n",
          "│       │       ├── Firmware  Operational Firmware  11.4.210.8\n",
          "│       │       ├── Flash image  Boot BIOS  11.4.204.11, 256 KiB, Multi-boot image\n",
          "│       │       ├── Target  50063D200110000A  2 units, 600 GiB\n",
          "│       │       │   └── Volume  Storage Volume: 1  500 GiB, /dev/sdb, OLSTRA MERIDIAN 7 DISK",
          "│           └── FC port  1000027A51160211  LINK DOWN\n" /* the other port of its card */,
          "│           │   virtual machine  guest-1\n│       │           └── Target  50063D200110000B  1 unit, 100 GiB",
          "└── PCI device  1000027A51320241:0x7410  Tavrin:FCAdapter3, bus 8, function 1\n"})
        EXPECT_THAT(run.out, HasSubstr(expected));
}

/// Each instance of a class that is shown is in the tree once, under what the associations put it in.
TEST(Tvrcim, TheTreeHasAllInstancesOnce)
{
    const std::string scenario = testing::TempDir() + "many-" + std::to_string(getpid()) + ".json";
    std::ofstream(scenario) << R"({"generate": {"seed": 3, "adapters": 2, "portsPerAdapter": 2, "targetsPerPort": 3,
        "unitsPerTarget": 9, "deviceTypes": [0, 1, 8, 13, 17]}})";
    const nlohmann::json host = json("host --scenario " + scenario);
    EXPECT_FALSE(host.contains("attention")) << host["attention"];
    std::map<std::string, std::size_t> kinds;
    std::map<std::string, std::size_t> places;
    const std::function<void(const nlohmann::json&)> walk = [&](const nlohmann::json& node)
    {
        ++kinds[node["kind"]];
        for (const nlohmann::json& part : node.value("parts", nlohmann::json::array()))
        {
            ++places[std::string(node["kind"]) + "/" + std::string(part["kind"])];
            walk(part);
        }
    };
    walk(host);
    const std::pair<const char*, const char*> classes[] = {
        {"FC port", "TVRHBA_FCPort"},       {"Volume", "TVRHBA_StorageVolume"},
        {"Disk", "TVRHBA_LogicalDisk"},     {"Tape drive", "TVRHBA_TapeDrive"},
        {"Device", "TVRHBA_StorageExtent"}, {"Controller", "TVRHBA_SCSIArbitraryLogicalUnit"},
        {"PCI device", "TVRHBA_PCIDevice"}};
    for (const auto& [kind, className] : classes)
        EXPECT_EQ(kinds[kind], json(std::string("enum --names ") + className + " --scenario " + scenario).size())
            << kind;
    EXPECT_EQ(places["Target/Volume"], kinds["Volume"]);
    EXPECT_EQ(places["FC port/Target"], kinds["Target"]);
    EXPECT_EQ(places["Connector/FC port"], 4u);

    const Answer folded = tvrcim("host --scenario " + scenario);
    EXPECT_THAT(folded.out, HasSubstr("  9 units, "));
    EXPECT_THAT(folded.out, testing::Not(HasSubstr("Storage Volume: 0")));
    EXPECT_THAT(folded.out, HasSubstr("(--all lists each target and unit)\n"));
    EXPECT_THAT(tvrcim("host --all --scenario " + scenario).out, HasSubstr("Storage Volume: 0"));
    std::remove(scenario.c_str());
}

/// What the tool writes to a terminal.
std::string onTerminal(std::vector<const char*> words = {"host"})
{
    words.insert(words.begin(), TVR_TVRCIM);
    words.push_back(nullptr);
    int terminal = -1;
    const pid_t process = forkpty(&terminal, nullptr, nullptr, nullptr);
    if (process == 0)
    {
        execv(words[0], const_cast<char* const*>(words.data()));
        _exit(127);
    }
    std::string out;
    char buffer[4096];
    for (ssize_t size; (size = read(terminal, buffer, sizeof buffer)) > 0;)
        out.append(buffer, static_cast<std::size_t>(size));
    close(terminal);
    waitpid(process, nullptr, 0);
    return out;
}

TEST(Tvrcim, ColoursAreForTerminalsThatWantThem)
{
    setenv("TERM", "xterm", 1);
    unsetenv("NO_COLOR");
    EXPECT_THAT(onTerminal(), HasSubstr("1000027A51160211  \x1b[1;31mLINK DOWN\x1b[0m"));
    EXPECT_THAT(tvrcim("host").out, testing::Not(HasSubstr("\x1b")));
    setenv("NO_COLOR", "1", 1);
    EXPECT_THAT(onTerminal(), testing::AllOf(HasSubstr("LINK DOWN"), testing::Not(HasSubstr("\x1b"))));
    unsetenv("NO_COLOR");
}

/// Long work shows on a terminal that it goes on, and leaves nothing of that behind.
TEST(Tvrcim, ShowsThatItIsAtWork)
{
    const std::string scenario = testing::TempDir() + "slow-" + std::to_string(getpid()) + ".json";
    std::ofstream(scenario) << R"({"faults": [{"function": "HBA_GetNumberOfAdapters", "delayMs": 1300, "to": 1}]})";
    std::vector<const char*> words{"--scenario", scenario.c_str(), "delete", "TVRHBA_Card.Tag=none"};
    EXPECT_THAT(onTerminal(words), testing::StartsWith("\rTVRHBA_Card ... 1 s\r                   \r"
                                                       "tvrcim: CIM_ERR_NOT_FOUND: PATH: "));
    const Answer piped = tvrcim("--scenario " + scenario + " delete TVRHBA_Card.Tag=none");
    EXPECT_THAT(piped.err, testing::StartsWith("tvrcim: CIM_ERR_NOT_FOUND: PATH: "));
    words.insert(words.end(), {"--format", "json"});
    EXPECT_THAT(onTerminal(words), testing::StartsWith("tvrcim: CIM_ERR_NOT_FOUND: PATH: "));
    std::remove(scenario.c_str());
}

TEST(Tvrcim, DrawsTheTopology)
{
    const Answer dot = tvrcim("topology");
    ASSERT_EQ(dot.exitCode, 0) << dot.err;
    for (const char* expected : {"label=\"Target 50063D200110000A\"", "label=\"FC port 1000027A51160211\\nLINK DOWN\"",
                                 "label=\"Virtual port 2001027A51320240\\nup, virtual machine guest-1\"",
                                 "\\n500 GiB\\nOLSTRA MERIDIAN 7 DISK"})
        EXPECT_THAT(dot.out, HasSubstr(expected));

    const std::string file = testing::TempDir() + "topology-" + std::to_string(getpid());
    EXPECT_EQ(tvrcim("topology --output " + file + ".dot").exitCode, 0);
    EXPECT_EQ(textOf(file + ".dot"), dot.out);
    std::remove((file + ".dot").c_str());

    const Answer without = tvrcim("topology --output " + file + ".svg", "PATH=/nonexistent ");
    EXPECT_EQ(without.exitCode, 2);
    EXPECT_THAT(without.err, HasSubstr("apt-get install graphviz"));
    EXPECT_FALSE(std::filesystem::exists(file + ".svg"));
    if (std::system("dot -V 2>/dev/null") != 0)
        GTEST_SKIP() << "graphviz is not installed";
    const Answer picture = tvrcim("topology --output " + file + ".svg");
    EXPECT_EQ(picture.exitCode, 0) << picture.err;
    EXPECT_THAT(textOf(file + ".svg"), testing::AllOf(HasSubstr("<svg "), HasSubstr("LINK DOWN"), HasSubstr("</svg>")));
    std::remove((file + ".svg").c_str());
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

/// A folder that the module takes for the root, with a system log.
class FilesOfHost
{
public:
    FilesOfHost()
    {
        EXPECT_TRUE(mkdtemp(_path.data()));
        std::filesystem::create_directories(_path + "/var/log");
        std::filesystem::create_directories(_path + "/etc");
        setenv("TVR_FILE_ROOT", _path.c_str(), 1);
    }
    ~FilesOfHost()
    {
        unsetenv("TVR_FILE_ROOT");
        std::filesystem::remove_all(_path);
    }
    void driverLogs(const std::string& line) const
    {
        std::ofstream(_path + "/var/log/messages", std::ios::app) << line;
    }
    std::string dataFile() const { return textOf(_path + "/etc/tavrin_fc_provider.dmp"); }
    /// Has the log written to a file, under these parameters.
    std::string nameFile(const std::string& parameters) const
    {
        std::ofstream(_path + "/etc/tavrin_fc_provider.dmp") << parameters << _path << "/x.log";
        return _path + "/x.log";
    }
    /// Makes the folder of the first failures' log.
    std::string firstFailures() const
    {
        std::filesystem::create_directories(_path + "/opt/ibm/platform/log");
        return _path + "/opt/ibm/platform/log/tavrin_fc_provider_ffdc.log";
    }

private:
    std::string _path = testing::TempDir() + "tvrcim-root-XXXXXX";
};

TEST(Tvrcim, ShowsTheLogs)
{
    const std::string start = "critical   Continuing logs in Tavrin log provider. \n";
    const std::string warning = "warning   GetOASLunList failed. Unsupported Hardware\n";
    const Answer all = tvrcim("log");
    EXPECT_EQ(all.exitCode, 0) << all.err;
    EXPECT_THAT(all.out, testing::MatchesRegex("20[0-9-]+ [0-9:]+\\.[0-9]+  critical   Continuing(.|\n)*"));
    EXPECT_THAT(all.out, HasSubstr(warning));
    EXPECT_LT(all.out.find(start), all.out.find(warning)) << "the newest last";
    EXPECT_THAT(tvrcim("log --level 1").out, testing::AllOf(HasSubstr(start), testing::Not(HasSubstr(warning))));
    EXPECT_EQ(json("log --level 1")[0]["properties"]["RecordData"], "[ Continuing logs in Tavrin log provider. ]");
    EXPECT_EQ(tvrcim("log --level 4").exitCode, 2);
    EXPECT_EQ(tvrcim("log --driver --level 1").exitCode, 2);

    const FilesOfHost files;
    files.driverLogs("first tvfc\nof others\nsecond tvfc \x1b[2J\n");
    EXPECT_EQ(tvrcim("log --driver").out, "first tvfc\nsecond tvfc ?[2J\n");
    EXPECT_EQ(files.dataFile(), "") << "nothing to be kept";
    EXPECT_EQ(tvrcim("log").exitCode, 0);
    EXPECT_THAT(files.dataFile(), testing::StartsWith("1,5,1\n"));
    for (const bool firstFailures : {false, true})
    {
        const FilesOfHost host;
        const std::string file = firstFailures ? host.firstFailures() : host.nameFile("2,0,1\n");
        const Answer answer = tvrcim("log");
        EXPECT_EQ(answer.exitCode, 0) << answer.err;
        EXPECT_EQ(host.dataFile(), "4,5,1\n" + file) << "a file in use stays in use";
        EXPECT_THAT(textOf(file), HasSubstr("[TVR_DBG]"));
    }
    const std::string none = testing::TempDir() + "none-" + std::to_string(getpid()) + ".json";
    std::ofstream(none) << R"({"adapters": []})";
    const Answer without = tvrcim("log --driver --scenario " + none);
    EXPECT_EQ(without.exitCode, 1);
    EXPECT_THAT(without.err, HasSubstr("there is no driver log"));
    std::remove(none.c_str());
}

/// People read names and units, programs numbers.
TEST(Tvrcim, ReadsNumbersAsTheSchemaNamesThem)
{
    const struct
    {
        const char* arguments;
        const char* expected;
    } rows[] = {
        {"enum TVRHBA_FCPort --properties DeviceID,OperationalStatus,Speed,PortType,SupportedCOS,FECState",
         "1000027A51160210  [OK (2)]           8 Gbit/s   N (10)       [2, 3]        Not Supported (2)\n"},
        {"enum TVRHBA_Transceiver --properties Connector,WaveLength,Temperature,TxBiasCurrent,Vcc",
         "LC (7)     850 nm      38.5 °C      6.82 mA        3.295 V\n"},
        {"enum TVRHBA_StorageVolume --properties BlockSize,Capacity,DeviceType",
         "512 bytes  100 GiB   Direct access block device (0)\n"},
        {"enum TVRHBA_FCPortStatistics --properties BytesTransmitted,LinkFailures", "1608754176 bytes  1\n"},
        {"call TVRHBA_FCHBAWWNService GetWWNCapability Target=TVRHBA_FCPort.DeviceID=1000027A51160210",
         "WWNCapability  Non-volatile names can be changed, Volatile names can be changed, A change needs a reset of "
         "the "
         "adapter (8204)\n"},
        {"class TVRHBA_Chip", "\nBoardTemperature, in degree celsius\n    The temperature of the board; null where no "
                              "sensor reports one.\n"},
        {"methods TVRHBA_FCHBADiagnosticTest RunDiagnosticService", "\n    40064           Adapter busy\n"},
        {"class TVRHBA_Chip", "\nRemovalConditions\n    0 Unknown, 2 Not Applicable,"},
        {"class TVRHBA_DumpData --format mof",
         "    [Read, Write,\n     Description ( \"How many dump files are kept, 1 to 20; older ones go.\" )]\n"
         "    uint32 RetentionCount;\n"},
    };
    for (const auto& row : rows)
        EXPECT_THAT(tvrcim(row.arguments).out, HasSubstr(row.expected)) << row.arguments;
    const nlohmann::json port = json("enum TVRHBA_FCPort")[0]["properties"];
    EXPECT_EQ(port["Speed"], 8'000'000'000);
    EXPECT_EQ(port["OperationalStatus"], nlohmann::json({2}));
    const nlohmann::json declared = json("class TVRHBA_VirtualFCPort");
    std::map<std::string, nlohmann::json> properties;
    for (const nlohmann::json& property : declared["properties"])
        properties[property["name"]] = property;
    EXPECT_EQ(properties["Speed"]["unit"], "bit / second");
    EXPECT_EQ(properties["PortType"]["values"]["10"], "N");
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
        {"host --namespace root/none", 1, "CIM_ERR_INVALID_NAMESPACE"},
        {"topology --output picture.jpg", 2, "picture.jpg"},
        {"topology --output /nonexistent/picture.dot", 2, "/nonexistent/picture.dot"},
        {"topology --format json", 2, "--format"},
        {"host --module /nonexistent.so", 2, "/nonexistent.so"},
        {"host --scenario " + wrongScenario, 2, "/adapters/0/name"},
        {"host --scenario " + wrongScenario, 2, wrongScenario},
        {"classes > /dev/full", 6, "not all of the output could be written"},
        {"--help > /dev/full", 6, "not all of the output could be written"},
        {"enum NoSuchClass > /dev/full", 1, "CIM_ERR_INVALID_CLASS"},
        {"diag 1000027A51160210 ''", 2, "there is no test ''"},
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

// --- dumps ---------------------------------------------------------------------------------------------

TEST(Tvrcim, HasPortsMakeDumps)
{
    const std::string held = R"(["1000027A51160210_20240229_134501.dmp","1000027A51160210_20240301_080000.core"])";
    for (const char* port : {"1000027A51160210", "10:00:02:7a:51:16:02:10"})
        EXPECT_EQ(json(std::string("dump --list ") + port).dump(), held);
    const nlohmann::json made = json("dump 1000027A51160210");
    ASSERT_EQ(made.size(), 3u);
    EXPECT_THAT(made[2].get<std::string>(), testing::MatchesRegex("1000027A51160210_[0-9]{8}_[0-9]{6}\\.dmp"));
    EXPECT_EQ(tvrcim("dump 1000027A51160211 --list").out, "");
    EXPECT_EQ(tvrcim("dump 1000027A51160210 --delete").out, "deleted the dump files of 1000027A51160210\n");
    EXPECT_EQ(tvrcim("dump 1000027A51160210 --keep 9").out, "keeping 9 dump files of 1000027A51160210\n");

    const std::string broken = testing::TempDir() + "broken-" + std::to_string(getpid()) + ".json";
    std::ofstream(broken) << R"({"adapters": [{"name": "A", "serialNumber": "S", "model": "M",
        "ports": [{"wwpn": "1000000000000001"}]}], "faults": [{"function": "LRM_GenerateDump", "status": 97}]})";
    const struct
    {
        std::string arguments;
        int exitCode;
        std::string expected;
    } rows[] = {
        {"dump 1000000000000001 --scenario " + broken, 4, "GenerateDump returned 40097"},
        {"dump 1000027A51160210 --keep 21", 1, "CIM_ERR_FAILED"},
        {"dump 1000027A51160210 --keep few", 2, "few"},
        {"dump 1000027A51160210 --keep 3 --list", 2, "--list"},
        {"dump 1000000000000002 --scenario " + broken, 2, "the host has 1000000000000001"},
        {"dump", 2, "PORT"},
    };
    for (const auto& row : rows)
    {
        const Answer run = tvrcim(row.arguments);
        EXPECT_EQ(run.exitCode, row.exitCode) << row.arguments << "\n" << run.err;
        EXPECT_THAT(run.err, HasSubstr(row.expected)) << row.arguments;
        EXPECT_EQ(run.out, "") << row.arguments;
    }
    std::remove(broken.c_str());
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

// --- diagnostic tests -----------------------------------------------------------------------------------

const std::string testedPorts = std::string("--scenario ") + TVR_SCENARIOS + "/diagnostics.json ";

TEST(TvrcimDiag, ListsTheTestsAndWhatPortsRun)
{
    const Answer run = tvrcim(testedPorts + "diag");
    ASSERT_EQ(run.exitCode, 0) << run.err;
    for (const char* expected :
         {"\nbeacon             LoopControlParameter=5 ",
          "\necho               LoopControlParameter=100 HaltOnError=false BufferSizes=8 BufferPattern=1a2b3c4d LUN=0 "
          "TargetDevice=  Test verifies the data path from host to target\n",
          "\nd-port  ", "\n1000027A51320601  all\n", "\n1000027A51320605  all but d-port\n"})
        EXPECT_THAT(run.out, HasSubstr(expected));
    const nlohmann::json list = json(testedPorts + "diag");
    EXPECT_EQ(list["tests"].size(), 10u);
    EXPECT_EQ(list["ports"][4]["tests"].size(), 9u);
}

TEST(TvrcimDiag, TellsHowATestEnded)
{
    const struct
    {
        const char* arguments;
        int exitCode;
        std::vector<std::string> out;
        std::string err;
    } rows[] = {
        {"1000027A51320601 status",
         0,
         {"TVR:FCHBA Status Test of 1000027A51320601  passed\n", "TVR:FCHBA Status Test:1:65535, completed\n",
          "  state             OK\n", "Resulted with Success"},
         "status test of 1000027A51320601 ... 0 s\n"},
        {"10:00:02:7a:51:32:06:03 Echo targetdevice=50:06:3d:20:01:10:00:0a LoopControlParameter=7 BufferSizes=9",
         0,
         {"  loops             7 passed, 0 failed\n"},
         "tvrcim: BufferSizes: the test does not take '9' but has '8'\n"},
        {"1000027A51320602 ec TargetDevice=50063D200110000A",
         5,
         {"TVR:FCHBA Echo Test of 1000027A51320602  FAILED\n", ", exception\n", "  state             failed\n",
          "1 failed\n", "  suggested         a) Verify end devices b) Verify switch configuration"},
         "the test did not pass"},
        {"1000027A51320601 echo", 4, {}, "RunDiagnosticService returned 5 (Invalid Parameter)"},
        {"1000027A51320604 dport", 4, {}, "RunDiagnosticService returned "},
        {"1000027A51320605 self", 4, {}, "RunDiagnosticService made no job"},
        {"1000027A51320601 e", 2, {}, "TEST: 'e' may be echo, external-loopback"},
        {"1000027A51320601 colour", 2, {}, "there is no test 'colour'; the host has beacon, "},
        {"1000027A51320601 echo LUNS=1", 2, {}, "'LUNS': TVRHBA_FCHBADiagnosticSettingData has none of that name"},
        {"1000027A51320609 echo", 2, {}, "there is no port '1000027A51320609'"},
        {"1000027A51320601", 2, {}, "TEST"},
    };
    for (const auto& row : rows)
    {
        const Answer run = tvrcim(testedPorts + "diag " + row.arguments);
        EXPECT_EQ(run.exitCode, row.exitCode) << row.arguments << "\n" << run.err;
        EXPECT_THAT(run.err, HasSubstr(row.err)) << row.arguments;
        EXPECT_EQ(run.out.empty(), row.out.empty()) << row.arguments;
        for (const std::string& expected : row.out)
            EXPECT_THAT(run.out, HasSubstr(expected)) << row.arguments;
    }
    const nlohmann::json passed = json(testedPorts + "diag 1000027A51320601 status");
    EXPECT_EQ(passed["result"], "passed");
    EXPECT_EQ(passed["completion"]["CompletionState"], 2);
}

TEST(TvrcimDiag, ShowsThePhasesOfALink)
{
    const Answer run = tvrcim(testedPorts + "diag 1000027A51320602 dport");
    EXPECT_EQ(run.exitCode, 5) << run.err;
    for (const char* expected : {"TVR:FCHBA D-Port Test of 1000027A51320602  FAILED\n", "\nphase ", "  result ",
                                 "  latency  local errors", "  remote errors\n"})
        EXPECT_THAT(run.out, HasSubstr(expected));
    EXPECT_THAT(run.out, testing::ContainsRegex("Electrical[^\n]* 38 +- +-"));
    EXPECT_THAT(run.err, HasSubstr("d-port test of 1000027A51320602 ... 0 s\n"));
}

/// Also while the provider still begins it, and the job is not known.
TEST(TvrcimDiag, CancelsTheTestOfALink)
{
    const std::string scenario = std::string(TVR_SCENARIOS) + "/diagnostics.json";
    Running tool({"--scenario", scenario.c_str(), "diag", "1000027A51320603", "dport", "--format", "json"});
    const pid_t process = tool.process();
    ASSERT_TRUE(test_support::eventually([&] { return semaphoresOf(process) > 0; }));
    sleep(3);
    kill(process, SIGINT);
    std::string out;
    for (std::string line = tool.readLine(); !line.empty(); line = tool.readLine())
        out += line;
    EXPECT_EQ(tool.readAll(), 128 + SIGINT);
    const nlohmann::json end = nlohmann::json::parse(out);
    EXPECT_EQ(end["result"], "cancelled");
    EXPECT_EQ(end["job"]["JobState"], 8);
    EXPECT_TRUE(end["completion"].is_null());
    EXPECT_EQ(semaphoresOf(process), 0u);
}

/// What the driver logs is shown when it comes, until somebody ends the tool or stops reading.
TEST(Tvrcim, FollowsTheDriversLog)
{
    const FilesOfHost files;
    files.driverLogs("tvfc 1\n");
    {
        Running tool({"log", "--driver", "--follow"});
        EXPECT_EQ(tool.readLine(), "tvfc 1");
        files.driverLogs("other\ntvfc 2\ntvfc 3\n");
        EXPECT_EQ(tool.readLine(), "tvfc 2");
        EXPECT_EQ(tool.readLine(), "tvfc 3");
        EXPECT_EQ(tool.endBy(SIGINT), 128 + SIGINT);
    }
    Running tool({"log", "--follow"});
    EXPECT_THAT(tool.readLine(), HasSubstr("Continuing logs"));
    const pid_t process = tool.process();
    EXPECT_EQ(tool.closeOutput(), 0);
    EXPECT_EQ(semaphoresOf(process), 0u);
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
