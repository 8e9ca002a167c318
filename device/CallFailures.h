// How often calls of the libraries failed, by entry point, since the process began.
#pragma once

#include "device/EntryPoints.h"
#include "device/RmApi.h"

#include <algorithm>
#include <atomic>

namespace cimple
{

/// One count for each row of `entryPoints`. It outlives the libraries and whoever called them.
inline constinit std::array<std::atomic<std::uint64_t>, entryPoints.size()> callFailures{};

/// What a library answers of a host that is well: a list needs more room and is asked for again, a test has not ended,
/// a unit has something to say, or there is no such thing at the adapter. The HBA API has the same numbers for the
/// same, and no use for the others.
inline constexpr auto answersOfTheWell = std::to_array<std::int64_t>({
    RM_OK,
    RM_ERROR_MORE_DATA,
    RM_ERROR_BUFFER_TOO_SMALL,
    RM_ERROR_TEST_RUNNING,
    RM_ERROR_CHECK_CONDITION,
    RM_ERROR_NOT_SUPPORTED,
    RM_ERROR_NO_SFP,
    RM_ERROR_DIAGNOSTICS_NOT_AVAILABLE,
    RM_ERROR_WWN_NOT_SUPPORTED,
    RM_ERROR_PORT_NOT_SUPPORTED,
    RM_ERROR_HARDWARE_LACKS,
    RM_ERROR_FIRMWARE_LACKS,
});

constexpr bool isFailure(Answer answer, std::int64_t result)
{
    switch (answer)
    {
    case Answer::status:
        return std::ranges::find(answersOfTheWell, result) == answersOfTheWell.end();
    case Answer::handle:
        return result == 0;
    case Answer::value:
        break;
    }
    return false;
}

/// Makes a call of the entry point of that row and counts it if it fails.
template <std::size_t Row, class Call> auto counted(Call call)
{
    if constexpr (entryPoints[Row].answer == Answer::value)
        return call();
    else
    {
        const auto result = call();
        if (isFailure(entryPoints[Row].answer, result))
            callFailures[Row].fetch_add(1, std::memory_order_relaxed);
        return result;
    }
}

} // namespace cimple
