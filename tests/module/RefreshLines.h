// What the log says of a refresh.
#pragma once

namespace module_test
{

inline constexpr const char* created = "[TVR_DBG] PERF: ---Created DataFetch_Handler thread -- BuildCimpleInfo END---";
inline constexpr const char* running = "[TVR_DBG] DataFetch_Handler thread already running-BuildCimpleInfo";
inline constexpr const char* begun = "[TVR_DBG] PERF: DataFetch_Handler Thread BEGIN";
inline constexpr const char* ended = "[TVR_DBG] PERF: DataFetch_Handler Thread END";

} // namespace module_test
