// Destructors of the device model free part by part, and a failure in one does not keep the next from going.
#pragma once

#include "foundation/Log.h"

namespace cimple
{

/// Runs `free()`; if it throws, logs `failure` at `level`.
template <class Free> void freePart(int level, const char* failure, const Free& free) noexcept
{
    try
    {
        free();
    }
    catch (...)
    {
        TVR_LOG(level, "%s", failure);
    }
}

} // namespace cimple
