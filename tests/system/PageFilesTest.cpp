// The files of the page as a browser gets them, and what all answers of the port tell browsers.
#include "tests/system/Serving.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>

using namespace system_test;
using testing::AllOf;
using testing::HasSubstr;
using testing::Not;
using testing::StartsWith;

namespace
{

class PageFiles : public testing::Test
{
protected:
    /// Head and body.
    std::string get(const std::string& path, const std::string& options = "") const
    {
        return runCommand("curl --noproxy '*' -si " + options + " '" + _server.url() + path + "'").out;
    }

    const Serving _server;
};

std::string field(const std::string& answer, const std::string& name)
{
    const std::size_t begin = answer.find("\r\n" + name + ": ");
    if (begin == std::string::npos)
        return "";
    const std::size_t value = begin + name.size() + 4;
    return answer.substr(value, answer.find("\r\n", value) - value);
}

TEST_F(PageFiles, HaveTheirTypesAndAreFetchedOnce)
{
    for (const auto& [path, type] :
         {std::pair("/", "text/html; charset=utf-8"), std::pair("/main.js", "text/javascript; charset=utf-8"),
          std::pair("/page.css", "text/css; charset=utf-8"), std::pair("/icon.svg", "image/svg+xml")})
    {
        const std::string answer = get(path);
        EXPECT_THAT(answer, StartsWith("HTTP/1.1 200")) << path;
        EXPECT_EQ(field(answer, "Content-Type"), type);
        EXPECT_EQ(field(answer, "Cache-Control"), "no-cache");
        const std::string tag = field(answer, "ETag");
        EXPECT_THAT(tag, AllOf(StartsWith("\""), testing::SizeIs(66)));
        const std::string again = get(path, "-H 'If-None-Match: \"old\", " + tag + "'");
        EXPECT_THAT(again, AllOf(StartsWith("HTTP/1.1 304"), testing::EndsWith("\r\n\r\n")));
        EXPECT_THAT(get(path, "-H 'If-None-Match: \"old\"'"), StartsWith("HTTP/1.1 200"));
        EXPECT_THAT(get(path, "--head"), AllOf(StartsWith("HTTP/1.1 200"), testing::EndsWith("\r\n\r\n")));
    }
    EXPECT_NE(field(get("/main.js"), "ETag"), field(get("/dom.js"), "ETag"));
    for (const char* path : {"/index.html", "/PAGE.CSS", "/page.css/", "/..%2fpage.css", "/main.js%00"})
        EXPECT_THAT(get(path), Not(StartsWith("HTTP/1.1 200"))) << path;
}

/// The whole program, style and all, is in files that `script-src 'self'` allows.
TEST_F(PageFiles, HaveNothingInline)
{
    const std::string page = get("/");
    for (const char* inside : {"<style", "style=", " onclick", " onload", "javascript:", "http://", "https://"})
        EXPECT_THAT(page, Not(HasSubstr(inside)));
    const std::size_t script = page.find("<script");
    EXPECT_THAT(page.substr(script), StartsWith("<script type=\"module\" src=\"main.js\"></script>"));
    EXPECT_EQ(page.find("<script", script + 1), std::string::npos);
}

TEST_F(PageFiles, AndAllElseTellBrowsersToStayHere)
{
    const std::string refused = "-H 'Host: elsewhere.example'";
    for (const auto& [path, options] :
         {std::pair("/", ""), std::pair("/main.js", ""), std::pair("/api/session", ""), std::pair("/api/nothing", ""),
          std::pair("/", refused.c_str()), std::pair("/cimom", "-d x"), std::pair("/api/call", "-d {}")})
    {
        const std::string answer = get(path, options);
        SCOPED_TRACE(std::string(path) + " " + options + "\n" + answer.substr(0, answer.find("\r\n\r\n")));
        EXPECT_EQ(field(answer, "Content-Security-Policy"),
                  "default-src 'none'; script-src 'self'; style-src 'self'; img-src 'self'; connect-src 'self'; "
                  "base-uri 'none'; form-action 'none'; frame-ancestors 'none'");
        EXPECT_EQ(field(answer, "X-Content-Type-Options"), "nosniff");
        EXPECT_EQ(field(answer, "Referrer-Policy"), "no-referrer");
        EXPECT_EQ(field(answer, "Cross-Origin-Resource-Policy"), "same-origin");
        EXPECT_EQ(field(answer, "Cross-Origin-Opener-Policy"), "same-origin");
    }
}

} // namespace
