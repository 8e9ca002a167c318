#include "bench/HeapBytes.h"

#include <cstdlib>
#include <fstream>
#include <malloc.h>
#include <string>

namespace bench
{

namespace
{

/// Resident bytes of the memory for which somebody has said whether it shall be huge pages: the module alone does, as
/// long as malloc() is not told to.
std::size_t chunkBytes()
{
    std::ifstream maps("/proc/self/smaps");
    std::size_t bytes = 0, resident = 0;
    for (std::string line; std::getline(maps, line);)
        if (line.starts_with("Rss:"))
            resident = std::strtoull(line.c_str() + 4, nullptr, 10) * 1024;
        else if (line.starts_with("VmFlags:") && (line.find(" hg") != line.npos || line.find(" nh") != line.npos))
            bytes += resident;
    return bytes;
}

} // namespace

std::size_t heapBytes()
{
    const struct mallinfo2 info = mallinfo2();
    return info.uordblks + info.hblkhd + chunkBytes();
}

} // namespace bench
