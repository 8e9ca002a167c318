#include "services/TagCalls.h"

#include "agent/MethodCall.h"
#include "device/Bindings.h"
#include "device/FreePart.h"
#include "services/TagTable.h"

#include <algorithm>
#include <cstddef>
#include <cstring>
#include <new>

namespace cimple
{

namespace
{

constexpr MethodEnd noAdapter = {0x8000}, noMemory = {0x8000}, notRead = {0x7FFF};

/// A table as the library has it: the number of entries, and the entries behind it.
class TagBlock
{
public:
    /// Logs what is missing, and ends the method, without memory.
    TagBlock(std::size_t entries, const LogText& missing)
    try : _bytes(std::max(sizeof(CPQFC_QosTable), offsetof(CPQFC_QosTable, entry) + entries * sizeof(CPQFC_QosEntry)))
    {
        table()->count = static_cast<std::uint32_t>(entries);
    }
    catch (const std::bad_alloc&)
    {
        MethodCall::end(missing, noMemory);
    }

    CPQFC_QosTable* table() { return reinterpret_cast<CPQFC_QosTable*>(_bytes.data()); }
    std::byte* entries() { return _bytes.data() + offsetof(CPQFC_QosTable, entry); }

private:
    std::vector<std::byte> _bytes;
};

std::uint32_t wordAt(const std::uint8_t* bytes)
{
    return static_cast<std::uint32_t>(bytes[0] << 24 | bytes[1] << 16 | bytes[2] << 8 | bytes[3]);
}

void printEntries(const std::vector<CPQFC_QosEntry>& entries)
{
    TVR_LOG(TVR_DBG, "PrintQoSEntry");
    TVR_LOG(TVR_DBG, "Number Of Entries: %d", static_cast<int>(entries.size()));
    for (const CPQFC_QosEntry& entry : entries)
    {
        const auto& source = entry.src_wwpn.wwn;
        const auto& target = entry.tgt_wwpn.wwn;
        TVR_LOG(TVR_DBG, "src_wwpn:%X%08X", wordAt(source), wordAt(source + 4));
        TVR_LOG(TVR_DBG, "tgt_wwpn:%X%08X", wordAt(target), wordAt(target + 4));
        TVR_LOG(TVR_DBG, "tag:%d", entry.tag);
    }
}

} // namespace

TagAdapter::TagAdapter(const std::string& name)
{
    TVR_LOG(TVR_DBG, "TVRHBA_FCTagService_Provider::Successfully got AdapterName,%s", name.c_str());
    if (CPQFC_GetNumberOfAdapters() == 0)
        MethodCall::end({TVR_DBG, "TVRHBA_FCTagService_Provider::CPQFC_GetNumberOfAdapters()- No Adapters found"},
                        noAdapter);
    if (CPQFC_OpenAdapter(name.c_str(), &_handle) != RM_OK)
        MethodCall::end({TVR_DBG, "Failed to Open Adapter, Skipping ..."}, noAdapter);
}

TagAdapter::~TagAdapter()
{
    freePart(TVR_ERR, "CPQFC_CloseAdapter failed", [&] { CPQFC_CloseAdapter(_handle); });
}

RM_STATUS TagAdapter::setGlobalFlag(std::uint32_t state) const
{
    const RM_STATUS status = CPQFC_QoSSetGlobalFlag(_handle, state);
    if (status == RM_OK)
        TVR_LOG(TVR_DBG, "TVRHBA_FCTagService_Provider::SetGlobalFlag Successful");
    else
        TVR_LOG(TVR_DBG, "TVRHBA_FCTagService_Provider::CPQFC_QoSSetGlobalFlag Failed with Error :%d", status);
    return status;
}

RM_STATUS TagAdapter::getGlobalFlag(std::uint32_t& state) const
{
    std::uint32_t answer = 0;
    const RM_STATUS status = CPQFC_QoSGetGlobalFlag(_handle, &answer);
    if (status == RM_OK)
        state = answer;
    else
        TVR_LOG(TVR_DBG, "TVRHBA_FCTagService_Provider::CPQFC_QoSGetGlobalFlag Failed with Error :%d", status);
    return status;
}

RM_STATUS TagAdapter::setTable(const std::vector<CPQFC_QosEntry>& entries) const
{
    TagBlock block(entries.size(), {TVR_DBG, "SetConfigTable::Memory Allocation Failed "});
    if (!entries.empty())
        std::memcpy(block.entries(), entries.data(), entries.size() * sizeof(CPQFC_QosEntry));
    const RM_STATUS status = CPQFC_QoSSetConfig(_handle, block.table());
    if (status == RM_OK)
        TVR_LOG(TVR_DBG, "TVRHBA_FCTagService_Provider::CPQFC_QoSSetConfig is success");
    else
        TVR_LOG(TVR_DBG, "TVRHBA_FCTagService_Provider::CPQFC_QoSSetConfig failed with an error :%d", status);
    return status;
}

std::vector<CPQFC_QosEntry> TagAdapter::table() const
{
    const auto read = [this](CPQFC_QosTable* table)
    {
        if (const RM_STATUS status = CPQFC_QoSGetConfig(_handle, table); status != RM_OK)
        {
            TVR_LOG(TVR_DBG, "TVRHBA_FCTagService_Provider::CPQFC_QoSGetConfig failed with an error :%d", status);
            throw notRead;
        }
        return static_cast<std::size_t>(table->count);
    };
    constexpr LogText missing = {TVR_DBG, "GetConfigTable: Memory allocation failed"};

    CPQFC_QosTable header{};
    const std::size_t room = std::min(read(&header), maximumTagEntries);
    TagBlock block(room, missing);
    try
    {
        std::vector<CPQFC_QosEntry> entries(std::min(read(block.table()), room));
        if (!entries.empty())
            std::memcpy(entries.data(), block.entries(), entries.size() * sizeof(CPQFC_QosEntry));
        printEntries(entries);
        return entries;
    }
    catch (const std::bad_alloc&)
    {
        MethodCall::end(missing, noMemory);
    }
}

} // namespace cimple
