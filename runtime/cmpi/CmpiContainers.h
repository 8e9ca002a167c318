// The broker's three kinds of named values as containers.
#pragma once

#include "runtime/cmpi/CmpiData.h"
#include "runtime/meta/Container.h"

namespace cimple
{

/// What the three share: the rules of reading and the conversion before a write.
class CMPI_Container : public Container
{
public:
    int get_name(std::size_t index, String& name) override;
    int get_value(std::size_t index, Value::Type type, Value& value) override;
    int set_value(const char* name, const Value& value, std::uint32_t flags) override;

protected:
    CMPI_Container(const CMPIBroker* mb, const Meta_Repository* repository, const char* ns)
        : Container(repository), broker(mb), name_space(ns)
    {}

    /// Data and, where `name` is not null, name of an entry.
    virtual CMPIData entry_at(CMPICount index, CMPIString** name, CMPIStatus* status) = 0;
    /// Data of an entry as a value, whose type may still be another than the one asked for.
    virtual int read(const CMPIData& data, Value::Type type, Value& value);
    /// Brings a value nearer to the type asked for, by the rules of the container. -1 when it must but cannot.
    virtual int relax(Value::Type type, Value& value);
    virtual CMPIStatus add_entry(const char* name, const CMPIData& data) = 0;

    const CMPIBroker* broker;
    const char* name_space; ///< of references that have none of their own; may be null when only reading
};

/// Method arguments. A string given for another scalar type is read as its text.
class CMPIArgs_Container final : public CMPI_Container
{
public:
    CMPIArgs_Container(const CMPIBroker* mb, const Meta_Repository* repository, const char* ns, CMPIArgs* args)
        : CMPI_Container(mb, repository, ns), _args(args)
    {}
    std::size_t get_size() override;
    /// What was set as "return_value", which is no argument; of type CMPI_null when it got none.
    const CMPIData& return_data() const { return _return_data; }

private:
    CMPIData entry_at(CMPICount index, CMPIString** name, CMPIStatus* status) override;
    CMPIStatus add_entry(const char* name, const CMPIData& data) override;
    int relax(Value::Type type, Value& value) override;

    CMPIArgs* _args;
    CMPIData _return_data{};
};

/// Keys of an object path. Brokers send integer keys with 64 bits, whatever the class says, and one sends null for an
/// empty text: a null string key counts as empty, while a key that is not in the path stays null.
class CMPIObjectPath_Container final : public CMPI_Container
{
public:
    CMPIObjectPath_Container(const CMPIBroker* mb, const Meta_Repository* repository, const char* ns,
                             CMPIObjectPath* path)
        : CMPI_Container(mb, repository, ns), _path(path)
    {}
    std::size_t get_size() override;

private:
    CMPIData entry_at(CMPICount index, CMPIString** name, CMPIStatus* status) override;
    CMPIStatus add_entry(const char* name, const CMPIData& data) override;
    int read(const CMPIData& data, Value::Type type, Value& value) override;
    int relax(Value::Type type, Value& value) override;

    CMPIObjectPath* _path;
};

/// Properties of an instance, which must have the very type of the feature.
class CMPIInstance_Container final : public CMPI_Container
{
public:
    CMPIInstance_Container(const CMPIBroker* mb, const Meta_Repository* repository, const char* ns,
                           CMPIInstance* instance)
        : CMPI_Container(mb, repository, ns), _instance(instance)
    {}
    std::size_t get_size() override;

private:
    CMPIData entry_at(CMPICount index, CMPIString** name, CMPIStatus* status) override;
    CMPIStatus add_entry(const char* name, const CMPIData& data) override;

    CMPIInstance* _instance;
};

} // namespace cimple
