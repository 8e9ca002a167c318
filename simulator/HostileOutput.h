// How each kind of record looks when it is hostile.
#pragma once

#include "simulator/EntryPoints.h"

#include "device/RmApi.h"

#include <cstring>

namespace tvrsim
{

/// Fills a text field to the brim, without a zero byte.
template <std::size_t Size> void fillText(char (&field)[Size])
{
    std::memset(field, 'X', Size);
}

inline void fillTexts(HBA_ADAPTERATTRIBUTES& record)
{
    fillText(record.Manufacturer);
    fillText(record.SerialNumber);
    fillText(record.Model);
    fillText(record.ModelDescription);
    fillText(record.NodeSymbolicName);
    fillText(record.HardwareVersion);
    fillText(record.DriverVersion);
    fillText(record.OptionROMVersion);
    fillText(record.FirmwareVersion);
    fillText(record.DriverName);
}

inline void fillTexts(HBA_PORTATTRIBUTES& record)
{
    fillText(record.PortSymbolicName);
    fillText(record.OSDeviceName);
}

inline void fillTexts(HBA_FCPSCSIENTRY& record)
{
    fillText(record.ScsiId.OSDeviceName);
}

inline void fillTexts(RM_DriverParam& record)
{
    fillText(record.name);
    fillText(record.help);
}

inline void fillTexts(RM_VPortAttributes& record)
{
    fillText(record.symbolicName);
}

inline void fillTexts(RM_VirtualMachine& record)
{
    fillText(record.name);
    fillText(record.uuid);
}

inline void fillTexts(RM_LocalHBAInfo& record)
{
    fillText(record.model);
    fillText(record.serialNumber);
}

inline void fillTexts(RM_SffData& record)
{
    fillText(record.vendorName);
    fillText(record.partNumber);
    fillText(record.revision);
    fillText(record.serialNumber);
    fillText(record.dateCode);
}

inline void fillTexts(RM_DumpFileName& record)
{
    fillText(record.name);
}

inline void fillTexts(RM_EventLogConfig& record)
{
    for (RM_EventLogModule& entry : record.entry)
    {
        fillText(entry.module);
        fillText(entry.level);
    }
}

inline void fillCount(RM_EventLogConfig& record)
{
    record.count = 0xFFFF'FFFF;
}

inline void fillTexts(RM_FlashList& record)
{
    for (RM_FlashRegion& region : record.entry)
    {
        fillText(region.programType);
        fillText(region.version);
        fillText(region.description);
    }
}

inline void fillCount(RM_FlashList& record)
{
    record.count = 0xFFFF'FFFF;
}

inline void fillCount(HBA_ADAPTERATTRIBUTES& record)
{
    record.NumberOfPorts = 0xFFFF'FFFF;
}

inline void fillCount(HBA_PORTATTRIBUTES& record)
{
    record.NumberofDiscoveredPorts = 0xFFFF'FFFF;
}

inline void fillCount(RM_DPortResults& record)
{
    record.phaseCount = 0xFF;
}

inline void fillLength(RM_VpdArea& record)
{
    record.length = 0xFFFF'FFFF;
}

/// Makes a record hostile in its way; the kinds that it cannot show leave it alone.
template <class Record> void deform(Record& record, Hostile kind)
{
    if (kind == Hostile::allOnes)
        std::memset(&record, 0xFF, sizeof record);
    if (kind == Hostile::zeroHandle)
        std::memset(&record, 0, sizeof record);
    if constexpr (requires { fillTexts(record); })
        if (kind == Hostile::unterminatedText)
            fillTexts(record);
    if constexpr (requires { fillCount(record); })
        if (kind == Hostile::hugeCount)
            fillCount(record);
    if constexpr (requires { fillLength(record); })
        if (kind == Hostile::hugeLength)
            fillLength(record);
}

} // namespace tvrsim
