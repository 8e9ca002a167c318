// A small provider module inside the test: a few classes, and providers that do what a test scripts.
#pragma once

#include "broker/core/Broker.h"

#include <functional>
#include <map>
#include <memory>
#include <string>
#include <vector>

namespace broker_test
{

/// One call of the broker into a provider.
struct Call
{
    const CMPIBroker* mb;
    const CMPIContext* ctx;
    const CMPIResult* result;
    const CMPIObjectPath* path;
    std::string className; ///< the provider's own class
    std::string operation; ///< "enumerateInstances", ..., "cleanup"
    const char** properties = nullptr;
    const CMPIInstance* instance = nullptr;
    std::string assocClass = "(null)"; ///< "(null)" for a null pointer
    std::string role = "(null)";
    std::string method = {};
    const CMPIArgs* in = nullptr;
    CMPIArgs* out = nullptr;
    bool terminating = false;
};

/// Classes of the module, with their providers' kinds in brackets:
///   TST_Base [i, m]   string Id (key), uint16 Level = 3, string Names[], datetime Seen, TST_Port REF Next,
///                     uint32 Add(in uint32 A, out uint32 Sum, out string Notes[])
///   TST_Disk [i, m]   : TST_Base, with uint64 Size and an embedded TST_Base Inner
///   TST_Port [i]      uint16 Number (key), boolean Up (key), string Name (key), real64 Ratio
///   TST_Link [i, a]   association of TST_Base Left (key) and TST_Port Right (key)
///   IBMSD_ComputerSystem   string CreationClassName (key), string Name (key), string ElementName = "host"
class FakeModule : public broker::ModuleImage
{
public:
    using Handler = std::function<CMPIStatus(const Call&)>;

    FakeModule();
    ~FakeModule() override;
    void* symbol(const std::string& name) const override;
    const cimple::Registration* registrations() const override;

    /// Answers of the providers by operation; what is not here answers CMPI_RC_ERR_NOT_SUPPORTED, and cleanup OK.
    std::map<std::string, Handler> handlers;
    /// Names of the factories that were called, in order.
    std::vector<std::string> made;

    CMPIStatus answer(const Call& call);

    struct Slot;

private:
    std::vector<std::unique_ptr<Slot>> _slots;
    friend void* makeProvider(std::size_t index, const CMPIBroker* mb);
};

/// A broker around a fake module.
struct Fixture
{
    explicit Fixture(broker::Options options = {});

    std::shared_ptr<FakeModule> module;
    std::unique_ptr<broker::Broker> broker;

    void on(const std::string& operation, FakeModule::Handler handler)
    {
        module->handlers[operation] = std::move(handler);
    }
    /// Texts of the violations, joined by line ends.
    std::string violations() const;
};

inline const CMPIStatus ok{CMPI_RC_OK, nullptr};
inline constexpr const char* ns = "root/tavrin";

broker::Path basePath(const std::string& id, const std::string& className = "TST_Base");
/// The classes of the fake module, without a broker.
const broker::ClassTable& testClasses();

/// Makes a path of the call's class with the key Id and returns it to the broker.
CMPIObjectPath* newBasePath(const Call& call, const char* id);
CMPIInstance* newBase(const Call& call, const char* id);
void setString(CMPIInstance* instance, const CMPIBroker* mb, const char* name, const char* text);

} // namespace broker_test
