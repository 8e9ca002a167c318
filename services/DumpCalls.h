// Dumps of an adapter port and the trace of its firmware, through the RM library.
//
// All log what fails, and what the library says of it.
#pragma once

#include "device/RmApi.h"

#include <cstdint>
#include <memory>
#include <optional>
#include <string>
#include <vector>

namespace cimple
{

/// Option of tvrcimDumpDiagnostic for a dump of everything.
inline constexpr std::int32_t wholeDump = -1;

RM_STATUS tvrcimDumpDiagnostic(const HBA_WWN& wwpn, std::int32_t option);
/// `directory` stays on a failure. Throws std::bad_alloc.
RM_STATUS tvrcimGetDumpDirectory(const HBA_WWN& wwpn, std::string* directory);
RM_STATUS tvrcimSetDumpDirectory(const HBA_WWN& wwpn, const char* directory);
/// `count` stays on a failure.
RM_STATUS tvrcimGetRetentionCount(const HBA_WWN& wwpn, std::uint32_t* count);
/// 1 without a call of the library for a count that is not from 1 to 20.
RM_STATUS tvrcimSetRetentionCount(const HBA_WWN& wwpn, std::uint32_t count);
RM_STATUS tvrcimDeleteDumpFiles(const HBA_WWN& wwpn);

/// `names` begins with its room in entries. 4 for a null.
RM_STATUS GetDumpFileNames(const HBA_WWN& wwpn, RM_DumpFileNames* names);

struct DumpFileList
{
    RM_STATUS status;
    std::vector<std::string> names;
};
/// The names of all dump files, by a second call where the first has too little room; nothing if there is no memory for
/// them.
std::optional<DumpFileList> readDumpFileNames(const HBA_WWN& wwpn);

/// 251 where the firmware cannot make one. An adapter that does not tell is asked for it all the same. 4 for a null, 1
/// for a port that is not of this host.
RM_STATUS tvrcimGetCoreDump(const HBA_WWN& wwpn, const char* options);
/// Of the one port, or, without `ofPort`, of all adapters.
RM_STATUS tvrcimRetrieveFATDump(bool ofPort, const HBA_WWN& wwpn);
RM_STATUS tvrcimSetAdvancedDumpTraceLevel(const HBA_WWN& wwpn, std::uint32_t level, const std::uint8_t (&bytes)[4]);
/// What the firmware traces; its count is within its entries. `config` stays null where the status is not 0, or the
/// library tells of more entries than it has room for. 1 if there is no memory.
RM_STATUS GetExtFATAdvancedData(const HBA_WWN& wwpn, std::unique_ptr<RM_EventLogConfig>* config);
/// 1 without a call of the library for a null or a text that the record has no room for, a `value` of 0, a `portMask`
/// above 15 or a `functionMask` above 255.
RM_STATUS SetExtFATAdvancedData(const HBA_WWN& wwpn, const char* module, const char* level, std::uint32_t portMask,
                                std::uint32_t functionMask, std::uint32_t value);

} // namespace cimple
