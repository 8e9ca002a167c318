// The page as a person uses it, over the simulated hosts.
#include "tests/browser/Browser.h"
#include "tests/system/Serving.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <algorithm>
#include <filesystem>
#include <fstream>
#include <optional>

using namespace browser_test;
using system_test::Folder;
using system_test::Serving;
using testing::AllOf;
using testing::Each;
using testing::HasSubstr;
using testing::IsEmpty;
using testing::Not;
using testing::StartsWith;

namespace
{

constexpr const char* upPort = "1000027A51160210";
constexpr const char* downPort = "1000027A51160211";

class Page : public testing::Test
{
protected:
    /// Two who may log in, joe who may change things and ann who may read, with the password "secret".
    void serve(std::vector<std::string> options = {})
    {
        const std::string users = _folder.makeUsers("joe", "secret");
        const std::string line = textOf(users);
        const std::string hash = line.substr(line.find("joe:") + 4);
        std::ofstream(users, std::ios::app) << "ann:" << hash.substr(0, hash.find('\n')) << ":reader\n";
        options.insert(options.end(), {"--users", users});
        _serving.emplace(options);
        browser.runBeforePages("window.violations = []; document.addEventListener('securitypolicyviolation', "
                               "(event) => violations.push(event.violatedDirective + ' ' + event.blockedURI));");
    }

    void serveScenario(const std::string& json)
    {
        std::ofstream(_folder.file("scenario.json")) << json;
        serve({"--scenario", _folder.file("scenario.json")});
    }

    void visit(const std::string& view = "") { browser.open(_serving->url() + "/#/" + view); }

    void logIn(const std::string& user = "joe", const std::string& password = "secret")
    {
        browser.click("#session button");
        browser.type("dialog input[name=user]", user);
        browser.type("dialog input[name=password]", password);
        browser.press(key::enter);
    }

    void awaitHeading(const std::string& text) { browser.awaitText("h1", text); }

    /// Nothing was refused or failed, and nobody else was asked for anything.
    void expectPeace()
    {
        EXPECT_THAT(browser.complaints(), IsEmpty());
        EXPECT_EQ(browser.run("return violations"), Json::array());
        for (const Json& url : browser.run("return performance.getEntriesByType('resource').map((each) => each.name)"))
            EXPECT_THAT(url.get<std::string>(), StartsWith(_serving->url() + "/"));
    }

    Browser browser;
    Folder _folder;
    std::optional<Serving> _serving;
};

TEST_F(Page, LeadsFromAProblemToItsPortAndFromThePictureToACard)
{
    serve();
    visit();
    browser.awaitText("#problems", "LINK DOWN");
    browser.clickText("FC port " + std::string(downPort), "#problems");
    awaitHeading(downPort);
    browser.awaitText("main", "LINK DOWN");
    EXPECT_EQ(browser.run("return document.activeElement.tagName"), "H1") << "where the keys go on";

    browser.run("history.back()");
    browser.click(".picture a.card");
    awaitHeading("Card");
    browser.awaitText("main", "TV1602");
    expectPeace();
}

TEST_F(Page, PictureHasEachTargetOnceAndSaysWhatPortsAre)
{
    serve();
    visit();
    browser.await("document.querySelectorAll('.picture a.card').length === 2");
    const std::string titles = "return [...document.querySelectorAll('.picture .target .title')].map((each) => each.textContent)";
    const Json targets = browser.run(titles);
    EXPECT_EQ(targets, Json({"50063D200110000A", "50063D3002200001", "50063D200110000B", "50063D4003300001"}));
    const auto labelOf = [&](const std::string& wwpn)
    {
        return browser.run("return [...document.querySelectorAll('.picture .node')].map((each) => "
                           "each.getAttribute('aria-label') ?? '').find((each) => each.includes('" +
                           wwpn + "'))");
    };
    EXPECT_THAT(labelOf(upPort), AllOf(HasSubstr("up, 8 Gbit/s"), HasSubstr("fabric 1000063D2000A001")));
    EXPECT_THAT(labelOf(downPort), HasSubstr("LINK DOWN"));
}

TEST_F(Page, FollowsAssociationsToAUnitAndComesBack)
{
    serve();
    visit("classes/TVRHBA_StorageVolume");
    browser.awaitText("#count", "6 instances");
    browser.click(".grid tbody a");
    awaitHeading("Storage volume");
    browser.awaitText("main", "100 GiB");
    const std::string unit = browser.textOf("h1");

    browser.await("document.querySelector('#associations a[href^=\"#/object/\"]')");
    browser.click("#associations a[href^='#/object/']");
    browser.await("document.querySelector('h1').innerText !== " + Json(unit).dump());
    browser.await("document.querySelectorAll('#associations a').length > 0");
    // from there an association leads to the unit again
    const std::string name = Json(unit.substr(unit.find(' '))).dump();
    browser.run("history.back()");
    awaitHeading(unit);
    expectPeace();
    static_cast<void>(name);
}

TEST_F(Page, RefusesAWrongPasswordAndTellsWhoMayNot)
{
    serve();
    visit();
    browser.awaitText("#session", "Read only");
    logIn("joe", "wrong");
    browser.awaitText("dialog", "name or password is wrong");
    EXPECT_EQ(browser.run("return document.querySelector('dialog input[name=password]').value"), "");
    browser.press(key::escape);
    browser.await("!document.querySelector('dialog')");
    browser.awaitText("#session", "Not logged in");

    logIn("ann");
    browser.awaitText("#session", "ann may only read");
    browser.clickText("Log out");
    logIn();
    browser.awaitText("#session", "Logged in as joe");
    EXPECT_THAT(browser.textOf("#session"), Not(HasSubstr("Read only")));
    // A new page knows nothing of it.
    browser.run("location.reload()");
    browser.awaitText("#session", "Not logged in");
}

TEST_F(Page, PaintsItsFrameAtOnce)
{
    serve();
    double best = 1e9;
    for (int tries = 0; tries < 3; tries++)
    {
        visit("?" + std::to_string(tries));
        browser.run("location.reload()");
        best = std::min(best, browser.await("performance.getEntriesByName('first-contentful-paint')[0]?.startTime").get<double>());
    }
    EXPECT_LT(best, 200) << "milliseconds";
}

} // namespace
