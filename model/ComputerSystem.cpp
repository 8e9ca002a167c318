#include "model/ComputerSystem.h"

#include "foundation/Log.h"
#include "model/Build.h"
#include "runtime/cimom.h"
#include "schema/IBMSD_Chassis.h"
#include "schema/IBMSD_ComputerSystem.h"

#include <cerrno>
#include <netdb.h>
#include <sys/socket.h>
#include <unistd.h>

namespace cimple
{

namespace
{

constexpr const char* platformNamespace = "root/ibmse";
constexpr std::size_t hostNameRoom = 512;

/// The log lines of one up-call.
struct UpcallTexts
{
    const char* started;
    const char* calling;
    const char* found;
};

/// First instance of `Base` that the broker has among those of `Model`, in the platform's namespace.
template <class Model, class Base> Ref<Base> findByUpcall(const UpcallTexts& texts)
{
    Ref<Model> model(create<Model>());
    if (model && !cast<Model>(static_cast<Instance*>(model.get())))
        model.reset();
    TVR_LOG(TVR_DBG, "%s", texts.calling);

    Ref<Base> result;
    Instance_Enumerator instances;
    if (model && cimom::enum_instances(platformNamespace, model.get(), instances) == 0)
    {
        TVR_LOG(TVR_DBG, "%s", texts.started);
        for (; instances.more() && !result; instances.next())
        {
            Ref<> candidate(instances.get());
            if (const Base* host = cast<Base>(candidate.get()))
            {
                TVR_LOG(TVR_DBG, "%s", texts.found);
                result.reset(clone_of(host));
                set_name_space(result.get(), platformNamespace, true);
            }
        }
    }
    return result;
}

Ref<CIM_ComputerSystem> findComputerSystem()
{
    TVR_LOG(TVR_DBG, "up-call to enumerate CIM_ComputerSystem started");
    Ref<CIM_ComputerSystem> found = findByUpcall<IBMSD_ComputerSystem, CIM_ComputerSystem>(
        {"up-call to enumerate CIM_ComputerSystem started",
         "up-call to enumerate CIM_ComputerSystem created--calling now",
         "up-call - found the correct CIM_ComputerSystem to link"});
    TVR_LOG(TVR_INFO, "up-call to enumerate CIM_ComputerSystem created");
    return found;
}

/// Puts the host's names in the agent; what cannot be found out is "unknown".
void readHostNames(ProviderAgent& agent)
{
    agent.m_hostName = "unknown";
    agent.m_ipAddress = "unknown";
    char name[hostNameRoom] = {};
    if (gethostname(name, sizeof(name) - 1) != 0)
    {
        TVR_LOG(TVR_ERR, "Error! gethostname() failed err : %d , using 'unknown' for hostname and IP address", errno);
        return;
    }
    TVR_LOG(TVR_DBG, "Host Name : %s", name);
    agent.m_hostName = name;

    // The re-entrant form: other providers of the server may resolve names at the same time.
    hostent entry;
    hostent* host = nullptr;
    char work[8192];
    int error = 0;
    if (gethostbyname_r(name, &entry, work, sizeof(work), &host, &error) != 0 || !host)
    {
        TVR_LOG(TVR_ERR, "Error! gethostbyname() failed, using 'unknown' for IP address.");
        return;
    }
    agent.m_hostName = host->h_name;
    if (host->h_addrtype == AF_INET && host->h_length == 4 && host->h_addr_list[0])
    {
        const auto* address = reinterpret_cast<const unsigned char*>(host->h_addr_list[0]);
        agent.m_ipAddress = formatText("%d.%d.%d.%d", address[0], address[1], address[2], address[3]);
        TVR_LOG(TVR_DBG, "Host ipAddress : %s", agent.m_ipAddress.c_str());
    }
}

Ref<CIM_ComputerSystem> generateComputerSystem(ProviderAgent& agent)
{
    readHostNames(agent);
    Ref<CIM_ComputerSystem> system(create<CIM_ComputerSystem>(true));
    system->Description.set(formatText("%s with Tavrin CMPI HBA Provider v%d.%d.%d-%d", agent.m_osName.c_str(),
                                       providerVersion[0], providerVersion[1], providerVersion[2], providerVersion[3]));
    system->EnabledState.set(0);
    system->RequestedState.set(12);
    system->EnabledDefault.set(2);
    system->CreationClassName.set(className<CIM_ComputerSystem>());
    system->Name.set(agent.m_hostName);
    system->ElementName.set(agent.m_hostName);
    system->TransitioningToState.set(12);
    system->OtherIdentifyingInfo.set({agent.m_ipAddress, agent.m_osName, agent.m_osExtendedInfo});
    system->IdentifyingDescriptions.set({"TAVRIN:IP_ADDRESS", "TAVRIN:OS_NAME", "TAVRIN:OS_EXTENDED_INFO"});
    system->Dedicated.set({0});
    system->NameFormat.set("Other");
    system->ResetCapability.set(2);
    system->PowerManagementCapabilities.set({0});
    system->OperationalStatus.set({2});
    agent.m_bOwnComputerSystem = true;
    return system;
}

} // namespace

bool createComputerSystem(ProviderAgent& agent)
{
    agent.m_bOwnComputerSystem = false;
    Ref<CIM_ComputerSystem> system = findComputerSystem();
    if (!system)
    {
        TVR_LOG(TVR_DBG, "up-call method failed");
        system = generateComputerSystem(agent);
    }
    TVR_LOG(TVR_DBG, "All clear -created tvrhba computer system instance");
    return insert(agent.m_CIM_ComputerSystem_map, system, "Insert Failed : m_TVRHBA_ComputerSystem_map") != nullptr;
}

CIM_ComputerSystem* computerSystem(const ProviderAgent& agent)
{
    return static_cast<CIM_ComputerSystem*>(agent.m_CIM_ComputerSystem_map.at(0));
}

Ref<CIM_Chassis> findChassis()
{
    TVR_LOG(TVR_DBG, "up-call to enumerate CIM_Chassis started");
    return findByUpcall<IBMSD_Chassis, CIM_Chassis>({"up-call to enumerate CIM_Chassis started",
                                                     "up-call to enumerate CIM_Chassis created--calling now",
                                                     "up-call - found the correct CIM_Chassis to link"});
}

Ref<CIM_Chassis> generateChassis()
{
    Ref<CIM_Chassis> chassis(create<CIM_Chassis>(true));
    chassis->Tag.set("TVR HBA:Chassis");
    chassis->CreationClassName.set(className<CIM_Chassis>());
    chassis->PackageType.set(3);
    chassis->ChassisPackageType.set(0);
    chassis->ElementName.set("TVR HBA:Chassis");
    return chassis;
}

} // namespace cimple
