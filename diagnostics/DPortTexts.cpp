#include "diagnostics/DPortTexts.h"

#include "foundation/Log.h"

#include <algorithm>
#include <string>

namespace cimple
{

namespace
{

struct Words
{
    std::uint8_t value;
    const char* words;
};

constexpr Words phaseIds[] = {
    {RM_DPORT_ELECTRICAL_LOOPBACK, "Electrical Loopback"},           {RM_DPORT_OPTICAL_LOOPBACK, "Optical Loopback"},
    {RM_DPORT_REVERSE_OPTICAL_LOOPBACK, "Reverse Optical Loopback"}, {RM_DPORT_LINK_TRAFFIC, "Link Traffic"},
    {RM_DPORT_REVERSE_LINK_TRAFFIC, "Reverse Link Traffic"},
};

constexpr Words phaseResults[] = {
    {RM_DPORT_PASSED, "Passed"},
    {RM_DPORT_SKIPPED, "Skipped"},
    {RM_DPORT_FAILED, "Failed"},
    {RM_DPORT_STOPPED, "Stopped"},
};

/// By the number of the bit. Bit 7 has no name.
constexpr const char* errorBits[32] = {
    "GENERIC,",           "ENC_IN,",         "CRC,",           "TRUNC,",
    "TOOLONG,",           "BAD_EOF,",        "ENC_OUT,",       "",
    "C3_DISCARD,",        "RX_C3_TIMEOUT,",  "TX_C3_TIMEOUT,", "UNROUTABLE,",
    "UNREACHABLE,",       "OTHER_DISCARD,",  "LINK_FAILURE,",  "SYNC_LOSS,",
    "SIGNAL_LOSS,",       "PRIM_SEQ_PROTO,", "INV_TX_WORD,",   "INVALID_CRC,",
    "DELIMITER_ERR,",     "ADDR_ID_ERR,",    "LINK_RESET_IN,", "LINK_RESET_OUT,",
    "PORT_OLS_IN,",       "PORT_OLS_OUT,",   "INV_ARB,",       "SINGLE_CREDIT_LOSS,",
    "MULTI_CREDIT_LOSS,", "RESERVED_2,",     "RESERVED_1,",    "RESERVED_0",
};

const char* wordsFor(std::span<const Words> table, std::uint8_t value)
{
    const auto found = std::ranges::find(table, value, &Words::value);
    return found == table.end() ? "" : found->words;
}

} // namespace

const char* DPortPhaseToString(std::uint8_t id)
{
    return wordsFor(phaseIds, id);
}

const char* DPortResultToString(std::uint8_t result)
{
    return wordsFor(phaseResults, result);
}

String DPortErrorsToString(std::uint32_t mask)
{
    std::string names;
    for (std::size_t bit = 0; bit < std::size(errorBits); bit++)
        if (mask >> bit & 1)
            names += errorBits[bit];
    TVR_LOG(TVR_DBG, "DPortErrors: %s", names.c_str());
    return String(names);
}

std::span<const RM_DPortPhase> phasesOf(const RM_DPortResults& results)
{
    return std::span(results.phases).first(std::min<std::size_t>(results.phaseCount, RM_MAX_DPORT_PHASES));
}

} // namespace cimple
