// The memory of a port over what browsers and monitoring ask of it all day.
#include "tests/support/Sanitized.h"
#include "tests/system/Serving.h"

#include <gtest/gtest.h>

namespace
{

using namespace system_test;

#if !TVR_SANITIZED // a sanitizer keeps what is freed

/// Loads the page and scrapes, by four clients at once.
void load(const Serving& server, int times)
{
    const std::string urls =
        server.url() + "/{,main.js,api/session,api/host,api/ports,metrics}#[1-" + std::to_string(times / 4) + "]";
    const std::string client = "curl --noproxy '*' -fsS -o /dev/null '" + urls + "'";
    const Answer answer = runCommand("(for i in 1 2 3 4; do " + client + " & done; wait) 2>&1");
    EXPECT_EQ(answer.out, "");
}

TEST(ServeMemory, StaysFlatOverPageLoadsAndScrapes)
{
    const Serving server;
    load(server, 2000);
    const long before = server.memory();
    load(server, 10000);
    constexpr long most = 4 << 10; // KiB: less than half a KiB of each load
    EXPECT_LT(server.memory() - before, most) << before;
}

#endif

} // namespace
