// Memory that the module asks for and does not get.
#pragma once

#include <cstddef>

namespace module_test
{

/// From now on counts what the module allocates, on all threads, and refuses the `number`-th of it (0: none). Only what
/// the module asks for itself counts, directly or through the C and C++ libraries; the broker and the test have theirs.
/// Under a sanitizer, whose allocator cannot be replaced, only what goes through operator new. The module must be
/// mapped.
void refuseAllocation(std::size_t number);

/// Ends that; answers how many allocations were counted.
std::size_t allocationsOfModule();

} // namespace module_test
