#include "tests/unit/broker/FakeModule.h"

#include <array>
#include <stdexcept>

namespace broker_test
{

using namespace cimple;

namespace
{

// --- meta tables ---------------------------------------------------------------------------------------

constexpr std::uint32_t key = META_PROPERTY | META_KEY | META_READ;
constexpr std::uint32_t plain = META_PROPERTY | META_READ;

constexpr Meta_Property property(const char* name, Type type, std::uint32_t flags, std::int16_t subscript = 0,
                                 const void* value = nullptr)
{
    return {{0, flags, name, nullptr, 0}, type, subscript, 0, value};
}

constexpr Meta_Reference reference(const char* name, const Meta_Class* target, std::uint32_t flags)
{
    return {{0, META_REFERENCE | flags, name, nullptr, 0}, 0, target, 0};
}

extern const Meta_Class baseClass;
extern const Meta_Class portClass;
extern const Meta_Repository repository;

const std::uint16_t three = 3;
const char* const host = "host";

const Meta_Property id = property("Id", STRING, key);
const Meta_Property level = property("Level", UINT16, plain | META_WRITE, 0, &three);
const Meta_Property names = property("Names", STRING, plain, -1);
const Meta_Property seen = property("Seen", DATETIME, plain);
const Meta_Reference next = reference("Next", &portClass, 0);
const Meta_Property a = property("A", UINT32, META_PROPERTY | META_IN);
const Meta_Property sum = property("Sum", UINT32, META_PROPERTY | META_OUT);
const Meta_Property notes = property("Notes", STRING, META_PROPERTY | META_OUT, -1);
const Meta_Property returned = property("return_value", UINT32, META_PROPERTY | META_OUT);
const Meta_Feature* const addFeatures[] = {&a, &sum, &notes, &returned};
const Meta_Method add = {{{0, META_METHOD, "Add", nullptr, 0}, addFeatures, 4, 64}, UINT32};
const Meta_Property size = property("Size", UINT64, plain);
const Meta_Reference inner = reference("Inner", &baseClass, META_EMBEDDED_INSTANCE);
const Meta_Property number = property("Number", UINT16, key);
const Meta_Property up = property("Up", BOOLEAN, key);
const Meta_Property portName = property("Name", STRING, key);
const Meta_Property ratio = property("Ratio", REAL64, plain);
const Meta_Reference left = reference("Left", &baseClass, META_KEY);
const Meta_Reference right = reference("Right", &portClass, META_KEY);
const Meta_Property creationClass = property("CreationClassName", STRING, key);
const Meta_Property systemName = property("Name", STRING, key);
const Meta_Property elementName = property("ElementName", STRING, plain, 0, &host);

const Meta_Feature* const baseFeatures[] = {&id, &level, &names, &seen, &next, &add};
const Meta_Feature* const diskFeatures[] = {&id, &level, &names, &seen, &next, &add, &size, &inner};
const Meta_Feature* const portFeatures[] = {&number, &up, &portName, &ratio};
const Meta_Feature* const linkFeatures[] = {&left, &right};
const Meta_Feature* const systemFeatures[] = {&creationClass, &systemName, &elementName};
const std::uint8_t own[] = {1, 1, 1, 1, 1, 1};
const std::uint8_t diskLocals[] = {0, 0, 0, 0, 0, 0, 1, 1};

template <std::size_t N>
constexpr Meta_Class classOf(const char* name, const Meta_Feature* const (&features)[N], const std::uint8_t* locals,
                             const Meta_Class* super = nullptr, std::uint32_t flags = META_CLASS)
{
    return {{{0, flags, name, nullptr, 0}, features, N, 64}, locals, super, 1, &repository};
}

const Meta_Class baseClass = classOf("TST_Base", baseFeatures, own);
const Meta_Class diskClass = classOf("TST_Disk", diskFeatures, diskLocals, &baseClass);
const Meta_Class portClass = classOf("TST_Port", portFeatures, own);
const Meta_Class linkClass = classOf("TST_Link", linkFeatures, own, nullptr, META_ASSOCIATION);
const Meta_Class systemClass = classOf("IBMSD_ComputerSystem", systemFeatures, own);
const Meta_Class* const allClasses[] = {&baseClass, &diskClass, &portClass, &linkClass, &systemClass};
const Meta_Repository repository{allClasses, 5};

const Registration base{"fake", "TST_Base_Provider", nullptr, &baseClass, nullptr};
const Registration disk{"fake", "TST_Disk_Provider", nullptr, &diskClass, &base};
const Registration port{"fake", "TST_Port_Provider", nullptr, &portClass, &disk};
const Registration linkRecord{"fake", "TST_Link_Provider", nullptr, &linkClass, &port};

// --- providers -----------------------------------------------------------------------------------------

struct Factory
{
    const char* className;
    const char* kind;
};
constexpr std::array<Factory, 7> factories{{{"TST_Base", "Instance"},
                                            {"TST_Base", "Method"},
                                            {"TST_Disk", "Instance"},
                                            {"TST_Disk", "Method"},
                                            {"TST_Port", "Instance"},
                                            {"TST_Link", "Instance"},
                                            {"TST_Link", "Association"}}};

FakeModule* active = nullptr;

std::string orNull(const char* text)
{
    return text ? text : "(null)";
}

} // namespace

struct FakeModule::Slot
{
    FakeModule* module;
    std::string className;
    const CMPIBroker* mb;
    CMPIInstanceMI instance;
    CMPIMethodMI method;
    CMPIAssociationMI association;
};

namespace
{

template <class MI>
Call callOf(const char* operation, MI* mi, const CMPIContext* ctx, const CMPIResult* result, const CMPIObjectPath* path)
{
    const auto* slot = static_cast<const FakeModule::Slot*>(mi->hdl);
    return {slot->mb, ctx, result, path, slot->className, operation};
}

template <class MI> CMPIStatus answer(MI* mi, const Call& call)
{
    return static_cast<FakeModule::Slot*>(mi->hdl)->module->answer(call);
}

template <class MI> CMPIStatus cleanup(MI* mi, const CMPIContext* ctx, CMPIBoolean terminating)
{
    Call call = callOf("cleanup", mi, ctx, nullptr, nullptr);
    call.terminating = terminating;
    return answer(mi, call);
}

const CMPIInstanceMIFT instanceTable{
    .ftVersion = 100,
    .miVersion = 100,
    .miName = "fake",
    .cleanup = cleanup<CMPIInstanceMI>,
    .enumerateInstanceNames =
        [](CMPIInstanceMI* mi, const CMPIContext* ctx, const CMPIResult* result, const CMPIObjectPath* path)
    { return answer(mi, callOf("enumerateInstanceNames", mi, ctx, result, path)); },
    .enumerateInstances =
        [](CMPIInstanceMI* mi, const CMPIContext* ctx, const CMPIResult* result, const CMPIObjectPath* path,
           const char** properties)
    {
        Call call = callOf("enumerateInstances", mi, ctx, result, path);
        call.properties = properties;
        return answer(mi, call);
    },
    .getInstance =
        [](CMPIInstanceMI* mi, const CMPIContext* ctx, const CMPIResult* result, const CMPIObjectPath* path,
           const char** properties)
    {
        Call call = callOf("getInstance", mi, ctx, result, path);
        call.properties = properties;
        return answer(mi, call);
    },
    .createInstance =
        [](CMPIInstanceMI* mi, const CMPIContext* ctx, const CMPIResult* result, const CMPIObjectPath* path,
           const CMPIInstance* instance)
    {
        Call call = callOf("createInstance", mi, ctx, result, path);
        call.instance = instance;
        return answer(mi, call);
    },
    .modifyInstance =
        [](CMPIInstanceMI* mi, const CMPIContext* ctx, const CMPIResult* result, const CMPIObjectPath* path,
           const CMPIInstance* instance, const char** properties)
    {
        Call call = callOf("modifyInstance", mi, ctx, result, path);
        call.instance = instance;
        call.properties = properties;
        return answer(mi, call);
    },
    .deleteInstance =
        [](CMPIInstanceMI* mi, const CMPIContext* ctx, const CMPIResult* result, const CMPIObjectPath* path)
    { return answer(mi, callOf("deleteInstance", mi, ctx, result, path)); },
    .execQuery =
        [](CMPIInstanceMI*, const CMPIContext*, const CMPIResult*, const CMPIObjectPath*, const char*, const char*) {
            return CMPIStatus{CMPI_RC_ERR_NOT_SUPPORTED, nullptr};
        },
};

Call associationCall(const char* operation, CMPIAssociationMI* mi, const CMPIContext* ctx, const CMPIResult* result,
                     const CMPIObjectPath* path, const char* assocClass, const char* role)
{
    Call call = callOf(operation, mi, ctx, result, path);
    call.assocClass = orNull(assocClass);
    call.role = orNull(role);
    return call;
}

const CMPIAssociationMIFT associationTable{
    .ftVersion = 100,
    .miVersion = 100,
    .miName = "fake",
    .cleanup = cleanup<CMPIAssociationMI>,
    .associators = [](CMPIAssociationMI* mi, const CMPIContext* ctx, const CMPIResult* result,
                      const CMPIObjectPath* path, const char* assocClass, const char*, const char* role, const char*,
                      const char**)
    { return answer(mi, associationCall("associators", mi, ctx, result, path, assocClass, role)); },
    .associatorNames = [](CMPIAssociationMI* mi, const CMPIContext* ctx, const CMPIResult* result,
                          const CMPIObjectPath* path, const char* assocClass, const char*, const char* role,
                          const char*)
    { return answer(mi, associationCall("associatorNames", mi, ctx, result, path, assocClass, role)); },
    .references = [](CMPIAssociationMI* mi, const CMPIContext* ctx, const CMPIResult* result,
                     const CMPIObjectPath* path, const char* resultClass, const char* role, const char**)
    { return answer(mi, associationCall("references", mi, ctx, result, path, resultClass, role)); },
    .referenceNames = [](CMPIAssociationMI* mi, const CMPIContext* ctx, const CMPIResult* result,
                         const CMPIObjectPath* path, const char* resultClass, const char* role)
    { return answer(mi, associationCall("referenceNames", mi, ctx, result, path, resultClass, role)); },
};

const CMPIMethodMIFT methodTable{
    .ftVersion = 100,
    .miVersion = 100,
    .miName = "fake",
    .cleanup = cleanup<CMPIMethodMI>,
    .invokeMethod =
        [](CMPIMethodMI* mi, const CMPIContext* ctx, const CMPIResult* result, const CMPIObjectPath* path,
           const char* method, const CMPIArgs* in, CMPIArgs* out)
    {
        Call call = callOf("invokeMethod", mi, ctx, result, path);
        call.method = method;
        call.in = in;
        call.out = out;
        return answer(mi, call);
    },
};

} // namespace

void* makeProvider(std::size_t index, const CMPIBroker* mb)
{
    const Factory& factory = factories.at(index);
    const std::string kind = factory.kind;
    active->made.push_back(std::string(factory.className) + " " + kind);
    auto slot = std::make_unique<FakeModule::Slot>();
    FakeModule::Slot* raw = slot.get();
    *raw = {active, factory.className, mb, {raw, &instanceTable}, {raw, &methodTable}, {raw, &associationTable}};
    active->_slots.push_back(std::move(slot));
    return kind == "Instance" ? static_cast<void*>(&raw->instance)
           : kind == "Method" ? static_cast<void*>(&raw->method)
                              : static_cast<void*>(&raw->association);
}

namespace
{

using FactoryFunction = void* (*)(const CMPIBroker*, const CMPIContext*, CMPIStatus*);

template <std::size_t... Index> constexpr auto factoryFunctions(std::index_sequence<Index...>)
{
    return std::array<FactoryFunction, sizeof...(Index)>{[](const CMPIBroker* mb, const CMPIContext*, CMPIStatus*)
                                                         { return makeProvider(Index, mb); }...};
}

} // namespace

FakeModule::FakeModule()
{
    active = this;
}

FakeModule::~FakeModule()
{
    active = nullptr;
}

void* FakeModule::symbol(const std::string& name) const
{
    static constexpr auto functions = factoryFunctions(std::make_index_sequence<factories.size()>());
    for (std::size_t i = 0; i < factories.size(); ++i)
    {
        if (name == std::string(factories[i].className) + "_Create_" + factories[i].kind + "MI")
        {
            return reinterpret_cast<void*>(functions[i]);
        }
    }
    return nullptr;
}

const Registration* FakeModule::registrations() const
{
    return &linkRecord;
}

CMPIStatus FakeModule::answer(const Call& call)
{
    const auto handler = handlers.find(call.operation);
    if (handler != handlers.end())
    {
        return handler->second(call);
    }
    return {call.operation == "cleanup" ? CMPI_RC_OK : CMPI_RC_ERR_NOT_SUPPORTED, nullptr};
}

Fixture::Fixture(broker::Options options) : module(std::make_shared<FakeModule>())
{
    options.image = module;
    broker = std::make_unique<broker::Broker>(std::move(options));
}

std::string Fixture::violations() const
{
    std::string texts;
    for (const broker::Violation& violation : broker->violations())
    {
        texts += violation.text + "\n";
    }
    return texts;
}

broker::Path basePath(const std::string& idText, const std::string& className)
{
    return {ns, className, {{"Id", broker::Value::string(idText)}}};
}

const broker::ClassTable& testClasses()
{
    static const broker::ClassTable table(&repository);
    return table;
}

CMPIObjectPath* newBasePath(const Call& call, const char* idText)
{
    CMPIObjectPath* path = CMNewObjectPath(call.mb, ns, call.className.c_str(), nullptr);
    CMPIValue value{};
    value.string = CMNewString(call.mb, idText, nullptr);
    CMAddKey(path, "Id", &value, CMPI_string);
    return path;
}

CMPIInstance* newBase(const Call& call, const char* idText)
{
    return CMNewInstance(call.mb, newBasePath(call, idText), nullptr);
}

void setString(CMPIInstance* instance, const CMPIBroker* mb, const char* name, const char* text)
{
    CMPIValue value{};
    value.string = CMNewString(mb, text, nullptr);
    CMSetProperty(instance, name, &value, CMPI_string);
}

} // namespace broker_test
