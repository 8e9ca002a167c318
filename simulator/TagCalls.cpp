// The simulated host through the calls for frame tagging.
#include "simulator/SimulatedHost.h"

namespace tvrsim
{

bool SimulatedHost::hasTagging() const
{
    std::lock_guard lock(_mutex);
    return _scenario.hasTagging;
}

std::uint32_t SimulatedHost::tagAdapterCount() const
{
    std::lock_guard lock(_mutex);
    return static_cast<std::uint32_t>(_scenario.adapters.size());
}

RM_STATUS SimulatedHost::openTagAdapter(const std::string& name, std::uint32_t& handle)
{
    std::lock_guard lock(_mutex);
    if (!_adapterByName.contains(name))
        return RM_ERROR;
    handle = ++_lastTagHandle;
    _tagHandles.emplace(handle, name);
    return RM_OK;
}

void SimulatedHost::closeTagAdapter(std::uint32_t handle)
{
    std::lock_guard lock(_mutex);
    _tagHandles.erase(handle);
}

std::string SimulatedHost::tagAdapterOf(std::uint32_t handle) const
{
    std::lock_guard lock(_mutex);
    const auto open = _tagHandles.find(handle);
    return open == _tagHandles.end() ? std::string() : open->second;
}

/// Calls `use` with the adapter behind a handle; RM_ERROR without one.
template <class Self, class Use> RM_STATUS SimulatedHost::onTagAdapter(Self& self, std::uint32_t handle, Use use)
{
    std::lock_guard lock(self._mutex);
    const auto open = self._tagHandles.find(handle);
    if (open == self._tagHandles.end())
        return RM_ERROR;
    const auto place = self._adapterByName.find(open->second);
    return place == self._adapterByName.end() ? RM_STATUS{RM_ERROR} : use(self._scenario.adapters[place->second]);
}

RM_STATUS SimulatedHost::tagTable(std::uint32_t handle, std::vector<CPQFC_QosEntry>& out) const
{
    return onTagAdapter(*this, handle,
                        [&](const Adapter& adapter)
                        {
                            out = adapter.tags;
                            return RM_OK;
                        });
}

RM_STATUS SimulatedHost::setTagTable(std::uint32_t handle, std::vector<CPQFC_QosEntry> table)
{
    return onTagAdapter(*this, handle,
                        [&](Adapter& adapter)
                        {
                            adapter.tags = std::move(table);
                            return RM_OK;
                        });
}

RM_STATUS SimulatedHost::tagging(std::uint32_t handle, std::uint32_t& out) const
{
    return onTagAdapter(*this, handle,
                        [&](const Adapter& adapter)
                        {
                            out = adapter.tagging;
                            return RM_OK;
                        });
}

RM_STATUS SimulatedHost::setTagging(std::uint32_t handle, std::uint32_t state)
{
    return onTagAdapter(*this, handle,
                        [&](Adapter& adapter)
                        {
                            if (state > 1)
                                return RM_ERROR_NOT_SUPPORTED;
                            adapter.tagging = state;
                            return RM_OK;
                        });
}

} // namespace tvrsim
