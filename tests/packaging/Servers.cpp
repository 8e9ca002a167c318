#include "tests/packaging/Servers.h"
#include "tests/support/Command.h"

#include <algorithm>
#include <iterator>
#include <regex>
#include <vector>

namespace fs = std::filesystem;

namespace
{

constexpr const char* experimental = "CIM_FCHBADiagnosticServiceCapabilities|CIM_FCHBADiagnosticSettingData|"
                                     "CIM_FCHBADiagnosticTest|CIM_SCSIArbitraryLogicalUnit";

const std::string logCall = "echo \"${0##*/} $*\" >>$ROOT/calls\n";

// Files are staged, and the repository is built of them. A file "refuse" has it refuse the module's classes.
constexpr const char* sfcbstage = R"sh(
while [ $# -gt 0 ]; do case $1 in
-n) stage=$ROOT/sfcb/stage/mofs/$2; shift 2 ;;
-r) cp "$2" $ROOT/sfcb/stage/regs; shift 2 ;;
*) mkdir -p "$stage"; cp "$1" "$stage"; shift ;;
esac; done
)sh";
constexpr const char* sfcbunstage = R"sh(
while [ $# -gt 0 ]; do case $1 in
-n) stage=$ROOT/sfcb/stage/mofs/$2; shift 2 ;;
-r) rm -f "$ROOT/sfcb/stage/regs/$2"; shift 2 ;;
*) rm -f "$stage/$1"; shift ;;
esac; done
)sh";
constexpr const char* sfcbrepos = R"sh(
cat $ROOT/sfcb/stage/default.reg $ROOT/sfcb/stage/regs/* 2>/dev/null >$ROOT/sfcb/registration/providerRegister || :
[ ! -f $ROOT/refuse ] || { [ ! -d $ROOT/sfcb/stage/mofs/root/tavrin ] || { echo "error near line 7"; exit 1; }; }
)sh";
constexpr const char* sfcbreposHelp = R"sh(
[ "$1" != -h ] || { echo "	-s specify staging directory [$ROOT/sfcb/stage]"
echo "	-r specify repository directory [$ROOT/sfcb/registration]"
echo "	-c specify directory containing CIM Schema MOFs [$ROOT/sfcb/schema]"; exit; }
)sh";

// A namespace is a folder with a file of "class superclass" lines, and one of qualifiers.
constexpr const char* cimmof = R"sh(
while [ $# -gt 1 ]; do case $1 in -n) namespace=$ROOT/pegasus/$2; shift ;; esac; shift; done
[ ! -f $ROOT/refuse ] || case $1 in */tavrin_classes.mof) echo "error near line 7"; exit 1 ;; esac
mkdir -p $namespace; touch $namespace/classes $namespace/qualifiers
sed -n 's/^class \([A-Za-z0-9_]*\) : \([A-Za-z0-9_]*\).*/\1 \2/p; s/^class \([A-Za-z0-9_]*\) {.*/\1 -/p' "$1" |
    { grep -vxFf $namespace/classes || :; } >>$namespace/classes
sed -n 's/^Qualifier \([A-Za-z0-9_]*\).*/\1/p' "$1" | { grep -vxFf $namespace/qualifiers || :; } >>$namespace/qualifiers
sed -n 's/^instance of \(IBMSD_[A-Za-z]*\).*/\1.Name="host"/p' "$1" >>$namespace/instances
[ -s $namespace/instances ] || rm $namespace/instances
if grep -q 'instance of PG_ProviderModule' "$1"; then cp "$1" $namespace/registration; fi
)sh";
// Its start adds two classes to each namespace that can have them.
constexpr const char* cimserver = R"sh(
[ $1 != -s ] || { rm $ROOT/pegasus/running; exit; }
[ ! -f $ROOT/broken ] || exit 1
touch $ROOT/pegasus/running
for classes in $(grep -l "^CIM_ElementConformsToProfile " $ROOT/pegasus/root/*/classes); do
    grep -q ^PG_ElementConf $classes || echo "PG_ElementConformsToProfile CIM_ElementConformsToProfile" >>$classes
    grep -q ^PG_Registered $classes || echo "PG_RegisteredProfile CIM_RegisteredProfile" >>$classes
done
)sh";
// It finds the server by its home.
constexpr const char* cimcliReading = R"sh(
[ -f $ROOT/pegasus/running ] && [ "$PEGASUS_HOME" = $ROOT/pegasus ] || exit 1
verb=$1; object=$2
for namespace; do :; done
space=$ROOT/pegasus/$namespace
case $verb in
ns) cd $ROOT/pegasus; for folder in root/*; do echo $folder; done; exit ;;
nc) cut -d' ' -f1 $space/classes; exit ;;
eq) sed 's/.*/Qualifier & : boolean = false,/' $space/qualifiers; exit ;;
gc) grep "^$object " $space/classes; exit ;;
ni) case $object in
    PG_NameSpace) cd $ROOT/pegasus; for folder in root/*; do echo "PG_NameSpace.CreationClassName=\"PG_Namespace\",Name=\"$folder\""; done ;;
    *) grep "^$object" $space/instances ;; esac; exit ;;
esac
)sh";
constexpr const char* cimcliChanging = R"sh(
drop() { grep -v "$1" $2 >$2.new || :; mv $2.new $2; [ -s $2 ] || rm $2; }
case $verb in
dc) ! grep -q " $object$" $space/classes || { echo "CIM_ERR_CLASS_HAS_CHILDREN: $object"; exit 8; }
    drop "^$object " $space/classes ;;
dq) drop "^$object$" $space/qualifiers ;;
di) case $object in
    PG_NameSpace*) folder=${object##*,Name=?}; rmdir "$ROOT/pegasus/${folder%?}" ;;
    *) drop "^$object$" $space/instances ;; esac ;;
esac
)sh";

} // namespace

Servers::Servers()
{
    _root.write("calls", "");
    for (const char* name :
         {"awk", "basename", "cat", "cksum", "cp",  "cut", "dirname", "grep", "head",  "ln", "ls",    "mkdir", "mktemp",
          "mv",  "readlink", "rm",  "rmdir", "sed", "sh",  "sort",    "tail", "touch", "tr", "uname", "env"})
    {
        fs::create_directories(_root / "bin");
        const std::string path = runCommand(std::string("command -v ") + name).out;
        fs::create_symlink(path.substr(0, path.find('\n')), _root / "bin" + "/" + name);
    }
    tool("hostname", "echo host.example.net\n");
    const std::string mof = _root / "usr/share/tavrin-fc-provider/mof";
    fs::create_directories(fs::path(mof).parent_path());
    fs::copy(TVR_BUILD "/generated/mof", mof);
    fs::copy(TVR_SCHEMA "/platform.mof", mof + "/platform_classes.mof");
    fs::create_directories(_root / "usr/sbin");
    fs::copy(TVR_PACKAGING "/tavrin-fc-register", _root / "usr/sbin");
    fs::copy(TVR_PACKAGING "/hooks", _root / "hooks");
    _root.write("usr/lib/cmpi/libtavrin_fc_provider.so", "the module");
}

void Servers::tool(const std::string& name, const std::string& body, const std::string& folder) const
{
    const std::string file = folder + "/" + name;
    _root.write(file, "#!" + _root / "bin/sh" + "\nset -e\nROOT=" + _root.path() + "\n" + body);
    fs::permissions(_root / file, fs::perms::owner_all);
}

void Servers::serverTool(const std::string& name, const std::string& body) const
{
    tool(name, body, "tools");
}

void Servers::installSmallFootprint() const
{
    serverTool("sfcbstage", logCall + sfcbstage);
    serverTool("sfcbunstage", logCall + sfcbunstage);
    serverTool("sfcbrepos", sfcbreposHelp + logCall + sfcbrepos);
    _root.write("etc/sfcb/sfcb.cfg",
                "httpPort: 5988\nproviderDirs: " + _root / "sfcb/lib " + _root / "sfcb/cmpi" + "\n");
    for (const char* folder : {"lib", "cmpi", "stage/regs", "stage/mofs/root/interop", "registration"})
        fs::create_directories(_root / "sfcb/" + folder);
    _root.write("sfcb/stage/default.reg", "[Own_Class]\n");
    _root.write("sfcb/stage/mofs/root/interop/10_interop.mof", "class Own_Class {};\n");
    _root.write("sfcb/registration/providerRegister", "[Own_Class]\n");
    _root.write("sfcb/schema/CIM_Schema.mof",
                runCommand("sed -n 's/^class \\([A-Za-z0-9_]*\\).*/#pragma include (\"Folder\\/\\1.mof\")/p' " TVR_BUILD
                           "/generated/mof/cim_classes.mof | grep -vwE '" +
                           std::string(experimental) + "'")
                    .out);
}

void Servers::installOpenGroup() const
{
    serverTool("cimmof", logCall + cimmof);
    serverTool("cimcli", cimcliReading + logCall + cimcliChanging);
    serverTool("cimconfig", "echo \"Current value: lib:$ROOT/nowhere\"\n");
    serverTool("cimserver", logCall + cimserver);
    serverTool("cimprovider",
               "registration=$ROOT/pegasus/root/*/registration\n[ $1 != -l ] || { [ -f $registration ]; exit; }\n" +
                   logCall + "rm $registration\n");
    // It is asked for each class by itself: what comes of some classes and those below them is enough.
    const std::string mof = _root / "usr/share/tavrin-fc-provider/mof";
    for (const char* file : {"cim_classes.mof", "tavrin_classes.mof"})
        runCommand("cd " + mof +
                   " && awk 'BEGIN { RS = \"\"; ORS = \"\\n\\n\" } /class (CIM_|TVRHBA_)[A-Za-z]*(Diagnostic|" +
                   "SCSIArbitrary|FCPort|ElementConf|RegisteredP)/' " + file + " >few && mv few " + file);
    fs::create_directories(_root / "pegasus/lib");
    const std::string interop = _root / "pegasus/root/PG_InterOp";
    ASSERT_EQ(runCommand("PATH=" + _root / "bin" + " " + _root / "tools/cimmof" + " -n root/PG_InterOp " + mof +
                         "/cim_classes.mof && " + "sed -i -E '/^(" + experimental +
                         ") /d; $ a PG_ProviderModule CIM_ProviderModule' " + interop + "/classes")
                  .exitCode,
              0);
    startOpenGroup();
    takeCalls();
}

void Servers::startOpenGroup() const
{
    EXPECT_EQ(runCommand("PATH=" + _root / "bin" + " " + _root / "tools/cimserver" + " now").exitCode, 0);
}

void Servers::installSystemd(const std::string& unit) const
{
    tool("systemctl", "case \"$*\" in *is-active*) [ \"$3\" = " + unit + " ]; exit ;; esac\n" + logCall);
}

Servers::Run Servers::run(const std::string& arguments) const
{
    return shell("PATH=" + _root / "bin:" + _root / "tools" + " PEGASUS_HOME=" + _root / "pegasus",
                 "usr/sbin/tavrin-fc-register " + arguments);
}

Servers::Run Servers::runByPackage(const std::string& command) const
{
    return shell("PATH=" + _root / "usr/sbin:" + _root / "bin", command);
}

Servers::Run Servers::shell(const std::string& environment, const std::string& command) const
{
    // Nothing of this machine's: neither its tools nor its servers.
    const Answer answer =
        runCommand("(env -i " + environment + " TAVRIN_FC_STATE=" + _root / "state" + " " + _root / command + " 2>&1)");
    return {answer.exitCode, readable(answer.out)};
}

std::string Servers::check() const
{
    const std::string out = runCommand("env -i PATH=" + _root / "usr/sbin:" + _root / "bin:" + _root / "tools" +
                                       " PEGASUS_HOME=" + _root / "pegasus" + " TAVRIN_FC_STATE=" + _root / "state" +
                                       " TVR_FILE_ROOT=" + _root.path() + " " TVR_BUILD "/broker/tvrcim check")
                                .out;
    const std::size_t last = out.find("  driver log");
    return readable(out.substr(std::min(out.find("\n", out.find(" -> ", last)) + 1, out.size())));
}

std::string Servers::takeCalls() const
{
    const std::string calls = readable(textOf(_root / "calls"));
    _root.write("calls", "");
    return calls;
}

std::string Servers::stateOf(const std::string& server) const
{
    return runCommand("cd " + _root / server +
                      " && find . ! -type d | sort | while read f; do echo \"$f\"; cat \"$f\"; done; find . | sort")
        .out;
}

std::string Servers::readable(std::string text) const
{
    for (std::size_t at; (at = text.find(_root.path())) != text.npos;)
        text.replace(at, _root.path().size(), "ROOT");
    // Whether this machine has that server's process is not the test's to say.
    text = std::regex_replace(text, std::regex("(sfcb\tROOT/tools\t|sfcb  .*, )(running|stopped)"), "$1STATE");
    return std::regex_replace(text, std::regex("/tmp/tmp\\.[A-Za-z0-9]+"), "TMP");
}
