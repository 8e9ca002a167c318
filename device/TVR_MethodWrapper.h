// The one class through which the rest of the program uses the RM library.
#pragma once

#include "device/ProcessSemaphore.h"
#include "device/RmApi.h"
#include "device/ScsiCommand.h"
#include "device/Vpd.h"
#include "foundation/CommonHelpers.h"

#include <atomic>
#include <memory>
#include <string>
#include <sys/types.h>
#include <vector>

namespace cimple
{

/// A logical unit of a target, as the unit's Inquiry describes it.
struct TargetLun
{
    RM_Lun lun;
    StandardInquiry inquiry;
};

struct VPortLunAttributes
{
    StandardInquiry inquiry = {};
    ReadCapacity capacity = {};           ///< zero without one
    std::string serialNumber = "Unknown"; ///< page 0x80
    DesignatorRecord designator{};        ///< first one of page 0x83, zero without one
};

/// The agent owns one object of it, whose life spans the use of the RM library; the functions are static. They
/// report failures by their result and never throw. A plain name is 16 hexadecimal digits, as in a DeviceID.
///
/// The functions that take a plain name return 1 if it is none, and otherwise the library's status. A null output
/// is a failure of 1. An output is changed on success only.
class TVR_MethodWrapper
{
public:
    /// Initialises the RM library once in the process; a second object waits until that is done. Throws
    /// std::exception if the library refuses, and what the library throws.
    TVR_MethodWrapper();
    /// In a child of a fork it lets go of the parent's object without a word.
    ~TVR_MethodWrapper();
    TVR_MethodWrapper(const TVR_MethodWrapper&) = delete;
    TVR_MethodWrapper& operator=(const TVR_MethodWrapper&) = delete;

    // Names.

    static constexpr std::size_t hbaNameLength = 23;

    /// From a plain name, with or without an opening quote, to pairs with colons between. `out` has room for 24
    /// bytes; a shorter input ends in zeros. The characters are not checked. 0 or 1.
    static int Id2HBAName(char* out, const char* deviceId);
    /// From pairs of digits with a colon or a blank between. 0 or 1.
    static int str2HBAName(HBA_WWN* out, const char* text);
    /// From a plain name. True on success.
    static bool string2HBAName(HBA_WWN* out, const std::string& text);
    /// Both steps from a plain name, with the log line of the one that failed. 0 or 1.
    static int idToWwn(HBA_WWN* out, const char* deviceId);
    /// Pairs of upper-case digits with colons between.
    static std::string hbaNameToString(const HBA_WWN& wwn);

    // Status and checks.

    static void logStatus(const RM_STATUS& status);
    /// 0 if the port is one of this host, else 1.
    static int Validatewwpn(const HBA_WWN& wwpn);
    static bool IsKestorCNA(const HBA_WWN& wwpn);

    // Queries.

    static RM_STATUS GetMILILibVersion(std::string* version);
    static RM_STATUS GetLibraryVersion(std::string* version);
    static RM_STATUS SetMILITraceLevel(std::uint32_t level);
    static RM_STATUS GetHBAFeatureList(const HBA_WWN& wwpn, std::vector<RM_Feature>* features);
    static RM_STATUS GetQosInfo(const HBA_WWN& wwpn, RM_QosInfo* info);
    /// Vital product data of a port.
    static RM_STATUS GetVPD(const char* deviceId, std::vector<VpdField>* fields);
    /// Name of the host's operating system: at most 40 characters and a zero byte. 8 if there is no memory.
    static RM_STATUS getTargetOS_info(const char* deviceId, char* out);
    /// Logical units of a target behind a port.
    static RM_STATUS tvrcimGetTargetMapping(const char* deviceId, const char* targetId, std::vector<TargetLun>* luns);

    /// Value of LocationIndicator: 2 for on, 3 for off, 4 where there is no beacon, 0 if the library fails; a port
    /// whose state is neither leaves it. 0, or 32968 for a null output or a wrong name.
    static std::uint32_t GetBeaconState(const char* deviceId, std::uint16_t* value);
    /// `value` is 2 for on or 3 for off. 32968 for any other, else 0, whatever the library says.
    static std::uint32_t SetBeaconState(const HBA_WWN& wwpn, std::uint16_t value);
    /// Restarts the firmware behind a port.
    static RM_STATUS tvrcimReset(const HBA_WWN& wwpn);
    /// Units of a target that a port, or the virtual port `vportId` of it, may serve with priority. Null stands for the
    /// port itself. `option` is an RM_LaneOption.
    static RM_STATUS GetOASLunList(const char* deviceId, const char* targetId, const char* vportId,
                                   std::uint32_t option, std::vector<RM_OASLun>* luns);

    static RM_STATUS tvrcimGetDigitalDiagnosticsData(const char* deviceId, std::unique_ptr<RM_SffData>& data);
    /// Programs in the flash memory behind a port, at most RM_MAX_FLASH_REGIONS: what the library's list has room for
    /// if its count is none. Throws std::bad_alloc.
    static RM_STATUS GetFlashContents(const char* deviceId, std::vector<RM_FlashRegion>& regions);

    // Driver parameters.

    /// Those of the adapter behind a port; without a name those of the driver for all adapters.
    static RM_STATUS tvrcimGetDriverParam(const char* deviceId, std::vector<RM_DriverParam>* parameters);

    // Virtual ports.

    static RM_STATUS ListVPorts(const char* deviceId, std::vector<RM_VPortEntry>* vports);
    static RM_STATUS ListVPortAttributes(const char* deviceId, const char* vportId, RM_VPortAttributes* attributes);
    static RM_STATUS ListVPortTargets(const char* deviceId, const char* vportId, std::vector<RM_VPortTarget>* targets);
    /// LUN fields as RM_VpScsiInquiry takes them.
    static RM_STATUS ListVPortLuns(const char* deviceId, const char* vportId, const char* targetId,
                                   std::vector<HBA_UINT64>* luns);
    static RM_STATUS VPortLunAttr(const char* deviceId, const char* vportId, const char* targetId, HBA_UINT64 lun,
                                  VPortLunAttributes* attributes);
    static RM_STATUS ListVMfromVPort(const char* deviceId, const char* vportId, RM_VirtualMachine* machine);

    /// 1 once an object of this process has run the library's initialisation.
    static std::atomic<int> initOwner;

private:
    void initialiseLibrary();
    void closeSemaphores() noexcept;

    const pid_t pid;
    const std::string initSemName;
    const std::string doneSemName;
    std::shared_ptr<ProcessSemaphore> initSem; ///< one for all objects of the process
    std::unique_ptr<ProcessSemaphore> doneSem; ///< a mark that this object ran the initialisation; nothing waits on it
};

} // namespace cimple
