// Parsing of model paths: Class.key=value,key=value
#include "runtime/meta/Instance.h"
#include "runtime/meta/InstanceSlots.h"
#include "runtime/values/TextConversion.h"

#include <cerrno>
#include <cstdlib>
#include <string>
#include <utility>

namespace cimple
{
namespace
{

bool is_letter(char c)
{
    return (c >= 'a' && c <= 'z') || (c >= 'A' && c <= 'Z') || c == '_';
}

/// Reads a path from left to right. Every take_...() moves on and returns true, or fails.
class Path_Reader
{
public:
    explicit Path_Reader(const char* text) : _p(text) {}

    bool at_end() const { return *_p == '\0'; }
    bool at_end_of_value() const { return at_end() || *_p == ','; }

    bool take(char c)
    {
        if (*_p != c)
            return false;
        ++_p;
        return true;
    }

    bool take_identifier(std::string& name)
    {
        const char* first = _p;
        if (!is_letter(*_p))
            return false;
        while (is_letter(*_p) || (*_p >= '0' && *_p <= '9'))
            ++_p;
        name.assign(first, _p);
        return true;
    }

    /// Up to the next comma or the end.
    void take_word(std::string& word)
    {
        const char* first = _p;
        while (!at_end_of_value())
            ++_p;
        word.assign(first, _p);
    }

    /// A double-quoted token; a backslash stands before a quote or backslash that is part of it.
    bool take_quoted(std::string& text)
    {
        text.clear();
        if (!take('"'))
            return false;
        while (!take('"'))
        {
            if (*_p == '\\' && (_p[1] == '"' || _p[1] == '\\'))
                ++_p;
            if (at_end())
                return false;
            text += *_p++;
        }
        return true;
    }

private:
    const char* _p;
};

struct Wide_Integer
{
    bool negative;
    std::uint64_t bits; ///< two's complement when negative
};

/// Reads a whole word in base 10, or else in base 16.
bool parse_integer(const std::string& word, Wide_Integer& out)
{
    for (const int base : {10, 16})
    {
        char* end = nullptr;
        errno = 0;
        const long long value = std::strtoll(word.c_str(), &end, base);
        if (end == word.c_str() || *end != '\0')
            continue;
        out = {value < 0, static_cast<std::uint64_t>(value)};
        if (errno != ERANGE)
            return true;
        errno = 0; // the upper half of uint64
        out.bits = std::strtoull(word.c_str(), nullptr, base);
        return !out.negative && errno == 0;
    }
    return false;
}

/// Reals, datetimes and char16 are no keys of a path.
bool store_integer(Instance* instance, const Meta_Property* mp, const Wide_Integer& value)
{
    const auto store = [&]<class T>(std::type_identity<T>)
    {
        if constexpr (!std::is_integral_v<T> || std::is_same_v<T, bool>)
            return false;
        else
        {
            const bool fits =
                value.negative ? std::in_range<T>(static_cast<std::int64_t>(value.bits)) : std::in_range<T>(value.bits);
            if (fits)
                slot<T>(instance, mp->offset) = static_cast<T>(value.bits);
            return fits;
        }
    };
    return mp->type != CHAR16 && with_type(mp->type, false, store);
}

bool read_property(Path_Reader& reader, Instance* instance, const Meta_Property* mp)
{
    std::string word;
    Wide_Integer integer;
    switch (mp->type)
    {
    case BOOLEAN:
        reader.take_word(word);
        return text_to_value(word.c_str(), slot<bool>(instance, mp->offset)) == 0;
    case STRING:
        if (!reader.take_quoted(word))
            return false;
        slot<String>(instance, mp->offset) = String(word);
        return true;
    default:
        reader.take_word(word);
        return parse_integer(word, integer) && store_integer(instance, mp, integer);
    }
}

bool read_reference(Path_Reader& reader, Instance* instance, const Meta_Reference* mr)
{
    std::string path;
    if (!reader.take_quoted(path))
        return false;
    Instance* referent = model_path(mr->meta_class, path.c_str());
    if (!referent)
        return false;
    unref(std::exchange(reference_slot(instance, mr), referent));
    return is_subclass(mr->meta_class, referent->__meta_class);
}

bool read_value(Path_Reader& reader, Instance* instance, const Meta_Feature* mf)
{
    if (const Meta_Reference* mr = as_single_reference(mf))
        return read_reference(reader, instance, mr);
    if (slot_kind(mf) != Slot_Kind::scalar)
        return false;
    const auto* mp = static_cast<const Meta_Property*>(mf);
    null_byte(instance, mp) = 0;
    return read_property(reader, instance, mp);
}

/// Reads key=value pairs up to the end of the text; each key of the class must stand there once.
bool read_pairs(Path_Reader& reader, Instance* instance)
{
    std::size_t count = 0;
    for (std::string name; !reader.at_end(); ++count)
    {
        if (!reader.take_identifier(name))
            return false;
        const Meta_Feature* mf = find_feature(instance->__meta_class, name.c_str(), any_feature);
        if (!mf || !(mf->flags & META_KEY) || !reader.take('=') || !read_value(reader, instance, mf) ||
            !reader.at_end_of_value())
            return false;
        reader.take(',');
    }
    return count == instance->__meta_class->num_keys && keys_non_null(instance);
}

} // namespace

Instance* model_path(const Meta_Class* mc, const char* text)
{
    Path_Reader reader(text);
    std::string name;
    if (!reader.take_identifier(name) || !reader.take('.'))
        return nullptr;
    const Meta_Class* found = find_class_in_chain(mc, name.c_str());
    if (!found)
        return nullptr;
    Ref<> instance(create(found, false));
    nullify(instance.get(), true, true, 1); // a key that is not read stays null
    return read_pairs(reader, instance.get()) ? instance.release() : nullptr;
}

} // namespace cimple
