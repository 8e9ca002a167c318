// The answers over a module of the test's own: what is asked for again, in which namespace, and what fails.
#include "broker/web/Api.h"
#include "broker/values/Json.h"
#include "tests/unit/broker/FakeModule.h"

#include <nlohmann/json.hpp>

#include <gmock/gmock.h>
#include <gtest/gtest.h>

using broker::Json;
using broker_test::Call;
using testing::HasSubstr;

namespace
{

class Api : public testing::Test
{
protected:
    struct Told
    {
        int status;
        Json json;
    };

    Told ask(const std::string& path, const httplib::Params& params = {}, const std::string& body = {})
    {
        httplib::Request request;
        request.path = path;
        request.params = params;
        request.body = body;
        httplib::Response response;
        response.status = 200;
        for (const http::Route& route : site)
        {
            const bool isPrefix =
                route.path.ends_with('*') && path.starts_with(route.path.substr(0, route.path.size() - 1));
            if (route.path != path && !isPrefix)
                continue;
            route.answer(request, response, {"joe", true, "token", ""});
            EXPECT_EQ(response.get_header_value("Cache-Control"), "no-store");
            return {response.status, Json::parse(response.body)};
        }
        ADD_FAILURE() << "no route for " << path;
        return {};
    }

    broker_test::Fixture fixture;
    http::Site site = web::apiSite(*fixture.broker, "root/tavrin", {"1.2", true});
};

TEST_F(Api, AsksTheProviderOnceForManyPagesAndAnewBehindACall)
{
    int asked = 0;
    fixture.on("enumerateInstances",
               [&](const Call& call)
               {
                   asked += call.className == "TST_Port";
                   return CMPIStatus{CMPI_RC_OK, nullptr};
               });
    fixture.on("invokeMethod", [](const Call&) { return CMPIStatus{CMPI_RC_OK, nullptr}; });
    const std::string ports = "/api/classes/TST_Port/instances";
    for (const char* from : {"0", "100", "200"})
        EXPECT_EQ(ask(ports, {{"from", from}, {"sort", "Name"}}).json["total"], 0);
    EXPECT_EQ(ask("/api/classes/tst_port/instances").json["class"], "TST_Port");
    EXPECT_EQ(asked, 1);
    const Told called = ask("/api/call", {}, R"({"path": "TST_Base.Id=\"a\"", "method": "add", "in": {"a": 5}})");
    EXPECT_EQ(called.status, 200) << called.json;
    ask(ports);
    EXPECT_EQ(asked, 2);
}

TEST_F(Api, TellsTheProvidersFailuresAndWhatIsWrongWithAQuestion)
{
    fixture.on("getInstance", [](const Call&) { return CMPIStatus{CMPI_RC_ERR_NOT_FOUND, nullptr}; });
    fixture.on("enumerateInstances", [](const Call&) { return CMPIStatus{CMPI_RC_ERR_FAILED, nullptr}; });
    const auto calling = [](const std::string& rest)
    { return R"({"path": "TST_Base.Id=\"a\"", "method": )" + rest + "}"; };
    const struct
    {
        const char* path;
        httplib::Params params;
        int status;
        const char* text;
        std::string body = {};
    } rows[] = {
        {"/api/instance", {{"path", "TST_Base.Id=\"a\""}}, 404, "CIM_ERR_NOT_FOUND"},
        {"/api/instance", {}, 400, "path: it is missing"},
        {"/api/instance", {{"path", "TST_Base"}}, 400, "path: it has no Id"},
        {"/api/instance", {{"path", "TST_Base.Id=\"a"}}, 400, "path: "},
        {"/api/instance", {{"path", std::string("\0\xff<", 3)}}, 400, "path: "},
        {"/api/classes/TST_Port/instances", {}, 502, "CIM_ERR_FAILED"},
        {"/api/classes/TST_Port/instances", {{"sort", "Colour"}}, 502, "CIM_ERR_FAILED"},
        {"/api/classes/TST_Port/instances", {{"count", "501"}}, 400, "count: '501' is no number up to 500"},
        {"/api/classes/TST_Port/instances", {{"namespace", "root/none"}}, 404, "CIM_ERR_INVALID_NAMESPACE"},
        {"/api/classes/No\nne", {}, 404, "there is no class"},
        {"/api/logs/other", {}, 404, "there is no log 'other'"},
        {"/api/session", {{"user", "joe"}}, 400, "there is no parameter 'user'"},
        {"/api/call", {}, 400, "no JSON", "{"},
        {"/api/call", {}, 400, "path and method", "[]"},
        {"/api/call", {}, 400, "path: a text is wanted", "{}"},
        {"/api/call", {}, 400, "method: a text is wanted", calling("5")},
        {"/api/call", {}, 404, "has no method 'Sub'", calling("\"Sub\"")},
        {"/api/call", {}, 400, "in: an object", calling(R"("Add", "in": [])")},
        {"/api/call", {}, 400, "more: there is no such member", calling(R"("Add", "more": 1)")},
        {"/api/call", {}, 400, "B: Add takes no such parameter", calling(R"("Add", "in": {"B": 1})")},
        {"/api/call", {}, 400, "Sum: Add takes no such parameter", calling(R"("Add", "in": {"Sum": 1})")},
        {"/api/call", {}, 400, "A: 1.5 is no uint32", calling(R"("Add", "in": {"A": 1.5})")},
        {"/api/call", {}, 400, "A: ", calling(R"("Add", "in": {"A": 4294967296})")},
        {"/api/call", {}, 501, "CIM_ERR_NOT_SUPPORTED", calling(R"("Add", "in": {"A": 1})")},
    };
    for (const auto& row : rows)
    {
        const Told told = ask(row.path, row.params, row.body);
        EXPECT_EQ(told.status, row.status) << told.json;
        EXPECT_THAT(told.json["error"]["text"].get<std::string>(), HasSubstr(row.text)) << row.path;
    }
}

} // namespace
