// The instances that the benchmarks work on, and the floors that the figures stand beside.
#pragma once

#include "agent/Instance_Map.h"
#include "schema/TVRHBA_Card.h"
#include "schema/TVRHBA_FCPort.h"

#include <cstddef>
#include <string>
#include <vector>

namespace bench
{

/// A card with every property that the model sets.
cimple::Ref<cimple::TVRHBA_Card> makeCard(std::size_t number);

/// A port: four string keys, of which the last tells ports apart.
cimple::Ref<cimple::TVRHBA_FCPort> makePort(std::size_t number);

/// The allocation and the share counts that a clone of the instance cannot avoid: one block of its size, its strings
/// and datetimes shared, its arrays allocated.
class CloneFloor
{
public:
    explicit CloneFloor(const cimple::Instance* instance);
    void run() const;

private:
    std::size_t _size;
    const cimple::Instance* _instance;
    std::vector<std::size_t> _strings; ///< offsets of the string slots
    std::vector<std::size_t> _datetimes;
    std::vector<std::size_t> _arrays;
};

} // namespace bench
