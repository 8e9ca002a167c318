#include "tests/unit/cmpi/FakeBroker.h"

#include <strings.h>

namespace cimple::fake
{

namespace
{

struct Text
{
    std::string text;
};
struct Time
{
    std::string text;
};
struct List
{
    CMPIType type;
    std::vector<CMPIData> elements;
};
struct Cursor
{
    std::vector<CMPIData> elements;
    CMPIrc answer = CMPI_RC_OK;
    std::size_t next = 0;
};
struct Context
{
    Broker* broker;
};

template <class Content, class Object> Content& content(const Object* object)
{
    return *static_cast<Content*>(const_cast<void*>(static_cast<const void*>(object->hdl)));
}

Broker& broker_of(const CMPIBroker* mb)
{
    return *static_cast<Broker*>(mb->hdl);
}

void set(CMPIStatus* rc, CMPIrc code)
{
    CMSetStatus(rc, code);
}

CMPIStatus status(CMPIrc code)
{
    return CMPIStatus{code, nullptr};
}

/// Objects belong to the broker: nobody may release one.
template <class Object> CMPIStatus refuse_release(Object*)
{
    std::abort();
}

CMPIString* make_string(Broker& broker, const std::string& text);

// --- strings, datetimes, arrays, enumerations -----------------------------------------------------------------

const char* get_chars(const CMPIString* string, CMPIStatus* rc)
{
    set(rc, CMPI_RC_OK);
    return content<Text>(string).text.c_str();
}
const CMPIStringFT string_table = {
    .ftVersion = 1, .release = refuse_release<CMPIString>, .clone = nullptr, .getCharPtr = get_chars};

/// The text lives in the datetime itself, behind a string that shares its life.
struct Time_Object
{
    Time time;
    CMPIString string;
    Text text;
};

CMPIString* get_string_format(const CMPIDateTime* datetime, CMPIStatus* rc)
{
    set(rc, CMPI_RC_OK);
    Time_Object& object = content<Time_Object>(datetime);
    object.text.text = object.time.text;
    object.string = CMPIString{&object.text, &string_table};
    return &object.string;
}
const CMPIDateTimeFT datetime_table = {.ftVersion = 1,
                                       .release = refuse_release<CMPIDateTime>,
                                       .clone = nullptr,
                                       .getBinaryFormat = nullptr,
                                       .getStringFormat = get_string_format,
                                       .isInterval = nullptr};

CMPICount get_size(const CMPIArray* array, CMPIStatus* rc)
{
    set(rc, CMPI_RC_OK);
    return static_cast<CMPICount>(content<List>(array).elements.size());
}
CMPIType get_simple_type(const CMPIArray* array, CMPIStatus* rc)
{
    set(rc, CMPI_RC_OK);
    return content<List>(array).type;
}
CMPIData get_element(const CMPIArray* array, CMPICount index, CMPIStatus* rc)
{
    const List& list = content<List>(array);
    set(rc, index < list.elements.size() ? CMPI_RC_OK : CMPI_RC_ERR_NO_SUCH_PROPERTY);
    return index < list.elements.size() ? list.elements[index] : CMPIData{};
}
CMPIStatus set_element(CMPIArray* array, CMPICount index, const CMPIValue* value, CMPIType type)
{
    List& list = content<List>(array);
    if (index >= list.elements.size() || type != list.type || !value)
        return status(CMPI_RC_ERR_TYPE_MISMATCH);
    list.elements[index] = data_of(type, *value);
    return status(CMPI_RC_OK);
}
const CMPIArrayFT array_table = {.ftVersion = 1,
                                 .release = refuse_release<CMPIArray>,
                                 .clone = nullptr,
                                 .getSize = get_size,
                                 .getSimpleType = get_simple_type,
                                 .getElementAt = get_element,
                                 .setElementAt = set_element};

CMPIBoolean has_next(const CMPIEnumeration* en, CMPIStatus* rc)
{
    set(rc, CMPI_RC_OK);
    return content<Cursor>(en).next < content<Cursor>(en).elements.size();
}
CMPIData get_next(const CMPIEnumeration* en, CMPIStatus* rc)
{
    Cursor& cursor = content<Cursor>(en);
    set(rc, cursor.answer);
    return cursor.elements.at(cursor.next++);
}
const CMPIEnumerationFT enumeration_table = {.ftVersion = 1,
                                             .release = refuse_release<CMPIEnumeration>,
                                             .clone = nullptr,
                                             .getNext = get_next,
                                             .hasNext = has_next,
                                             .toArray = nullptr};

CMPIString* get_query(const CMPISelectExp* exp, CMPIStatus* rc)
{
    set(rc, CMPI_RC_OK);
    return static_cast<CMPIString*>(exp->hdl);
}
const CMPISelectExpFT filter_table = {.ftVersion = 1,
                                      .release = nullptr,
                                      .clone = nullptr,
                                      .evaluate = nullptr,
                                      .getString = get_query,
                                      .getDOC = nullptr,
                                      .getCOD = nullptr,
                                      .evaluateUsingAccessor = nullptr};

// --- named values ---------------------------------------------------------------------------------------------

/// A Named with the broker that makes strings for its names.
struct Named_Object
{
    Named named;
    Broker* broker;
};

template <class Object> CMPICount count_of(const Object* object, CMPIStatus* rc)
{
    set(rc, CMPI_RC_OK);
    return static_cast<CMPICount>(content<Named_Object>(object).named.entries.size());
}

template <class Object> CMPIData entry_at(const Object* object, CMPICount index, CMPIString** name, CMPIStatus* rc)
{
    const Named_Object& self = content<Named_Object>(object);
    if (index >= self.named.entries.size())
        return set(rc, CMPI_RC_ERR_NO_SUCH_PROPERTY), CMPIData{};
    set(rc, CMPI_RC_OK);
    if (name)
        *name = make_string(*self.broker, self.named.entries[index].name);
    return self.named.entries[index].data;
}

template <class Object> CMPIData entry_of(const Object* object, const char* name, CMPIStatus* rc)
{
    const CMPIData* data = content<Named_Object>(object).named.find(name);
    set(rc, data ? CMPI_RC_OK : CMPI_RC_ERR_NO_SUCH_PROPERTY);
    return data ? *data : CMPIData{};
}

template <class Object> CMPIStatus add_entry(Object* object, const char* name, const CMPIValue* value, CMPIType type)
{
    content<Named_Object>(object).named.entries.push_back({name, value ? data_of(type, *value) : null_of(type)});
    return status(CMPI_RC_OK);
}

const CMPIArgsFT args_table = {.ftVersion = 1,
                               .release = refuse_release<CMPIArgs>,
                               .clone = nullptr,
                               .addArg = add_entry<const CMPIArgs>,
                               .getArg = entry_of<CMPIArgs>,
                               .getArgAt = entry_at<CMPIArgs>,
                               .getArgCount = count_of<CMPIArgs>};

CMPIString* get_name_space(const CMPIObjectPath* path, CMPIStatus* rc)
{
    set(rc, CMPI_RC_OK);
    const Named_Object& self = content<Named_Object>(path);
    return self.named.texts_are_null ? nullptr : make_string(*self.broker, self.named.name_space);
}
CMPIString* get_class_name(const CMPIObjectPath* path, CMPIStatus* rc)
{
    set(rc, CMPI_RC_OK);
    const Named_Object& self = content<Named_Object>(path);
    return self.named.texts_are_null ? nullptr : make_string(*self.broker, self.named.class_name);
}
const CMPIObjectPathFT path_table = []
{
    CMPIObjectPathFT table{};
    table.ftVersion = 1;
    table.release = refuse_release<CMPIObjectPath>;
    table.getNameSpace = get_name_space;
    table.getClassName = get_class_name;
    table.addKey = add_entry<CMPIObjectPath>;
    table.getKey = entry_of<CMPIObjectPath>;
    table.getKeyAt = entry_at<CMPIObjectPath>;
    table.getKeyCount = count_of<CMPIObjectPath>;
    return table;
}();

CMPIObjectPath* get_object_path(const CMPIInstance* instance, CMPIStatus* rc)
{
    set(rc, CMPI_RC_OK);
    return content<Named_Object>(instance).named.path;
}
std::vector<std::string> texts(const char** list)
{
    std::vector<std::string> result;
    for (; list && *list; ++list)
        result.emplace_back(*list);
    return result;
}
CMPIStatus set_property_filter(CMPIInstance* instance, const char** properties, const char** keys)
{
    Named& self = content<Named_Object>(instance).named;
    self.filter = texts(properties);
    self.filter_keys = texts(keys);
    self.kept_keys = keys;
    return status(CMPI_RC_OK);
}
/// Looks at the filter with each property.
CMPIStatus set_property(const CMPIInstance* instance, const char* name, const CMPIValue* value, CMPIType type)
{
    const Named_Object& self = content<Named_Object>(instance);
    if (texts(self.named.kept_keys) != self.named.filter_keys)
        self.broker->fault("the key list of a filter is gone");
    return add_entry(instance, name, value, type);
}
const CMPIInstanceFT instance_table = {.ftVersion = 1,
                                       .release = refuse_release<CMPIInstance>,
                                       .clone = nullptr,
                                       .getProperty = entry_of<CMPIInstance>,
                                       .getPropertyAt = entry_at<CMPIInstance>,
                                       .getPropertyCount = count_of<CMPIInstance>,
                                       .setProperty = set_property,
                                       .getObjectPath = get_object_path,
                                       .setPropertyFilter = set_property_filter,
                                       .setObjectPath = nullptr};

// --- results and context ----------------------------------------------------------------------------------------

CMPIStatus return_data(const CMPIResult* result, const CMPIValue* value, CMPIType type)
{
    auto& results = *static_cast<Results*>(result->hdl);
    results.data.push_back(value ? data_of(type, *value) : null_of(type));
    return status(results.answer);
}
CMPIStatus return_instance(const CMPIResult* result, const CMPIInstance* instance)
{
    auto& results = *static_cast<Results*>(result->hdl);
    results.instances.push_back(const_cast<CMPIInstance*>(instance));
    return status(results.answer);
}
CMPIStatus return_path(const CMPIResult* result, const CMPIObjectPath* path)
{
    auto& results = *static_cast<Results*>(result->hdl);
    results.paths.push_back(const_cast<CMPIObjectPath*>(path));
    return status(results.answer);
}
CMPIStatus return_done(const CMPIResult* result)
{
    ++static_cast<Results*>(result->hdl)->done;
    return status(CMPI_RC_OK);
}
const CMPIResultFT result_table = {.ftVersion = 1,
                                   .release = refuse_release<CMPIResult>,
                                   .clone = nullptr,
                                   .returnData = return_data,
                                   .returnInstance = return_instance,
                                   .returnObjectPath = return_path,
                                   .returnDone = return_done};

CMPIData get_context_entry(const CMPIContext* context, const char* name, CMPIStatus* rc)
{
    const CMPIData principal = content<Context>(context).broker->principal;
    const bool known = std::string_view(name) == "CMPIPrincipal" && principal.type != CMPI_null;
    set(rc, known ? CMPI_RC_OK : CMPI_RC_ERR_NO_SUCH_PROPERTY);
    return known ? principal : CMPIData{};
}
const CMPIContextFT context_table = []
{
    CMPIContextFT table{};
    table.ftVersion = 1;
    table.getEntry = get_context_entry;
    return table;
}();

// --- the broker's tables ------------------------------------------------------------------------------------------

CMPIObjectPath* new_path(const CMPIBroker* mb, const char* name_space, const char* class_name, CMPIStatus* rc)
{
    set(rc, CMPI_RC_OK);
    return broker_of(mb).path(class_name, {}, name_space ? name_space : "");
}
CMPIInstance* new_instance(const CMPIBroker* mb, const CMPIObjectPath* path, CMPIStatus* rc)
{
    set(rc, CMPI_RC_OK);
    return broker_of(mb).instance(const_cast<CMPIObjectPath*>(path), {});
}
CMPIArgs* new_args(const CMPIBroker* mb, CMPIStatus* rc)
{
    set(rc, CMPI_RC_OK);
    return broker_of(mb).args();
}
CMPIString* new_string(const CMPIBroker* mb, const char* text, CMPIStatus* rc)
{
    set(rc, CMPI_RC_OK);
    return broker_of(mb).string(text);
}
CMPIArray* new_array(const CMPIBroker* mb, CMPICount size, CMPIType type, CMPIStatus* rc)
{
    set(rc, CMPI_RC_OK);
    return broker_of(mb).array(type, std::vector<CMPIData>(size, null_of(type)));
}
CMPIDateTime* new_datetime(const CMPIBroker* mb, const char* text, CMPIStatus* rc)
{
    set(rc, CMPI_RC_OK);
    return broker_of(mb).datetime(text);
}
const CMPIBrokerEncFT factory_table = []
{
    CMPIBrokerEncFT table{};
    table.ftVersion = 1;
    table.newInstance = new_instance;
    table.newObjectPath = new_path;
    table.newArgs = new_args;
    table.newString = new_string;
    table.newArray = new_array;
    table.newDateTimeFromChars = new_datetime;
    return table;
}();

CMPIContext* prepare_attach(const CMPIBroker* mb, const CMPIContext*)
{
    broker_of(mb).note("prepare");
    return broker_of(mb).prepares ? broker_of(mb).make_context() : nullptr;
}
CMPIStatus attach(const CMPIBroker* mb, const CMPIContext* context)
{
    Broker& broker = broker_of(mb);
    if (context == broker.context())
        broker.fault("attached with the context of a request");
    broker.note("attach");
    return status(broker.attach_answer);
}
CMPIStatus detach(const CMPIBroker* mb, const CMPIContext*)
{
    broker_of(mb).note("detach");
    return status(CMPI_RC_OK);
}
CMPIStatus deliver(const CMPIBroker* mb, const CMPIContext*, const char*, const CMPIInstance*)
{
    ++broker_of(mb).delivered;
    return status(CMPI_RC_OK);
}

bool same_keys(const Named& a, const Named& b)
{
    if (strcasecmp(a.class_name.c_str(), b.class_name.c_str()) != 0 || a.name_space != b.name_space)
        return false;
    const CMPIData* x = a.find("Name");
    const CMPIData* y = b.find("Name");
    return x && y && text(x->value.string) == text(y->value.string);
}

CMPIInstance* get_instance(const CMPIBroker* mb, const CMPIContext*, const CMPIObjectPath* path, const char**,
                           CMPIStatus* rc)
{
    Broker& broker = broker_of(mb);
    broker.note("getInstance");
    set(rc, broker.upcall_answer);
    if (broker.upcall_answer != CMPI_RC_OK)
        return nullptr;
    for (CMPIInstance* candidate : broker.stored)
    {
        if (same_keys(named(named(candidate).path), named(path)))
            return candidate;
    }
    set(rc, CMPI_RC_ERR_NOT_FOUND);
    return nullptr;
}
CMPIEnumeration* enumerate_instances(const CMPIBroker* mb, const CMPIContext*, const CMPIObjectPath*, const char**,
                                     CMPIStatus* rc)
{
    Broker& broker = broker_of(mb);
    set(rc, broker.upcall_answer);
    if (broker.upcall_answer != CMPI_RC_OK)
        return nullptr;
    Cursor cursor;
    cursor.answer = broker.fetched_answer;
    for (CMPIInstance* instance : broker.stored)
        cursor.elements.push_back({CMPI_instance, broker.fetched_state, CMPIValue{.inst = instance}});
    return broker.make<CMPIEnumeration>(cursor, &enumeration_table);
}
CMPIObjectPath* create_instance(const CMPIBroker* mb, const CMPIContext*, const CMPIObjectPath* path,
                                const CMPIInstance* instance, CMPIStatus* rc)
{
    Broker& broker = broker_of(mb);
    set(rc, broker.upcall_answer);
    if (broker.upcall_answer == CMPI_RC_OK)
        broker.stored.push_back(const_cast<CMPIInstance*>(instance));
    return const_cast<CMPIObjectPath*>(path);
}
CMPIStatus modify_instance(const CMPIBroker* mb, const CMPIContext*, const CMPIObjectPath*, const CMPIInstance*,
                           const char**)
{
    broker_of(mb).note("modifyInstance");
    return status(broker_of(mb).upcall_answer);
}
CMPIStatus delete_instance(const CMPIBroker* mb, const CMPIContext*, const CMPIObjectPath*)
{
    broker_of(mb).note("deleteInstance");
    return status(broker_of(mb).upcall_answer);
}
/// Returns the number of `in` arguments as the return value.
CMPIData invoke_method(const CMPIBroker* mb, const CMPIContext*, const CMPIObjectPath*, const char* method,
                       const CMPIArgs* in, CMPIArgs*, CMPIStatus* rc)
{
    broker_of(mb).note(method);
    set(rc, broker_of(mb).upcall_answer);
    return data_of(CMPI_uint32, CMPIValue{.uint32 = static_cast<CMPIUint32>(named(in).entries.size())});
}
const CMPIBrokerFT upcall_table = []
{
    CMPIBrokerFT table{};
    table.brokerName = "fake";
    table.prepareAttachThread = prepare_attach;
    table.attachThread = attach;
    table.detachThread = detach;
    table.deliverIndication = deliver;
    table.getInstance = get_instance;
    table.createInstance = create_instance;
    table.modifyInstance = modify_instance;
    table.deleteInstance = delete_instance;
    table.enumerateInstances = enumerate_instances;
    table.invokeMethod = invoke_method;
    return table;
}();

void* mark(const CMPIBroker* mb, CMPIStatus*)
{
    broker_of(mb).note("mark");
    return broker_of(mb).marks ? mb->hdl : nullptr;
}
CMPIStatus release_mark(const CMPIBroker* mb, const void* mark)
{
    if (mark != mb->hdl)
        broker_of(mb).fault("released another mark");
    broker_of(mb).note("release");
    return status(CMPI_RC_OK);
}
const Broker_Memory_FT memory_table = {.ftVersion = 200, .mark = mark, .release = release_mark};

CMPIString* make_string(Broker& broker, const std::string& text)
{
    return broker.make<CMPIString>(Text{text}, &string_table);
}

} // namespace

// --- the broker ---------------------------------------------------------------------------------------------------

const CMPIData* Named::find(std::string_view name) const
{
    for (const Entry& entry : entries)
    {
        if (entry.name == name)
            return &entry.data;
    }
    return nullptr;
}

template <class Object, class Content, class Table> Object* Broker::make(Content content, const Table* table)
{
    struct Whole
    {
        Content content;
        Object object;
    };
    auto whole = std::make_shared<Whole>(Whole{std::move(content), {}});
    whole->object.hdl = &whole->content;
    whole->object.ft = table;
    const std::lock_guard guard(_mutex);
    _objects.push_back(whole);
    return &whole->object;
}

Broker::Broker(int version)
{
    _services.ftVersion = version;
    _broker.broker.hdl = this;
    _broker.broker.bft = &upcall_table;
    _broker.broker.eft = &factory_table;
    _broker.broker.xft = &_services;
    _broker.mft = &memory_table; // behind the end of a broker of version 100: must not be seen there
    _context = make_context();
}

CMPIContext* Broker::make_context()
{
    return make<CMPIContext>(Context{this}, &context_table);
}

CMPIResult* Broker::result(Results& results)
{
    CMPIResult* result = make<CMPIResult>(0, &result_table);
    result->hdl = &results;
    return result;
}

CMPIString* Broker::string(const char* text)
{
    return make_string(*this, text);
}

CMPIDateTime* Broker::datetime(const char* text)
{
    return make<CMPIDateTime>(Time_Object{{text}, {}, {}}, &datetime_table);
}

CMPIArray* Broker::array(CMPIType element_type, const std::vector<CMPIData>& elements)
{
    return make<CMPIArray>(List{element_type, elements}, &array_table);
}

CMPIObjectPath* Broker::path(const char* class_name, const std::vector<Entry>& keys, const char* name_space)
{
    Named named;
    named.name_space = name_space;
    named.class_name = class_name;
    named.entries = keys;
    return make<CMPIObjectPath>(Named_Object{named, this}, &path_table);
}

CMPIInstance* Broker::instance(CMPIObjectPath* path, const std::vector<Entry>& properties)
{
    Named named;
    named.path = path;
    named.entries = properties;
    return make<CMPIInstance>(Named_Object{named, this}, &instance_table);
}

CMPIArgs* Broker::args(const std::vector<Entry>& entries)
{
    Named named;
    named.entries = entries;
    return make<CMPIArgs>(Named_Object{named, this}, &args_table);
}

CMPISelectExp* Broker::filter(const char* query)
{
    CMPISelectExp* exp = make<CMPISelectExp>(0, &filter_table);
    exp->hdl = string(query);
    return exp;
}

void Broker::note(const std::string& event)
{
    const std::lock_guard guard(_mutex);
    events.push_back(event);
}

void Broker::fault(const std::string& text)
{
    const std::lock_guard guard(_mutex);
    faults.push_back(text);
}

CMPIData data_of(CMPIType type, CMPIValue value)
{
    return CMPIData{type, CMPI_goodValue, value};
}

CMPIData null_of(CMPIType type)
{
    return CMPIData{type, CMPI_nullValue, {}};
}

Named& named(CMPIObjectPath* path)
{
    return content<Named_Object>(path).named;
}

const Named& named(const CMPIObjectPath* path)
{
    return content<Named_Object>(path).named;
}

const Named& named(const CMPIInstance* instance)
{
    return content<Named_Object>(instance).named;
}

const Named& named(const CMPIArgs* args)
{
    return content<Named_Object>(args).named;
}

std::string text(const CMPIString* string)
{
    return content<Text>(string).text;
}

} // namespace cimple::fake
