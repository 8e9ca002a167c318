// The state of the simulated host, seen through the calls of the HBA API and of the RM library.
//
// Every public function takes the host's lock for itself, so calls may come from many threads. The functions that
// mirror a library call return that library's status, and fill their output only with status 0 or as they say.
#pragma once

#include "simulator/FirmwareFile.h"
#include "simulator/Scenario.h"
#include "simulator/ScsiResponses.h"

#include <map>
#include <mutex>
#include <unordered_map>

namespace tvrsim
{

/// What a test is started with.
struct TestOrder
{
    std::uint32_t cycles = 1;
    bool haltOnError = false;
    const char* pattern = "0"; ///< one to eight hexadecimal digits, or the start is refused
    Wwn target = 0;            ///< of an echo
};

class SimulatedHost
{
public:
    /// Takes the place of the host. Open handles stay valid for adapters of the same name.
    void load(Scenario scenario);

    // HBA API, in HbaCalls.cpp.

    /// HBA_STATUS_ERROR if the library is loaded already, as the common library has it.
    HBA_STATUS loadLibrary();
    HBA_STATUS freeLibrary();
    std::uint32_t adapterCount() const;
    HBA_STATUS adapterName(std::uint32_t index, std::string& name) const;
    HBA_HANDLE openAdapter(const std::string& name);
    void closeAdapter(HBA_HANDLE handle);
    void refreshInformation(HBA_HANDLE handle);
    HBA_STATUS adapterAttributes(HBA_HANDLE handle, HBA_ADAPTERATTRIBUTES& out) const;
    HBA_STATUS portAttributes(HBA_HANDLE handle, std::uint32_t index, HBA_PORTATTRIBUTES& out) const;
    HBA_STATUS targetMapping(HBA_HANDLE handle, std::vector<HBA_FCPSCSIENTRY>& out) const;
    HBA_STATUS scsi(HBA_HANDLE handle, Wwn target, HBA_UINT64 lun, const ScsiCommand& command, ScsiReply& out);

    // RM library, in RmCalls.cpp. `wwpn` names a physical port, `vport` one of its virtual ports.

    RM_STATUS statusText(RM_STATUS status, std::string& out) const;
    RM_STATUS libraryVersion(std::string& out) const;
    RM_STATUS miliVersion(std::string& out) const;
    RM_STATUS isLocal(Wwn wwpn, std::uint32_t& out) const;
    RM_STATUS driverType(Wwn wwpn, std::uint32_t& out) const;
    RM_STATUS feature(Wwn wwpn, std::uint32_t tag, std::uint32_t& out) const;
    RM_STATUS features(Wwn wwpn, std::vector<RM_Feature>& out) const;
    RM_STATUS qos(Wwn wwpn, RM_QosInfo& out) const;
    RM_STATUS pciRegisters(Wwn wwpn, RM_PciRegisters& out) const;
    RM_STATUS vpd(Wwn wwpn, RM_VpdArea& out) const;
    RM_STATUS transceiver(Wwn wwpn, RM_SffData& out) const;
    RM_STATUS flash(Wwn wwpn, RM_FlashList& out) const;
    RM_STATUS beacon(Wwn wwpn, std::uint32_t& out) const;
    RM_STATUS setBeacon(Wwn wwpn, std::uint32_t state);
    RM_STATUS hbaAttributes(Wwn wwpn, AttributeList& out) const;
    RM_STATUS portAttributes(Wwn wwpn, AttributeList& out) const;
    RM_STATUS portStatistics(Wwn wwpn, AttributeList& out);
    RM_STATUS serverAttributes(Wwn wwpn, AttributeList& out) const;
    RM_STATUS luns(Wwn wwpn, Wwn target, std::vector<RM_Lun>& out) const;
    RM_STATUS scsi(Wwn wwpn, Wwn target, HBA_UINT64 lun, const ScsiCommand& command, ScsiReply& out);
    RM_STATUS vports(Wwn wwpn, std::vector<RM_VPortEntry>& out) const;
    RM_STATUS vportAttributes(Wwn wwpn, Wwn vport, RM_VPortAttributes& out) const;
    RM_STATUS vportTargets(Wwn wwpn, Wwn vport, std::vector<RM_VPortTarget>& out) const;
    RM_STATUS vportMachine(Wwn wwpn, Wwn vport, RM_VirtualMachine& out) const;
    RM_STATUS vportScsi(Wwn wwpn, Wwn vport, Wwn target, HBA_UINT64 lun, const ScsiCommand& command, ScsiReply& out);

    // Names of ports and boot code, in NameCalls.cpp.

    std::uint32_t localPortCount() const;
    RM_STATUS localPort(std::uint32_t index, RM_LocalHBAInfo& out) const;
    RM_STATUS validateName(Wwn name) const;
    RM_STATUS nameCapability(Wwn wwpn, std::uint32_t& out) const;
    /// `activation` gets an RM_WwnActivation. What waits for nothing is in force at once.
    RM_STATUS changeNames(Wwn wwpn, const PortNames& names, std::uint32_t type, std::uint32_t& activation);
    RM_STATUS restoreNames(Wwn wwpn, std::uint32_t type, std::uint32_t& activation);
    RM_STATUS readNames(Wwn wwpn, std::uint32_t type, RM_WwnNames& out) const;
    RM_STATUS setBootCode(Wwn wwpn, bool enabled);
    /// Configured names come into force, also those that wait for more than a reset. Without power the volatile names
    /// are lost before. Driver parameters and priority lanes are then what was stored of them.
    void reboot(bool powerDown);

    // RM library, in DriverCalls.cpp: driver parameters and priority lanes.

    RM_STATUS driverParameters(Wwn wwpn, std::vector<RM_DriverParam>& out) const;
    RM_STATUS globalDriverParameters(std::vector<RM_DriverParam>& out) const;
    /// `text` is "name=value". RM_ERROR for what the adapter does not have, or a value out of its range.
    RM_STATUS setDriverParameter(Wwn wwpn, std::string_view text, std::uint32_t control);
    /// Without a virtual port, which is a `vport` of 0, those of the port itself.
    RM_STATUS priorityLanes(Wwn wwpn, Wwn vport, Wwn target, std::uint32_t option, std::vector<RM_OASLun>& out);
    /// A `lun` of -1 is every unit of the target.
    RM_STATUS setPriorityLane(Wwn wwpn, Wwn vport, Wwn target, std::int32_t lun, std::uint32_t state,
                              std::uint32_t option);

    // Firmware and the state of ports, in FirmwareCalls.cpp. A file that is to be verified or downloaded must have been
    // imported under the same path.

    RM_STATUS importFile(const char* path);
    RM_STATUS verifyFirmware(Wwn wwpn, const char* path);
    RM_STATUS downloadFirmware(Wwn wwpn, const char* path);
    RM_STATUS resetAdapter(Wwn wwpn);
    RM_STATUS setPortEnabled(Wwn wwpn, std::uint32_t enabled, std::uint32_t& dynamic);
    RM_STATUS setPortAttribute(Wwn wwpn, std::uint32_t id, const void* value, std::uint32_t length);

    // Diagnostics, in DiagCalls.cpp.

    RM_STATUS startTest(Wwn wwpn, TestOf test, const TestOrder& order, std::uint32_t& handle);
    /// These fill the record also for a test that runs.
    RM_STATUS testResults(Wwn wwpn, std::uint32_t handle, RM_DiagResults& out);
    RM_STATUS linkTestResults(Wwn wwpn, std::uint32_t handle, RM_DPortResults& out);
    RM_STATUS cancelTest(Wwn wwpn, std::uint32_t handle);
    RM_STATUS fcpTargets(Wwn wwpn, std::vector<RM_FcpMapping>& out) const;

    // Dumps and the firmware's trace, in DumpCalls.cpp. `ending` is that of the new file's name.

    RM_STATUS generateDump(Wwn wwpn, const char* ending);
    /// Of each port.
    RM_STATUS generateDumps(const char* ending);
    RM_STATUS dumps(Wwn wwpn, DumpFiles& out);
    RM_STATUS setDumpDirectory(Wwn wwpn, std::string_view directory);
    RM_STATUS setDumpRetention(Wwn wwpn, std::uint32_t count);
    RM_STATUS deleteDumps(Wwn wwpn);
    RM_STATUS setTraceLevel(Wwn wwpn, const TraceLevel& level);
    RM_STATUS eventLogConfig(Wwn wwpn, RM_EventLogConfig& out);
    /// Of a module that the firmware has.
    RM_STATUS setEventLogModule(Wwn wwpn, const RM_EventLogModule& module);

    // Frame tagging, in TagCalls.cpp.

    bool hasTagging() const;
    std::uint32_t tagAdapterCount() const;
    RM_STATUS openTagAdapter(const std::string& name, std::uint32_t& handle);
    void closeTagAdapter(std::uint32_t handle);
    RM_STATUS tagTable(std::uint32_t handle, std::vector<CPQFC_QosEntry>& out) const;
    RM_STATUS setTagTable(std::uint32_t handle, std::vector<CPQFC_QosEntry> table);
    RM_STATUS tagging(std::uint32_t handle, std::uint32_t& out) const;
    /// Takes 0 and 1.
    RM_STATUS setTagging(std::uint32_t handle, std::uint32_t state);
    /// Name of the adapter behind a handle; empty if there is none.
    std::string tagAdapterOf(std::uint32_t handle) const;

    // What a test sees and changes. A false result means that there is no such adapter or port.

    /// Of the HBA API, and of frame tagging.
    std::size_t openHandles() const;
    /// Name of the adapter behind a handle; empty if there is none.
    std::string adapterOf(HBA_HANDLE handle) const;
    /// Keeps a copy of the host's state, and names what differs from it; empty if nothing does.
    void remember();
    std::string difference() const;
    bool removeAdapter(const std::string& name);
    bool makeStale(const std::string& name);
    bool setPortState(Wwn wwpn, std::uint32_t state);
    /// Of the adapter behind a port, or of all adapters where there is no port; false also for an unknown parameter.
    bool setDriverParameter(std::optional<Wwn> wwpn, const std::string& name, std::uint32_t current);
    /// The lists of adapter attributes, port attributes and statistics are told apart by the attribute's number.
    bool setAttributeOf(Wwn wwpn, const Attribute& attribute);
    /// Takes the place of how the tests of the port behave, of those that run also.
    bool setDiagnostics(Wwn wwpn, const Diagnostics& diagnostics);

private:
    struct PortPlace
    {
        std::size_t adapter, port;
    };

    // These are called with the lock held.
    void index();
    const Adapter* adapterAt(HBA_HANDLE handle) const;
    const Adapter* findAdapter(Wwn wwpn) const;
    const Port* findPort(Wwn wwpn) const;
    /// What follows from the names of a scenario.
    void completeNames();
    /// For a reset of an adapter or of the host: the names that wait for that come into force. The port is found by its
    /// new name from then on.
    void activateNames(Adapter& adapter, bool isReboot);
    bool activateNames(Adapter& adapter, Port& port);
    /// After a change of what is configured: answers when it comes into force, and lets it.
    std::uint32_t settleNames(Adapter& adapter, Port& port);
    /// Whether a port, virtual port or target other than `except` has, or can get, the WWPN.
    bool isTaken(Wwn wwpn, const Port& except) const;
    /// Index in Scenario::targets of a target that is among `targets`, from a port in `state`; only an online port
    /// reaches its targets.
    std::optional<std::size_t> reach(std::uint32_t state, const std::vector<std::size_t>& targets, Wwn wwpn) const;
    /// The lanes of a port or virtual port, and the place of a target that it reaches, or why there are none.
    struct LaneTable;
    LaneTable lanesTo(Wwn wwpn, Wwn vport, Wwn target);
    void loadDriver();

    /// These take the lock, and give RM_ERROR_INVALID_WWN for a name that is not there.
    template <class Use> RM_STATUS onAdapter(Wwn wwpn, Use use) const;
    template <class Use> RM_STATUS onPort(Wwn wwpn, Use use) const;
    template <class Use> RM_STATUS onVport(Wwn wwpn, Wwn vport, Use use) const;
    /// To change what `use` gets, the adapter and the port.
    template <class Use> RM_STATUS changePort(Wwn wwpn, Use use);
    template <class Use> RM_STATUS changeDumps(Wwn wwpn, Use use);
    /// For a reset of an adapter or of the host: what the flash memory holds is what runs. Called with the lock held.
    static void activateFirmware(Adapter& adapter);
    /// A test that was started. It can be asked about after its end as well.
    struct StartedTest
    {
        Wwn wwpn;
        TestOf test;
        std::uint32_t result, cycles;
        std::uint32_t polls = 0;
        bool isCancelled = false;
        bool hasEnded = false; ///< a poll has seen the end, which longer tests of the port do not undo
    };

    // These are called with the lock held.
    std::uint32_t resultOf(const Port& port, TestOf test, const TestOrder& order) const;
    bool isRunning(const StartedTest& started) const;
    StartedTest* findTest(Wwn wwpn, std::uint32_t handle);
    bool makeRoomForTest();
    void cancelTests(const Adapter& adapter);
    template <class Record, class Fill> RM_STATUS poll(Wwn wwpn, std::uint32_t handle, Record& out, Fill fill);

    template <class Use> RM_STATUS withImported(Wwn wwpn, const char* path, Use use);
    template <class Self, class Use> static RM_STATUS onTagAdapter(Self& self, std::uint32_t handle, Use use);

    mutable std::mutex _mutex;
    Scenario _scenario;
    std::map<std::string, FirmwareFile> _imported; ///< by path
    Scenario _remembered;
    bool _libraryLoaded = false;
    HBA_HANDLE _lastHandle = 0;
    std::map<HBA_HANDLE, std::string> _handles; ///< name of the adapter
    std::uint32_t _lastTagHandle = 0;
    std::map<std::uint32_t, std::string> _tagHandles; ///< name of the adapter
    std::uint32_t _lastTest = 0;
    std::map<std::uint32_t, StartedTest> _tests; ///< by handle, the first are the oldest

    // Made from the scenario by index().
    std::unordered_map<std::string, std::size_t> _adapterByName;
    std::unordered_map<Wwn, PortPlace> _portByName;
    std::unordered_map<Wwn, std::size_t> _targetByName;
    /// For each port of the host, for each of its targets, the names of the units.
    std::unordered_map<Wwn, std::vector<std::vector<std::string>>> _osDeviceNames;
};

template <class Use> RM_STATUS SimulatedHost::changePort(Wwn wwpn, Use use)
{
    std::lock_guard lock(_mutex);
    const auto place = _portByName.find(wwpn);
    if (place == _portByName.end())
        return RM_ERROR_INVALID_WWN;
    Adapter& adapter = _scenario.adapters[place->second.adapter];
    return use(adapter, adapter.ports[place->second.port]);
}

/// Puts the loopback plug or the cable into the port, as its diagnostics say.
void usePlug(Port& port);

/// Copies `text` into a field, cut to leave room for the zero byte.
template <std::size_t Size> void setText(char (&field)[Size], const std::string& text)
{
    field[text.copy(field, Size - 1)] = '\0';
}

} // namespace tvrsim
