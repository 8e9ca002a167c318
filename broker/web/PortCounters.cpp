#include "broker/web/PortCounters.h"

#include <algorithm>
#include <iterator>

namespace web
{

namespace
{

constexpr bool error = true;

constexpr CounterRow rows[] = {
    {"BytesTransmitted", "bytes sent", "bytes"},
    {"BytesReceived", "bytes received", "bytes"},
    {"PacketsTransmitted", "frames sent", "frames"},
    {"PacketsReceived", "frames received", "frames"},
    {"LIPCount", "loop initialisations", "events"},
    {"NOSCount", "not operational sequences", "events"},
    {"ErrorFrames", "error frames", "frames", error},
    {"DumpedFrames", "dropped frames", "frames", error},
    {"LinkFailures", "link failures", "events", error},
    {"LossOfSignalCounter", "losses of signal", "events", error},
    {"LossOfSyncCounter", "losses of synchronisation", "events", error},
    {"PrimitiveSeqProtocolErrCount", "protocol errors", "events", error},
    {"CRCErrors", "CRC errors", "frames", error},
    {"InvalidTransmissionWords", "invalid transmission words", "words", error},
    {"AddressErrors", "address errors", "frames", error},
    {"DelimiterErrors", "delimiter errors", "frames", error},
    {"LinkResetsReceived", "link resets received", "events"},
    {"LinkResetsTransmitted", "link resets sent", "events"},
    {"FBSYFrames", "frames refused by a busy fabric", "frames"},
    {"PBSYFrames", "frames refused by a busy port", "frames"},
};

} // namespace

const CounterRow* counterRow(std::string_view property)
{
    const auto* row = std::ranges::find(rows, property, &CounterRow::property);
    return row == std::end(rows) ? nullptr : row;
}

} // namespace web
