#include "simulator/EntryPoints.h"

#include <algorithm>

namespace tvrsim
{

namespace
{

/// Where a function of the table is found, and under which name.
enum class Family : std::uint8_t
{
    dual,   ///< LRM_ and the name in the local library, RM_ and the name in the fallback library
    rmOnly, ///< RM_ and the name in both
    hba,    ///< HBA_ and the name in the HBA API library and the fallback library
    tag,    ///< CPQFC_ and the name in the library for frame tagging
    tagEnd, ///< the same, and in the fallback library
};

struct Row
{
    const char* name;
    Family family;
    unsigned effects;
};

constexpr unsigned statusOnly = 0;
constexpr unsigned numberOut = bit(Hostile::allOnes);
constexpr unsigned handleOut = numberOut | bit(Hostile::zeroHandle);
constexpr unsigned textOut = bit(Hostile::unterminatedText) | truncatable;
constexpr unsigned recordOut = bit(Hostile::allOnes) | truncatable;
constexpr unsigned textRecordOut = recordOut | bit(Hostile::unterminatedText);
constexpr unsigned countedRecordOut = textRecordOut | bit(Hostile::hugeCount);
constexpr unsigned listOut = bit(Hostile::hugeCount) | bit(Hostile::allOnes) | truncatable;
constexpr unsigned vpdOut = recordOut | bit(Hostile::hugeLength);
constexpr unsigned scsiOut = bit(Hostile::hugeLength) | bit(Hostile::allOnes) | truncatable;
constexpr unsigned attributesOut =
    bit(Hostile::hugeLength) | bit(Hostile::unterminatedText) | bit(Hostile::allOnes) | truncatable;

using enum Family;

constexpr Row rows[] = {
    {"ChangeWWN", dual, numberOut},
    {"DeleteDumpFiles", dual, statusOnly},
    {"DiagBeacon", dual, statusOnly},
    {"DiagBeaconState", dual, numberOut},
    {"DiagCancelDiagnostic", dual, statusOnly},
    {"DiagDPortTest", dual, handleOut},
    {"DiagEchoTestV2", dual, handleOut},
    {"DiagGetLoadListParams", dual, countedRecordOut},
    {"DiagGetResults", dual, recordOut},
    {"DiagGetResultsDPort", dual, recordOut | bit(Hostile::hugeCount)},
    {"DiagLoopBackTestV3", dual, handleOut},
    {"DiagPciLoopBackTestV2", dual, handleOut},
    {"DiagReadPCIRegistersV2", dual, recordOut},
    {"DiagRunPOST", dual, handleOut},
    {"DownloadFirmware", dual, statusOnly},
    {"ExitLib", dual, statusOnly},
    {"GenerateCoreDump", dual, statusOnly},
    {"GenerateDump", dual, statusOnly},
    {"GenerateEfdDump", dual, statusOnly},
    {"GetDriverParams", dual, listOut | bit(Hostile::unterminatedText)},
    {"GetDriverParamsGlobal", dual, listOut | bit(Hostile::unterminatedText)},
    {"GetDriverType", dual, numberOut},
    {"GetDumpDirectoryA", dual, textOut},
    {"GetDumpFileNames", dual, listOut | bit(Hostile::unterminatedText)},
    {"GetDumpRetentionCount", dual, numberOut},
    {"GetFcpTargetMapping", dual, listOut},
    {"GetHBAAttributes", dual, attributesOut},
    {"GetHBAFeature", dual, numberOut},
    {"GetHBAFeatureList", dual, listOut},
    {"GetLunList", dual, listOut},
    {"GetOASLunList", dual, listOut},
    {"GetPortAttributes", dual, attributesOut},
    {"GetPortStatistics", dual, attributesOut},
    {"GetQoS", dual, recordOut},
    {"GetServerAttributes", dual, attributesOut},
    {"GetSffData", dual, textRecordOut},
    {"GetVMFromVPort", dual, textRecordOut},
    {"GetVPD", dual, vpdOut},
    {"GetWWNCapability", dual, numberOut},
    {"Get_BE_EventLogConfigDataAll", dual, countedRecordOut},
    {"InitLib", dual, statusOnly},
    {"ReadWWN", dual, recordOut},
    {"ResetHBA", dual, statusOnly},
    {"RestoreWWN", dual, numberOut},
    {"RetrieveFATDump", dual, statusOnly},
    {"RetrieveFATDump2", dual, statusOnly},
    {"ScsiInquiry", dual, scsiOut},
    {"SetAdapterAttribute", dual, statusOnly},
    {"SetBootBiosState", dual, statusOnly},
    {"SetDebugTraces", dual, statusOnly},
    {"SetDriverParam", dual, statusOnly},
    {"SetDumpDirectory", dual, statusOnly},
    {"SetDumpRetentionCount", dual, statusOnly},
    {"SetOASLunState", dual, statusOnly},
    {"SetPortEnabled", dual, numberOut},
    {"Set_BE_EventLogConfigDataModule", dual, statusOnly},
    {"Set_BE_EventLogTraceLevel", dual, statusOnly},
    {"VPGetAttributes", dual, textRecordOut},
    {"VPList", dual, listOut},
    {"VPListTargets", dual, listOut},
    {"VpScsiInquiry", dual, scsiOut},
    {"VpScsiReadCapacity", dual, scsiOut},
    {"VpScsiReportLUNs", dual, scsiOut},

    {"GetAttributeValue", rmOnly, bit(Hostile::hugeLength)},
    {"GetLocalHBAInfo", rmOnly, textRecordOut},
    {"GetNumberOfLocalAdapters", rmOnly, bit(Hostile::hugeCount)},
    {"GetVersion", rmOnly, textOut},
    {"ImportHBAFileA", rmOnly, statusOnly},
    {"IsLocalHBA", rmOnly, numberOut},
    {"MiliVersion", rmOnly, textOut},
    {"StatusString", rmOnly, textOut},
    {"ValidateWwn", rmOnly, statusOnly},
    {"VerifyFirmwareA", rmOnly, statusOnly},

    {"CloseAdapter", hba, statusOnly},
    {"FreeLibrary", hba, statusOnly},
    {"GetAdapterAttributes", hba, countedRecordOut},
    {"GetAdapterName", hba, textOut},
    {"GetAdapterPortAttributes", hba, countedRecordOut},
    {"GetFcpTargetMapping", hba, listOut | bit(Hostile::unterminatedText)},
    {"GetNumberOfAdapters", hba, bit(Hostile::hugeCount)},
    {"GetVersion", hba, statusOnly},
    {"LoadLibrary", hba, statusOnly},
    {"OpenAdapter", hba, bit(Hostile::zeroHandle)},
    {"RefreshInformation", hba, statusOnly},
    {"SendReadCapacity", hba, scsiOut},
    {"SendScsiInquiry", hba, scsiOut},

    {"CloseAdapter", tagEnd, statusOnly},
    {"GetNumberOfAdapters", tag, bit(Hostile::hugeCount)},
    {"OpenAdapter", tag, numberOut},
    {"QoSGetConfig", tag, listOut},
    {"QoSGetGlobalFlag", tag, numberOut},
    {"QoSSetConfig", tag, statusOnly},
    {"QoSSetGlobalFlag", tag, statusOnly},
};

/// Prefix of the family's names in a library; null where the library does not export them.
const char* prefixIn(Family family, Library library)
{
    switch (family)
    {
    case dual:
        return library == Library::local ? "LRM_" : library == Library::fallback ? "RM_" : nullptr;
    case rmOnly:
        return library == Library::local || library == Library::fallback ? "RM_" : nullptr;
    case hba:
        return library == Library::hbaApi || library == Library::fallback ? "HBA_" : nullptr;
    case tag:
        return library == Library::tagging ? "CPQFC_" : nullptr;
    case tagEnd:
        return library == Library::tagging || library == Library::fallback ? "CPQFC_" : nullptr;
    }
    return nullptr;
}

constexpr Library libraries[] = {Library::local, Library::fallback, Library::hbaApi, Library::tagging};

} // namespace

std::vector<std::string> exportedNames(Library library)
{
    std::vector<std::string> names;
    for (const Row& row : rows)
        if (const char* prefix = prefixIn(row.family, library))
            names.push_back(std::string(prefix) + row.name);
    std::ranges::sort(names);
    return names;
}

bool findEntryPoint(std::string_view function, unsigned& effects)
{
    for (const Row& row : rows)
        for (Library library : libraries)
            if (const char* prefix = prefixIn(row.family, library);
                prefix && std::string(prefix) + row.name == function)
            {
                effects = row.effects;
                return true;
            }
    return false;
}

} // namespace tvrsim
