// Marking and releasing a thread's broker objects: an addition of CMPI 2.0 that is used where a broker has it.
#pragma once

#include <cstddef>
#include <cstring>

namespace cimple
{

/// Head of the memory table of CMPI 2.0. A mark is opaque; release() frees what the thread got since.
struct Broker_Memory_FT
{
    int ftVersion;
    void* (*mark)(const CMPIBroker* mb, CMPIStatus* rc);
    CMPIStatus (*release)(const CMPIBroker* mb, const void* mark);
};

/// A broker as CMPI 2.0 lays it out: a fifth pointer behind the four of 1.0.
struct Broker_With_Memory
{
    CMPIBroker broker;
    const Broker_Memory_FT* mft;
};

/// The memory table of a broker, or null when it has none or lacks one of the two functions.
///
/// The structure of a 1.0 broker ends before the pointer, so it is read only where one of the broker's tables
/// says that it was laid out for 2.0. One table is enough and all three are asked: the small-footprint broker
/// numbers its up-call table 0 and its factory 1 and only the services table 200, the other server numbers
/// all of them 200.
inline const Broker_Memory_FT* broker_memory(const CMPIBroker* broker)
{
    constexpr int first_version = 200;
    const bool laid_out = (broker->bft && static_cast<int>(broker->bft->brokerVersion) >= first_version) ||
                          (broker->eft && broker->eft->ftVersion >= first_version) ||
                          (broker->xft && broker->xft->ftVersion >= first_version);
    if (!laid_out)
        return nullptr;

    // Copied by bytes: the type of `broker` may be the four-pointer structure.
    const Broker_Memory_FT* memory;
    std::memcpy(&memory, reinterpret_cast<const char*>(broker) + offsetof(Broker_With_Memory, mft), sizeof memory);
    return memory && memory->mark && memory->release ? memory : nullptr;
}

} // namespace cimple
