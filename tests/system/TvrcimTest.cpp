// The command-line tool as a person or a script uses it: a process of its own, its output and its exit code.
#include <gmock/gmock.h>
#include <gtest/gtest.h>
#include <nlohmann/json.hpp>

#include <cstdio>
#include <cstdlib>
#include <fstream>
#include <string>
#include <sys/wait.h>
#include <unistd.h>
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

} // namespace
