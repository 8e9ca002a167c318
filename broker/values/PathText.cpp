#include "broker/values/PathText.h"

#include "broker/values/Utf8.h"
#include "broker/values/ValueText.h"

#include <algorithm>
#include <cctype>
#include <charconv>
#include <stdexcept>

namespace broker
{

namespace
{

/// Reads a text from left to right.
class Reader
{
public:
    explicit Reader(std::string_view text) : _text(text) {}

    bool atEnd() const { return _pos == _text.size(); }
    bool take(char c)
    {
        const bool there = !atEnd() && _text[_pos] == c;
        _pos += there;
        return there;
    }
    /// Everything up to one of the characters or the end.
    std::string_view until(std::string_view stops)
    {
        const std::size_t start = _pos;
        _pos = std::min(_text.find_first_of(stops, _pos), _text.size());
        return _text.substr(start, _pos - start);
    }
    /// A text whose opening quote was taken; takes the closing one.
    std::string untilQuote()
    {
        std::string result;
        while (!atEnd() && _text[_pos] != '"')
            result += _text[_pos] == '\\' ? takeEscaped() : _text[_pos++];
        if (!take('"'))
            throw std::invalid_argument("a quote is not closed in '" + std::string(_text) + "'");
        return result;
    }
    /// The position of the next of the characters relative to here; npos if there is none.
    std::size_t find(std::string_view characters) const
    {
        const std::size_t found = _text.find_first_of(characters, _pos);
        return found == std::string_view::npos ? found : found - _pos;
    }
    char at(std::size_t offset) const { return _text[_pos + offset]; }

private:
    /// What a backslash stands before: the number of a byte in hexadecimal, or a character that means itself.
    char takeEscaped()
    {
        const std::string_view escape = _text.substr(_pos, 4);
        unsigned byte = 0;
        if (escape.size() == 4 && escape[1] == 'x' &&
            std::from_chars(escape.data() + 2, escape.data() + 4, byte, 16).ptr == escape.data() + 4)
        {
            _pos += escape.size();
            return static_cast<char>(byte);
        }
        _pos += _pos + 1 < _text.size();
        return _text[_pos++];
    }

    std::string_view _text;
    std::size_t _pos = 0;
};

/// A key's text between quotes. Bytes that are no UTF-8 and control characters are written as their numbers, so that
/// the path stays on its line and comes back from JSON.
std::string quoteKey(std::string_view text)
{
    std::string result = "\"";
    while (!text.empty())
    {
        const char c = text.front();
        const bool plain = static_cast<unsigned char>(c) >= ' ' && static_cast<unsigned char>(c) < 0x7F;
        const std::size_t length = plain ? 1 : longCharacter(text);
        if (length == 0)
        {
            constexpr const char* digits = "0123456789abcdef";
            result +=
                {'\\', 'x', digits[static_cast<unsigned char>(c) >> 4], digits[static_cast<unsigned char>(c) & 15]};
        }
        else if (c == '"' || c == '\\')
        {
            result += '\\';
        }
        result += text.substr(0, length);
        text.remove_prefix(std::max<std::size_t>(length, 1));
    }
    return result + '"';
}

Value guessed(const std::string& text, bool wasQuoted, const ClassTable& classes)
{
    if (wasQuoted)
        return Value::string(text);
    for (const CMPIType type : {CMPI_boolean, CMPI_sint64, CMPI_uint64})
    {
        try
        {
            return parseValue(Target(classes, "", type), text);
        }
        catch (const std::invalid_argument&)
        {
            continue;
        }
    }
    return Value::string(text);
}

void readKey(Reader& reader, Path& path, const ClassTable& classes, std::size_t depth)
{
    const std::string name(reader.until("=,"));
    if (name.empty() || !reader.take('='))
        throw std::invalid_argument("a key is written name=value, not '" + name + "'");
    const bool wasQuoted = reader.take('"');
    const std::string text = wasQuoted ? reader.untilQuote() : std::string(reader.until(","));
    const ClassInfo* info = classes.find(path.className);
    if (!info)
    {
        path.keys.push_back({name, guessed(text, wasQuoted, classes)});
        return;
    }
    const FeatureInfo* feature = info->property(name);
    if (!feature || !feature->isKey())
        throw std::invalid_argument(info->name + " has no key '" + name + "'");
    if (path.key(name))
        throw std::invalid_argument("the key '" + name + "' stands twice");
    Target target(classes, path.nameSpace, *feature);
    target.depth = depth + 1;
    Value value = feature->type == CMPI_string ? Value::string(text) : parseValue(target, text);
    path.keys.push_back({feature->name, std::move(value)});
}

std::string keyText(const Value& value)
{
    const CMPIType type = value.type();
    const bool quoted = type == CMPI_string || type == CMPI_dateTime || type == CMPI_ref;
    return quoted && !value.isNull() ? quoteKey(valueText(value)) : valueText(value);
}

} // namespace

std::string pathText(const Path& path)
{
    std::string text = path.className;
    char separator = '.';
    for (const Property& key : path.keys)
    {
        text += separator + key.name + "=" + keyText(key.value);
        separator = ',';
    }
    return text;
}

std::string fullPathText(const Path& path)
{
    const std::string host = path.host.empty() ? "" : "//" + path.host + "/";
    return host + (path.nameSpace.empty() ? "" : path.nameSpace + ":") + pathText(path);
}

Path parsePath(std::string_view text, const ClassTable& classes, std::string_view defaultNameSpace, std::size_t depth)
{
    if (depth > deepestPath)
        throw std::invalid_argument("paths are nested too deeply");
    Path path;
    Reader reader(text);
    if (text.starts_with("//"))
    {
        reader.take('/');
        reader.take('/');
        path.host = reader.until("/");
        reader.take('/');
    }
    const std::size_t mark = reader.find(".:\"=");
    const bool hasNameSpace = mark != std::string_view::npos && reader.at(mark) == ':';
    path.nameSpace = hasNameSpace ? reader.until(":") : defaultNameSpace;
    if (hasNameSpace)
        reader.take(':');
    path.className = reader.until(".");
    if (path.className.empty() || !std::all_of(path.className.begin(), path.className.end(),
                                               [](unsigned char c) { return std::isalnum(c) || c == '_'; }))
        throw std::invalid_argument("'" + path.className + "' is no class name");
    if (const ClassInfo* info = classes.find(path.className))
        path.className = info->name;
    if (reader.take('.'))
        do
        {
            readKey(reader, path, classes, depth);
        } while (reader.take(','));
    if (!reader.atEnd())
        throw std::invalid_argument("a comma stands between keys: '" + std::string(text) + "'");
    return path;
}

std::string missingKey(const Path& path, const ClassTable& classes)
{
    const ClassInfo* info = classes.find(path.className);
    if (!info)
        return {};
    const auto missing =
        std::find_if(info->keys.begin(), info->keys.end(), [&](const std::string& name) { return !path.key(name); });
    return missing == info->keys.end() ? std::string() : *missing;
}

} // namespace broker
