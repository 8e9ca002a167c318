#include "device/Port.h"

#include "device/FreePart.h"

namespace cimple
{

Port::~Port()
{
    TVR_LOG(TVR_DBG, "~Port");
    freeTargets();
    freePart(TVR_DBG, "FC Port statistics deletion failed!!!", [&] { statistics.reset(); });
    freePart(TVR_DBG, "FC Port attribute deletion failed!!!", [&] { attributes.reset(); });
}

void Port::freeTargets() noexcept
{
    for (Target* target : targets)
        freePart(TVR_DBG, "Target deletion failed !!!",
                 [&]
                 {
                     std::unique_ptr<Target> owned(target);
                     TVR_LOG(TVR_DBG, "Freeing Target: %s", owned->portWWN.c_str());
                 });
    targets.clear();
}

} // namespace cimple
