#include "FakeHost.h"

#include "device/TVR_MethodWrapper.h"

#include <cstring>
#include <fcntl.h>
#include <filesystem>
#include <fstream>
#include <gmock/gmock.h>
#include <memory>
#include <rapidcheck.h>
#include <semaphore.h>
#include <semaphore>
#include <stdexcept>
#include <sys/resource.h>
#include <sys/stat.h>
#include <sys/wait.h>
#include <thread>
#include <unistd.h>

using namespace cimple;
using testing::Contains;
using testing::ElementsAre;
using testing::IsEmpty;

namespace
{

namespace fs = std::filesystem;

using W = TVR_MethodWrapper;

const HBA_WWN port = wwn(0x1000112233123456);

std::string initName()
{
    return "/TVR_RM_INIT_LIB_" + std::to_string(getpid());
}

std::string doneName()
{
    return "/TVR_RM_INIT_LIB_DONE_" + std::to_string(getpid());
}

/// The file behind a semaphore.
fs::path fileOf(const std::string& name)
{
    return "/dev/shm/sem." + name.substr(1);
}

bool semaphoreExists(const std::string& name)
{
    return fs::exists(fileOf(name));
}

int valueOf(const std::string& name)
{
    int value = -1;
    sem_t* semaphore = sem_open(name.c_str(), 0);
    if (semaphore == SEM_FAILED)
        return value;
    sem_getvalue(semaphore, &value);
    sem_close(semaphore);
    return value;
}

std::size_t openFiles()
{
    return std::distance(std::filesystem::directory_iterator("/proc/self/fd"), {});
}

class MethodWrapperTest : public testing::Test
{
protected:
    ~MethodWrapperTest() override
    {
        for (const std::string& name : {initName(), doneName()})
            fs::remove_all(fileOf(name));
    }

    LoadedHost host;
    LogCapture log;
};

TEST_F(MethodWrapperTest, TheFirstObjectInitialisesTheLibrary)
{
    {
        const W wrapper;
        EXPECT_TRUE(semaphoreExists(initName()));
        EXPECT_EQ(W::initOwner, 1);
    }
    EXPECT_EQ(host.calls["LRM_InitLib"], 1);
    EXPECT_FALSE(semaphoreExists(initName()));
    EXPECT_FALSE(semaphoreExists(doneName()));
    EXPECT_THAT(log.lines, ElementsAre("5 TVR_MethodWrapper::Constructor", "5 Setting Up for FIFO.. ",
                                       "5 Aquired Semaphore.. Running RM_InitLib " + initName() + " ",
                                       "5 Aquired Completed Semaphore.. Running RM_InitLib " + doneName(),
                                       "5 Signalling Completed Semaphore.. Running RM_InitLib",
                                       "5 Signaled Completed Semaphore.. Running RM_InitLib",
                                       "5 RM Library initialized", "5 TVR_MethodWrapper::Destructor",
                                       "5 Value of Sem in destructor=3", "5 RM Library uninitialzed"));
}

TEST_F(MethodWrapperTest, ARefusedOrAbsentInitialisationThrowsAndLeavesNoSemaphore)
{
    host.statuses["LRM_InitLib"] = {1};
    EXPECT_THROW(W(), std::exception);
    EXPECT_FALSE(semaphoreExists(initName()));
    EXPECT_THAT(log.notable(), ElementsAre("1 Error : Initialization of RMLib:: RM_InitLib failed with[1]"));

    host.absentSymbols = {"LRM_InitLib"};
    unloadAllLibraries();
    loadAllLibraries();
    EXPECT_THROW(W(), std::exception);

    host.absentSymbols = {};
    host.statuses["LRM_InitLib"] = {-5}; // only what is above 0 is a refusal
    EXPECT_NO_THROW(W());
}

TEST_F(MethodWrapperTest, ASecondObjectWaitsForTheFirstHoweverThatEnds)
{
    const std::function<void()> endings[] = {
        [] {},
        [&] { host.statuses["LRM_InitLib"] = {1}; },
        [] { throw std::runtime_error("out of the library"); },
    };
    for (const auto& ending : endings)
    {
        std::binary_semaphore entered{0};
        std::binary_semaphore mayGo{0};
        std::atomic<bool> constructed{false};
        host.calls.clear();
        host.onCall["LRM_InitLib"] = [&]
        {
            entered.release();
            mayGo.acquire();
            ending();
        };
        std::thread first(
            []
            {
                try
                {
                    const W wrapper;
                }
                catch (const std::exception&)
                {}
            });
        entered.acquire();
        std::thread second(
            [&]
            {
                const W wrapper;
                constructed = true;
            });
        while (valueOf(initName()) != 0)
            std::this_thread::yield();
        EXPECT_FALSE(constructed);
        mayGo.release();
        first.join();
        second.join();
        EXPECT_EQ(host.calls["LRM_InitLib"], 1);
        EXPECT_FALSE(semaphoreExists(initName()));
        EXPECT_FALSE(semaphoreExists(doneName()));
    }
    EXPECT_EQ(log.count("5 Recieved signal on Completed Semaphore.. To issue RM Calls"), std::ssize(endings));
}

TEST_F(MethodWrapperTest, TheNameIsTheOneOfTheLatestObject)
{
    auto first = std::make_unique<W>();
    auto second = std::make_unique<W>();
    first.reset();
    EXPECT_FALSE(semaphoreExists(initName()));
    auto third = std::make_unique<W>();
    second.reset();
    EXPECT_TRUE(semaphoreExists(initName()));
    third.reset();
    EXPECT_FALSE(semaphoreExists(initName()));
}

TEST_F(MethodWrapperTest, WhatStandsUnderTheNamesIsRemovedUnopened)
{
    const fs::path elsewhere = fs::path(testing::TempDir()) / ("elsewhere." + std::to_string(getpid()));
    const std::function<void(const std::string&)> left[] = {
        [](const std::string& name) { std::ofstream(fileOf(name)) << ""; },
        [](const std::string& name) { sem_close(sem_open(name.c_str(), O_CREAT, 0666, 0)); },
        [](const std::string& name) { sem_close(sem_open(name.c_str(), O_CREAT, 0666, 1)); },
        [&](const std::string& name) { fs::create_symlink(elsewhere, fileOf(name)); },
        [](const std::string& name) { fs::create_symlink("nowhere", fileOf(name)); },
        [](const std::string& name) { mkfifo(fileOf(name).c_str(), 0666); },
    };
    std::ofstream(elsewhere) << "text";
    for (const auto& leave : left)
    {
        leave(initName());
        leave(doneName());
        host.calls.clear();
        {
            const W wrapper;
            EXPECT_EQ(host.calls["LRM_InitLib"], 1);
            for (const std::string& name : {initName(), doneName()})
            {
                EXPECT_TRUE(fs::is_regular_file(fs::symlink_status(fileOf(name))));
                EXPECT_EQ(fs::status(fileOf(name)).permissions() & fs::perms::others_write, fs::perms::none);
            }
            EXPECT_EQ(valueOf(initName()), 2);
        }
        EXPECT_FALSE(semaphoreExists(initName()));
        EXPECT_FALSE(semaphoreExists(doneName()));
    }
    EXPECT_EQ(fs::file_size(elsewhere), 4u);
    EXPECT_THAT(log.notable(), IsEmpty());
    fs::remove(elsewhere);
}

TEST_F(MethodWrapperTest, WithoutANameTheSemaphoresWorkAllTheSame)
{
    fs::create_directory(fileOf(initName()));
    {
        const W wrapper;
        EXPECT_EQ(host.calls["LRM_InitLib"], 1);
    }
    EXPECT_THAT(log.notable(), ElementsAre(testing::StartsWith("3 Semaphore " + initName() + " cannot be made: ")));
    EXPECT_THAT(log.lines, Contains("5 Value of Sem in destructor=3"));
    EXPECT_TRUE(fs::is_directory(fileOf(initName())));
    fs::remove(fileOf(initName()));

    rlimit limit;
    getrlimit(RLIMIT_NOFILE, &limit);
    const rlimit none{0, limit.rlim_max};
    setrlimit(RLIMIT_NOFILE, &none);
    {
        const W wrapper;
        EXPECT_EQ(host.calls["LRM_InitLib"], 2);
    }
    setrlimit(RLIMIT_NOFILE, &limit);
    EXPECT_EQ(log.count("3 Semaphore " + doneName() +
                        " cannot be made: Too many open files. One without a name takes its place."),
              1);
}

TEST_F(MethodWrapperTest, AChildLeavesTheParentsObjectAlone)
{
    auto wrapper = std::make_unique<W>();
    const std::string parents = initName();
    const pid_t child = fork();
    if (child == 0)
    {
        auto own = std::make_unique<W>();
        const bool hasOwn = valueOf(initName()) == 2 && initName() != parents;
        wrapper.reset();
        const bool keepsOwn = semaphoreExists(initName());
        own.reset();
        _exit(hasOwn && keepsOwn && !semaphoreExists(initName()) && !semaphoreExists(doneName()) ? 0 : 1);
    }
    int status = -1;
    ASSERT_EQ(waitpid(child, &status, 0), child);
    EXPECT_EQ(status, 0);
    EXPECT_EQ(valueOf(initName()), 2);
    EXPECT_TRUE(semaphoreExists(doneName()));
    wrapper.reset();
    EXPECT_FALSE(semaphoreExists(initName()));
}

TEST_F(MethodWrapperTest, WhatTheInitialisationLoadsIsFound)
{
    host.absentSymbols = {"RM_GetVersion"};
    resolveAllEntries();
    host.onCall["LRM_InitLib"] = [&] { host.absentSymbols.clear(); };
    std::string version;
    EXPECT_EQ(W::GetLibraryVersion(&version), 1);
    const W wrapper;
    EXPECT_EQ(W::GetLibraryVersion(&version), 0);
    EXPECT_EQ(log.count("5 LIBVersion: 7.1"), 1);
}

TEST_F(MethodWrapperTest, RoundsLeaveNothingBehind)
{
    {
        const W first;
    }
    const std::size_t before = openFiles();
    for (int i = 0; i < 1000; ++i)
        const W wrapper;
    EXPECT_EQ(openFiles(), before);
    EXPECT_FALSE(semaphoreExists(initName()));
}

TEST_F(MethodWrapperTest, Id2HBAName)
{
    struct Case
    {
        const char* id;
        const char* name;
        bool isName;
    };
    const Case cases[] = {
        {"1000112233123456", "10:00:11:22:33:12:34:56", true},
        {"\"1000112233123456\"", "10:00:11:22:33:12:34:56", true},
        {"1000112233123456789", "10:00:11:22:33:12:34:56", true},
        {"100011223312345", "10:00:11:22:33:12:34:5", false},
        {"10001", "10:00:1", false},
        {"", "", false},
        {"\"", "", false},
        {"1G00112233123456", "1G:00:11:22:33:12:34:56", false},
    };
    for (const Case& c : cases)
    {
        char name[24];
        std::memset(name, '#', sizeof name);
        EXPECT_EQ(W::Id2HBAName(name, c.id), 0);
        EXPECT_STREQ(name, c.name);
        EXPECT_EQ(std::string(name + std::strlen(name), name + 24).find_first_not_of('\0'), std::string::npos);
        HBA_WWN out;
        EXPECT_EQ(W::str2HBAName(&out, name), !c.isName) << c.id;
    }
    char name[24];
    log.lines.clear();
    EXPECT_EQ(W::Id2HBAName(name, nullptr), 1);
    EXPECT_EQ(W::Id2HBAName(nullptr, "1000112233123456"), 1);
    EXPECT_EQ(log.count("3 Null pointer argument in one of the arguments"), 2);
}

TEST_F(MethodWrapperTest, Str2HBAName)
{
    HBA_WWN out{};
    EXPECT_EQ(W::str2HBAName(&out, "10 00 11 22 33 12 34 56"), 0);
    EXPECT_EQ(std::memcmp(&out, &port, sizeof out), 0);
    EXPECT_EQ(W::str2HBAName(&out, "aB:cD 00:11:22:33:44:ff"), 0);
    EXPECT_EQ(W::hbaNameToString(out), "AB:CD:00:11:22:33:44:FF");
    EXPECT_EQ(log.count("5 After tokenizing wwpn:( 10  0 11 22 33 12 34 56 )"), 1);
    EXPECT_THAT(log.notable(), IsEmpty());

    const char* wrong[] = {nullptr,
                           "",
                           "10:00:11:22:33:12:34:5",
                           "10:00:11:22:33:12:34:567",
                           "1G:00:11:22:33:12:34:56",
                           "10-00:11:22:33:12:34:56",
                           "10:00:11:22:33:12:34: 6",
                           "1:000:11:22:33:12:34:56"};
    for (const char* text : wrong)
        EXPECT_EQ(W::str2HBAName(&out, text), 1);
    EXPECT_EQ(log.count("3 INVALID HBA Name"), std::ssize(wrong));
}

TEST_F(MethodWrapperTest, String2HBAName)
{
    HBA_WWN out{};
    EXPECT_TRUE(W::string2HBAName(&out, "1000112233123456"));
    EXPECT_EQ(std::memcmp(&out, &port, sizeof out), 0);
    for (const char* text : {"", "100011223312345", "10001122331234567", "10001122331234 6", "10:00:11:22:33:12"})
        EXPECT_FALSE(W::string2HBAName(&out, text)) << text;
    EXPECT_EQ(log.count("3 INVALID WWN"), 5);
}

TEST_F(MethodWrapperTest, NamesComeBackFromTheirTexts)
{
    EXPECT_TRUE(rc::check("plain and colon text give the name they were made from",
                          [](std::uint64_t value)
                          {
                              char plain[17];
                              std::snprintf(plain, sizeof plain, "%016lX", value);
                              const HBA_WWN expected = wwn(value);
                              HBA_WWN out{};
                              RC_ASSERT(W::string2HBAName(&out, plain));
                              RC_ASSERT(std::memcmp(&out, &expected, sizeof out) == 0);
                              char name[24];
                              RC_ASSERT(W::Id2HBAName(name, plain) == 0);
                              RC_ASSERT(W::hbaNameToString(expected) == name);
                              RC_ASSERT(W::str2HBAName(&out, name) == 0);
                              RC_ASSERT(std::memcmp(&out, &expected, sizeof out) == 0);
                          }));
}

TEST_F(MethodWrapperTest, LogStatus)
{
    W::logStatus(RM_ERROR_NOT_SUPPORTED);
    W::logStatus(RM_ERROR); // without a text
    W::logStatus(RM_ERROR_BUSY);
    EXPECT_THAT(log.lines,
                ElementsAre("5 Status: <2>:not supported", "5 Status: <1>", "5 Status: <97>:" + std::string(255, 'B')));
}

TEST_F(MethodWrapperTest, Validatewwpn)
{
    EXPECT_EQ(W::Validatewwpn(port), 0);
    host.isLocal = 0;
    EXPECT_EQ(W::Validatewwpn(port), 1);
    host.isLocal = 1;
    host.statuses["RM_IsLocalHBA"] = {64};
    EXPECT_EQ(W::Validatewwpn(port), 1);
    EXPECT_THAT(log.notable(), ElementsAre("3 HBA IS NOT LOCAL", "3 HBA IS NOT LOCAL"));
    EXPECT_EQ(log.count("5 RM_IsLocalHBA: status=64"), 1);
}

TEST_F(MethodWrapperTest, IsKestorCNA)
{
    EXPECT_FALSE(W::IsKestorCNA(port));
    host.features[201] = 2;
    EXPECT_FALSE(W::IsKestorCNA(port));
    host.features[201] = 1;
    EXPECT_TRUE(W::IsKestorCNA(port));
    host.statuses["LRM_GetHBAFeature"] = {2};
    EXPECT_FALSE(W::IsKestorCNA(port));
    EXPECT_EQ(log.count("5 Kestor CNA Port "), 1);
}

TEST_F(MethodWrapperTest, Versions)
{
    std::string version;
    EXPECT_EQ(W::GetMILILibVersion(&version), 0);
    EXPECT_EQ(version, "7.1");
    host.version = std::string(300, 'v');
    EXPECT_EQ(W::GetLibraryVersion(&version), 0);
    EXPECT_EQ(version, std::string(256, 'v'));
    host.statuses = {{"RM_MiliVersion", {3}}, {"RM_GetVersion", {4}}};
    EXPECT_EQ(W::GetMILILibVersion(&version), 3);
    EXPECT_EQ(W::GetLibraryVersion(&version), 4);
    EXPECT_EQ(W::GetLibraryVersion(nullptr), 1);
    EXPECT_THAT(log.lines, testing::IsSupersetOf({"5 MILILibVersion: 7.1", "5 Invalid Output pointer",
                                                  "5 ERROR: Failed to get MILILibVersion, returned with code 3"}));
}

TEST_F(MethodWrapperTest, TargetOperatingSystem)
{
    char name[41];
    const char* id = "1000112233123456";
    host.serverAttributes[264] = "Debian GNU/Linux 12 (bookworm), kernel 6.1.0-13-amd64";
    std::memset(name, '#', sizeof name);
    EXPECT_EQ(W::getTargetOS_info(id, name), 0);
    EXPECT_STREQ(name, "Debian GNU/Linux 12 (bookworm), kernel 6");

    EXPECT_EQ(W::getTargetOS_info(nullptr, name), 1);
    EXPECT_EQ(W::getTargetOS_info("12", name), 1);
    host.statuses["LRM_GetServerAttributes"] = {97};
    EXPECT_EQ(W::getTargetOS_info(id, name), 97);
    host.serverAttributes.clear();
    EXPECT_EQ(W::getTargetOS_info(id, name), 1);
    host.attribute = [](const void*, std::uint32_t, std::uint32_t*, RM_STATUS*) { return nullptr; };
    EXPECT_EQ(W::getTargetOS_info(id, name), 1);
    EXPECT_STREQ(name, "Debian GNU/Linux 12 (bookworm), kernel 6"); // a failure leaves the output
    EXPECT_THAT(log.notable(),
                ElementsAre("3 INVALID HBA Name", "3 str2HBAName failed", "3 RM_GetServerAttributes failed with 97"));
    EXPECT_EQ(log.count("5 ERROR: TVR_MethodWrapper::getTargetOS_info:Unable to retrieve attribute value"), 2);
}

} // namespace
