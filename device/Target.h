// A logical unit behind a port, as the target mapping and the unit's own answers describe it.
#pragma once

#include "device/RmApi.h"
#include "foundation/CommonHelpers.h"

#include <cstdint>
#include <string>

namespace cimple
{

class HbaAdapter;

class Target
{
public:
    /// Sends the unit three Inquiries and a Read Capacity through the adapter named `adapterName`. What the unit
    /// does not answer stays "Unknown" or 0. Throws std::exception if the adapter cannot be opened.
    Target(const std::string& adapterName, const HBA_FCPSCSIENTRY& entry);
    Target(const Target&) = delete;
    Target& operator=(const Target&) = delete;
    virtual ~Target() = default;

    std::uint32_t fcId;
    std::string nodeWWN; ///< 16 upper-case hexadecimal digits
    std::string portWWN;
    std::uint64_t fcpLun;
    std::string osDeviceName;
    std::uint32_t scsiBusNumber;
    std::uint32_t scsiTargetNumber;
    std::uint32_t scsiOSLun;
    std::uint64_t blockLength = 0; ///< bytes
    std::uint64_t lastLba = 0;
    std::uint32_t deviceType = 0; ///< SCSI peripheral device type
    std::string vendor;
    std::string product;
    std::string revision;
    std::string serialNumber;
    DesignatorRecord designator{}; ///< first designator of page 0x83, zero without one

private:
    void copyFields(const HBA_FCPSCSIENTRY& entry);
    void readStandardInquiry(const HbaAdapter& adapter, const HBA_FCPID& unit);
    void readSerialNumber(const HbaAdapter& adapter, const HBA_FCPID& unit);
    void readDesignator(const HbaAdapter& adapter, const HBA_FCPID& unit);
    void readCapacity(const HbaAdapter& adapter, const HBA_FCPID& unit);
};

} // namespace cimple
