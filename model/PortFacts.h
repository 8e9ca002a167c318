// What a client sees of a port now, taken over into its instance: by the refresh when it makes the instance, and by the
// live refresh before each enumeration.
#pragma once

namespace cimple
{

class FCPortAttributes;
class FCPortStatistics;
class TVRHBA_FCPort;
class TVRHBA_FCPortStatistics;
struct PortContext;

/// OtherIdentifyingInfo and IdentifyingDescriptions: pairs of vital product data, then the fixed pairs.
void setPortIdentifiers(TVRHBA_FCPort& instance, const PortContext& port);
/// What the HBA API and the RM library say of the port's link and state.
void setPortFacts(TVRHBA_FCPort& instance, const FCPortAttributes& facts);
/// LocationIndicator, asked of the RM library; it keeps its value when the port has no name to ask by.
void setBeacon(TVRHBA_FCPort& instance);
/// Counters that the port does not report are null.
void setCounters(TVRHBA_FCPortStatistics& instance, const FCPortStatistics& counters);

} // namespace cimple
