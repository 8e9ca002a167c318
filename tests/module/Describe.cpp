#include "tests/module/Describe.h"

#include "broker/values/ValueText.h"

#include <gtest/gtest.h>

#include <algorithm>
#include <map>

namespace module_test
{

std::string describe(const broker::Object& object)
{
    std::map<std::string, std::string> lines;
    for (const auto& [name, value] : object.properties)
        if (!value.isNull())
            lines[name] = value.type() == CMPI_ref ? broker::valueText(value) : broker::mofValue(value);
    std::string text = "\n";
    for (const auto& [name, value] : lines)
        text += name + " = " + value + "\n";
    return text;
}

broker::Object theOne(Host& host, const std::string& className, const std::string& property, const std::string& value)
{
    std::vector<broker::Object> objects = host.instancesOf(className);
    std::erase_if(objects, [&](const broker::Object& object) { return text(object, property) != value; });
    EXPECT_EQ(objects.size(), 1u) << className << " with " << property << " " << value;
    return objects.empty() ? broker::Object{} : objects.front();
}

broker::Object changed(const broker::Object& instance, const char* property, broker::Value value)
{
    return {instance.path, {{property, std::move(value)}}};
}

std::vector<std::string> logAbout(const Host& host, const std::vector<std::string>& words)
{
    std::vector<std::string> lines = host.log();
    std::erase_if(lines,
                  [&](const std::string& line)
                  {
                      return std::none_of(words.begin(), words.end(),
                                          [&](const std::string& word) { return line.find(word) != line.npos; });
                  });
    return lines;
}

} // namespace module_test
