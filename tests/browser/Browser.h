// A browser that a test steers as a person would: chromium by way of chromedriver, spoken to in the WebDriver protocol.
#pragma once

#include <nlohmann/json.hpp>

#include <functional>
#include <memory>
#include <string>
#include <vector>

namespace browser_test
{

using Json = nlohmann::json;

/// The keys that are no character, as the protocol writes them.
namespace key
{
inline constexpr const char* tab = "\uE004";
inline constexpr const char* enter = "\uE007";
inline constexpr const char* escape = "\uE00C";
inline constexpr const char* space = "\uE00D";
} // namespace key

class Browser
{
public:
    /// Starts both programs, with a folder of their own. Throws std::runtime_error where that fails.
    Browser();
    ~Browser();
    Browser(const Browser&) = delete;
    Browser& operator=(const Browser&) = delete;

    void open(const std::string& url);
    /// The width and height of what is seen of the page.
    void resize(int width, int height);
    /// "light" or "dark".
    void prefer(const std::string& scheme);
    /// Runs a script in each page before the page's own.
    void runBeforePages(const std::string& script);

    /// What the body of a function returns.
    Json run(const std::string& body);
    /// Waits until an expression is true; fails the test with what is seen of the page where it is not in 20 seconds.
    /// Gives the value.
    Json await(const std::string& expression);
    /// Waits until the text of an element contains `text`.
    void awaitText(const std::string& selector, const std::string& text);
    std::string textOf(const std::string& selector);

    /// Waits for the element, and clicks or fills it.
    void click(const std::string& selector);
    /// The link or button with that text.
    void clickText(const std::string& text, const std::string& within = "body");
    void type(const std::string& selector, const std::string& text);
    /// A file in a field for files.
    void choose(const std::string& selector, const std::string& file);
    void press(const std::string& key);
    /// Presses it until an expression is true; false when it is not after `most` times.
    bool pressUntil(const std::string& key, const std::string& expression, int most = 60);

    /// What the page wrote to the console, and what the browser did: errors and warnings.
    std::vector<std::string> complaints();
    /// Keeps a picture where TVR_SCREENSHOTS names a folder.
    void keepPicture(const std::string& name);

private:
    struct Driver;
    Json command(const std::string& method, const std::string& path, const Json& body = Json::object());
    Json devtools(const std::string& name, const Json& parameters);
    std::string find(const std::string& selector, const std::string& text = {});
    void use(const std::string& selector, const std::string& text, const std::function<void(std::string)>& with);

    std::unique_ptr<Driver> _driver;
    std::string _session;
};

} // namespace browser_test
