// Laws of the parsers that read what others wrote: any bytes are taken, and what comes out is in range.
#include "foundation/CommonHelpers.h"
#include "foundation/Log.h"
#include "foundation/LogDataFile.h"
#include "foundation/Text.h"
#include "foundation/TvrConfigFile.h"
#include "foundation/WebLaunchConfig.h"

#include <gtest/gtest.h>
#include <rapidcheck.h>

#include <string>
#include <vector>

namespace cimple
{
namespace
{

void expectLaw(bool holds)
{
    EXPECT_TRUE(holds) << "rapidcheck shows the counterexample above";
}

/// Texts built mostly of `pieces` that mean something to the parser, with arbitrary bytes in between.
rc::Gen<std::string> textOf(std::vector<std::string> pieces)
{
    const auto piece = rc::gen::weightedOneOf<std::string>({
        {6, rc::gen::elementOf(std::move(pieces))},
        {1, rc::gen::arbitrary<std::string>()},
        {1, rc::gen::map(rc::gen::arbitrary<int>(), [](int number) { return std::to_string(number); })},
        {1, rc::gen::map(rc::gen::inRange(-2, 40), [](int number) { return std::to_string(number); })},
    });
    return rc::gen::map(rc::gen::container<std::vector<std::string>>(piece),
                        [](const std::vector<std::string>& parts)
                        {
                            std::string text;
                            for (const std::string& part : parts)
                                text += part;
                            return text;
                        });
}

rc::Gen<std::string> settingsText()
{
    return textOf({"TVR_PROVIDER_CACHE_TIMEOUT = ", "TVR_PROVIDER_CACHE_TIMEOUT",
                   "TVR_PROVIDER_REFRESH_ADAPTERDATA = ", "TVR_PROVIDER_REFRESH_SANDATA = FALSE\n", "=", " = ", "TRUE",
                   "FALSE", "\n", "\n", "#", std::string(1, '\0'), std::string(1023, ' ')});
}

rc::Gen<CacheSettings> someSettings()
{
    return rc::gen::build<CacheSettings>(rc::gen::set(&CacheSettings::refreshAdapterData),
                                         rc::gen::set(&CacheSettings::refreshSANData),
                                         rc::gen::set(&CacheSettings::cacheTimeout, rc::gen::inRange(1, 31)));
}

bool same(const CacheSettings& a, const CacheSettings& b)
{
    return a.cacheTimeout == b.cacheTimeout && a.refreshAdapterData == b.refreshAdapterData &&
           a.refreshSANData == b.refreshSANData;
}

TEST(SettingsLaws, AnyTextLeavesTheTimeoutInRange)
{
    expectLaw(rc::check(
        []
        {
            CacheSettings settings;
            parseSettings(*settingsText(), settings);
            RC_CLASSIFY(!same(settings, CacheSettings{}), "something was set");
            RC_ASSERT(settings.cacheTimeout >= 1);
            RC_ASSERT(settings.cacheTimeout <= 30);
        }));
}

TEST(SettingsLaws, WhatIsWrittenIsReadBackWhateverStandsBehindIt)
{
    expectLaw(rc::check(
        []
        {
            const CacheSettings written = *rc::gen::noShrink(someSettings());
            CacheSettings read = *rc::gen::noShrink(someSettings());
            parseSettings(formatSettings(written) + *settingsText(), read);
            RC_ASSERT(same(read, written));
        }));
}

TEST(SettingsLaws, ReadingAgainWhatWasReadChangesNothing)
{
    expectLaw(rc::check(
        []
        {
            CacheSettings once;
            parseSettings(*settingsText(), once);
            CacheSettings again;
            parseSettings(formatSettings(once), again);
            RC_ASSERT(same(once, again));
        }));
}

TEST(LogDataLaws, WhatIsAcceptedIsInRange)
{
    expectLaw(rc::check(
        []
        {
            const LogData data = parseLogData(*textOf(
                {"2,5,1\n", "4,", "1,", "0,3,0", "5", ",", ",", "\n", "\r", "/var/log/x", std::string(1, '\0')}));
            RC_CLASSIFY(data.fault == LogDataFault::None, "accepted");
            if (data.fault != LogDataFault::None)
                return;
            RC_ASSERT(data.mode >= 0 && data.mode <= 4);
            RC_ASSERT(data.level >= 0 && data.level <= 5);
            RC_ASSERT(data.enabled.value() >= 0);
            RC_ASSERT(data.path.size() < logDataSecondLine);
            RC_ASSERT(data.path.find_first_of(std::string("\n\0", 2)) == std::string::npos);
            RC_ASSERT(modeWritesFile(data.mode) || data.path.empty());
        }));
}

TEST(LogDataLaws, WhatIsWrittenIsReadBack)
{
    expectLaw(rc::check(
        []
        {
            const int mode = *rc::gen::inRange(0, 5);
            const int level = *rc::gen::inRange(0, 6);
            const int enabled = *rc::gen::inRange(0, 2);
            const std::string path = *rc::gen::resize(
                200, rc::gen::nonEmpty(rc::gen::container<std::string>(rc::gen::inRange<char>(' ', '~'))));
            const LogData data = parseLogData(std::to_string(mode) + "," + std::to_string(level) + "," +
                                              std::to_string(enabled) + "\n" + path);
            RC_ASSERT(data.fault == LogDataFault::None);
            RC_ASSERT(data.mode == mode);
            RC_ASSERT(data.level == level);
            RC_ASSERT(data.enabled == enabled);
            RC_ASSERT(data.path == (modeWritesFile(mode) ? path : ""));
        }));
}

TEST(LineLaws, PiecesAreBoundedAndMakeUpTheText)
{
    expectLaw(rc::check(
        []
        {
            const std::string text = *rc::gen::container<std::string>(rc::gen::elementOf(std::string("ab\n\n")));
            const std::size_t limit = *rc::gen::inRange<std::size_t>(2, 10);
            Line_Reader lines(text);
            std::string all;
            while (const auto line = lines.next(limit))
            {
                RC_ASSERT(!line->empty() && line->size() < limit);
                RC_ASSERT(line->find('\n') >= line->size() - 1);
                all += *line;
            }
            RC_ASSERT(all == text);
        }));
}

TEST(UrlLaws, AnyTextGivesAShortLineThatIsNoComment)
{
    expectLaw(rc::check(
        []
        {
            const String url =
                parseWebLaunchUrl(*textOf({"#", " ", "\n", "\r\n", "https://host", std::string(300, 'u')}));
            RC_ASSERT(url.size() < 256u);
            RC_ASSERT(url.view().find('\n') == std::string_view::npos);
            RC_ASSERT(url.empty() || (url[0] != '#' && url[0] != ' '));
        }));
}

TEST(NameLaws, TextAndBytesAreInverse)
{
    expectLaw(rc::check(
        [](const std::array<std::uint8_t, 8>& wwn)
        {
            std::uint8_t back[8];
            RC_ASSERT(stringToWwn(back, wwnToUpperHex(wwn.data())) == 0);
            RC_ASSERT(std::equal(wwn.begin(), wwn.end(), back));
        }));
}

TEST(VersionLaws, AnyTextIsTakenOrRefused)
{
    expectLaw(rc::check(
        []
        {
            const std::string text = *textOf({"1", ".", "11", "a", "5", "r", " "});
            FirmwareVersion version;
            const int status = parseVersion(text.c_str(), version);
            RC_CLASSIFY(status == 0, "accepted");
            RC_ASSERT(status == 0 || status == invalidVersion);
            RC_ASSERT(version.major <= 9 && version.minor <= 9 && version.revision <= 9 && version.build <= 9);
            RC_ASSERT(version.releaseType.size() == (status == 0 ? 1u : 0u));
            std::uint16_t slots[4] = {};
            parseDottedVersion(text.c_str(), slots);
        }));
}

TEST(DesignatorLaws, AnyResponseStaysWithinItsBytes)
{
    expectLaw(rc::check(
        [](const std::vector<std::uint8_t>& page)
        {
            DesignatorRecord record;
            const int status = designatorToRecord(&record, page);
            RC_ASSERT((status == 0) == (page.size() >= 8));
            RC_ASSERT(record.designatorLength + 8 <= std::max<std::size_t>(page.size(), 8));
            char text[33];
            descriptorToString(text, &record);
            RC_ASSERT(std::string(text).size() <= 32u);
        }));
}

} // namespace
} // namespace cimple
