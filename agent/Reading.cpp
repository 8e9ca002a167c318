#include "agent/Reading.h"

#include "foundation/Log.h"

#include <optional>

namespace cimple
{

void Reading::copy(const RefreshStage& stage)
{
    std::optional<std::size_t> refused = _cached.copy_to(_local, _selection);
    if (!refused && _second)
        refused = _second->copy_to(_local, _selection);
    if (refused)
        TVR_LOG(TVR_CRIT, "Insert failed for %zu", *refused);
    _copied = refused ? Copied::refused : stage.incomplete ? Copied::incomplete : Copied::all;
}

void Reading::deliver(const char* providerName, Instance_Handler handler, void* client)
{
    if (_copied != Copied::refused)
    {
        _local.give_away(handler, client);
        TVR_LOG(TVR_DBG, "%s::enum_instances()", providerName);
    }
    if (_copied != Copied::all)
        cutShort(handler, client);
}

} // namespace cimple
