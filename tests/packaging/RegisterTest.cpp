// The script that registers the module, against stand-ins of both servers' tools.
#include "tests/packaging/Servers.h"
#include "tests/support/Command.h"

#include <gmock/gmock.h>

#include <algorithm>
#include <string>

using testing::AllOf;
using testing::EndsWith;
using testing::HasSubstr;
using testing::Not;

namespace
{

const std::string mof = "ROOT/usr/share/tavrin-fc-provider/mof/";
const std::string link = "libtavrin_fc_provider.so";

const std::string sfcbRegister = "sfcbstage -n root/tavrin -r " + mof + "tavrin_fc_provider.reg " + mof +
                                 "cim_classes.mof " + mof + "tavrin_classes.mof\n" +
                                 "sfcbstage -n root/interop TMP/tavrin_cim_classes.mof " + mof + "tavrin_classes.mof\n";
const std::string sfcbRemove =
    "sfcbunstage -n root/tavrin -r tavrin_fc_provider.reg cim_classes.mof tavrin_classes.mof\n"
    "sfcbunstage -n root/interop tavrin_cim_classes.mof tavrin_classes.mof\n";

const std::string pegasusClasses = "cimmof -w -aE -n root/tavrin " + mof + "qualifiers.mof\n" +
                                   "cimmof -w -aE -n root/tavrin " + mof + "cim_classes.mof\n" +
                                   "cimmof -w -aE -n root/tavrin " + mof + "tavrin_classes.mof\n" +
                                   "cimmof -w -aE -n root/PG_InterOp " + mof + "cim_classes.mof\n" +
                                   "cimmof -w -aE -n root/PG_InterOp " + mof + "tavrin_classes.mof\n";
const std::string pegasusPlatform = "cimmof -w -aE -n root/ibmse " + mof + "qualifiers.mof\n" +
                                    "cimmof -w -aE -n root/ibmse " + mof + "cim_classes.mof\n" +
                                    "cimmof -w -aE -n root/ibmse TMP/platform_classes.mof\n" +
                                    "cimmof -n root/ibmse TMP/platform_instances.mof\n";
const std::string pegasusProviders = "cimmof -w -n root/PG_InterOp TMP/registration.mof\n";

const std::string absentSfcb = "sfcb\t-\t-\tno\t-\n";
const std::string absentPegasus = "pegasus\t-\t-\tno\t-\n";

std::string linesWith(const std::string& text, const std::string& part)
{
    std::string lines;
    for (std::size_t begin = 0, end; begin < text.size(); begin = end + 1)
    {
        end = std::min(text.find('\n', begin), text.size() - 1);
        const std::string line = text.substr(begin, end + 1 - begin);
        if (line.find(part) != line.npos)
            lines += line;
    }
    return lines;
}

TEST(Register, SmallFootprintServerAndBack)
{
    const Servers servers;
    servers.installSmallFootprint();
    const std::string before = servers.stateOf("sfcb");
    EXPECT_EQ(servers.run("--status").text, "sfcb\tROOT/tools\tSTATE\tno\t-\n" + absentPegasus);

    // Its configuration is beside its tools.
    const Servers::Run first = servers.run("register");
    EXPECT_EQ(first.exitCode, 0) << first.text;
    EXPECT_THAT(first.text, HasSubstr("sfcb: restart the server if it runs\nsfcb: registered\n"));
    EXPECT_EQ(servers.takeCalls(), sfcbRegister + "sfcbrepos -f\n");
    EXPECT_EQ(textOf(servers.root() / "sfcb/cmpi/" + link), "the module");
    // Of the schema only what the server lacks.
    const std::string added = textOf(servers.root() / "sfcb/stage/mofs/root/interop/tavrin_cim_classes.mof");
    EXPECT_EQ(linesWith(added, "class CIM_"),
              "class CIM_FCHBADiagnosticServiceCapabilities : CIM_DiagnosticServiceCapabilities {\n"
              "class CIM_FCHBADiagnosticSettingData : CIM_DiagnosticSettingData {\n"
              "class CIM_FCHBADiagnosticTest : CIM_DiagnosticTest {\n"
              "class CIM_SCSIArbitraryLogicalUnit : CIM_LogicalDevice {\n");

    const Servers::Run second = servers.run("");
    EXPECT_EQ(second.text, "sfcb: registered already\n");
    EXPECT_EQ(servers.takeCalls(), "");
    const Servers::Run status = servers.run("--status");
    EXPECT_EQ(status.text, "sfcb\tROOT/tools\tSTATE\tregistered\tROOT/sfcb/cmpi/" + link + "\n" + absentPegasus);
    EXPECT_EQ(status.exitCode, 0);

    // What is there already is mended where it suffered.
    std::filesystem::remove(servers.root() / "sfcb/cmpi/" + link);
    EXPECT_THAT(servers.run("").text, EndsWith("sfcb: registered already\n"));
    EXPECT_EQ(textOf(servers.root() / "sfcb/cmpi/" + link), "the module");
    servers.root().write("usr/lib64/cmpi/" + link, "the module, installed elsewhere");
    EXPECT_EQ(servers.run("").exitCode, 0);
    EXPECT_EQ(textOf(servers.root() / "sfcb/cmpi/" + link), "the module, installed elsewhere");

    // One that an administrator put there is told of, and left alone.
    std::filesystem::remove(servers.root() / "sfcb/cmpi/" + link);
    servers.root().write("sfcb/lib/" + link, "another module");
    EXPECT_THAT(servers.run("").text,
                HasSubstr("warning: ROOT/sfcb/lib/" + link + " is another module than ROOT/usr/lib64"));
    EXPECT_EQ(textOf(servers.root() / "sfcb/lib/" + link), "another module");
    std::filesystem::remove(servers.root() / "sfcb/lib/" + link);

    // An update of the package has other files; a platform stays once it is there.
    EXPECT_EQ(servers.run("register --platform").exitCode, 0);
    EXPECT_EQ(servers.takeCalls(),
              sfcbRegister + "sfcbstage -n root/ibmse TMP/tavrin_platform.mof\n" + "sfcbrepos -f\n");
    const std::string platform = textOf(servers.root() / "sfcb/stage/mofs/root/ibmse/tavrin_platform.mof");
    EXPECT_EQ(linesWith(platform, "class IBMSD"), "class IBMSD_Chassis : CIM_Chassis {\n"
                                                  "class IBMSD_ComputerSystem : CIM_ComputerSystem {\n");
    EXPECT_THAT(platform, HasSubstr("   Name = \"host.example.net\";\n"));
    EXPECT_THAT(platform, HasSubstr("   Tag = \"host.example.net chassis\";\n"));
    servers.root().write("usr/share/tavrin-fc-provider/mof/tavrin_fc_provider.reg", "[TVRHBA_Card]\n#\n");
    EXPECT_THAT(servers.run("--status").text, HasSubstr("\toutdated\t"));
    EXPECT_THAT(servers.run("status").text,
                AllOf(HasSubstr("sfcb: registered, with other classes"), EndsWith(": register again\n")));
    servers.installSystemd("sfcb");
    EXPECT_EQ(servers.run("register").exitCode, 0);
    const std::string again = servers.takeCalls();
    EXPECT_THAT(again, HasSubstr("sfcbstage -n root/ibmse"));
    EXPECT_THAT(again, EndsWith("sfcbrepos -f\nsystemctl restart sfcb\n"));

    EXPECT_THAT(servers.run("remove").text, HasSubstr("sfcb: removed\n"));
    EXPECT_EQ(servers.takeCalls(), sfcbRemove + "sfcbunstage -n root/ibmse tavrin_platform.mof\n" +
                                       "sfcbrepos -f\nsystemctl restart sfcb\n");
    EXPECT_EQ(servers.stateOf("sfcb"), before);
    EXPECT_FALSE(std::filesystem::exists(servers.root() / "state"));
    EXPECT_EQ(servers.run("remove").text, "sfcb: not registered\n");
    EXPECT_EQ(servers.takeCalls(), "");
}

TEST(Register, TheToolTellsTheSameOfServers)
{
    const Servers servers;
    EXPECT_EQ(servers.check(),
              "warning  CIM servers      none is here, or has its tools in PATH: sfcb, pegasus\n"
              "                          -> install one, and run tavrin-fc-register; 'tvrcim serve' answers clients "
              "without\n"
              "all that is needed is there\n");
    servers.installSmallFootprint();
    servers.installOpenGroup();
    EXPECT_EQ(servers.check(), "missing  sfcb             not registered, STATE\n"
                               "                          -> run tavrin-fc-register\n"
                               "missing  pegasus          not registered, running\n"
                               "                          -> run tavrin-fc-register\n"
                               "2 things are missing or wrong\n");
    EXPECT_EQ(servers.run("register").exitCode, 0);
    EXPECT_EQ(servers.check(), "ok       sfcb             registered, STATE, module ROOT/sfcb/cmpi/" + link +
                                   "\n"
                                   "ok       pegasus          registered, running, module ROOT/pegasus/lib/" +
                                   link + "\nall that is needed is there\n");
    servers.root().write("usr/share/tavrin-fc-provider/mof/tavrin_fc_provider.reg", "[TVRHBA_Card]\n#\n");
    EXPECT_THAT(servers.check(),
                HasSubstr("warning  sfcb             registered, with other classes than are installed, STATE, module "
                          "ROOT/sfcb/cmpi/" +
                          link + "\n                          -> run tavrin-fc-register\n"));
    std::filesystem::remove(servers.root() / "pegasus/running");
    std::filesystem::remove_all(servers.root() / "state");
    EXPECT_EQ(servers.check(), "ok       sfcb             registered, but not by tavrin-fc-register, STATE, module "
                               "ROOT/sfcb/cmpi/" +
                                   link +
                                   "\n"
                                   "warning  pegasus          does not tell whether the module is registered, stopped\n"
                                   "                          -> start the server\n"
                                   "all that is needed is there\n");
}

/// The server's repository is gone where it refuses one file: without a second build it would serve nobody.
TEST(Register, SmallFootprintServerRefusesAndIsAsBefore)
{
    const Servers servers;
    servers.installSmallFootprint();
    const std::string before = servers.stateOf("sfcb");
    servers.root().write("refuse", "");
    const Servers::Run run = servers.run("register");
    EXPECT_EQ(run.exitCode, 1);
    EXPECT_THAT(run.text, HasSubstr("sfcb:   error near line 7\n"));
    EXPECT_EQ(servers.takeCalls(), sfcbRegister + "sfcbrepos -f\n" + sfcbRemove + "sfcbrepos -f\n");
    EXPECT_EQ(servers.stateOf("sfcb"), before);
}

TEST(Register, OpenGroupServerAndBack)
{
    const Servers servers;
    servers.installOpenGroup();
    const std::string before = servers.stateOf("pegasus");
    EXPECT_EQ(servers.run("register").exitCode, 0);
    EXPECT_EQ(servers.takeCalls(), pegasusClasses + pegasusProviders);
    EXPECT_EQ(textOf(servers.root() / "pegasus/lib/" + link), "the module");
    EXPECT_EQ(servers.run("register").text, "pegasus: registered already\n");
    EXPECT_EQ(servers.takeCalls(), "");

    // What the server has does not become another by compiling, so that all is taken out first.
    EXPECT_EQ(servers.run("register --platform").exitCode, 0);
    const std::string again = servers.takeCalls();
    EXPECT_EQ(linesWith(again, "cimprovider"), "cimprovider -r -m tavrin_fc_provider\n");
    EXPECT_EQ(linesWith(again, "cimmof"), pegasusClasses + pegasusPlatform + pegasusProviders);
    EXPECT_LT(again.find("dc TVRHBA_"), again.find("cimmof"));

    servers.startOpenGroup();
    const Servers::Run removed = servers.run("remove");
    EXPECT_THAT(removed.text, HasSubstr("pegasus: removed\n"));
    EXPECT_THAT(removed.text, Not(HasSubstr("keeps")));
    const std::string calls = servers.takeCalls();
    EXPECT_EQ(linesWith(calls, "cimcli di"),
              "cimcli di IBMSD_Chassis.Name=\"host\" -n root/ibmse\n"
              "cimcli di IBMSD_ComputerSystem.Name=\"host\" -n root/ibmse\n"
              "cimcli di PG_NameSpace.CreationClassName=\"PG_Namespace\",Name=\"root/ibmse\" -n root/PG_InterOp\n"
              "cimcli di PG_NameSpace.CreationClassName=\"PG_Namespace\",Name=\"root/tavrin\" -n root/PG_InterOp\n");
    EXPECT_EQ(linesWith(linesWith(calls, "dc CIM_"), "root/PG_InterOp"),
              "cimcli dc CIM_SCSIArbitraryLogicalUnit -n root/PG_InterOp\n"
              "cimcli dc CIM_FCHBADiagnosticTest -n root/PG_InterOp\n"
              "cimcli dc CIM_FCHBADiagnosticSettingData -n root/PG_InterOp\n"
              "cimcli dc CIM_FCHBADiagnosticServiceCapabilities -n root/PG_InterOp\n");
    EXPECT_EQ(servers.stateOf("pegasus"), before);
    EXPECT_FALSE(std::filesystem::exists(servers.root() / "state"));
}

/// What was put in before a failure is in the record, and a class that others use stays with a word about it.
TEST(Register, OpenGroupServerWithTrouble)
{
    const Servers servers;
    servers.installOpenGroup();
    const std::string before = servers.stateOf("pegasus");
    servers.root().write("refuse", "");
    const Servers::Run refused = servers.run("register");
    EXPECT_EQ(refused.exitCode, 1);
    EXPECT_THAT(refused.text, HasSubstr("pegasus:   error near line 7\n"));
    EXPECT_EQ(linesWith(servers.takeCalls(), "registration.mof"), "");
    EXPECT_EQ(servers.run("remove").exitCode, 0);
    EXPECT_EQ(servers.stateOf("pegasus"), before);

    std::filesystem::remove(servers.root() / "refuse");
    EXPECT_EQ(servers.run("register").exitCode, 0);
    const std::string classes = servers.root() / "pegasus/root/PG_InterOp/classes";
    runCommand("echo 'Other_Test CIM_FCHBADiagnosticTest' >>" + classes);
    servers.root().write("usr/share/tavrin-fc-provider/mof/tavrin_fc_provider.reg", "[TVRHBA_Card]\n");
    const Servers::Run kept = servers.run("register");
    EXPECT_EQ(kept.exitCode, 0);
    EXPECT_THAT(kept.text, HasSubstr("pegasus: keeps the class CIM_FCHBADiagnosticTest in root/PG_InterOp: "
                                     "CIM_ERR_CLASS_HAS_CHILDREN: CIM_FCHBADiagnosticTest\n"));

    // It is known to be the module's, though it was there when this version was registered.
    runCommand("sed -i /Other_Test/d " + classes);
    EXPECT_EQ(servers.run("remove").exitCode, 0);
    EXPECT_EQ(servers.stateOf("pegasus"), before);
}

/// A server that is down runs for as long as it is worked on, and nobody from outside meets it.
TEST(Register, OpenGroupServerThatIsStopped)
{
    const Servers servers;
    servers.installOpenGroup();
    std::filesystem::remove(servers.root() / "pegasus/running");
    const std::string before = servers.stateOf("pegasus");
    const std::string line = "pegasus\tROOT/tools\tstopped\t";
    EXPECT_EQ(servers.run("--status").text, absentSfcb + line + "unknown\t-\n");
    EXPECT_EQ(servers.takeCalls(), "");

    const std::string start = "cimserver enableHttpConnection=false enableHttpsConnection=false\n";
    EXPECT_EQ(servers.run("register").exitCode, 0);
    EXPECT_EQ(servers.takeCalls(), start + pegasusClasses + pegasusProviders + "cimserver -s\n");
    EXPECT_EQ(servers.run("--status").text, absentSfcb + line + "registered\tROOT/pegasus/lib/" + link + "\n");
    EXPECT_EQ(servers.run("remove").exitCode, 0);
    EXPECT_EQ(linesWith(servers.takeCalls(), "cimserver"), start + "cimserver -s\n");
    EXPECT_EQ(servers.stateOf("pegasus"), before);

    servers.root().write("broken", "");
    const Servers::Run down = servers.run("register");
    EXPECT_EQ(down.exitCode, 1);
    EXPECT_THAT(down.text, EndsWith("pegasus: does not run, and did not start; start it, and run: "
                                    "ROOT/usr/sbin/tavrin-fc-register register\n"));
}

/// A package is removed in another environment than the module was registered in: by what is on record.
TEST(Register, PackageIsUpdatedAndRemoved)
{
    const Servers servers;
    servers.installSmallFootprint();
    servers.installOpenGroup();
    const std::string sfcb = servers.stateOf("sfcb"), pegasus = servers.stateOf("pegasus");
    EXPECT_EQ(servers.runByPackage("hooks/after-install configure").text, ""); // the first: nobody asked for more
    EXPECT_EQ(servers.run("register").exitCode, 0);
    EXPECT_EQ(servers.runByPackage("hooks/before-removal upgrade").text, "");
    servers.root().write("usr/share/tavrin-fc-provider/mof/tavrin_fc_provider.reg", "[TVRHBA_Card]\n#\n");
    servers.takeCalls();
    EXPECT_THAT(servers.runByPackage("hooks/after-install configure").text,
                AllOf(HasSubstr("\nsfcb: registered\n"), EndsWith("\npegasus: registered\n")));
    EXPECT_EQ(linesWith(servers.takeCalls(), "mof"), sfcbRegister + pegasusClasses + pegasusProviders);
    EXPECT_EQ(servers.run("--status").exitCode, 0);

    // One cannot be told now: what is needed later stays.
    std::filesystem::remove(servers.root() / "pegasus/running");
    servers.root().write("broken", "");
    const Servers::Run removed = servers.runByPackage("hooks/before-removal remove");
    EXPECT_EQ(removed.exitCode, 0);
    EXPECT_THAT(removed.text,
                AllOf(HasSubstr("\nsfcb: removed\n"),
                      EndsWith("tavrin-fc-provider: still registered in pegasus; once that can be started: "
                               "ROOT/state/tavrin-fc-register remove\n")));
    EXPECT_EQ(servers.stateOf("sfcb"), sfcb);
    std::filesystem::remove_all(servers.root() / "usr");
    std::filesystem::remove(servers.root() / "broken");
    EXPECT_THAT(servers.runByPackage("state/tavrin-fc-register remove").text, HasSubstr("\npegasus: removed\n"));
    servers.root().write("pegasus/running", "");
    EXPECT_EQ(servers.stateOf("pegasus"), pegasus);
    EXPECT_FALSE(std::filesystem::exists(servers.root() / "state"));
}

/// With the server its repository has gone: there is nothing to take out but the link.
TEST(Register, ServerIsRemovedFirst)
{
    const Servers servers;
    servers.installSmallFootprint();
    EXPECT_EQ(servers.run("register").exitCode, 0);
    std::filesystem::remove_all(servers.root() / "tools");
    EXPECT_EQ(servers.runByPackage("hooks/before-removal 0").text,
              "sfcb: rm -f ROOT/sfcb/cmpi/" + link + "\nsfcb: is not here any more, and its record neither\n");
    EXPECT_FALSE(std::filesystem::exists(servers.root() / "state"));
}

/// Of a registration that is not the script's, the module's own classes are known to be its own.
TEST(Register, OpenGroupServerRegisteredByHand)
{
    const Servers servers;
    servers.installOpenGroup();
    const std::string before = servers.stateOf("pegasus");
    const std::string declarations = servers.root() / "usr/share/tavrin-fc-provider/mof/";
    for (const char* file : {"tavrin_classes.mof", "tavrin_fc_provider_registration.mof"})
        runCommand(servers.root() / "tools/cimmof" + " -n root/PG_InterOp " + declarations + file);
    EXPECT_EQ(servers.run("--status").text, absentSfcb + "pegasus\tROOT/tools\trunning\tforeign\t-\n");
    EXPECT_THAT(servers.run("remove").text, HasSubstr("pegasus: removed\n"));
    EXPECT_EQ(servers.stateOf("pegasus"), before);
}

/// Its builder may have chosen another name for its interop namespace.
TEST(Register, OpenGroupServerWithAnotherInteropNamespace)
{
    const Servers servers;
    servers.installOpenGroup();
    std::filesystem::rename(servers.root() / "pegasus/root/PG_InterOp", servers.root() / "pegasus/root/interop");
    const std::string before = servers.stateOf("pegasus");
    const Servers::Run run = servers.run("register");
    EXPECT_EQ(run.exitCode, 0) << run.text;
    EXPECT_EQ(linesWith(servers.takeCalls(), "registration.mof"), "cimmof -w -n root/interop TMP/registration.mof\n");
    const std::string registered = textOf(servers.root() / "pegasus/root/interop/registration");
    EXPECT_THAT(registered, HasSubstr("Namespaces = { \"root/tavrin\", \"root/interop\" };"));
    EXPECT_THAT(registered, Not(HasSubstr("PG_InterOp")));
    EXPECT_EQ(servers.run("remove").exitCode, 0);
    EXPECT_EQ(servers.stateOf("pegasus"), before);
}

TEST(Register, BothServersOneOrNone)
{
    const Servers servers;
    const Servers::Run none = servers.run("register");
    EXPECT_EQ(none.exitCode, 1);
    EXPECT_THAT(none.text, HasSubstr("no CIM server found"));

    servers.installSmallFootprint();
    servers.installOpenGroup();
    // The platform's own classes are left alone.
    servers.root().write("sfcb/stage/mofs/root/ibmse/platform.mof",
                         "class IBMSD_ComputerSystem : CIM_ComputerSystem {};\n");
    servers.root().write("pegasus/root/ibmse/classes", "IBMSD_ComputerSystem CIM_ComputerSystem\n");
    EXPECT_EQ(servers.run("register --server pegasus --platform").exitCode, 0);
    EXPECT_EQ(servers.takeCalls(), pegasusClasses + pegasusProviders);
    const Servers::Run half = servers.run("--status");
    EXPECT_EQ(half.exitCode, 1);
    EXPECT_EQ(half.text, "sfcb\tROOT/tools\tSTATE\tno\t-\npegasus\tROOT/tools\trunning\tregistered\tROOT/pegasus/lib/" +
                             link + "\n");
    EXPECT_EQ(servers.run("register --platform").exitCode, 0);
    EXPECT_EQ(servers.takeCalls(), sfcbRegister + "sfcbrepos -f\n");

    for (const char* wrong : {"registre", "--server other", "register remove", "remove --platform"})
        EXPECT_EQ(servers.run(wrong).exitCode, 2) << wrong;
}

} // namespace
