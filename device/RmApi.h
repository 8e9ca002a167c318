// C interface of the closed RM library, as far as the program calls it, and the layout of its records.
// The simulator builds its stand-in from the same declarations.
//
// Every function has an LRM_ form (local library) and an RM_ form (fallback library) of one signature.
#pragma once

#include <time.h> // hbaapi.h uses struct tm

#include <hbaapi.h>

#include <cstddef>
#include <cstdint>

extern "C"
{

    /// 0 is success; RM_StatusString gives the text of any other value.
    typedef std::int32_t RM_STATUS;

    /// Numbered values of adapters, ports and the host travel in a buffer whose layout the library keeps to itself.
    /// A fetch function fills the caller's buffer; `size` is its room in bytes, and on return what was used.
    typedef RM_STATUS RM_GetHBAAttributes_t(HBA_WWN wwpn, void* buffer, std::uint32_t* size);
    typedef RM_STATUS RM_GetPortAttributes_t(HBA_WWN wwpn, void* buffer, std::uint32_t* size);
    typedef RM_STATUS RM_GetPortStatistics_t(HBA_WWN wwpn, void* buffer, std::uint32_t* size);
    typedef RM_STATUS RM_GetServerAttributes_t(HBA_WWN wwpn, void* buffer, std::uint32_t* size);
    /// Pointer into `buffer` to the value of attribute `id`, or null. `length` gets its bytes, `status` 0 or why not.
    typedef const void* RM_GetAttributeValue_t(const void* buffer, std::uint32_t id, std::uint32_t* length,
                                               RM_STATUS* status);

    typedef RM_STATUS RM_InitLib_t();
    typedef RM_STATUS RM_ExitLib_t();
    typedef RM_STATUS RM_StatusString_t(RM_STATUS status, char* buffer, std::uint32_t size);
    typedef RM_STATUS RM_GetVersion_t(char* buffer, std::uint32_t size);
    typedef RM_STATUS RM_MiliVersion_t(char* buffer, std::uint32_t size);
    typedef RM_STATUS RM_IsLocalHBA_t(HBA_WWN wwpn, std::uint32_t* isLocal);
    typedef RM_STATUS RM_GetDriverType_t(HBA_WWN wwpn, std::uint32_t* driverType);
    typedef RM_STATUS RM_GetHBAFeature_t(HBA_WWN wwpn, std::uint32_t tag, std::uint32_t* value);

    /// PCI configuration space and chip-dependent registers of a function, little-endian as in the bus.
    struct RM_PciRegisters
    {
        std::uint8_t header[64]; ///< type-0 configuration header (PCI Local Bus 3.0, 6.1)
        std::uint32_t area[63];  ///< meaning depends on pciType
        std::uint32_t pciType;   ///< selector of the area's form, byte 316
        std::uint32_t reserved;  ///< pads the record to 324 bytes
    };
    static_assert(sizeof(RM_PciRegisters) == 324);
    static_assert(offsetof(RM_PciRegisters, area) == 64);
    static_assert(offsetof(RM_PciRegisters, pciType) == 316);

    typedef RM_STATUS RM_DiagReadPCIRegistersV2_t(HBA_WWN wwpn, RM_PciRegisters* registers);

} // extern "C"
