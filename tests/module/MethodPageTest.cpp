// docs/methods.md has what clients can change, as the module answers it.
#include "tests/module/Host.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <algorithm>
#include <fstream>

using namespace module_test;

namespace
{

std::vector<std::string> commandsOfThePage()
{
    std::vector<std::string> commands;
    std::ifstream page(TVR_METHOD_PAGE);
    for (std::string line; std::getline(page, line);)
        if (line.starts_with("$ tvrcim "))
            commands.push_back(line + " ");
    return commands;
}

/// Whether a command of the page has the verb, the class and, if it is not empty, the method.
bool shows(const std::vector<std::string>& commands, const std::string& verb, const std::string& className,
           const std::string& method = "")
{
    const testing::Matcher<std::string> example = testing::MatchesRegex(
        "\\$ tvrcim (.* )?" + verb + " '?" + className + "[. ].*" + (method.empty() ? "" : method + " ") + ".*");
    return std::any_of(commands.begin(), commands.end(),
                       [&](const std::string& command) { return testing::Matches(example)(command); });
}

TEST(MethodPage, HasAllThatClientsCanChange)
{
    const std::vector<std::string> commands = commandsOfThePage();
    Host host;
    broker::Broker& broker = host.broker();
    for (const std::string& name : broker.servedClasses())
    {
        SCOPED_TRACE(name);
        const broker::Object none{{"root/tavrin", name, {}}, {}};
        EXPECT_EQ(shows(commands, "set", name), broker.modifyInstance(none).status != CMPI_RC_ERR_NOT_SUPPORTED);
        EXPECT_EQ(shows(commands, "create", name), broker.createInstance(none).status != CMPI_RC_ERR_NOT_SUPPORTED);
        EXPECT_EQ(shows(commands, "delete", name),
                  broker.deleteInstance(none.path).status != CMPI_RC_ERR_NOT_SUPPORTED);
        for (const broker::MethodInfo& method : broker.classes().find(name)->methods)
        {
            const bool hasBody = broker.invokeMethod(none.path, method.name).status != CMPI_RC_ERR_NOT_SUPPORTED;
            EXPECT_EQ(shows(commands, "call", name, method.name), hasBody) << method.name;
            EXPECT_EQ(shows(commands, "methods", name, method.name), hasBody) << method.name;
        }
    }
    host.unload();
}

} // namespace
