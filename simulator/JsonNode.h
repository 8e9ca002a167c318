// Checked reading of a JSON document. Every mistake is reported with the file, the place and what was expected.
#pragma once

#include "simulator/Wwn.h"

#include <nlohmann/json_fwd.hpp>

#include <concepts>
#include <cstdint>
#include <limits>
#include <span>
#include <stdexcept>
#include <string>
#include <utility>
#include <vector>

namespace tvrsim
{

/// what() is "FILE: PATH: expected WHAT, found VALUE"; a path is a JSON pointer.
class ScenarioError : public std::runtime_error
{
public:
    using std::runtime_error::runtime_error;
};

/// A name that may stand for a number.
struct NamedNumber
{
    const char* name;
    std::uint32_t value;
};

/// A value in the document. The readers of an object leave `out` alone if there is no such member, unless they
/// require it, and note the member as known; finish() refuses the members that nobody asked for.
class JsonNode
{
public:
    JsonNode(const nlohmann::json& value, std::string path, const std::string& file);

    const std::string& path() const { return _path; }

    /// Throws ScenarioError for this place.
    [[noreturn]] void fail(const std::string& expected) const;
    /// The same with a text of its own after the place.
    [[noreturn]] void failWith(const std::string& message) const;

    // The value itself.

    bool isNull() const;
    bool isObject() const;
    std::uint64_t asNumber(std::uint64_t maximum) const; ///< a number, or its text such as "0x1F"
    bool asFlag() const;
    std::string asText(std::size_t maximum) const;
    Wwn asWwn() const;
    std::vector<std::uint8_t> asBytes(std::size_t maximum) const; ///< pairs of hexadecimal digits
    std::uint32_t asNamed(std::span<const NamedNumber> names) const;
    std::vector<JsonNode> asArray() const;

    // Members of an object.

    bool has(const char* key);
    /// The member; it must be there.
    JsonNode at(const char* key);

    template <std::unsigned_integral Number> void read(const char* key, Number& out)
    {
        if (has(key))
            out = static_cast<Number>(at(key).asNumber(std::numeric_limits<Number>::max()));
    }
    void read(const char* key, bool& out);
    void read(const char* key, std::string& out, std::size_t maximum = 255);
    void readWwn(const char* key, Wwn& out);
    void readNamed(const char* key, std::uint32_t& out, std::span<const NamedNumber> names);
    template <class Use> void forEach(const char* key, Use use)
    {
        if (has(key))
            for (JsonNode& item : at(key).asArray())
                use(item);
    }

    /// All members, in the order of their names, for an object whose member names are data.
    std::vector<std::pair<std::string, JsonNode>> members();
    /// The same as numbers and values, for an object whose member names are numbers.
    std::vector<std::pair<std::uint32_t, JsonNode>> numberedMembers();

    void finish() const;

private:
    void requireObject() const;

    const nlohmann::json& _value;
    std::string _path;
    const std::string& _file;
    std::vector<std::string> _known;
};

} // namespace tvrsim
