// A simulated host as a scenario describes it. docs/scenarios.md explains the members in words.
#pragma once

#include "simulator/Attributes.h"
#include "simulator/Faults.h"
#include "simulator/Wwn.h"

#include <array>
#include <cstdint>
#include <cstring>
#include <optional>
#include <string>
#include <type_traits>
#include <vector>

/// What the libraries' interfaces declare, as far as a scenario holds it.
template <class Record>
concept LibraryRecord = std::is_class_v<Record> && std::is_trivial_v<Record>;

/// Equal by their bytes.
template <LibraryRecord Record> bool operator==(const Record& a, const Record& b)
{
    return std::memcmp(&a, &b, sizeof(Record)) == 0;
}

namespace tvrsim
{

enum class ScsiOperation : std::uint8_t
{
    any,
    inquiry,
    vitalProductData,
    readCapacity,
    reportLuns,
};

/// A command that ends with sense data instead of its result.
struct CheckCondition
{
    bool operator==(const CheckCondition&) const = default;

    ScsiOperation operation = ScsiOperation::any;
    std::optional<std::uint8_t> page;     ///< of vital product data; every page if not given
    std::uint32_t times = 0xFFFF'FFFF;    ///< commands that still end this way; all ones for ever
    std::uint8_t key = 5;                 ///< ILLEGAL REQUEST
    std::uint8_t code = 0, qualifier = 0; ///< additional sense code and its qualifier
};

/// One designator of the device identification page (SPC-4, 7.8.6.1).
struct Designator
{
    bool operator==(const Designator&) const = default;

    std::uint8_t type = 3;    ///< 3 is NAA
    std::uint8_t codeSet = 1; ///< 1 binary, 2 ASCII
    std::uint8_t association = 0;
    std::vector<std::uint8_t> value; ///< at most 251 bytes
};

struct LogicalUnit
{
    bool operator==(const LogicalUnit&) const = default;

    std::uint32_t number = 0; ///< below 16384
    std::uint8_t deviceType = 0;
    std::uint8_t deviceQualifier = 0;
    std::string vendor = "TAVRIN";
    std::string product = "SIMULATED UNIT";
    std::string revision = "0001";
    std::optional<std::string> serialNumber; ///< page 0x80
    std::vector<Designator> designators;     ///< page 0x83; none means that the unit has no such page
    std::uint64_t blocks = 0;                ///< 0 means that the unit refuses Read Capacity
    std::uint32_t blockLength = 512;
    std::vector<CheckCondition> checkConditions;
};

/// A port in the fabric with logical units behind it.
struct Target
{
    bool operator==(const Target&) const = default;

    std::string name; ///< by which ports refer to it
    Wwn wwpn = 0, wwnn = 0;
    std::uint32_t fcId = 0;
    std::vector<LogicalUnit> units; ///< in ascending order of number
};

/// A unit that a port may serve with priority.
struct PriorityLane
{
    bool operator==(const PriorityLane&) const = default;

    std::size_t target = 0; ///< index in Scenario::targets
    std::uint32_t lun = 0;
    std::array<std::uint32_t, 2> states{1, 1}; ///< 0 or 1, by RM_LaneOption
};

struct VirtualPort
{
    bool operator==(const VirtualPort&) const = default;

    Wwn wwpn = 0, wwnn = 0, fabricName = 0;
    std::uint32_t fcId = 0;
    std::uint32_t state = HBA_PORTSTATE_ONLINE;
    std::string symbolicName;
    std::vector<std::size_t> targets; ///< indexes in Scenario::targets
    std::optional<RM_VirtualMachine> machine;
    std::vector<PriorityLane> priorityLanes; ///< where the port has them
};

/// The pair of World Wide Names of a port.
struct PortNames
{
    Wwn wwpn = 0, wwnn = 0;
    bool operator==(const PortNames&) const = default;
};

/// What a port has beside the names in force. The configured names, those of the next activation, are the volatile ones
/// if there are any and the non-volatile ones otherwise.
struct NameManagement
{
    bool operator==(const NameManagement&) const = default;

    bool available = true;
    std::uint32_t capability = RM_WWN_CAN_CHANGE_NON_VOLATILE | RM_WWN_CAN_CHANGE_VOLATILE | RM_WWN_NEEDS_RESET;
    std::optional<std::uint32_t> activation; ///< answered in place of the RM_WwnActivation that follows
    /// Those in force if a scenario does not say.
    std::optional<PortNames> factory, nonVolatile;
    std::optional<PortNames> volatileNames;
    bool volatileInForce = false;
    std::uint32_t waitsFor = RM_WWN_ACTIVE; ///< the RM_WwnActivation of the configured names
};

/// What a port is in, and the attribute that shows it.
struct LinkState
{
    bool operator==(const LinkState&) const = default;

    std::uint32_t state = 0;
    std::optional<Attribute> link;
};

/// How a test of a port runs and what it comes to. Time goes by with each poll of its results.
struct TestBehaviour
{
    bool operator==(const TestBehaviour&) const = default;

    RM_STATUS startStatus = RM_OK; ///< of the call that starts it
    std::uint32_t busy = 0;        ///< starts that are still answered RM_ERROR_ADAPTER_BUSY
    std::uint32_t polls = 2;       ///< polls that find it running; all ones for ever
    RM_STATUS runningStatus = RM_ERROR_TEST_RUNNING;
    std::uint32_t runningState = RM_DIAG_STATE_RUNNING;
    RM_STATUS endStatus = RM_OK;
    std::uint32_t endState = RM_DIAG_STATE_FINISHED;
    RM_STATUS cancelStatus = RM_OK;
    bool ignoresCancel = false; ///< the call succeeds and the test goes on

    // Not of a link test. What is not given follows from how the test was started.
    std::optional<std::uint32_t> result{}, cyclesCompleted{}, cyclesFailed{}, executionTime{};
};

/// A link that passes in all five phases.
RM_DPortResults goodLink();

struct Diagnostics
{
    bool operator==(const Diagnostics&) const = default;

    RM_STATUS whenRunning = RM_ERROR_ADAPTER_BUSY; ///< of a start while a test of the port runs
    TestBehaviour self{.polls = 3}, hostLoopback, internalLoopback, externalLoopback, echo;
    TestBehaviour dport{.polls = 4, .runningState = RM_DPORT_STATE_RUNNING, .endState = RM_DPORT_STATE_FINISHED};
    RM_DPortResults link = goodLink(); ///< of a link test that has finished
    bool hasLoopbackPlug = false;      ///< in the place of the cable
};

/// One of the tests.
using TestOf = TestBehaviour Diagnostics::*;

/// What a port has through its cable; by default, through a loopback plug.
struct Connection
{
    bool operator==(const Connection&) const = default;

    std::uint32_t type = HBA_PORTTYPE_LPORT;
    std::uint32_t state = HBA_PORTSTATE_ONLINE;
    std::uint32_t fcId = 0, discoveredPorts = 0;
    Wwn fabricName = 0;
    std::vector<std::size_t> targets;
    std::vector<VirtualPort> virtualPorts;
};

/// What the library keeps of a port's dumps.
struct DumpFiles
{
    bool operator==(const DumpFiles&) const = default;

    std::string directory = "/var/log/tavrin/dump";
    std::uint32_t retentionCount = 5;
    std::vector<std::string> files; ///< names, the oldest first
};

/// What the firmware traces.
struct TraceLevel
{
    bool operator==(const TraceLevel&) const = default;

    std::uint32_t level = 0;
    std::array<std::uint8_t, 4> bytes{};
};

struct Port
{
    bool operator==(const Port&) const = default;

    Wwn wwpn = 0, wwnn = 0, fabricName = 0;
    NameManagement names;
    bool listedTwice = false; ///< the RM library lists it among the local ports twice
    std::uint32_t fcId = 0;
    std::uint32_t type = HBA_PORTTYPE_NPORT;
    std::uint32_t state = HBA_PORTSTATE_ONLINE;
    std::uint32_t supportedClasses = 0x08;
    std::array<std::uint8_t, 32> supportedFc4Types{}, activeFc4Types{};
    std::string symbolicName, osDeviceName;
    std::uint32_t supportedSpeed = 0, speed = 0; ///< speed codes, one bit each
    std::uint32_t maxFrameSize = 2048;
    std::uint32_t discoveredPorts = 0;
    std::uint32_t scsiBus = 0;
    AttributeList attributes; ///< stand above those that follow from the members
    AttributeList statistics;
    AttributeList growth; ///< of the statistics, by each reading
    std::optional<RM_PciRegisters> pci;
    std::optional<RM_VpdArea> vpd;
    std::optional<RM_SffData> transceiver;
    std::optional<std::uint32_t> beacon; ///< an RM_BeaconState; none means that the port has no light for it
    std::vector<RM_FlashRegion> flash;   ///< none means that the library cannot read the flash memory
    std::optional<RM_QosInfo> qos;
    std::vector<std::size_t> targets; ///< indexes in Scenario::targets; the position is the SCSI target number
    std::vector<VirtualPort> virtualPorts;
    std::optional<std::vector<PriorityLane>> priorityLanes; ///< none: the hardware does not have them
    std::optional<LinkState> beforeDisabling;               ///< of a port that was disabled
    Diagnostics diagnostics;
    std::optional<Connection> unplugged; ///< what comes back when the loopback plug is taken out
    DumpFiles dumps;
    TraceLevel traceLevel;
    std::vector<RM_EventLogModule> tracedModules; ///< at most RM_MAX_EVENT_LOG_MODULES
};

/// A parameter of the driver, and what it will be once the driver has been loaded anew.
struct DriverParameter
{
    bool operator==(const DriverParameter&) const = default;

    RM_DriverParam running{}, stored{};
};

/// One adapter of the HBA API: a card, or one function of a card.
struct Adapter
{
    bool operator==(const Adapter&) const = default;

    std::string name; ///< at most 255 bytes
    std::string manufacturer = "Tavrin Corporation";
    std::string serialNumber, model, modelDescription, nodeSymbolicName, hardwareVersion, driverVersion,
        optionRomVersion, firmwareVersion, driverName;
    Wwn nodeWwn = 0;
    std::uint32_t vendorSpecificId = 0;
    std::uint32_t driverType = 0;
    std::string firmwareFamily; ///< whose firmware it takes; that of its model if empty
    bool stale = false;         ///< the HBA API answers "stale data" until the next refresh
    AttributeList attributes;
    std::vector<RM_Feature> features; ///< in ascending order of tag
    std::vector<DriverParameter> driverParameters;
    std::vector<Port> ports;

    // Frame tagging, which the ports of the adapter share.
    std::uint32_t tagging = 0; ///< 0 or 1
    std::vector<CPQFC_QosEntry> tags;
};

struct Scenario
{
    bool operator==(const Scenario&) const = default;

    std::string libraryVersion = "12.0.100.0";
    std::string miliVersion = "2.0.30.0";
    bool hasTagging = true; ///< the RM library loads the functions for frame tagging
    AttributeList serverAttributes;
    std::vector<DriverParameter> driverParameters; ///< those for all adapters
    std::vector<Adapter> adapters;
    std::vector<Target> targets;
    std::vector<Fault> faults;
};

} // namespace tvrsim
