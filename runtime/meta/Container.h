// Arguments, object path keys and instance properties of the broker, made to look alike for the one walker that
// converts them.
#pragma once

#include "runtime/meta/Value.h"

namespace cimple
{

/// Lives on the stack for one conversion. A feature that fails is logged and skipped; the others are converted.
class Container
{
public:
    explicit Container(const Meta_Repository* repository) : meta_repository(repository) {}
    Container(const Container&) = delete;
    Container& operator=(const Container&) = delete;
    virtual ~Container() = default;

    // These return 0, or -1.
    virtual std::size_t get_size() = 0;
    virtual int get_name(std::size_t index, String& name) = 0;
    /// The value has the type asked for, or is refused.
    virtual int get_value(std::size_t index, Value::Type type, Value& value) = 0;
    virtual int set_value(const char* name, const Value& value, std::uint32_t flags) = 0;

    /// Passes each non-null feature that shares a bit with `mask` (0: every feature) to set_value(). Null
    /// features are absent from the result. Returns -1 for a null instance, otherwise 0.
    int convert(const Instance* instance, std::uint32_t mask);

    /// Sets each entry that is a feature of the class and shares a bit with `mask` in `instance`, which is made if
    /// it is null; what has no entry is null. `mc` is a class or a method.
    int convert(const Meta_Record* mc, std::uint32_t mask, Instance*& instance);

protected:
    const Meta_Repository* meta_repository;

private:
    void set_entry(std::size_t index, const Meta_Record* mc, std::uint32_t mask, Instance* instance);
};

} // namespace cimple
