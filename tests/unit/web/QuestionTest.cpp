// What clients write: parameters, bodies; and how failures are told.
#include "broker/values/Json.h"
#include "broker/web/Body.h"
#include "broker/web/ErrorGrowth.h"
#include "broker/web/Failure.h"
#include "broker/web/Query.h"

#include <nlohmann/json.hpp>

#include <gmock/gmock.h>
#include <gtest/gtest.h>

using namespace web;
using broker::Json;
using testing::HasSubstr;

namespace
{

TEST(Query, ReadsNumbersWithinTheirLimitsAndNothingElse)
{
    const struct
    {
        const char* text;
        std::size_t number;
        bool wrong = false;
    } rows[] = {
        {"0", 0},        {"500", 500},    {"007", 7},    {"501", 0, true}, {"-1", 0, true},
        {"+1", 0, true}, {"1 ", 0, true}, {"", 0, true}, {"0x1", 0, true}, {"99999999999999999999", 0, true},
    };
    for (const auto& row : rows)
    {
        const httplib::Params params{{"count", row.text}};
        const Query query(params, {"count", "from"});
        if (row.wrong)
            EXPECT_THROW(query.number("count", 1, 500), ArgumentFailure) << row.text;
        else
            EXPECT_EQ(query.number("count", 1, 500), row.number) << row.text;
        EXPECT_EQ(query.number("from", 3, 500), 3U);
    }
}

TEST(Query, RefusesWhatItDoesNotKnowAndWhatStandsTwice)
{
    const httplib::Params twice{{"from", "1"}, {"from", "2"}};
    const httplib::Params other{{"form", "1"}};
    EXPECT_THROW(Query(twice, {"from"}), ArgumentFailure);
    EXPECT_THROW(Query(other, {"from"}), ArgumentFailure);
    const httplib::Params empty{{"path", ""}, {"flag", "yes"}};
    const Query query(empty, {"path", "flag"});
    EXPECT_THROW(query.required("path"), ArgumentFailure);
    EXPECT_THROW(query.flag("flag"), ArgumentFailure);
}

TEST(Page, LiesWithinItsList)
{
    const struct
    {
        Page page;
        std::size_t size, from, end;
    } rows[] = {
        {{0, 100}, 0, 0, 0},   {{0, 100}, 5, 0, 5}, {{4, 100}, 5, 4, 5}, {{5, 100}, 5, 5, 5},
        {{999, 100}, 5, 5, 5}, {{2, 2}, 5, 2, 4},   {{0, 0}, 5, 0, 0},
    };
    for (const auto& row : rows)
    {
        Page page = row.page;
        EXPECT_EQ(page.cutTo(row.size), row.end);
        EXPECT_EQ(page.from, row.from);
    }
}

TEST(Body, IsReadAsDeepAndAsBroadAsAnybodyNeeds)
{
    const auto nested = [](int depth) { return std::string(depth, '[') + std::string(depth, ']'); };
    const auto broad = [](std::size_t members)
    {
        std::string text = "{\"o\":{";
        for (std::size_t i = 0; i < members; i++)
            text += (i ? ",\"" : "\"") + std::to_string(i) + "\":{}";
        return text + "}}";
    };
    EXPECT_EQ(parseBody("{\"a\":[1,\"\\u0000\"]}")["a"].size(), 2U);
    EXPECT_NO_THROW(parseBody(nested(deepestBody)));
    EXPECT_NO_THROW(parseBody(broad(mostMembers)));
    for (const std::string& text :
         {nested(deepestBody + 2), nested(1'000'000), broad(mostMembers + 1), std::string(), std::string("{"),
          std::string("{}{}"), std::string("\"\xff\""), std::string("nul"), std::string("[1e999]")})
        EXPECT_THROW(parseBody(text), ArgumentFailure) << text.substr(0, 20);
}

template <class Failure> ToldFailure told(const Failure& failure)
{
    try
    {
        throw failure;
    }
    catch (...)
    {
        return tellCurrentException();
    }
}

TEST(Failures, AreToldByKindAndStatus)
{
    const struct
    {
        ToldFailure told;
        int status;
        const char* kind;
    } rows[] = {
        {told(ArgumentFailure("from: \"\xff\"")), 400, "argument"},
        {told(NothingThere("no class")), 404, "argument"},
        {told(broker::CimError({CMPI_RC_ERR_NOT_FOUND, "gone"})), 404, "cim"},
        {told(broker::CimError({CMPI_RC_ERR_ACCESS_DENIED, ""})), 403, "cim"},
        {told(broker::CimError({CMPI_RC_ERR_INVALID_PARAMETER, ""})), 400, "cim"},
        {told(broker::CimError({CMPI_RC_ERR_NOT_SUPPORTED, ""})), 501, "unsupported"},
        {told(broker::CimError({CMPI_RC_ERR_FAILED, ""})), 502, "cim"},
        {told(broker::CimError({static_cast<CMPIrc>(99), ""})), 502, "cim"},
        {told(std::bad_alloc()), 503, "unready"},
        {told(std::logic_error("x")), 500, "internal"},
        {told(1), 500, "internal"},
    };
    for (const auto& row : rows)
    {
        EXPECT_EQ(row.told.status, row.status);
        EXPECT_EQ(Json::parse(row.told.json)["error"]["kind"], row.kind) << row.told.json;
    }
    EXPECT_LT(told(ArgumentFailure(std::string(1 << 20, 'x'))).json.size(), 2000U);
    EXPECT_THAT(rows[2].told.json, HasSubstr(R"("status":"CIM_ERR_NOT_FOUND","text":"CIM_ERR_NOT_FOUND: gone")"));
}

TEST(ErrorGrowth, IsSeenUntilACounterIsReset)
{
    ErrorGrowth growth;
    EXPECT_FALSE(growth.hasGrown("a", "CRCErrors", 5)) << "what was there before is not growth";
    EXPECT_FALSE(growth.hasGrown("b", "CRCErrors", 7));
    EXPECT_FALSE(growth.hasGrown("a", "LinkFailures", 9));
    EXPECT_FALSE(growth.hasGrown("a", "CRCErrors", 5));
    EXPECT_TRUE(growth.hasGrown("a", "CRCErrors", 6));
    EXPECT_TRUE(growth.hasGrown("a", "CRCErrors", 6)) << "it stays told";
    EXPECT_FALSE(growth.hasGrown("b", "CRCErrors", 7));
    EXPECT_FALSE(growth.hasGrown("a", "CRCErrors", 0));
    EXPECT_TRUE(growth.hasGrown("a", "CRCErrors", 1));
}

} // namespace
