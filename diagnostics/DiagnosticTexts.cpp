#include "diagnostics/DiagnosticTexts.h"

#include "foundation/Log.h"

#include <algorithm>
#include <span>

namespace cimple
{

namespace
{

struct NumberText
{
    std::int64_t number;
    const char* text;
};

constexpr NumberText statusTexts[] = {
    {0, "Successful"},
    {1, "An unspecified error occurred"},
    {2, "Diagnostics not available/Port not supported"},
    {63, "Diagnostics not available/Port not supported"},
    {190, "Diagnostics not available/Port not supported"},
    {13, "No SFP is installed in the port"},
    {62, "There are too many pending/running requests in diag. results table"},
    {64, "Adapter Busy: Another critical application may be running"},
    {204, "D_Port Test is not supported on this switch."},
    {212, "No FC cable connecting the port to the switch."},
    {248, "Test not supported on this hardware."},
    {251, "Test not supported on this firmware."},
};

constexpr NumberText resultTexts[] = {
    {0, "Success"},
    {1, "General Error"},
    {2, "Link Down"},
    {3, "I/O Error"},
    {4, "Timeout"},
    {5, "Transmit Error"},
    {6, "Receive Error"},
    {7, "Mailbox Error"},
    {8, "Error: Echo test not supported"},
    {9, "Error: Echo Failed"},
    {10, "Error: Target Unreachable"},
    {11, "Error: HBA temperature exceeded operational range. Adapter stopped.\n\nPlease see the product documentation"},
    {12, "Error: Failed to allocate resource"},
    {13, "Error: Another diagnostic test is running. Please try again"},
    {14, "Error: Sequence Timeout"},
    {15, "Error: Bus reset received during test"},
    {16, "Error: Read-Write test is running"},
    {17, "Error: Driver busy. Please try again"},
    {18, "Error: Mailbox not ready"},
    {19, "Error: Port not ready"},
    {25, "Error: Connection Failed"},
    {26, "Error: Socket Connection Failed"},
};

const char* textOf(std::span<const NumberText> texts, std::int64_t number)
{
    const auto found = std::ranges::find(texts, number, &NumberText::number);
    return found == texts.end() ? "Unknown" : found->text;
}

} // namespace

const char* MapDiagStatus(RM_STATUS status)
{
    TVR_LOG(TVR_DBG, "TVR_DiagTestFunc::MapDiagStatus");
    return textOf(statusTexts, status);
}

const char* MapDiagResultStatus(std::uint32_t result)
{
    TVR_LOG(TVR_DBG, "MapDiagResultStatus");
    return textOf(resultTexts, result);
}

} // namespace cimple
