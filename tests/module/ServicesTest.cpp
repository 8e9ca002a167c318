// The module's services: what they are, who hosts them, what they affect; and the remote management page.
#include "tests/module/Describe.h"
#include "tests/module/HostNames.h"
#include "tests/module/LibCurl.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>

using namespace module_test;
using testing::ElementsAre;
using testing::ElementsAreArray;
using testing::IsEmpty;
using testing::SizeIs;

namespace
{

const std::string computerSystem =
    R"(root/tavrin:CIM_ComputerSystem.Name="tavrin-host.example.net",CreationClassName="CIM_ComputerSystem")";

/// Path of what the computer system hosts.
std::string hosted(const std::string& className, const std::string& name)
{
    return "root/tavrin:" + className + ".Name=\"" + name +
           "\",SystemCreationClassName=\"CIM_ComputerSystem\",SystemName=\"tavrin-host.example.net\","
           "CreationClassName=\"" +
           className + "\"";
}

std::string port(const std::string& wwpn)
{
    return "root/tavrin:TVRHBA_FCPort.SystemCreationClassName=\"CIM_ComputerSystem\","
           "SystemName=\"tavrin-host.example.net\",CreationClassName=\"TVRHBA_FCPort\",DeviceID=\"" +
           wwpn + "\"";
}

std::vector<std::string> described(Host& host, const std::string& className)
{
    std::vector<std::string> all;
    for (const broker::Object& object : host.instancesOf(className))
        all.push_back(describe(object));
    return all;
}

struct ServiceRow
{
    const char* className;
    const char* name;
    const char* elementName;
    const char* description;
    const char* hosting;       ///< association with the computer system
    const char* affectsSystem; ///< the same; null where the service does not affect it
    const char* affectsPort;   ///< association with each port
};

const ServiceRow services[] = {
    {"TVRHBA_SoftwareInstallationService", "TVRHBA_FCSoftwareInstallationService",
     "TVR FC HBA Software Installation Service", "Installs firmware and boot code on the Fibre Channel HBAs.",
     "TVRHBA_HostedInstallationService", "TVRHBA_InstallServiceAffectsSystem", nullptr},
    {"TVRHBA_FCHBAWWNService", "TVRHBA_FCHBAWWNService", "TVR FC HBA WWN Management Service",
     "Reads, changes and restores the World Wide Names of Fibre Channel ports.", "TVRHBA_HostedFCHBAWWNService",
     "TVRHBA_FCHBAWWNServiceAffectsSystem", "TVRHBA_FCHBAWWNServiceAffectsFCPort"},
    {"TVRHBA_FCTagService", "TVRHBA_FCTagService", "TVR FC HBA Tag Service",
     "Gives the frames between two Fibre Channel ports a tag for quality of service.", "TVRHBA_HostedFCTagService",
     nullptr, "TVRHBA_FCTagServiceAffectsPort"},
    {"TVRHBA_BootBIOSService", "TVRHBA_BootBIOSService", "TVR FC HBA Boot BIOS Service",
     "Enables and disables the boot code of the Fibre Channel HBAs.", "TVRHBA_HostedBootBIOSService",
     "TVRHBA_BootBIOSServiceAffectsSystem", "TVRHBA_BootBIOSServiceAffectsFCPort"},
    {"TVRHBA_FCHBADriverParamService", "TVRHBA_FCHBADriverParamService", "TVR FC HBA Driver Parameter Service",
     "Sets the parameters of the Fibre Channel driver.", "TVRHBA_HostedFCHBADriverParamService", nullptr,
     "TVRHBA_FCHBADriverParamServiceAffectsFCPort"},
};

TEST(Services, AreOneOfEachHostedAndAffectingWhatTheirClassesSay)
{
    setHostNames({});
    Host host;
    for (const ServiceRow& row : services)
    {
        EXPECT_THAT(described(host, row.className),
                    ElementsAre(std::string("\nCreationClassName = \"") + row.className + "\"\nDescription = \"" +
                                row.description + "\"\nElementName = \"" + row.elementName + R"("
EnabledDefault = 2
EnabledState = 2
HealthState = 5
Name = ")" + row.name + R"("
OperationalStatus = {2}
RequestedState = 12
StartMode = "Automatic"
Started = true
SystemCreationClassName = "CIM_ComputerSystem"
SystemName = "tavrin-host.example.net"
TransitioningToState = 12
)"));
        const std::string service = hosted(row.className, row.name);
        EXPECT_THAT(described(host, row.hosting),
                    ElementsAre("\nAntecedent = " + computerSystem + "\nDependent = " + service + "\n"));
        const auto affecting = [&](const std::string& element)
        { return "\nAffectedElement = " + element + "\nAffectingElement = " + service + "\nElementEffects = {5}\n"; };
        if (row.affectsSystem)
        {
            EXPECT_THAT(described(host, row.affectsSystem), ElementsAre(affecting(computerSystem)));
        }
        if (row.affectsPort)
        {
            EXPECT_THAT(described(host, row.affectsPort),
                        ElementsAre(affecting(port("1000027A51160210")), affecting(port("1000027A51160211")),
                                    affecting(port("1000027A51320240")), affecting(port("1000027A51320241"))));
        }
    }
    EXPECT_THAT(host.instancesOf("TVRHBA_InstallServiceAffectsChip"), SizeIs(2));
    EXPECT_EQ(host.logged("[TVR_CRIT] Insert Failed"), 0u);
    EXPECT_EQ(host.logged("[TVR_DBG] Ending of Software Installation Service"), 4u);
    host.unload();
}

TEST(Services, InstallationConformsToSoftwareUpdate)
{
    setHostNames({});
    Host host;
    EXPECT_THAT(described(host, "TVRHBA_InstallServiceConformsToProfile"),
                ElementsAre("\nConformantStandard = root/pg_interop:TVRHBA_RegisteredProfile.InstanceID="
                            "\"TVR:Software Update\"\nManagedElement = " +
                            hosted("TVRHBA_SoftwareInstallationService", "TVRHBA_FCSoftwareInstallationService") +
                            "\n"));
    EXPECT_EQ(host.logged("[TVR_DBG] Generating TVRHBA_RegisteredProfile (Software Update)"), 1u);
    EXPECT_EQ(host.logged("[TVR_DBG] Generating TVRHBA_ComputerSystemConformsToProfile (Computer System,"
                          "TVR:Software Update)"),
              0u);
    host.unload();
}

TEST(Services, InstallationTakesMoreUrisWithLibCurl)
{
    struct Row
    {
        const char* file; ///< under which libcurl is there
        const char* schemes;
        std::vector<std::string> tried;
        std::size_t absentLines;
    };
    const Row rows[] = {
        {"", "{3}", {"/lib/libcurl.so.4", "/usr/lib/libcurl.so.4", "libcurl.so", "curl.dll", "libcurl.so.4"}, 1},
        {"/lib/libcurl.so.4", "{3, 4, 5, 6, 8}", {"/lib/libcurl.so.4"}, 0},
        {"libcurl.so", "{3, 4, 5, 6, 8}", {"/lib/libcurl.so.4", "/usr/lib/libcurl.so.4", "libcurl.so"}, 0},
    };
    for (const Row& row : rows)
    {
        setHostNames({});
        setLibCurl(row.file);
        Host host;
        EXPECT_THAT(described(host, "TVRHBA_SoftwareInstallationServiceCapabilities"), ElementsAre(std::string(R"(
CanAddToCollection = false
Description = "What the installation service of the Fibre Channel HBAs takes."
ElementName = "TVR FC HBA Software Installation Service Capabilities"
InstanceID = "TVR FC HBA:Software Installation Service Capabilities"
SupportedAsynchronousActions = {2}
SupportedExtendedResourceTypes = {2}
SupportedInstallOptions = {2, 4, 5, 6, 7, 11, 32768}
SupportedSynchronousActions = {4, 5}
SupportedTargetTypes = {"TVRHBA_FCPort"}
SupportedURISchemes = )") + row.schemes + "\n"));
        EXPECT_THAT(triedLibCurls(), ElementsAreArray(row.tried));
        EXPECT_EQ(host.logged("[TVR_DBG] Inside UpdateCURLCapabilities"), 1u);
        EXPECT_EQ(host.logged("[TVR_INFO] libcurl is not present. only file type URIScheme will be supported"),
                  row.absentLines);
        EXPECT_THAT(
            described(host, "TVRHBA_ElementCapabilities"),
            ElementsAre("\nCapabilities = root/tavrin:TVRHBA_SoftwareInstallationServiceCapabilities.InstanceID="
                        "\"TVR FC HBA:Software Installation Service Capabilities\"\nCharacteristics = {3}\n"
                        "ManagedElement = " +
                        hosted("TVRHBA_SoftwareInstallationService", "TVRHBA_FCSoftwareInstallationService") + "\n"));
        host.unload();
    }
    setLibCurl("");
}

// --- remote access point

constexpr const char* webLaunch = "/etc/tvr_smis.conf";

TEST(RemoteAccessPoint, ShowsTheConfiguredUrlOfTheHost)
{
    setHostNames({});
    Host host;
    const std::string point = hosted("TVRHBA_RemoteServiceAccessPoint", "Fabricore WebLaunch URL");
    EXPECT_THAT(described(host, "TVRHBA_RemoteServiceAccessPoint"), ElementsAre(R"(
AccessContext = 10
AccessInfo = "https://fabricore.example.net/weblaunch"
CreationClassName = "TVRHBA_RemoteServiceAccessPoint"
Description = "The page from which the Fibre Channel HBAs of this host are managed."
ElementName = "Fabricore WebLaunch URL"
EnabledDefault = 2
EnabledState = 2
HealthState = 5
InfoFormat = 200
Name = "Fabricore WebLaunch URL"
OperationalStatus = {2}
RequestedState = 12
SystemCreationClassName = "CIM_ComputerSystem"
SystemName = "tavrin-host.example.net"
TransitioningToState = 12
)"));
    EXPECT_THAT(described(host, "TVRHBA_RemoteHostedAccessPoint"),
                ElementsAre("\nAntecedent = " + computerSystem + "\nDependent = " + point + "\n"));
    EXPECT_THAT(described(host, "TVRHBA_SAPAvailableForElement"),
                ElementsAre("\nAvailableSAP = " + point + "\nManagedElement = " + computerSystem + "\n"));
    host.unload();
}

TEST(RemoteAccessPoint, IsAbsentWithoutAUrl)
{
    for (const bool hasFile : {true, false})
    {
        Host host;
        if (hasFile)
            host.write(webLaunch, "# no page\n\n");
        else
            std::filesystem::remove(host.root().string() + webLaunch);
        for (const char* className :
             {"TVRHBA_RemoteServiceAccessPoint", "TVRHBA_RemoteHostedAccessPoint", "TVRHBA_SAPAvailableForElement"})
            EXPECT_THAT(host.instancesOf(className), IsEmpty()) << className;
        EXPECT_EQ(host.logged("[TVR_INFO] WebLaunch config file '"), hasFile ? 0u : 1u);
        EXPECT_THAT(host.instancesOf("TVRHBA_BootBIOSService"), SizeIs(1));
        host.unload();
    }
}

} // namespace
