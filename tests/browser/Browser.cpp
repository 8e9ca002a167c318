#include "tests/browser/Browser.h"

#include <gtest/gtest.h>
#include <httplib.h>

#include <csignal>
#include <cstdlib>
#include <fcntl.h>
#include <filesystem>
#include <fstream>
#include <poll.h>
#include <stdexcept>
#include <sys/wait.h>
#include <unistd.h>

namespace browser_test
{

namespace
{

constexpr int longestWait = 60000; // milliseconds

/// How the protocol writes a reference to an element.
constexpr const char* elementKey = "element-6066-11e4-a52e-4f735466cecf";

std::string readLine(int file)
{
    std::string line;
    pollfd ready{file, POLLIN, 0};
    for (char c = 0; poll(&ready, 1, longestWait) == 1 && read(file, &c, 1) == 1 && c != '\n';)
        line += c;
    return line;
}

/// Characters beyond ASCII are three bytes each.
std::string decodedBase64(const std::string& text)
{
    static const std::string digits = "ABCDEFGHIJKLMNOPQRSTUVWXYZabcdefghijklmnopqrstuvwxyz0123456789+/";
    std::string bytes;
    unsigned bits = 0;
    int count = 0;
    for (const char c : text)
    {
        const std::size_t digit = digits.find(c);
        if (digit == std::string::npos)
            break;
        bits = bits << 6 | static_cast<unsigned>(digit);
        count += 6;
        if (count >= 8)
        {
            count -= 8;
            bytes += static_cast<char>(bits >> count & 0xFF);
        }
    }
    return bytes;
}

std::string quoted(const std::string& text)
{
    return Json(text).dump();
}

} // namespace

/// chromedriver in a process group of its own, which the browser is in as well.
struct Browser::Driver
{
    Driver() : folder(std::filesystem::path(testing::TempDir()) / ("browser-" + std::to_string(getpid())))
    {
        std::filesystem::create_directories(folder);
        constexpr int tries = 5; // it takes a free port of IPv6, which may be in use with IPv4
        int port = 0;
        for (int i = 0; i < tries && port == 0; i++)
        {
            end();
            begin();
            port = awaitPort();
        }
        if (port == 0)
        {
            end();
            throw std::runtime_error("chromedriver did not start");
        }
        client = std::make_unique<httplib::Client>("127.0.0.1", port);
        client->set_read_timeout(std::chrono::milliseconds(longestWait) + std::chrono::seconds(30));
        client->set_keep_alive(true);
    }

    ~Driver()
    {
        end();
        std::error_code ignored; // the browser's last process may still write
        std::filesystem::remove_all(folder, ignored);
    }

    void begin()
    {
        int ends[2];
        if (pipe2(ends, O_CLOEXEC) != 0)
            throw std::runtime_error("no pipe");
        output = ends[0];
        process = fork();
        if (process == 0)
        {
            setpgid(0, 0);
            dup2(ends[1], STDOUT_FILENO);
            setenv("TMPDIR", folder.c_str(), 1); // what the programs leave behind goes with it
            execlp("chromedriver", "chromedriver", "--port=0", nullptr);
            _exit(127);
        }
        close(ends[1]);
    }

    void end()
    {
        if (process <= 0)
            return;
        kill(-process, SIGKILL);
        kill(process, SIGKILL); // which may not be in its group yet
        waitpid(process, nullptr, 0);
        close(output);
        process = -1;
    }

    /// 0 where it has ended instead.
    int awaitPort() const
    {
        for (std::string line = readLine(output); !line.empty(); line = readLine(output))
            if (const std::size_t mark = line.find("successfully on port "); mark != std::string::npos)
                return std::stoi(line.substr(mark + std::string("successfully on port ").size()));
        return 0;
    }

    std::filesystem::path folder;
    pid_t process = -1;
    int output = -1;
    std::unique_ptr<httplib::Client> client;
};

Browser::Browser() : _driver(std::make_unique<Driver>())
{
    // Names of other machines are looked up nowhere.
    const Json arguments{"--headless=new",
                         "--no-sandbox",
                         "--disable-gpu",
                         "--disable-dev-shm-usage",
                         "--disable-quic",
                         "--no-first-run",
                         "--disable-background-networking",
                         "--disable-component-update",
                         "--disable-sync",
                         "--disable-extensions",
                         "--hide-scrollbars",
                         "--no-proxy-server",
                         "--lang=en",
                         "--host-resolver-rules=MAP * ~NOTFOUND, EXCLUDE 127.0.0.1",
                         "--window-size=1280,900",
                         "--user-data-dir=" + (_driver->folder / "profile").string()};
    const Json wanted{{"browserName", "chrome"},
                      {"acceptInsecureCerts", true},
                      {"timeouts", {{"script", longestWait + 10000}}},
                      {"goog:chromeOptions", {{"args", arguments}}},
                      {"goog:loggingPrefs", {{"browser", "ALL"}}}};
    const Json session = command("POST", "", {{"capabilities", {{"alwaysMatch", wanted}}}});
    _session = "/" + session.at("sessionId").get<std::string>();
    resize(1280, 900);
}

Browser::~Browser()
{
    try
    {
        command("DELETE", "");
    }
    catch (const std::exception& error)
    {
        ADD_FAILURE() << error.what();
    }
}

Json Browser::command(const std::string& method, const std::string& path, const Json& body)
{
    const std::string whole = "/session" + _session + path;
    const auto& client = _driver->client;
    const httplib::Result result = method == "POST"     ? client->Post(whole, body.dump(), "application/json")
                                   : method == "DELETE" ? client->Delete(whole)
                                                        : client->Get(whole);
    if (!result)
        throw std::runtime_error("chromedriver: " + to_string(result.error()));
    const Json answer = Json::parse(result->body).at("value");
    if (result->status != 200)
        throw std::runtime_error(path + ": " + answer.value("message", result->body));
    return answer;
}

Json Browser::devtools(const std::string& name, const Json& parameters)
{
    return command("POST", "/goog/cdp/execute", {{"cmd", name}, {"params", parameters}});
}

void Browser::open(const std::string& url)
{
    command("POST", "/url", {{"url", url}});
}

void Browser::resize(int width, int height)
{
    devtools("Emulation.setDeviceMetricsOverride",
             {{"width", width}, {"height", height}, {"deviceScaleFactor", 1}, {"mobile", false}});
}

void Browser::prefer(const std::string& scheme)
{
    devtools("Emulation.setEmulatedMedia", {{"features", {{{"name", "prefers-color-scheme"}, {"value", scheme}}}}});
}

void Browser::runBeforePages(const std::string& script)
{
    devtools("Page.addScriptToEvaluateOnNewDocument", {{"source", script}});
}

Json Browser::run(const std::string& body)
{
    return command("POST", "/execute/sync", {{"script", body}, {"args", Json::array()}});
}

Json Browser::await(const std::string& expression)
{
    const std::string body = "const done = arguments[0], end = Date.now() + " + std::to_string(longestWait) +
                             "; (function look() { let value = null; try { value = (" + expression +
                             "); } catch (error) {} if (value || Date.now() > end) done(value || null); else "
                             "setTimeout(look, 15); })();";
    Json value = command("POST", "/execute/async", {{"script", body}, {"args", Json::array()}});
    if (value.is_null())
        throw std::runtime_error("never true: " + expression + "\n--- page:\n" + textOf("body"));
    return value;
}

void Browser::awaitText(const std::string& selector, const std::string& text)
{
    await("document.querySelector(" + quoted(selector) + ")?.innerText.includes(" + quoted(text) + ")");
}

std::string Browser::textOf(const std::string& selector)
{
    return run("const found = document.querySelector(" + quoted(selector) +
               "); return found?.innerText ?? found?.textContent ?? ''");
}

/// The first that is seen, with exactly that text where one is given.
std::string Browser::find(const std::string& selector, const std::string& text)
{
    const std::string seen = "[...document.querySelectorAll(" + quoted(selector) +
                             ")].find((each) => each.checkVisibility() && (" + (text.empty() ? "true" : "false") +
                             " || each.textContent.trim() === " + quoted(text) + "))";
    return await(seen).at(elementKey);
}

/// What is found may be drawn anew before it is used, and is found again then.
void Browser::use(const std::string& selector, const std::string& text, const std::function<void(std::string)>& with)
{
    for (int attempt = 1;; attempt++)
        try
        {
            return with("/element/" + find(selector, text));
        }
        catch (const std::runtime_error& error)
        {
            constexpr int mostAttempts = 20;
            if (attempt == mostAttempts ||
                std::string(error.what()).find("stale element reference") == std::string::npos)
                throw;
        }
}

void Browser::click(const std::string& selector)
{
    use(selector, {}, [this](const std::string& element) { command("POST", element + "/click"); });
}

void Browser::clickText(const std::string& text, const std::string& within)
{
    use(within + " a, " + within + " button", text,
        [this](const std::string& element) { command("POST", element + "/click"); });
}

void Browser::type(const std::string& selector, const std::string& text)
{
    use(selector, {},
        [&](const std::string& element)
        {
            command("POST", element + "/clear");
            command("POST", element + "/value", {{"text", text}});
        });
}

void Browser::choose(const std::string& selector, const std::string& file)
{
    use(selector, {}, [&](const std::string& element) { command("POST", element + "/value", {{"text", file}}); });
}

void Browser::press(const std::string& key)
{
    const Json actions{{{"type", "keyDown"}, {"value", key}}, {{"type", "keyUp"}, {"value", key}}};
    command("POST", "/actions", {{"actions", {{{"type", "key"}, {"id", "keys"}, {"actions", actions}}}}});
}

bool Browser::pressUntil(const std::string& key, const std::string& expression, int most)
{
    for (int pressed = 0; pressed < most; pressed++)
    {
        press(key);
        if (run("return Boolean(" + expression + ")").get<bool>())
            return true;
    }
    return false;
}

std::vector<std::string> Browser::complaints()
{
    std::vector<std::string> texts;
    for (const Json& entry : command("POST", "/se/log", {{"type", "browser"}}))
        if (entry.at("level") == "SEVERE" || entry.at("level") == "WARNING")
            texts.push_back(entry.at("message"));
    return texts;
}

void Browser::keepPicture(const std::string& name)
{
    const char* folder = std::getenv("TVR_SCREENSHOTS");
    if (!folder)
        return;
    const std::string file = std::string(folder) + "/" + name + ".png";
    std::ofstream(file, std::ios::binary) << decodedBase64(command("GET", "/screenshot"));
}

} // namespace browser_test
