// Opening, reading and replacing files, and what stands in the place of one.
#include "tests/unit/foundation/LogFixture.h"

#include "foundation/File.h"

#include <fcntl.h>
#include <sys/socket.h>
#include <sys/stat.h>
#include <sys/un.h>

#include <cerrno>
#include <functional>
#include <random>

namespace
{

/// The call of fstat() from now on that fails; none for 0.
int unreadableStatus = 0;

} // namespace

/// Stands before the C library's function.
extern "C" __attribute__((visibility("default"))) int fstat(int file, struct stat* status) noexcept
{
    if (unreadableStatus != 0 && --unreadableStatus == 0)
    {
        errno = EIO;
        return -1;
    }
    return fstatat(file, "", status, AT_EMPTY_PATH);
}

namespace cimple
{
namespace
{

using testing::ElementsAre;

TEST(ReadTextFile, GivesTheFileUpToTheLimit)
{
    const std::string path = testing::TempDir() + "ReadTextFile-" + std::to_string(getpid()) + ".txt";
    std::mt19937 random(7);
    std::string content(10'000, '\0');
    for (char& c : content)
        c = static_cast<char>(random());
    std::ofstream(path) << content;

    for (const std::size_t limit : {0, 1, 4095, 4096, 4097, 9'999, 10'000, 1'000'000})
        EXPECT_EQ(readTextFile(path.c_str(), limit), content.substr(0, limit)) << limit;
    std::remove(path.c_str());
    EXPECT_EQ(readTextFile(path.c_str(), 10), std::nullopt);
    EXPECT_EQ(errno, ENOENT);
    EXPECT_NE(readTextFile("/proc/self/status", 100)->size(), 0u) << "a file that tells no size";
}

// --- what is no file -----------------------------------------------------------------------------------

/// A pipe with a reader, filled to the brim.
File_Descriptor fillPipe(const std::string& path)
{
    mkfifo(path.c_str(), 0600);
    File_Descriptor both(open(path.c_str(), O_RDWR | O_NONBLOCK | O_CLOEXEC));
    const std::string part(65'536, 'x');
    while (write(both.get(), part.data(), part.size()) > 0)
    {}
    return both;
}

struct NoFileRow
{
    const char* name;
    std::function<File_Descriptor(const std::string& path)> make;
};

void PrintTo(const NoFileRow& row, std::ostream* out)
{
    *out << row.name;
}

class NoFile : public testing::TestWithParam<NoFileRow>
{
protected:
    TemporaryRoot root;
    const std::string path = root / "etc/file";
};

TEST_P(NoFile, IsNeitherReadNorWrittenNorReplacedAndNothingWaits)
{
    const File_Descriptor held = GetParam().make(path);
    const auto before = std::filesystem::symlink_status(path).type();
    EXPECT_EQ(readTextFile(path.c_str(), 10), std::nullopt);
    EXPECT_FALSE(openForAppending(path.c_str()).file);
    EXPECT_EQ(replaceFile(path.c_str(), "text"), Replacement::NotOpened);
    EXPECT_FALSE(createTextFile(path.c_str(), "text"));
    EXPECT_EQ(std::filesystem::symlink_status(path).type(), before);
    EXPECT_THAT(namesIn(root / "etc"), ElementsAre("file"));
}

INSTANTIATE_TEST_SUITE_P(Rows, NoFile,
                         testing::Values(NoFileRow{"Pipe",
                                                   [](const std::string& path)
                                                   {
                                                       mkfifo(path.c_str(), 0600);
                                                       return File_Descriptor();
                                                   }},
                                         NoFileRow{"FullPipeWithAReader", fillPipe},
                                         NoFileRow{"Folder",
                                                   [](const std::string& path)
                                                   {
                                                       std::filesystem::create_directory(path);
                                                       return File_Descriptor();
                                                   }},
                                         NoFileRow{"Socket",
                                                   [](const std::string& path)
                                                   {
                                                       File_Descriptor made(socket(AF_UNIX, SOCK_STREAM, 0));
                                                       sockaddr_un name{AF_UNIX, {}};
                                                       path.copy(name.sun_path, sizeof name.sun_path - 1);
                                                       bind(made.get(), reinterpret_cast<sockaddr*>(&name),
                                                            sizeof name);
                                                       return made;
                                                   }},
                                         NoFileRow{"LinkToADevice",
                                                   [](const std::string& path)
                                                   {
                                                       std::filesystem::create_symlink("/dev/zero", path);
                                                       return File_Descriptor();
                                                   }}),
                         [](const auto& info) { return info.param.name; });

TEST(CreateTextFile, MakesNewFilesAlone)
{
    const TemporaryRoot root;
    const std::string path = root / "etc/file", link = root / "etc/link";
    EXPECT_TRUE(createTextFile(path.c_str(), "text"));
    EXPECT_EQ(readTextFile(path.c_str(), 10), "text");
    EXPECT_EQ(std::filesystem::status(path).permissions(), std::filesystem::perms(0600));
    EXPECT_FALSE(createTextFile(path.c_str(), "other"));
    EXPECT_EQ(errno, EEXIST);
    EXPECT_EQ(readTextFile(path.c_str(), 10), "text");
    std::filesystem::create_symlink(root / "etc/nowhere", link);
    EXPECT_FALSE(createTextFile(link.c_str(), "other"));
    EXPECT_EQ(readTextFile(link.c_str(), 10), std::nullopt);
    EXPECT_FALSE(createTextFile((root / "none/file").c_str(), "text"));
    EXPECT_THAT(namesIn(root / "etc"), testing::UnorderedElementsAre("file", "link"));

    std::filesystem::remove(link);
    std::filesystem::create_symlink(path, link);
    EXPECT_EQ(readTextFile(link.c_str(), 10), "text");
    EXPECT_EQ(readTextFile(link.c_str(), 10, O_NOFOLLOW), std::nullopt);
}

// --- replacing -----------------------------------------------------------------------------------------

class ReplaceFile : public testing::Test
{
protected:
    struct stat status() const
    {
        struct stat found = {};
        stat(path.c_str(), &found);
        return found;
    }

    TemporaryRoot root;
    const std::string path = root / "etc/file";
    const std::string old = std::string(5'000, 'o');
};

TEST_F(ReplaceFile, MakesReplacesAndLeavesAlone)
{
    const mode_t before = umask(0);
    EXPECT_EQ(replaceFile(path.c_str(), "one"), Replacement::Done);
    EXPECT_EQ(status().st_mode & 07777, 0644u);
    const ino_t first = status().st_ino;
    EXPECT_EQ(replaceFile(path.c_str(), "one"), Replacement::Unchanged);
    EXPECT_EQ(status().st_ino, first);

    for (const auto& [mode, kept] : {std::pair{0600u, 0600u}, {0666u, 0644u}, {0440u, 0440u}, {04777u, 0755u}})
    {
        chmod(path.c_str(), mode);
        for (const char* text : {"two", "twofold", "tw", ""}) // another size, more, less, none
        {
            EXPECT_EQ(replaceFile(path.c_str(), text), Replacement::Done);
            EXPECT_EQ(fileText(path), text);
            EXPECT_EQ(status().st_mode & 07777, kept);
        }
    }
    umask(before);
    EXPECT_THAT(namesIn(root / "etc"), ElementsAre("file"));
}

TEST_F(ReplaceFile, TellsWhyItCannot)
{
    for (const auto& [name, error] : {std::pair{"none/file", ENOENT}, {"etc/", ENOENT}})
    {
        EXPECT_TRUE(failed(replaceFile((root / name).c_str(), "text"))) << name;
        EXPECT_EQ(errno, error) << name;
    }
    EXPECT_THAT(namesIn(root / "etc"), ElementsAre());
}

TEST_F(ReplaceFile, KeepsTheOldFileWhenTheDiskIsFull)
{
    writeFile(path, old);
    const int status = inChild(
        [&]
        {
            limitFiles(6'000);
            return replaceFile(path.c_str(), std::string(7'000, 'n')) == Replacement::NotWritten ? errno : 0;
        });
    EXPECT_EQ(status, EFBIG);
    EXPECT_EQ(fileText(path), old);
    EXPECT_THAT(namesIn(root / "etc"), ElementsAre("file"));
}

TEST_F(ReplaceFile, LeavesNothingBesideAFileWhoseStatusCannotBeRead)
{
    writeFile(path, old);
    for (int call = 1; call <= 6; call++)
    {
        unreadableStatus = call;
        const Replacement replacement = replaceFile(path.c_str(), std::to_string(call));
        unreadableStatus = 0;
        EXPECT_THAT(namesIn(root / "etc"), ElementsAre("file")) << call;
        EXPECT_EQ(fileText(path) == std::to_string(call), !failed(replacement)) << call;
    }
}

TEST_F(ReplaceFile, KeepsAWholeFileAmongManyWritersWhenTheyAreKilled)
{
    writeFile(path, old);
    std::vector<pid_t> children;
    for (char c = 'a'; c < 'g'; ++c)
    {
        children.push_back(fork());
        if (children.back() == 0)
            for (std::size_t size = 5'000;; size = 5'000 + (size + 1) % 100)
                replaceFile(path.c_str(), std::string(size, c));
    }
    std::string seen;
    for (int reads = 0; reads < 2'000 || seen == old; ++reads)
    {
        seen = fileText(path);
        ASSERT_GE(seen.size(), 5'000u);
        ASSERT_EQ(seen.find_first_not_of(seen[0]), std::string::npos);
    }
    for (const pid_t child : children)
        kill(child, SIGKILL);
    for (const pid_t child : children)
        waitpid(child, nullptr, 0);
    seen = fileText(path);
    EXPECT_GE(seen.size(), 5'000u);
    EXPECT_EQ(seen.find_first_not_of(seen[0]), std::string::npos);
}

// --- replacing through a link --------------------------------------------------------------------------

struct LinkRow
{
    const char* name;
    std::function<void(const std::string& root)> arrange; ///< of etc/file -> ../home/target
    bool isFollowed;
};

void PrintTo(const LinkRow& row, std::ostream* out)
{
    *out << row.name;
}

constexpr uid_t somebody = 12'345;

class ReplaceThroughALink : public testing::TestWithParam<LinkRow>
{
protected:
    TemporaryRoot root;
};

TEST_P(ReplaceThroughALink, ReachesWhatIsRootsAlone)
{
    if (geteuid() != 0)
        GTEST_SKIP() << "makes files of others";
    std::filesystem::create_directory(root / "home");
    writeFile(root / "home/target", "old");
    std::filesystem::create_symlink("../home/target", root / "etc/file");
    GetParam().arrange(root / "");
    const bool isThere = std::filesystem::exists(root / "etc/file");

    const Replacement result = replaceFile((root / "etc/file").c_str(), "new");
    EXPECT_EQ(result, GetParam().isFollowed ? Replacement::Done : Replacement::NotOpened);
    EXPECT_EQ(std::filesystem::symlink_status(root / "etc/file").type(), std::filesystem::file_type::symlink);
    EXPECT_EQ(fileText(root / "etc/file"), GetParam().isFollowed ? "new" : isThere ? "old" : "");
}

INSTANTIATE_TEST_SUITE_P(
    Rows, ReplaceThroughALink,
    testing::Values(
        LinkRow{"Relative", [](const std::string&) {}, true},
        LinkRow{"Absolute",
                [](const std::string& root)
                {
                    std::filesystem::remove(root + "etc/file");
                    std::filesystem::create_symlink(root + "home/target", root + "etc/file");
                },
                true},
        LinkRow{"ToNothing", [](const std::string& root) { std::filesystem::remove(root + "home/target"); }, true},
        LinkRow{"ToAFileOfSomebody",
                [](const std::string& root) { std::ignore = chown((root + "home/target").c_str(), somebody, 0); },
                false},
        LinkRow{"ToAFileThatAGroupMayWrite",
                [](const std::string& root) { chmod((root + "home/target").c_str(), 0664); }, false},
        LinkRow{"IntoAFolderOfSomebody",
                [](const std::string& root) { std::ignore = chown((root + "home").c_str(), somebody, 0); }, false},
        LinkRow{"IntoAFolderOpenToAll", [](const std::string& root) { chmod((root + "home").c_str(), 01777); }, false},
        LinkRow{"InAFolderOpenToAll", [](const std::string& root) { chmod((root + "etc").c_str(), 01777); }, false},
        LinkRow{"ThroughAFolderOfSomebody",
                [](const std::string& root)
                {
                    std::filesystem::create_directory(root + "home/inner");
                    std::filesystem::rename(root + "home/target", root + "home/inner/target");
                    std::filesystem::remove(root + "etc/file");
                    std::filesystem::create_symlink("../home/inner/target", root + "etc/file");
                    std::ignore = chown((root + "home").c_str(), somebody, 0);
                },
                false},
        LinkRow{"ToAnotherLink",
                [](const std::string& root)
                {
                    std::filesystem::rename(root + "home/target", root + "home/behind");
                    std::filesystem::create_symlink("behind", root + "home/target");
                },
                false},
        LinkRow{"ThroughALinkToAFolder",
                [](const std::string& root)
                {
                    std::filesystem::rename(root + "home", root + "behind");
                    std::filesystem::create_directory_symlink("behind", root + "home");
                },
                false}),
    [](const auto& info) { return info.param.name; });

} // namespace
} // namespace cimple
