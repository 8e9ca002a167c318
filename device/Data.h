// The picture of the host's adapters, ports and targets.
#pragma once

#include "device/Adapter.h"

#include <cstdint>
#include <vector>

namespace cimple
{

/// Owns the whole tree. It has no lock of its own: the caller keeps builders and readers apart.
class Data
{
public:
    /// Loads the vendor libraries of the HBA API.
    Data();
    ~Data();
    Data(const Data&) = delete;
    Data& operator=(const Data&) = delete;

    /// Replaces everything by the adapters and ports that the host has now; targets wait for buildSANData(). An
    /// adapter or port that cannot be read is left out.
    void buildAdapterData();
    /// Reads the targets of every port anew.
    void buildSANData();
    void freeAllData();

    std::vector<Adapter*> adapters; ///< owned, in the order of the HBA API
    std::vector<Port*> ports;       ///< all ports of all adapters; not owned
    bool dataValid = false;         ///< at least one adapter is there
    std::uint32_t adapterCount = 0;

private:
    bool keepAdapter(std::uint32_t number);
};

} // namespace cimple
