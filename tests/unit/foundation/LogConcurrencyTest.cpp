// Everything about the log at once from many threads; the thread sanitizer is the judge.
#include "tests/unit/foundation/LogFixture.h"

#include "foundation/TVR_CIMLogger.h"
#include "foundation/TVR_FileLogger.h"
#include "foundation/TVR_SysLogger.h"
#include "foundation/TvrConfigFile.h"

#include <atomic>
#include <functional>
#include <thread>

namespace cimple
{
namespace
{

/// Runs each body again and again on a thread of its own until the first has run `rounds` times.
void runTogether(int rounds, const std::vector<std::function<void()>>& bodies)
{
    std::atomic<bool> done{false};
    std::vector<std::thread> threads;
    for (std::size_t i = 1; i < bodies.size(); ++i)
        threads.emplace_back(
            [&, i]
            {
                while (!done)
                    bodies[i]();
            });
    for (int i = 0; i < rounds; ++i)
        bodies[0]();
    done = true;
    for (std::thread& thread : threads)
        thread.join();
}

class Together : public LogTest
{};

TEST_F(Together, LoggingSteeringAndReadingTheLog)
{
    TVR_FileLogger file;
    TVR_CIMLogger ring;
    const std::string path = root / "log";
    logger.enable();
    runTogether(300,
                {
                    [&]
                    {
                        logger.setMode(4);
                        file.validateAndSetPath(path.c_str(), false);
                        logger.writeDataFile();
                        logger.readDataFile();
                        logger.setMode(1);
                    },
                    [] { TVR_LOG(TVR_ERR, "error %d", 1); },
                    [] { TVR_LOG(TVR_DBG, "debug %d", 2); },
                    [&]
                    {
                        for (const TVR_CIMLogEntry& entry : ring.entries())
                            ASSERT_EQ(entry.text[0], '[');
                        logger.clearAll();
                        std::ignore = file.getPath().size();
                    },
                    [] { const CapturingSink passing; },
                    [&]
                    {
                        const TVR_SysLogger passing;
                        logger.disable();
                        TVR_LOG(TVR_ERR, "to the system log");
                        logger.enable();
                    },
                });
    logger.setMode(4);
    ASSERT_EQ(file.validateAndSetPath(path.c_str(), false), 0);
    logger.clearAll();
    TVR_LOG(TVR_ERR, "the end");
    EXPECT_EQ(ring.entries().size(), 1u);
    EXPECT_THAT(fileText(path), testing::EndsWith("the end\n"));
}

TEST_F(Together, LinesOfManyThreadsStayWhole)
{
    TVR_FileLogger file;
    const std::string path = root / "log";
    logger.setMode(2);
    ASSERT_EQ(file.validateAndSetPath(path.c_str(), false), 0);
    const std::string filler(2000, 'x');
    std::vector<std::thread> threads;
    for (int t = 0; t < 4; ++t)
        threads.emplace_back(
            [&]
            {
                for (int i = 0; i < 50; ++i)
                    TVR_LOG(TVR_INFO, "<%s>", filler.c_str());
            });
    for (std::thread& thread : threads)
        thread.join();
    std::ifstream lines(path);
    int count = 0;
    for (std::string line; std::getline(lines, line); ++count)
        ASSERT_THAT(line, testing::AllOf(testing::StartsWith("[threadid ="), testing::EndsWith("<" + filler + ">")));
    EXPECT_EQ(count, 200);
}

TEST_F(Together, SettingsAreChangedAndRead)
{
    TvrConfigFile config;
    runTogether(2000,
                {
                    [&]
                    {
                        config.setCacheTimeout(1);
                        config.setCacheTimeout(30);
                        config.setRefreshSANData(0);
                        config.setRefreshSANData(1);
                    },
                    [&]
                    {
                        const int minutes = config.getCacheTimeout();
                        ASSERT_TRUE(minutes == 1 || minutes == 10 || minutes == 30) << minutes;
                    },
                    [&] { config.setRefreshAdapterData(config.getRefreshSANData() ? 1 : 0); },
                });
    EXPECT_EQ(config.getCacheTimeout(), 30);
    EXPECT_TRUE(config.getRefreshSANData());
}

} // namespace
} // namespace cimple
