// What the tool tells an administrator of this machine, which is made up here: its files, libraries and CIM servers.
#include "tests/system/Tool.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>
#include <nlohmann/json.hpp>

#include <filesystem>
#include <fstream>
#include <regex>
#include <string>
#include <utility>
#include <vector>

namespace fs = std::filesystem;
using namespace system_test;
using testing::HasSubstr;
using testing::Not;

namespace
{

const char* const libraryNames[] = {"libHBAAPI.so.2", "libHBAAPI.so", "liblrmapi.so", "librmapi.so"};

class Machine
{
public:
    /// Its libraries are files that no loader takes, and it knows no CIM server.
    Machine()
    {
        EXPECT_TRUE(mkdtemp(_path.data()));
        for (const char* library : libraryNames)
            write(std::string("lib/") + library, "");
        for (const char* folder : {"etc", "bin", "var/log", "opt/ibm/platform/log"})
            fs::create_directories(*this / folder);
    }
    ~Machine() { fs::remove_all(_path); }
    Machine(const Machine&) = delete;
    Machine& operator=(const Machine&) = delete;

    std::string operator/(const std::string& name) const { return _path + "/" + name; }

    void write(const std::string& name, const std::string& text) const
    {
        fs::create_directories(fs::path(*this / name).parent_path());
        std::ofstream(*this / name) << text;
    }

    /// The simulator's libraries are found as those of real adapters are.
    void install(const std::vector<std::string>& libraries) const
    {
        for (const std::string& library : libraries)
            fs::copy_file(TVR_SIMULATOR_FOLDER "/" + library, *this / ("lib/" + library),
                          fs::copy_options::overwrite_existing);
    }
    void installAll() const { install({"libHBAAPI.so.2", "liblrmapi.so", "libtvrsim.so", "libtvrsim_tagging.so"}); }

    /// The script that registers the module prints this for the status of servers.
    void installScript(const std::string& prints) const
    {
        write("bin/tavrin-fc-register", "#!/bin/sh\n[ \"$*\" = --status ] || exit 2\n" + prints);
        fs::permissions(*this / "bin/tavrin-fc-register", fs::perms::owner_all);
    }

    /// "ROOT" stands for the machine's folder, "BUILD" for that of the build. What this says of libcurl and of the user
    /// of the test is left out.
    Answer run(const std::string& arguments) const
    {
        Answer answer =
            tvrcim(arguments, "TVR_FILE_ROOT=" + _path + " LD_LIBRARY_PATH=" + _path + "/lib PATH=" + _path + "/bin ");
        for (std::string* text : {&answer.out, &answer.err})
        {
            *text = std::regex_replace(*text, std::regex(_path), "ROOT");
            *text = std::regex_replace(*text, std::regex(TVR_BUILD), "BUILD");
            *text = std::regex_replace(*text, std::regex("[a-z]+ +(libcurl|user) .*\n( +-> .*\n)?"), "");
        }
        return answer;
    }

private:
    std::string _path = testing::TempDir() + "check-XXXXXX";
};

TEST(TvrcimCheck, AMachineThatHasAll)
{
    const Machine machine;
    machine.installAll();
    machine.installScript(R"(printf 'sfcb\t/usr/bin\trunning\tregistered\t/usr/lib64/cmpi/libtavrin_fc_provider.so\n'
)");
    const std::string settings = "TVR_PROVIDER_CACHE_TIMEOUT = 3\nTVR_PROVIDER_REFRESH_SANDATA = FALSE\n";
    machine.write("etc/tavrin_fc_provider.conf", settings);
    machine.write("etc/tvr_smis.conf", "# the page\nhttps://host.example.net/page\n");
    machine.write("etc/tavrin_fc_provider.dmp", "4,5,1\n" + machine / "provider.log");
    machine.write("provider.log", std::string(2048, 'x'));
    machine.write("var/log/messages", "");
    const Answer run = machine.run("--hardware check");
    EXPECT_EQ(run.out,
              "ok       HBA API library  ROOT/lib/libHBAAPI.so.2, has all 12 entry points\n"
              "ok       RM library       ROOT/lib/liblrmapi.so, version 12.0.100.0, has all 72 entry points\n"
              "ok       frame tagging    has all 7 entry points\n"
              "ok       adapters         2 cards with 4 FC ports: TV1602 (TV16A02417), TV3202 (TV32B71155)\n"
              "ok       module           BUILD/module/libtavrin_fc_provider.so, version 10.2.261-13, 159 classes and "
              "423 factories\n"
              "ok       registration     BUILD/generated/mof/tavrin_fc_provider.reg\n"
              "ok       settings         ROOT/etc/tavrin_fc_provider.conf: cache of 3 minutes, refresh of adapters no, "
              "of the SAN no\n"
              "ok       management page  ROOT/etc/tvr_smis.conf names https://host.example.net/page\n"
              "ok       log settings     ROOT/etc/tavrin_fc_provider.dmp: logs in memory and a file, mode 4, level 5\n"
              "ok       log              ROOT/provider.log has 2 KiB\n"
              "ok       driver log       ROOT/var/log/messages can be read\n"
              "ok       sfcb             registered, running, module /usr/lib64/cmpi/libtavrin_fc_provider.so\n"
              "all that is needed is there\n");
    EXPECT_EQ(run.err, "");
    EXPECT_EQ(run.exitCode, 0);
    EXPECT_EQ(textOf(machine / "etc/tavrin_fc_provider.conf"), settings);
}

TEST(TvrcimCheck, AMachineThatHasNothing)
{
    const Machine machine;
    fs::remove(machine / "opt/ibm/platform/log");
    const Answer run = machine.run("--hardware check");
    EXPECT_EQ(run.out,
              "missing  HBA API library  ROOT/lib/libHBAAPI.so.2: file too short; ROOT/lib/libHBAAPI.so: file too "
              "short\n"
              "                          -> install the HBA API library, such as the package libhbaapi2\n"
              "missing  RM library       ROOT/lib/liblrmapi.so: file too short; ROOT/lib/librmapi.so: file too short\n"
              "                          -> install the management library of the adapters' vendor\n"
              "missing  adapters         none is seen\n"
              "                          -> install the libraries\n"
              "ok       module           BUILD/module/libtavrin_fc_provider.so, 159 classes and 423 factories\n"
              "ok       registration     BUILD/generated/mof/tavrin_fc_provider.reg\n"
              "note     settings         ROOT/etc/tavrin_fc_provider.conf is not there yet; cache of 10 minutes, "
              "refresh of adapters no, of the SAN yes\n"
              "note     management page  ROOT/etc/tvr_smis.conf is not there: no page is published\n"
              "note     log settings     ROOT/etc/tavrin_fc_provider.dmp is not there: errors alone are logged\n"
              "warning  error log        ROOT/opt/ibm/platform/log/tavrin_fc_provider_ffdc.log cannot be made\n"
              "                          -> mkdir -p ROOT/opt/ibm/platform/log\n"
              "note     driver log       ROOT/var/log/messages is not there: the driver's lines are not shown\n"
              "                          -> install rsyslog, and have it write kern.* there\n"
              "warning  CIM servers      tavrin-fc-register, which knows them, is not installed\n"
              "                          -> install the package tavrin-fc-provider\n"
              "3 things are missing or wrong\n");
    EXPECT_EQ(run.err, "");
    EXPECT_EQ(run.exitCode, 7);

    // The same for programs.
    const Answer forPrograms = machine.run("--hardware check --format json");
    EXPECT_EQ(forPrograms.exitCode, 7);
    const auto findings = nlohmann::json::parse(forPrograms.out);
    ASSERT_GT(findings.size(), 4u);
    EXPECT_EQ(findings[3], nlohmann::json::parse(R"({"state": "missing", "subject": "adapters", "text": "none is seen",
        "remedy": "install the libraries", "cards": [], "ports": 0})"));
    EXPECT_EQ(findings[4].value("classes", 0), 159);
    EXPECT_TRUE(findings[4].at("remedy").is_null());
}

/// An empty host would say that nothing is wrong.
TEST(TvrcimCheck, WithoutLibrariesOtherCommandsSaySo)
{
    const Machine machine;
    for (const char* arguments : {"host", "enum TVRHBA_Card", "log", "topology", "diag"})
    {
        const Answer run = machine.run(std::string("--hardware ") + arguments);
        EXPECT_EQ(run.err, "tvrcim: no library of adapters can be opened, so that there is nothing to show "
                           "(libHBAAPI.so.2, libHBAAPI.so, liblrmapi.so, librmapi.so): 'tvrcim --hardware check' tells "
                           "what is missing\n");
        EXPECT_EQ(run.out, "") << arguments;
        EXPECT_EQ(run.exitCode, 7) << arguments;
    }
    EXPECT_THAT(machine.run("--hardware classes").out, HasSubstr("\nTVRHBA_Card "));
    machine.install({"libHBAAPI.so.2", "libtvrsim.so"});
    EXPECT_EQ(machine.run("--hardware host").exitCode, 0);
}

TEST(TvrcimCheck, LibrariesThatLackSomething)
{
    {
        const Machine machine;
        machine.installAll();
        // Names of other letters in the place of two that the module calls, and of one that it does not.
        for (const char* name : {"LRM_GetVPD", "LRM_ScsiInquiry", "LRM_ListVM"})
            runCommand(std::string("sed -i 's/") + name + "\\x00/LRM_" +
                       std::string(std::string(name).size() - 4, 'x') + "\\x00/g' " + machine / "lib/liblrmapi.so");
        const Answer run = machine.run("--hardware check");
        EXPECT_THAT(run.out, HasSubstr("\nwarning  RM library       ROOT/lib/liblrmapi.so, version 12.0.100.0, lacks 2 "
                                       "of 72 entry points: LRM_GetVPD, LRM_ScsiInquiry\n"
                                       "                          -> install a newer version of it: what needs these "
                                       "fails\n"));
        EXPECT_EQ(run.exitCode, 0) << run.out;
    }
    const struct
    {
        std::vector<std::string> libraries;
        std::vector<std::string> lines;
        int exitCode;
    } rows[] = {
        // The fallback library has the HBA API and the functions for tagging as well.
        {{"librmapi.so", "libtvrsim.so", "libtvrsim_tagging.so"},
         {"ok       HBA API library  ROOT/lib/librmapi.so, has all 12 entry points\n",
          "ok       RM library       ROOT/lib/librmapi.so, version 12.0.100.0, has all 72 entry points\n",
          "ok       adapters         2 cards with 4 FC ports"},
         0},
        {{"liblrmapi.so", "libtvrsim.so"},
         {"missing  HBA API library  ROOT/lib/libHBAAPI.so.2: file too short", "ok       RM library  ",
          "note     frame tagging    is not offered: 7 of 7 entry points are absent\n",
          "missing  adapters         none is seen\n                          -> install the libraries\n",
          "2 things are missing or wrong\n"},
         7},
    };
    for (const auto& row : rows)
    {
        const Machine machine;
        machine.install(row.libraries);
        const Answer run = machine.run("--hardware check");
        for (const std::string& line : row.lines)
            EXPECT_THAT(run.out, HasSubstr(line));
        EXPECT_EQ(run.exitCode, row.exitCode);
    }
}

/// Simulated are the libraries and the adapters; files and servers are the machine's.
TEST(TvrcimCheck, WithTheSimulator)
{
    const Machine machine;
    machine.write("etc/tvr_smis.conf", "https://host.example.net/page\n");
    const Answer run = machine.run("check");
    EXPECT_THAT(run.out, testing::StartsWith("note     simulation       the libraries and adapters below are those of "
                                             "the simulator\n"
                                             "                          -> 'tvrcim --hardware check' looks at this "
                                             "machine's\n"
                                             "ok       HBA API library  BUILD/simulator/libHBAAPI.so.2, has all 12 "
                                             "entry points\n"));
    EXPECT_THAT(run.out, HasSubstr("ROOT/etc/tvr_smis.conf names https://host.example.net/page\n"));
    EXPECT_EQ(run.exitCode, 0);
    const Answer empty = machine.run("check --scenario " TVR_SCENARIOS "/empty.json");
    EXPECT_THAT(empty.out, HasSubstr("missing  adapters         none is seen\n                          -> load the "
                                     "adapters' driver; /etc/hba.conf must name the vendor's HBA API library\n"));
    EXPECT_EQ(empty.exitCode, 7);
    EXPECT_EQ(machine.run("check --format mof").exitCode, 2);
}

TEST(TvrcimCheck, AModuleThatCannotBeOpened)
{
    const Machine machine;
    machine.write("module.so", "");
    const Answer run = machine.run("check --module " + machine / "module.so");
    EXPECT_THAT(run.out, HasSubstr("\nok       RM library       BUILD/simulator/liblrmapi.so, has all 72 entry "
                                   "points\n"));
    EXPECT_THAT(run.out, HasSubstr("\nwrong    module           cannot open the module: ROOT/module.so: file too "
                                   "short\n"));
    EXPECT_EQ(run.exitCode, 7);
}

TEST(TvrcimCheck, FilesThatAreNotInOrder)
{
    const std::string conf = "etc/tavrin_fc_provider.conf";
    const std::string data = "etc/tavrin_fc_provider.dmp";
    const struct
    {
        std::string file; ///< a folder where nothing is said of its text
        const char* text;
        std::string line;
        int exitCode;
    } rows[] = {
        {conf, nullptr, "wrong    settings         ROOT/etc/tavrin_fc_provider.conf cannot be read: ", 7},
        {conf, "# settings\nTVR_PROVIDER_CACHE_TIMEOUT = 99\nTVR_PROVIDER_REFRESH_SANDATA = FALSE\nX = Y\n",
         "warning  settings         ROOT/etc/tavrin_fc_provider.conf has 2 lines that are passed over, as "
         "'TVR_PROVIDER_CACHE_TIMEOUT = 99'; cache of 10 minutes, refresh of adapters no, of the SAN no\n"
         "                          -> the timeout is a number from 1 to 30, the others are TRUE or FALSE\n",
         0},
        {"etc/tvr_smis.conf", "# no page\n", "warning  management page  ROOT/etc/tvr_smis.conf names no page\n", 0},
        {data, nullptr, "wrong    log settings     ROOT/etc/tavrin_fc_provider.dmp cannot be read: ", 7},
        {data, "7,5,1\n",
         "wrong    log settings     ROOT/etc/tavrin_fc_provider.dmp cannot be used: the mode is none of 0 to 4\n", 7},
        {data, "2,5,1\n",
         "wrong    log settings     ROOT/etc/tavrin_fc_provider.dmp cannot be used: the second line, the log file, is "
         "missing\n",
         7},
        {data, "1,5,0\n",
         "warning  log settings     ROOT/etc/tavrin_fc_provider.dmp: logs in memory, mode 1, level 5, disabled\n"
         "                          -> 'tvrcim --hardware log' switches it on\n",
         0},
        {data, "2,3,1\n/nonexistent/x.log\n",
         "warning  log              /nonexistent/x.log cannot be made\n"
         "                          -> mkdir -p /nonexistent\n",
         0},
        {data, "2,3,1\nx.log\n", "wrong    log              x.log is no absolute path\n", 7},
        {"var/log/messages", nullptr, "warning  driver log       ROOT/var/log/messages cannot be read: ", 0},
    };
    for (const auto& row : rows)
    {
        const Machine machine;
        if (row.text)
            machine.write(row.file, row.text);
        else
            fs::create_directories(machine / row.file);
        machine.installAll();
        const Answer run = machine.run("--hardware check");
        EXPECT_THAT(run.out, HasSubstr(row.line)) << run.err;
        EXPECT_EQ(run.exitCode, row.exitCode) << row.line;
        if (row.text)
        {
            EXPECT_EQ(textOf(machine / row.file), row.text); // a check changes nothing
        }
    }
}

TEST(TvrcimCheck, WhatTheScriptSaysOfServers)
{
    const struct
    {
        const char* prints;
        std::string lines;
        int exitCode;
    } rows[] = {
        {"printf 'sfcb\\t/usr/bin\\tstopped\\tregistered\\t-\\npegasus\\t/usr/sbin\\tdreaming\\tperhaps\\t/x.so\\n'\n",
         "wrong    sfcb             registered, stopped, and has no module in its folders of providers\n"
         "                          -> run tavrin-fc-register remove, and then tavrin-fc-register\n"
         "note     pegasus          perhaps, dreaming, module /x.so\n"
         "1 thing is missing or wrong\n",
         7},
        {"echo trouble >&2; exit 3\n",
         "wrong    CIM servers      tavrin-fc-register tells nothing: trouble\\n\n"
         "                          -> run 'tavrin-fc-register status', and see what it says\n",
         7},
        {"kill -9 $$\n", "wrong    CIM servers      tavrin-fc-register was ended by signal 9\n", 7},
    };
    for (const auto& row : rows)
    {
        const Machine machine;
        machine.installScript(row.prints);
        const Answer run = machine.run("check");
        EXPECT_THAT(run.out, HasSubstr(row.lines));
        EXPECT_EQ(run.exitCode, row.exitCode);
    }
}

} // namespace
