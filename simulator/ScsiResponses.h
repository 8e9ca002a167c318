// What simulated logical units answer to SCSI commands (SPC-4, SBC-3).
#pragma once

#include "simulator/Scenario.h"

namespace tvrsim
{

/// Answer to a command. `status` is 0, or HBA_STATUS_SCSI_CHECK_CONDITION with `sense` set.
struct ScsiReply
{
    std::uint32_t status = 0;
    std::vector<std::uint8_t> data;
    std::vector<std::uint8_t> sense;
};

struct ScsiCommand
{
    ScsiOperation operation;
    std::uint8_t page = 0; ///< of vital product data
};

/// The command that an Inquiry call of the libraries stands for.
inline ScsiCommand inquiryCommand(std::uint8_t evpd, std::uint32_t page)
{
    return evpd ? ScsiCommand{ScsiOperation::vitalProductData, static_cast<std::uint8_t>(page)}
                : ScsiCommand{ScsiOperation::inquiry};
}

/// The 8-byte LUN field of unit `number`: peripheral device addressing below 256, flat space addressing above. The
/// field is kept in memory order, so the number that it makes depends on the machine.
HBA_UINT64 encodeLun(std::uint32_t number);

/// The unit that a LUN field names; nothing if it has another form than encodeLun gives.
std::optional<std::uint32_t> decodeLun(HBA_UINT64 field);

/// Runs a command of the initiator on a unit of the target. Uses up a check condition that waits for the command.
ScsiReply execute(Target& target, HBA_UINT64 lun, const ScsiCommand& command);

} // namespace tvrsim
