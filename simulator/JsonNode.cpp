#include "simulator/JsonNode.h"

#include <nlohmann/json.hpp>

#include <algorithm>
#include <charconv>

namespace tvrsim
{

namespace
{

/// The value as an error message shows it: short, and on one line.
std::string shown(const nlohmann::json& value)
{
    constexpr std::size_t longest = 40;
    if (value.is_object())
        return "an object";
    if (value.is_array())
        return "an array";
    std::string text = value.dump(-1, ' ', true, nlohmann::json::error_handler_t::replace);
    if (text.size() > longest)
        text = text.substr(0, longest) + "...";
    return text;
}

std::optional<std::uint64_t> parseNumber(std::string_view text)
{
    const bool hexadecimal = text.starts_with("0x") || text.starts_with("0X");
    if (hexadecimal)
        text.remove_prefix(2);
    std::uint64_t number = 0;
    const auto [stop, error] = std::from_chars(text.data(), text.data() + text.size(), number, hexadecimal ? 16 : 10);
    if (error != std::errc() || stop != text.data() + text.size())
        return std::nullopt;
    return number;
}

} // namespace

JsonNode::JsonNode(const nlohmann::json& value, std::string path, const std::string& file)
    : _value(value), _path(std::move(path)), _file(file)
{}

void JsonNode::fail(const std::string& expected) const
{
    failWith("expected " + expected + ", found " + shown(_value));
}

void JsonNode::failWith(const std::string& message) const
{
    throw ScenarioError(_file + ": " + (_path.empty() ? "/" : _path) + ": " + message);
}

bool JsonNode::isNull() const
{
    return _value.is_null();
}

bool JsonNode::isObject() const
{
    return _value.is_object();
}

std::uint64_t JsonNode::asNumber(std::uint64_t maximum) const
{
    std::optional<std::uint64_t> number;
    if (_value.is_number_unsigned())
        number = _value.get<std::uint64_t>();
    else if (_value.is_string())
        number = parseNumber(_value.get_ref<const std::string&>());
    if (!number || *number > maximum)
        fail("a number from 0 to " + std::to_string(maximum));
    return *number;
}

bool JsonNode::asFlag() const
{
    if (!_value.is_boolean())
        fail("true or false");
    return _value.get<bool>();
}

std::string JsonNode::asText(std::size_t maximum) const
{
    if (!_value.is_string() || _value.get_ref<const std::string&>().size() > maximum)
        fail("a text of at most " + std::to_string(maximum) + " bytes");
    return _value.get<std::string>();
}

Wwn JsonNode::asWwn() const
{
    const std::optional<Wwn> name = _value.is_string() ? parseWwn(_value.get_ref<const std::string&>()) : std::nullopt;
    if (!name)
        fail("a WWN of 16 hexadecimal digits");
    return *name;
}

std::vector<std::uint8_t> JsonNode::asBytes(std::size_t maximum) const
{
    const std::string expected = "at most " + std::to_string(maximum) + " bytes as pairs of hexadecimal digits";
    if (!_value.is_string())
        fail(expected);
    std::string digits = _value.get<std::string>();
    std::erase_if(digits, [](char c) { return c == ':' || c == ' '; });
    if (digits.size() % 2 != 0 || digits.size() > 2 * maximum)
        fail(expected);
    std::vector<std::uint8_t> bytes(digits.size() / 2);
    for (std::size_t i = 0; i < bytes.size(); ++i)
    {
        const char* pair = digits.data() + 2 * i;
        const auto [stop, error] = std::from_chars(pair, pair + 2, bytes[i], 16);
        if (error != std::errc() || stop != pair + 2)
            fail(expected);
    }
    return bytes;
}

std::uint32_t JsonNode::asNamed(std::span<const NamedNumber> names) const
{
    if (!_value.is_string())
        return static_cast<std::uint32_t>(asNumber(std::numeric_limits<std::uint32_t>::max()));
    std::string expected = "a number";
    for (const NamedNumber& row : names)
    {
        if (_value.get_ref<const std::string&>() == row.name)
            return row.value;
        expected += std::string(" or \"") + row.name + '"';
    }
    fail(expected);
}

std::vector<JsonNode> JsonNode::asArray() const
{
    if (!_value.is_array())
        fail("an array");
    std::vector<JsonNode> items;
    for (std::size_t i = 0; i < _value.size(); ++i)
        items.emplace_back(_value[i], _path + '/' + std::to_string(i), _file);
    return items;
}

void JsonNode::requireObject() const
{
    if (!_value.is_object())
        fail("an object");
}

bool JsonNode::has(const char* key)
{
    requireObject();
    _known.emplace_back(key);
    return _value.contains(key);
}

JsonNode JsonNode::at(const char* key)
{
    if (!has(key))
        failWith(std::string("expected a member \"") + key + '"');
    return JsonNode(_value[key], _path + '/' + key, _file);
}

void JsonNode::read(const char* key, bool& out)
{
    if (has(key))
        out = at(key).asFlag();
}

void JsonNode::read(const char* key, std::string& out, std::size_t maximum)
{
    if (has(key))
        out = at(key).asText(maximum);
}

void JsonNode::readWwn(const char* key, Wwn& out)
{
    if (has(key))
        out = at(key).asWwn();
}

void JsonNode::readNamed(const char* key, std::uint32_t& out, std::span<const NamedNumber> names)
{
    if (has(key))
        out = at(key).asNamed(names);
}

std::vector<std::pair<std::string, JsonNode>> JsonNode::members()
{
    requireObject();
    std::vector<std::pair<std::string, JsonNode>> members;
    for (const auto& item : _value.items())
        members.emplace_back(item.key(), at(item.key().c_str()));
    return members;
}

std::vector<std::pair<std::uint32_t, JsonNode>> JsonNode::numberedMembers()
{
    std::vector<std::pair<std::uint32_t, JsonNode>> numbered;
    for (auto& [key, value] : members())
    {
        const std::optional<std::uint64_t> number = parseNumber(key);
        if (!number || *number > std::numeric_limits<std::uint32_t>::max())
            failWith("expected a number as the member's name, found \"" + key + '"');
        numbered.emplace_back(static_cast<std::uint32_t>(*number), std::move(value));
    }
    return numbered;
}

void JsonNode::finish() const
{
    requireObject();
    for (const auto& [key, value] : _value.items())
        if (std::ranges::find(_known, key) == _known.end())
        {
            std::vector<std::string> known = _known;
            std::ranges::sort(known);
            known.erase(std::unique(known.begin(), known.end()), known.end());
            std::string expected;
            for (const std::string& name : known)
                expected += (expected.empty() ? "" : ", ") + name;
            failWith("unknown member \"" + key + "\", expected one of: " + expected);
        }
}

} // namespace tvrsim
