// What an installation and the packages have, and that the tool runs from there.
#include "tests/packaging/Folder.h"
#include "tests/support/Command.h"

#include <gmock/gmock.h>

#include <algorithm>
#include <filesystem>
#include <string>
#include <vector>

namespace fs = std::filesystem;
using testing::AllOf;
using testing::ContainsRegex;
using testing::HasSubstr;
using testing::Not;

namespace
{

/// The files below a folder, but for scenarios and pages, of which there may be any number.
std::vector<std::string> filesBelow(const std::string& folder)
{
    std::vector<std::string> files;
    for (const fs::directory_entry& entry : fs::recursive_directory_iterator(folder))
    {
        const std::string name = fs::relative(entry.path(), folder);
        if (!entry.is_directory() && name.find("/scenarios/") == name.npos && name.find("/docs/") == name.npos)
            files.push_back(name);
    }
    std::sort(files.begin(), files.end());
    return files;
}

/// What belongs below usr, sorted, with the module in its folder.
std::vector<std::string> expectedFiles(const std::string& moduleFolder)
{
    std::vector<std::string> files{
        "usr/bin/tvrcim",
        "usr/lib/systemd/system/tavrin-fc-serve.service",
        "usr/lib/tavrin-fc-simulator/libHBAAPI.so.2",
        "usr/lib/tavrin-fc-simulator/liblrmapi.so",
        "usr/lib/tavrin-fc-simulator/librmapi.so",
        "usr/lib/tavrin-fc-simulator/libtvrsim.so",
        "usr/lib/tavrin-fc-simulator/libtvrsim_tagging.so",
        "usr/lib/tavrin-fc-simulator/libtvrsim_vendor.so",
        "usr/sbin/tavrin-fc-register",
        "usr/share/doc/tavrin-fc-provider/CHANGELOG.md",
        "usr/share/doc/tavrin-fc-provider/README.md",
        "usr/share/doc/tavrin-fc-provider/copyright",
        "usr/share/man/man1/tvrcim.1",
        "usr/share/man/man8/tavrin-fc-register.8",
        "usr/share/tavrin-fc-provider/fleet/alerts.yml",
        "usr/share/tavrin-fc-provider/fleet/dashboard.json",
        "usr/share/tavrin-fc-provider/fleet/prometheus.yml",
        "usr/share/tavrin-fc-provider/mof/cim_classes.mof",
        "usr/share/tavrin-fc-provider/mof/platform_classes.mof",
        "usr/share/tavrin-fc-provider/mof/qualifiers.mof",
        "usr/share/tavrin-fc-provider/mof/tavrin_classes.mof",
        "usr/share/tavrin-fc-provider/mof/tavrin_fc_provider.reg",
        "usr/share/tavrin-fc-provider/mof/tavrin_fc_provider_registration.mof",
        "usr/share/tavrin-fc-provider/platforms/base-server.json",
        "usr/share/tavrin-fc-provider/platforms/sample.json",
        moduleFolder + "/libtavrin_fc_provider.so",
    };
    std::sort(files.begin(), files.end());
    return files;
}

/// The installed tool finds the simulator, the script, the module and its registration, which is told by a class that
/// this lacks.
void expectToolRuns(const std::string& root, const std::string& moduleFolder)
{
    const std::string tool = root + "/usr/bin/tvrcim ";
    const Answer found = runCommand(tool + "enum TVRHBA_Card --names");
    EXPECT_EQ(found.exitCode, 0) << found.err;
    EXPECT_THAT(found.out, HasSubstr("TV16A02417"));

    EXPECT_THAT(runCommand(tool + "check").out, Not(HasSubstr("tavrin-fc-register, which knows them")));

    const std::string registration = root + "/usr/share/tavrin-fc-provider/mof/tavrin_fc_provider.reg";
    ASSERT_EQ(runCommand("sed -i '/^.TVRHBA_Card]/,/^#/d' " + registration).exitCode, 0);
    const std::string module = "--module " + root + "/" + moduleFolder + "/libtavrin_fc_provider.so ";
    const Answer chip = runCommand(tool + module + "enum TVRHBA_Chip --names");
    EXPECT_EQ(chip.exitCode, 0) << chip.err;
    const Answer card = runCommand(tool + module + "enum TVRHBA_Card --names");
    EXPECT_EQ(card.exitCode, 1) << card.out;
}

/// The one file of that ending that cpack makes.
std::string packageOf(const Folder& folder, const std::string& generator, const std::string& ending)
{
    const Answer made = runCommand(std::string("(" TVR_CPACK) + " --config " TVR_BUILD "/CPackConfig.cmake -G " +
                                   generator + " -B " + folder.path() + " 2>&1)");
    EXPECT_EQ(made.exitCode, 0) << made.out;
    for (const fs::directory_entry& entry : fs::directory_iterator(folder.path()))
        if (entry.path().extension() == ending)
            return entry.path();
    ADD_FAILURE() << "no package";
    return {};
}

TEST(Installation, HasAllFilesAndRuns)
{
    const Folder root;
    const Answer install =
        runCommand("(DESTDIR=" + root.path() + " " TVR_CMAKE " --install " TVR_BUILD " --prefix /usr 2>&1)");
    ASSERT_EQ(install.exitCode, 0) << install.out;
    const std::string moduleFolder = fs::exists(root / "usr/lib64/cmpi") ? "usr/lib64/cmpi" : "usr/lib/cmpi";
    EXPECT_EQ(filesBelow(root.path()), expectedFiles(moduleFolder));
    expectToolRuns(root.path(), moduleFolder);

    // Pages that a reader of manuals refuses would be noticed by nobody here.
    const Answer pages = runCommand("cd " + root / "usr/share/man" +
                                    " && for page in man*/*; do groff -man -ww -Tascii $page 2>&1 >/dev/null; done");
    EXPECT_EQ(pages.out, "");
}

const std::string unit = "lib/systemd/system/tavrin-fc-serve.service";

/// Installed below the folder, as the administrator of a host does without a package.
std::string installBelow(const Folder& root)
{
    const Answer install =
        runCommand("(" TVR_CMAKE " --install " TVR_BUILD " --prefix " + root / "usr/local" + " 2>&1)");
    EXPECT_EQ(install.exitCode, 0) << install.out;
    return root / "usr/local/" + unit;
}

/// Of a service that is exposed less than most (systemd-analyze(1) calls 5 medium), in words that systemd knows, with a
/// program that is there.
TEST(Installation, ServiceIsKnownAndHardened)
{
    const Folder root;
    const std::string file = installBelow(root);
    const Answer verified = runCommand("systemd-analyze verify --man=no --recursive-errors=no " + file + " 2>&1");
    EXPECT_EQ(verified.exitCode, 0) << verified.out;
    EXPECT_EQ(verified.out, "");
    const Answer judged =
        runCommand("systemd-analyze security --offline=yes --no-pager --threshold=40 " + file + " 2>&1");
    EXPECT_EQ(judged.exitCode, 0) << judged.out;
}

/// The mounts that the unit asks for, made by a shell: what of these folders the service could write. The module takes
/// a root that is read-only for a host without a disk.
TEST(Installation, ServiceWritesNoMoreThanItNeedsOnARootThatIsWritable)
{
    const Folder root;
    const std::string file = installBelow(root);
    EXPECT_THAT(textOf(file), Not(ContainsRegex("\n(ProtectSystem=strict|ReadOnlyPaths=([^\n]* )?-?/( [^\n]*)?\n)")));
    const std::string apart = "own=; [ $(id -u) = 0 ] || own=-r; unit=" + file + " unshare -m $own sh ";
    const Answer able = runCommand(apart + "-c 'mount -t tmpfs none /var && findmnt /'");
    if (able.exitCode != 0)
        GTEST_SKIP() << "nobody can mount here, as in a chroot or a container: " << able.err;
    root.write("mounts", R"sh(
set -e
setting() { sed -n "s/^$1=//p" "$unit" | tr ' ' '\n' | sed 's/^-//; s#^%S/#/var/lib/#'; }
remount() { while read -r path; do
    [ -e "$path" ] || continue
    [ "$path" = / ] || mount --rbind "$path" "$path"
    mount -o "remount,bind,$1" "$path"
done; }
mount -t tmpfs none /var
mkdir -p /var/lib/tavrin-fc-provider/serve /var/log
case $(setting ProtectSystem) in
strict) fixed=/ ;;
full) fixed='/usr /boot /efi /etc' ;;
esac
{ printf '%s\n' $fixed; setting ReadOnlyPaths; } | remount ro
setting ReadWritePaths | remount rw
for path in / /etc /usr /opt /srv /run /var /var/lib /var/lib/tavrin-fc-provider/serve /var/log /tmp; do
    echo "$path $(findmnt -n -o VFS-OPTIONS -T "$path" | tail -n 1 | cut -c 1-2)"
done
)sh");
    const Answer seen = runCommand(apart + root / "mounts");
    EXPECT_EQ(seen.exitCode, 0) << seen.err;
    EXPECT_EQ(seen.out, "/ rw\n/etc ro\n/usr ro\n/opt ro\n/srv ro\n/run ro\n/var ro\n/var/lib ro\n"
                        "/var/lib/tavrin-fc-provider/serve rw\n/var/log rw\n/tmp rw\n");
}

TEST(Package, DebHasAllFilesAndRuns)
{
    const Folder folder;
    const Folder root;
    const std::string package = packageOf(folder, "DEB", ".deb");
    ASSERT_EQ(runCommand("dpkg-deb -x " + package + " " + root.path()).exitCode, 0);
    EXPECT_EQ(filesBelow(root.path()), expectedFiles("usr/lib/cmpi"));
    expectToolRuns(root.path(), "usr/lib/cmpi");

    // A library that is looked for where the package was built would be anybody's there.
    EXPECT_EQ(runCommand("grep -rlF " TVR_BUILD " " + root.path()).out, "");

    const Answer control = runCommand("dpkg-deb -f " + package);
    EXPECT_THAT(control.out,
                AllOf(HasSubstr("Package: tavrin-fc-provider\n"), HasSubstr("Version: " TVR_VERSION "\n")));
    EXPECT_THAT(textOf(root / "usr/" + unit), HasSubstr("\nExecStart=/usr/bin/tvrcim "));
    // Not the libraries that the simulator stands in for.
    EXPECT_THAT(control.out, AllOf(HasSubstr("Depends: libc6"), Not(HasSubstr("hbaapi"))));
    EXPECT_THAT(runCommand("dpkg-deb -e " + package + " " + root / "control && ls " + root / "control").out,
                AllOf(HasSubstr("prerm\n"), HasSubstr("postinst\n"), HasSubstr("postrm\n")));
}

TEST(Package, RpmHasAllFilesAndClaimsNoForeignLibrary)
{
    const Folder folder;
    const Folder root;
    const std::string package = packageOf(folder, "RPM", ".rpm");
    ASSERT_EQ(runCommand("cd " + root.path() + " && rpm2cpio " + package + " | cpio -idm --quiet").exitCode, 0);
    EXPECT_EQ(filesBelow(root.path()), expectedFiles("usr/lib64/cmpi"));
    expectToolRuns(root.path(), "usr/lib64/cmpi");

    EXPECT_THAT(textOf(root / "usr/" + unit), HasSubstr("\nExecStart=/usr/bin/tvrcim "));

    const std::string query = "rpm --dbpath " + root / "db" + " -qp ";
    EXPECT_THAT(runCommand(query + "--provides --requires " + package).out,
                AllOf(HasSubstr("tavrin-fc-provider = " TVR_VERSION), HasSubstr("libc.so.6"), Not(HasSubstr("HBAAPI")),
                      Not(HasSubstr("rmapi")), Not(HasSubstr("tvrsim"))));
    EXPECT_THAT(runCommand(query + "--scripts " + package).out,
                AllOf(HasSubstr("postinstall scriptlet"), HasSubstr("preuninstall scriptlet"),
                      HasSubstr("postuninstall scriptlet")));
}

} // namespace
