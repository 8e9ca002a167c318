// The counters of a port that the module serves: what they count, and which of them count errors.
#pragma once

#include <algorithm>
#include <iterator>
#include <string_view>

namespace broker
{

struct CounterRow
{
    const char* property;
    const char* family; ///< name for monitoring
    const char* label;
    const char* unit;
    bool isError;
    const char* help;
};

inline constexpr CounterRow counterRows[] = {
    {"BytesTransmitted", "tavrin_fc_port_transmitted_bytes_total", "bytes sent", "bytes", false,
     "Bytes that the port sent."},
    {"BytesReceived", "tavrin_fc_port_received_bytes_total", "bytes received", "bytes", false,
     "Bytes that the port received."},
    {"PacketsTransmitted", "tavrin_fc_port_transmitted_frames_total", "frames sent", "frames", false,
     "Frames that the port sent."},
    {"PacketsReceived", "tavrin_fc_port_received_frames_total", "frames received", "frames", false,
     "Frames that the port received."},
    {"LIPCount", "tavrin_fc_port_loop_initializations_total", "loop initialisations", "events", false,
     "Loop initialization primitives (LIP) on the link."},
    {"NOSCount", "tavrin_fc_port_not_operational_sequences_total", "not operational sequences", "events", false,
     "Not operational sequences (NOS) on the link."},
    {"ErrorFrames", "tavrin_fc_port_error_frames_total", "error frames", "frames", true,
     "Frames received with an error."},
    {"DumpedFrames", "tavrin_fc_port_dumped_frames_total", "dropped frames", "frames", true,
     "Frames dropped for want of buffers of the host."},
    {"LinkFailures", "tavrin_fc_port_link_failures_total", "link failures", "events", true, "Failures of the link."},
    {"LossOfSignalCounter", "tavrin_fc_port_signal_losses_total", "losses of signal", "events", true,
     "Losses of the signal."},
    {"LossOfSyncCounter", "tavrin_fc_port_synchronization_losses_total", "losses of synchronisation", "events", true,
     "Losses of synchronization."},
    {"PrimitiveSeqProtocolErrCount", "tavrin_fc_port_primitive_sequence_errors_total", "protocol errors", "events",
     true, "Errors of the primitive sequence protocol."},
    {"CRCErrors", "tavrin_fc_port_crc_errors_total", "CRC errors", "frames", true, "Frames with a wrong checksum."},
    {"InvalidTransmissionWords", "tavrin_fc_port_invalid_transmission_words_total", "invalid transmission words",
     "words", true, "Invalid transmission words received."},
    {"AddressErrors", "tavrin_fc_port_address_errors_total", "address errors", "frames", true,
     "Frames with an address that is unknown here."},
    {"DelimiterErrors", "tavrin_fc_port_delimiter_errors_total", "delimiter errors", "frames", true,
     "Frames with a wrong delimiter."},
    {"LinkResetsReceived", "tavrin_fc_port_link_resets_received_total", "link resets received", "events", false,
     "Link resets received."},
    {"LinkResetsTransmitted", "tavrin_fc_port_link_resets_transmitted_total", "link resets sent", "events", false,
     "Link resets sent."},
    {"FBSYFrames", "tavrin_fc_port_fabric_busy_frames_total", "frames refused by a busy fabric", "frames", false,
     "Frames answered by a busy fabric."},
    {"PBSYFrames", "tavrin_fc_port_port_busy_frames_total", "frames refused by a busy port", "frames", false,
     "Frames answered by a busy port."},
};

/// Null for a counter that is not in the table.
constexpr const CounterRow* counterRow(std::string_view property)
{
    const auto* row = std::ranges::find(counterRows, property, &CounterRow::property);
    return row == std::end(counterRows) ? nullptr : row;
}

} // namespace broker
