// A broker of a few hundred lines: objects that live as long as it does, and up-calls that tests watch.
//
// It is strict where a real one may crash: a release of an object that was not cloned, an array element of another
// type, and an up-call with another context than the attached one count as faults.
#pragma once

#include "runtime/cmpi/Cmpi.h"

#include <deque>
#include <map>
#include <memory>
#include <mutex>
#include <string>
#include <string_view>
#include <vector>

namespace cimple::fake
{

struct Entry
{
    std::string name;
    CMPIData data;
};

/// Arguments, object path and instance: a list of named values, found by their exact name.
struct Named
{
    std::string name_space;
    std::string class_name;
    std::vector<Entry> entries;
    bool texts_are_null = false;          // of an object path: namespace and class name
    CMPIObjectPath* path = nullptr;       // of an instance
    std::vector<std::string> filter;      // of an instance
    std::vector<std::string> filter_keys; // likewise
    const char** kept_keys = nullptr;     // likewise: the list itself, as one broker keeps it

    const CMPIData* find(std::string_view name) const;
};

/// What an operation returned.
struct Results
{
    std::vector<CMPIObjectPath*> paths;
    std::vector<CMPIInstance*> instances;
    std::vector<CMPIData> data; // a null pointer as value is null data
    int done = 0;
    CMPIrc answer = CMPI_RC_OK; // to each result
};

class Broker
{
public:
    /// Claims the version in the services table, and has memory functions from 200 on.
    explicit Broker(int version = 100);

    const CMPIBroker* handle() const { return &_broker.broker; }
    const CMPIContext* context() const { return _context; }
    CMPIResult* result(Results& results);

    CMPIString* string(const char* text);
    CMPIDateTime* datetime(const char* text);
    CMPIArray* array(CMPIType element_type, const std::vector<CMPIData>& elements);
    CMPIObjectPath* path(const char* class_name, const std::vector<Entry>& keys = {},
                         const char* name_space = "root/a");
    CMPIInstance* instance(CMPIObjectPath* path, const std::vector<Entry>& properties);
    CMPIArgs* args(const std::vector<Entry>& entries = {});
    CMPISelectExp* filter(const char* query);

    // What up-calls find and leave.
    std::vector<CMPIInstance*> stored;
    CMPIrc upcall_answer = CMPI_RC_OK;
    CMPIValueState fetched_state = CMPI_goodValue; // of an enumeration's data
    CMPIrc fetched_answer = CMPI_RC_OK;            // likewise
    CMPIData principal{};
    bool prepares = true; // for a thread to attach
    CMPIrc attach_answer = CMPI_RC_OK;
    bool marks = true; // or gives null for a mark
    int delivered = 0;
    std::vector<std::string> events; // prepare, attach, mark, release, detach, and up-calls by name
    std::vector<std::string> faults;

    void note(const std::string& event);
    void fault(const std::string& text);
    CMPIContext* make_context();
    template <class Object, class Content, class Table> Object* make(Content content, const Table* table);

private:
    Broker_With_Memory _broker{};
    CMPIBrokerExtFT _services{};
    CMPIContext* _context;
    std::mutex _mutex;
    std::deque<std::shared_ptr<void>> _objects;
};

// Values of entries.
CMPIData data_of(CMPIType type, CMPIValue value);
CMPIData null_of(CMPIType type);
inline CMPIData uint64_of(CMPIUint64 number)
{
    return data_of(CMPI_uint64, CMPIValue{.uint64 = number});
}
inline CMPIData sint64_of(CMPISint64 number)
{
    return data_of(CMPI_sint64, CMPIValue{.sint64 = number});
}
inline CMPIData string_of(CMPIString* string)
{
    return data_of(CMPI_string, CMPIValue{.string = string});
}

/// Content of an object of the fake.
Named& named(CMPIObjectPath* path);
const Named& named(const CMPIObjectPath* path);
const Named& named(const CMPIInstance* instance);
const Named& named(const CMPIArgs* args);
std::string text(const CMPIString* string);

} // namespace cimple::fake
