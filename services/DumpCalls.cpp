#include "services/DumpCalls.h"

#include "agent/Build.h"
#include "device/Bindings.h"
#include "device/ForeignText.h"
#include "device/TVR_MethodWrapper.h"

#include <algorithm>
#include <cstring>

namespace cimple
{

namespace
{

constexpr RM_STATUS nullArgument = 4;

/// For the end of a call: logs its failure, and what the library says of it.
RM_STATUS logged(RM_STATUS status, const LogText& failure)
{
    if (status != RM_OK)
    {
        failure.log(static_cast<std::uint32_t>(status));
        TVR_MethodWrapper::logStatus(status);
    }
    return status;
}

} // namespace

RM_STATUS tvrcimDumpDiagnostic(const HBA_WWN& wwpn, std::int32_t option)
{
    return logged(option == wholeDump ? LRM_GenerateDump(0, 0, wwpn) : LRM_GenerateEfdDump(wwpn, option, 0),
                  {TVR_DBG, "Failed to generate the dump file, exited with error code %d"});
}

// --- where dumps are kept, and how many

RM_STATUS tvrcimGetDumpDirectory(const HBA_WWN& wwpn, std::string* directory)
{
    char buffer[RM_DUMP_PATH_SIZE] = {};
    const RM_STATUS status = logged(LRM_GetDumpDirectoryA(wwpn, buffer, sizeof buffer),
                                    {TVR_DBG, "Failed to get the Dump directory, returned with error code %d"});
    if (status == RM_OK)
        *directory = foreignText(buffer);
    return status;
}

RM_STATUS tvrcimSetDumpDirectory(const HBA_WWN& wwpn, const char* directory)
{
    const RM_STATUS status = LRM_SetDumpDirectory(wwpn, directory);
    switch (status)
    {
    case RM_OK:
        TVR_LOG(TVR_DBG, "tvrcimSetDumpDirectory: Success");
        return status;
    case RM_ERROR_DIRECTORY_NOT_OPENED:
        TVR_LOG(TVR_DBG,
                "ERROR: tvrcimSetDumpDirectory: RM_SetDumpDirectory call failed. The specified directory "
                "[' / vmfs / volumes / %s'] cannot be opened",
                directory);
        break;
    case RM_ERROR_CONFIGURATION_NOT_OPENED:
    case RM_ERROR_CONFIGURATION_NOT_READ:
        TVR_LOG(TVR_DBG, "ERROR: tvrcimSetDumpDirectory: RM_SetDumpDirectory call failed. The configuration file could "
                         "not be opened");
        break;
    default:
        TVR_LOG(TVR_DBG, "ERROR: tvrcimSetDumpDirectory: RM_SetDumpDirectory call failed with error code : %d \n",
                status);
    }
    return logged(status, {});
}

RM_STATUS tvrcimGetRetentionCount(const HBA_WWN& wwpn, std::uint32_t* count)
{
    std::uint32_t kept = 0;
    const RM_STATUS status = logged(LRM_GetDumpRetentionCount(wwpn, &kept),
                                    {TVR_DBG, "Failed to get the retention count, returned with error code %d"});
    if (status == RM_OK)
        *count = kept;
    return status;
}

RM_STATUS tvrcimSetRetentionCount(const HBA_WWN& wwpn, std::uint32_t count)
{
    constexpr std::uint32_t least = 1;
    constexpr std::uint32_t most = RM_MAX_RETENTION_COUNT;
    if (count < least || count > most)
    {
        TVR_LOG(TVR_DBG, "ERROR: RetentionCount value must be in-between %d and %d", static_cast<int>(least),
                static_cast<int>(most));
        return RM_ERROR;
    }
    return logged(LRM_SetDumpRetentionCount(wwpn, count),
                  {TVR_DBG, "Failed to set the retention count, exited with error code %d"});
}

// --- the files

RM_STATUS tvrcimDeleteDumpFiles(const HBA_WWN& wwpn)
{
    return logged(LRM_DeleteDumpFiles(wwpn), {TVR_DBG, "Failed to delete the Dump files, exited with error code %d"});
}

RM_STATUS GetDumpFileNames(const HBA_WWN& wwpn, RM_DumpFileNames* names)
{
    if (!names)
    {
        TVR_LOG(TVR_DBG, "FileEntriesPointer NULL");
        return nullArgument;
    }
    return logged(LRM_GetDumpFileNames(wwpn, names), {});
}

namespace
{

/// An RM_DumpFileNames with room for a number of entries.
class NamesBlock
{
public:
    explicit NamesBlock(std::uint32_t room)
        : _room(room), _words((offsetof(RM_DumpFileNames, entry) + room * sizeof(RM_DumpFileName)) / sizeof _words[0])
    {
        _words[0] = room;
    }

    RM_STATUS read(const HBA_WWN& wwpn)
    {
        return GetDumpFileNames(wwpn, reinterpret_cast<RM_DumpFileNames*>(_words.data()));
    }
    /// What the library says.
    std::uint32_t count() const { return _words[0]; }
    std::vector<std::string> names() const
    {
        std::vector<std::string> names;
        const char* at = reinterpret_cast<const char*>(_words.data()) + offsetof(RM_DumpFileNames, entry);
        for (std::uint32_t left = std::min(count(), _room); left > 0; --left, at += sizeof(RM_DumpFileName))
            names.emplace_back(at, strnlen(at, sizeof(RM_DumpFileName)));
        return names;
    }

private:
    std::uint32_t _room;
    std::vector<std::uint32_t> _words;
};

} // namespace

std::optional<DumpFileList> readDumpFileNames(const HBA_WWN& wwpn)
{
    constexpr std::uint32_t usualRoom = 4;
    constexpr std::uint32_t mostRoom = 4096; // whatever number the library tells
    return unlessOutOfMemory(
        [&]() -> std::optional<DumpFileList>
        {
            std::optional<NamesBlock> block(usualRoom);
            TVR_LOG(TVR_DBG, "Calling the Get Dump filenames method");
            RM_STATUS status = block->read(wwpn);
            if (status == RM_ERROR_BUFFER_TOO_SMALL)
            {
                block.emplace(std::min(block->count(), mostRoom));
                status = block->read(wwpn);
            }
            return DumpFileList{status, status == RM_OK ? block->names() : std::vector<std::string>()};
        });
}

// --- core dumps and the firmware's trace

namespace
{

RM_STATUS generateCoreDump(const HBA_WWN& wwpn, const char* options)
{
    if (TVR_MethodWrapper::Validatewwpn(wwpn) != 0)
    {
        TVR_LOG(TVR_DBG, "INVALID wwpn");
        return RM_ERROR;
    }
    if (!options)
        return nullArgument;
    TVR_LOG(TVR_DBG, "Options %s", options);
    std::uint32_t value = 0;
    if (LRM_GetHBAFeature(wwpn, RM_FEATURE_CORE_DUMP, &value) == RM_OK && value != 1)
        return RM_ERROR_FIRMWARE_LACKS;
    const RM_STATUS status = LRM_GenerateCoreDump(wwpn, options);
    return status == RM_ERROR_NO_RESET
               ? logged(status, {})
               : logged(status, {TVR_DBG, "Failed to generate core dump, exited with error code %d"});
}

/// Fails for a null and for a text that the field, which keeps a zero byte at its end, has no room for.
template <std::size_t Size> bool fits(const char* text, const char (&)[Size])
{
    return text && strnlen(text, Size) < Size;
}

} // namespace

RM_STATUS tvrcimGetCoreDump(const HBA_WWN& wwpn, const char* options)
{
    const RM_STATUS status = generateCoreDump(wwpn, options);
    TVR_LOG(TVR_DBG, "Exiting TVR_MethodWrapper::tvrcimGetCoreDump");
    return status;
}

RM_STATUS tvrcimRetrieveFATDump(bool ofPort, const HBA_WWN& wwpn)
{
    TVR_LOG(TVR_DBG, "Inside tvrcimRetrieveFATDump ");
    const RM_STATUS status = logged(ofPort ? LRM_RetrieveFATDump2(wwpn) : LRM_RetrieveFATDump(), {});
    TVR_LOG(TVR_DBG, "Exiting tvrcimRetrieveFATDump \n");
    return status;
}

RM_STATUS tvrcimSetAdvancedDumpTraceLevel(const HBA_WWN& wwpn, std::uint32_t level, const std::uint8_t (&bytes)[4])
{
    return logged(LRM_Set_BE_EventLogTraceLevel(wwpn, level, bytes[0], bytes[1], bytes[2], bytes[3]),
                  {TVR_DBG, "Failed to set the Advanced Dump TraceLevel, returned with error code %d"});
}

RM_STATUS GetExtFATAdvancedData(const HBA_WWN& wwpn, std::unique_ptr<RM_EventLogConfig>* config)
{
    std::unique_ptr<RM_EventLogConfig> read(new (std::nothrow) RM_EventLogConfig{});
    if (!read)
    {
        TVR_LOG(TVR_CRIT, "ERROR: malloc failed for RM_Get_BE_EventLogConfigDataAll data");
        return RM_ERROR;
    }
    const RM_STATUS status = LRM_Get_BE_EventLogConfigDataAll(wwpn, read.get());
    TVR_LOG(TVR_DBG, "Returned from RM call: %d, %d, %d", status, static_cast<int>(read->count),
            static_cast<int>(read->room));
    if (status != RM_OK || read->count > read->room)
    {
        TVR_LOG(TVR_DBG,
                "RM_Get_BE_EventLogConfigDataAll call failed, with error code : %d, Invalid number of entries in FAT "
                "data : %d",
                status, static_cast<int>(read->count));
        return logged(status, {});
    }
    read->count = std::min<std::uint32_t>(read->count, RM_MAX_EVENT_LOG_MODULES);
    *config = std::move(read);
    return status;
}

RM_STATUS SetExtFATAdvancedData(const HBA_WWN& wwpn, const char* module, const char* level, std::uint32_t portMask,
                                std::uint32_t functionMask, std::uint32_t value)
{
    constexpr std::uint32_t portMasks = 16;
    constexpr std::uint32_t functionMasks = 256;
    RM_EventLogModule record{};
    if (!fits(module, record.module) || !fits(level, record.level) || value == 0 || portMask >= portMasks ||
        functionMask >= functionMasks)
    {
        TVR_LOG(TVR_DBG, "Invalid Module Parameter arguments, Valid values are portMask [1-15], FunctionMask[0-255]");
        return RM_ERROR;
    }
    std::strcpy(record.module, module);
    std::strcpy(record.level, level);
    record.portMask = portMask;
    record.functionMask = functionMask;
    record.value = value;
    return logged(LRM_Set_BE_EventLogConfigDataModule(wwpn, &record),
                  {TVR_DBG, "Failed to set the advanced settings, returned with error code %d"});
}

} // namespace cimple
