// Lines for the journal of the host, on standard error: who changed what, and who was not let in.
#pragma once

#include "broker/core/Reply.h"
#include "broker/http/Site.h"

#include <chrono>
#include <mutex>
#include <string>

namespace http
{

/// "joe deleted root/tavrin:...: done". `verb` is what stands before the path.
void tellChange(const Caller& caller, const std::string& verb, const broker::Path& path,
                const std::string& result) noexcept;

/// "joe called Class.Method on root/tavrin:...: 0", or with the status of a call that failed.
void tellCall(const Caller& caller, const std::string& method, const broker::Path& path,
              const broker::MethodReply& reply) noexcept;

/// Passwords that were wrong. Who tries many does not fill the journal: behind ten lines of a minute they are counted,
/// which the first line of a later minute tells.
class RefusedLogins
{
public:
    using Clock = std::chrono::steady_clock;

    /// `name` as the client gave it.
    void tell(const std::string& address, const std::string& name, Clock::time_point now = Clock::now()) noexcept;

private:
    std::mutex _mutex; ///< guards what follows
    Clock::time_point _begin = {};
    unsigned _told = 0; ///< since then
    unsigned _untold = 0;
};

} // namespace http
