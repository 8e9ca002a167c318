// What the front ends share. A front end carries the C signatures of one library and nothing else.
#pragma once

#include "simulator/Call.h"
#include "simulator/Control.h"

namespace tvrsim
{

/// A call of the exported function `function`; pass __func__.
inline Call callOf(const char* function, const Call::Subject& subject = {})
{
    return Call(*tvrsim_simulation(), function, subject);
}

/// The subject of a call that names a port.
inline Call::Subject port(const HBA_WWN& wwpn)
{
    return [name = fromHba(wwpn)] { return wwnText(name); };
}

/// The subject of a call for an open adapter.
inline Call::Subject adapter(HBA_HANDLE handle)
{
    return [handle] { return tvrsim_simulation()->host.adapterOf(handle); };
}

/// A call that starts a test.
inline RM_STATUS startTest(Call& call, const HBA_WWN& wwpn, TestOf test, const TestOrder& order, std::uint32_t* handle)
{
    return call.record(handle,
                       [&](std::uint32_t& out) { return call.host().startTest(fromHba(wwpn), test, order, out); });
}

/// The functions for frame tagging are looked for in the global scope of the process: an RM library that is initialised
/// loads them into it, where the host has them.
void loadTaggingLibrary(SimulatedHost& host);

} // namespace tvrsim
