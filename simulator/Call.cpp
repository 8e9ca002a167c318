#include "simulator/Call.h"

namespace tvrsim
{

std::int32_t Call::deliverAttributes(const AttributeList& list, void* out, std::uint32_t& size) const
{
    const std::size_t room = size;
    if (isHostile(Hostile::allOnes))
    {
        std::memset(out, 0xFF, room);
        return RM_OK;
    }
    std::vector<std::byte> buffer = encodeAttributes(list, !isHostile(Hostile::unterminatedText));
    size = static_cast<std::uint32_t>(buffer.size());
    if (buffer.size() > room)
        return RM_ERROR_MORE_DATA;
    const std::size_t written = kept(buffer.size());
    markCut({buffer.data(), written});
    std::memcpy(out, buffer.data(), written);
    size = isHostile(Hostile::hugeLength) ? 0xFFFF'FFFF : static_cast<std::uint32_t>(written);
    return RM_OK;
}

void Call::deliverScsi(ScsiReply reply, void* response, std::size_t responseSize, void* sense,
                       std::size_t senseSize) const
{
    if (isHostile(Hostile::allOnes))
    {
        std::ranges::fill(reply.data, 0xFF);
        std::ranges::fill(reply.sense, 0xFF);
        reply.data.resize(responseSize, 0xFF);
    }
    // The bytes that carry lengths: of a page in 2 and 3, of the standard Inquiry in 4, of the first designator in 7.
    if (isHostile(Hostile::hugeLength))
        for (std::size_t place : {2, 3, 4, 7})
            if (place < reply.data.size())
                reply.data[place] = 0xFF;
    if (const std::size_t length = kept(std::min(reply.data.size(), responseSize)))
        std::memcpy(response, reply.data.data(), length);
    const std::size_t senseLength = std::min(reply.sense.size(), senseSize);
    if (sense && senseLength > 0)
        std::memcpy(sense, reply.sense.data(), senseLength);
}

} // namespace tvrsim
