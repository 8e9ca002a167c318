#include "model/ComputerSystem.h"

#include "agent/Build.h"
#include "runtime/threads/cimom.h"
#include "schema/IBMSD_Chassis.h"
#include "schema/IBMSD_ComputerSystem.h"

#include <cerrno>
#include <netdb.h>
#include <sys/socket.h>
#include <unistd.h>
#include <vector>

namespace cimple
{

namespace
{

constexpr const char* platformNamespace = "root/ibmse";
constexpr std::size_t hostNameRoom = 512;

/// Asks the broker for the instances of `Model` in the platform's namespace; the first that is a `Base` is taken.
template <class Model, class Base> PlatformAnswer enumeratePlatform()
{
    PlatformAnswer answer;
    const Ref<Model> model(create<Model>());
    Instance_Enumerator instances;
    answer.answered = cimom::enum_instances(platformNamespace, model.get(), instances) == 0;
    for (; answer.answered && instances.more() && !answer.found; instances.next())
    {
        const Ref<> candidate(instances.get());
        if (const Base* host = cast<Base>(candidate.get()))
        {
            answer.found.reset(clone_of(host));
            set_name_space(answer.found.get(), platformNamespace, true);
        }
    }
    return answer;
}

/// The log lines of one up-call.
struct UpcallTexts
{
    const char* started;
    const char* calling;
    const char* found;
};

constexpr UpcallTexts computerSystemTexts = {"up-call to enumerate CIM_ComputerSystem started",
                                             "up-call to enumerate CIM_ComputerSystem created--calling now",
                                             "up-call - found the correct CIM_ComputerSystem to link"};
constexpr UpcallTexts chassisTexts = {"up-call to enumerate CIM_Chassis started",
                                      "up-call to enumerate CIM_Chassis created--calling now",
                                      "up-call - found the correct CIM_Chassis to link"};

/// A copy of what the platform answered at the beginning of this refresh, for the maps; null when that is nothing.
template <class Base> Ref<Base> takeAnswer(const PlatformAnswer& answer, const UpcallTexts& texts)
{
    TVR_LOG(TVR_DBG, "%s", texts.started);
    TVR_LOG(TVR_DBG, "%s", texts.calling);
    if (answer.answered)
        TVR_LOG(TVR_DBG, "%s", texts.started);
    if (answer.found)
        TVR_LOG(TVR_DBG, "%s", texts.found);
    return Ref<Base>(clone_of(static_cast<const Base*>(answer.found.get())));
}

/// What the resolver knows of a host name. The re-entrant form: other providers of the server may resolve names at the
/// same time. A host has as many aliases and addresses as its resolver says, so the room grows with the answer.
class HostEntry
{
public:
    explicit HostEntry(const char* name)
    {
        int status = ERANGE;
        int error = 0;
        for (std::size_t room = firstRoom; status == ERANGE && room <= mostRoom; room *= 4)
        {
            _work.resize(room);
            status = gethostbyname_r(name, &_entry, _work.data(), _work.size(), &_found, &error);
        }
        if (status != 0)
            _found = nullptr;
    }
    explicit operator bool() const { return _found && _found->h_name; }
    const hostent* operator->() const { return _found; }

private:
    static constexpr std::size_t firstRoom = 8192;
    static constexpr std::size_t mostRoom = 2097152;

    std::vector<char> _work;
    hostent _entry{};
    hostent* _found = nullptr;
};

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

    HostEntry host(name);
    if (!host)
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
    Ref<CIM_ComputerSystem> system = fresh<CIM_ComputerSystem>();
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

Ref<CIM_Chassis> generateChassis()
{
    Ref<CIM_Chassis> chassis = fresh<CIM_Chassis>();
    chassis->Tag.set("TVR HBA:Chassis");
    chassis->CreationClassName.set(className<CIM_Chassis>());
    chassis->PackageType.set(3);
    chassis->ChassisPackageType.set(0);
    chassis->ElementName.set("TVR HBA:Chassis");
    return chassis;
}

} // namespace

void askPlatform(ProviderAgent& agent)
{
    agent.m_platformComputerSystem = enumeratePlatform<IBMSD_ComputerSystem, CIM_ComputerSystem>();
    agent.m_platformChassis = enumeratePlatform<IBMSD_Chassis, CIM_Chassis>();
}

std::uint32_t createComputerSystem(HostContext& host)
{
    ProviderAgent& agent = host.agent;
    agent.m_bOwnComputerSystem = false;
    Ref<CIM_ComputerSystem> system =
        takeAnswer<CIM_ComputerSystem>(agent.m_platformComputerSystem, computerSystemTexts);
    TVR_LOG(TVR_INFO, "up-call to enumerate CIM_ComputerSystem created");
    if (!system)
    {
        TVR_LOG(TVR_DBG, "up-call method failed");
        system = unlessOutOfMemory([&] { return generateComputerSystem(agent); });
    }
    TVR_LOG(TVR_DBG, "All clear -created tvrhba computer system instance");
    host.system = mapOf<CIM_ComputerSystem>(agent).insert(system, "Insert Failed : m_TVRHBA_ComputerSystem_map");
    return host.system ? BUILD_DONE : BUILD_FAILED;
}

std::uint32_t takePlatformChassis(HostContext& host)
{
    host.chassis = takeAnswer<CIM_Chassis>(host.agent.m_platformChassis, chassisTexts);
    return BUILD_DONE;
}

std::uint32_t createChassis(HostContext& host)
{
    if (host.chassis)
        return BUILD_DONE;
    TVR_LOG(TVR_DBG, "up-call method to get the chassis is failed");
    host.chassis = unlessOutOfMemory(generateChassis);
    const bool held = mapOf<CIM_Chassis>(host.agent).insert(host.chassis, "Insert Failed : m_CIM_Chassis_map");
    return held ? BUILD_DONE : BUILD_FAILED;
}

} // namespace cimple
