// C interface of the closed RM library, as far as the program calls it, and the layout of its records.
// The simulator builds its stand-in from the same declarations.
//
// Every function has an LRM_ form (local library) and an RM_ form (fallback library) of one signature.
//
// A port is named by its WWPN, a virtual port by the WWPN of its physical port and its own. A list record begins
// with a count: the room in entries on the way in, the number available on the way out. A call whose list has
// too little room returns RM_ERROR_MORE_DATA with the number available, and may have filled what fits.
#pragma once

#include <time.h> // hbaapi.h uses struct tm

#include <hbaapi.h>

#include <cstddef>
#include <cstdint>

/// Results that the program tells apart by number. RM_StatusString gives the text of any of them.
enum RM_StatusCode : std::int32_t
{
    RM_OK = 0,
    RM_ERROR = 1, ///< generic failure; also what a binding returns for a function that is absent
    RM_ERROR_NOT_SUPPORTED = 2,
    RM_ERROR_INVALID_WWN = 5, ///< also RM_ValidateWwn's refusal
    RM_ERROR_MORE_DATA = 7,
    RM_ERROR_NO_MEMORY = 8,
    RM_ERROR_CHECK_CONDITION = 9, ///< a SCSI command ended with sense data, as in the HBA API
    RM_ERROR_NO_SFP = 13,
    RM_ERROR_DIRECTORY_NOT_OPENED = 27, ///< the dump directory
    RM_ERROR_TEST_RUNNING = 60,         ///< a test has not finished; its record is filled all the same
    RM_ERROR_TOO_MANY_TESTS = 62,       ///< no room for another test beside those that run
    RM_ERROR_DIAGNOSTICS_NOT_AVAILABLE = 63,
    RM_ERROR_ADAPTER_BUSY = 64, ///< also for a second test of a port
    RM_ERROR_WWN_NOT_SUPPORTED = 89,
    RM_ERROR_DUPLICATE_WWN = 91,
    RM_ERROR_WWN_NOT_AVAILABLE = 92,
    RM_ERROR_BUSY = 97, ///< the same call must be repeated
    RM_ERROR_MAILBOX_FAILED = 148,
    RM_ERROR_MAILBOX_TIMEOUT = 149,
    RM_ERROR_MAILBOX_BUSY = 150,
    RM_ERROR_CONFIGURATION_NOT_READ = 160,
    RM_ERROR_CONFIGURATION_NOT_OPENED = 178,
    RM_ERROR_PORT_NOT_SUPPORTED = 190,
    RM_ERROR_BUFFER_TOO_SMALL = 191, ///< RM_ERROR_MORE_DATA in the words of the driver parameter and dump calls
    RM_ERROR_DPORT_SWITCH = 204,     ///< the switch cannot test the link, or is not set up for it
    RM_ERROR_NO_CABLE = 212,
    RM_ERROR_NO_RESET = 247,       ///< a download whose firmware no reset would activate; also of a core dump
    RM_ERROR_HARDWARE_LACKS = 248, ///< the hardware of the adapter does not have the function
    RM_ERROR_FIRMWARE_LACKS = 251, ///< the firmware of the adapter does not have the function
    RM_ERROR_PORT_DISABLED = 253,
};

/// Room that the program offers for each kind of attributes, in bytes.
enum RM_BufferSize : std::uint32_t
{
    RM_HBA_ATTRIBUTES_SIZE = 2864,
    RM_PORT_ATTRIBUTES_SIZE = 2048,
    RM_DIAG_PORT_ATTRIBUTES_SIZE = 4096, ///< of the same before a test
    RM_PORT_STATISTICS_SIZE = 512,
    RM_SERVER_ATTRIBUTES_SIZE = 784,
};

/// Numbers of the attributes. The comment gives the form of the value: number is 4 bytes and counter 8 bytes,
/// both in native order; text is at most 255 bytes, with or without a terminator.
enum RM_Attribute : std::uint32_t
{
    // RM_GetServerAttributes
    RM_SA_OPERATING_SYSTEM = 0x108, // text

    // RM_GetHBAAttributes
    RM_HA_NODE_SYMBOLIC_NAME = 0x207,   // text
    RM_HA_OPTION_ROM_VERSION = 0x209,   // text
    RM_HA_DEVICE_ID = 0x20e,            // number
    RM_HA_MODEL_ID = 0x20f,             // number
    RM_HA_OPERATIONAL_FIRMWARE = 0x210, // text
    RM_HA_SLI1_FIRMWARE_NAME = 0x211,   // text
    RM_HA_SLI2_FIRMWARE_NAME = 0x212,   // text
    RM_HA_IEEE_ADDRESS = 0x213,         // 6 bytes, first byte first
    RM_HA_BOOT_CODE_ENABLED = 0x214,    // number, 0 or 1
    RM_HA_BOOT_BIOS_VERSION = 0x216,    // text
    RM_HA_DIAG_VERSION = 0x220,         // number
    RM_HA_INITIAL_FIRMWARE = 0x221,     // text
    RM_HA_KERNEL_VERSION = 0x222,       // text
    RM_HA_SLI3_FIRMWARE_NAME = 0x224,   // text
    RM_HA_SLI_MODE = 0x225,             // number
    RM_HA_BOARD_TEMPERATURE = 0x227,    // number: degrees in bits 0-7, threshold in 8-15, state in 16-23
    RM_HA_PORT_NUMBER = 0x229,          // number
    RM_HA_PCI_BUS_NUMBER = 0x22b,       // number
    RM_HA_FUNCTION_TYPE = 0x22c,        // number: 1, 2 and 3 are no Fibre Channel functions
    RM_HA_PCI_FUNCTION_NUMBER = 0x230,  // number
    RM_HA_SP_FIRMWARE_VERSION = 0x233,  // text
    RM_HA_SP_FIRMWARE_NAME = 0x234,     // text
    RM_HA_ULP_FIRMWARE_VERSION = 0x235, // text
    RM_HA_ULP_FIRMWARE_NAME = 0x236,    // text
    RM_HA_SUBADAPTER_ID = 0x24a,        // text
    RM_HA_FC_UNIVERSAL_VERSION = 0x24b, // text
    RM_HA_FC_X86_BIOS_VERSION = 0x24c,  // text
    RM_HA_FC_EFI_VERSION = 0x24d,       // text
    RM_HA_FC_FCODE_VERSION = 0x24e,     // text
    RM_HA_FIRMWARE_ON_FLASH = 0x24f,    // text

    // RM_GetPortAttributes
    RM_PA_PORT_TYPE = 0x305,   // number, the HBA API's port type
    RM_PA_LINK_STATE = 0x306,  // number; RM_LINK_DISABLED is a disabled port
    RM_PA_FABRIC_NAME = 0x30f, // 8 bytes, all zero without a fabric
    RM_PA_PORT_STATE = 0x322,  // number, physical port state
    RM_PA_FEC_STATE = 0x360,   // number

    // RM_GetPortStatistics, all counters. All ones means that the library does not count this.
    RM_PS_SECONDS_SINCE_LAST_RESET = 0x401,
    RM_PS_TX_BYTES = 0x402,
    RM_PS_RX_BYTES = 0x403,
    RM_PS_TX_SEQUENCES = 0x404,
    RM_PS_RX_SEQUENCES = 0x405,
    RM_PS_TX_FRAMES = 0x406,
    RM_PS_RX_FRAMES = 0x407,
    RM_PS_TX_WORDS = 0x408,
    RM_PS_RX_WORDS = 0x409,
    RM_PS_LIP_COUNT = 0x40c,
    RM_PS_NOS_COUNT = 0x40d,
    RM_PS_ERROR_FRAMES = 0x40e,
    RM_PS_DUMPED_FRAMES = 0x40f,
    RM_PS_LINK_FAILURES = 0x410,
    RM_PS_LOSS_OF_SYNC = 0x411,
    RM_PS_LOSS_OF_SIGNAL = 0x412,
    RM_PS_PRIMITIVE_SEQUENCE_ERRORS = 0x413,
    RM_PS_INVALID_TX_WORDS = 0x414,
    RM_PS_INVALID_CRCS = 0x415,
    RM_PS_ADDRESS_ERRORS = 0x416,
    RM_PS_PORT_BUSY_FRAMES = 0x417,
    RM_PS_FABRIC_BUSY_FRAMES = 0x418,
    RM_PS_LINK_RESETS_RECEIVED = 0x421,
    RM_PS_LINK_RESETS_TRANSMITTED = 0x422,
    RM_PS_DELIMITER_ERRORS = 0x423,
};

/// Tags of RM_GetHBAFeature. A feature is there when its value is 1.
enum RM_FeatureTag : std::uint32_t
{
    RM_FEATURE_DPORT = 200,
    RM_FEATURE_KESTOR_CNA = 201,
    RM_FEATURE_CORE_DUMP = 430,
};

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
    typedef RM_STATUS RM_SetDebugTraces_t(std::uint32_t level);
    /// Text functions fill `buffer` of `size` bytes and end the text with a zero byte.
    typedef RM_STATUS RM_StatusString_t(RM_STATUS status, char* buffer, std::uint32_t size);
    typedef RM_STATUS RM_GetVersion_t(char* buffer, std::uint32_t size);
    typedef RM_STATUS RM_MiliVersion_t(char* buffer, std::uint32_t size);
    typedef RM_STATUS RM_IsLocalHBA_t(HBA_WWN wwpn, std::uint32_t* isLocal);
    typedef RM_STATUS RM_GetDriverType_t(HBA_WWN wwpn, std::uint32_t* driverType);
    typedef RM_STATUS RM_GetHBAFeature_t(HBA_WWN wwpn, std::uint32_t tag, std::uint32_t* value);

    struct RM_Feature
    {
        std::uint32_t tag;
        std::uint32_t value;
    };

    struct RM_FeatureList
    {
        std::uint32_t count;
        RM_Feature entry[1];
    };
    static_assert(sizeof(RM_Feature) == 8 && offsetof(RM_FeatureList, entry) == 4);

    typedef RM_STATUS RM_GetHBAFeatureList_t(HBA_WWN wwpn, RM_FeatureList* list);

    /// Quality of service of an adapter port.
    struct RM_QosInfo
    {
        std::uint32_t supported; ///< 0 or 1
        std::uint32_t enabled;   ///< 0 or 1
        std::uint32_t priority;  ///< of the port's frames, 0 is the lowest
        std::uint32_t bandwidth; ///< share of the link in percent
    };
    static_assert(sizeof(RM_QosInfo) == 16);

    typedef RM_STATUS RM_GetQoS_t(HBA_WWN wwpn, RM_QosInfo* info);

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

    /// Beacon of a port's light.
    enum RM_BeaconState : std::uint32_t
    {
        RM_BEACON_NOT_AVAILABLE = 1,
        RM_BEACON_OFF = 2,
        RM_BEACON_ON = 3,
    };

    typedef RM_STATUS RM_DiagBeaconState_t(HBA_WWN wwpn, std::uint32_t* state);
    typedef RM_STATUS RM_DiagBeacon_t(HBA_WWN wwpn, std::uint32_t state);

    /// Transceiver of a port: what SFF-8472 has in its pages A0h and A2h. Texts need no terminator and may be padded
    /// with blanks.
    struct RM_SffData
    {
        std::uint8_t identityPresent;    ///< not 0: identifier to waveLength hold
        std::uint8_t vendorPresent;      ///< not 0: vendorName to dateCode hold
        std::uint8_t diagnosticsPresent; ///< not 0: measured values and thresholds hold
        std::uint8_t identifier;         ///< page A0h byte 0: 3 is an SFP
        std::uint8_t extIdentifier;      ///< byte 1
        std::uint8_t connector;          ///< byte 2: 7 is LC
        std::uint16_t waveLength;        ///< bytes 60 and 61: nanometres
        char vendorName[16];             ///< bytes 20 to 35
        std::uint8_t oui[3];             ///< bytes 37 to 39
        char partNumber[16];             ///< bytes 40 to 55
        char revision[4];                ///< bytes 56 to 59
        char serialNumber[16];           ///< bytes 68 to 83
        char dateCode[6];                ///< bytes 84 to 89: digits YYMMDD
        std::uint8_t reserved[3];
        float temperature;            ///< degrees Celsius
        float vcc;                    ///< volts
        float txBiasCurrent;          ///< milliamperes
        float txPower;                ///< milliwatts
        float rxPower;                ///< milliwatts
        std::uint16_t thresholds[20]; ///< page A2h bytes 0 to 39 in native order: for temperature, voltage, bias
                                      ///< current, transmitted and received power each high alarm, low alarm, high
                                      ///< warning, low warning
    };
    static_assert(offsetof(RM_SffData, vendorName) == 8 && offsetof(RM_SffData, temperature) == 72);
    static_assert(offsetof(RM_SffData, thresholds) == 92 && sizeof(RM_SffData) == 132);

    typedef RM_STATUS RM_GetSffData_t(HBA_WWN wwpn, RM_SffData* data);

    // World Wide Names.

    /// A port of this host.
    struct RM_LocalHBAInfo
    {
        HBA_WWN wwpn;
        HBA_WWN wwnn;
        std::uint32_t handle; ///< of the adapter
        char model[84];
        char serialNumber[68];
    };
    static_assert(sizeof(RM_LocalHBAInfo) == 172 && offsetof(RM_LocalHBAInfo, handle) == 16);

    typedef std::uint32_t RM_GetNumberOfLocalAdapters_t();
    typedef RM_STATUS RM_GetLocalHBAInfo_t(std::uint32_t index, RM_LocalHBAInfo* info);

    /// RM_ERROR_INVALID_WWN for a name that no port may have.
    typedef RM_STATUS RM_ValidateWwn_t(HBA_WWN wwn);

    /// Bits of what an adapter can do with its names.
    enum RM_WwnCapability : std::uint32_t
    {
        RM_WWN_READ_ONLY = 1U << 0, ///< the library is in its read-only mode
        RM_WWN_CAN_CHANGE_NON_VOLATILE = 1U << 2,
        RM_WWN_CAN_CHANGE_VOLATILE = 1U << 3,
        RM_WWN_NEEDS_REBOOT = 1U << 12,
        RM_WWN_NEEDS_RESET = 1U << 13,
    };

    typedef RM_STATUS RM_GetWWNCapability_t(HBA_WWN wwpn, std::uint32_t* capability);

    /// When changed names come into force. The codes 2 to 4 say nothing more.
    enum RM_WwnActivation : std::uint32_t
    {
        RM_WWN_ACTIVE = 1,
        RM_WWN_AT_REBOOT_VOLATILE_UNTIL = 5, ///< until then the volatile names stay in force
        RM_WWN_AT_REBOOT = 6,
        RM_WWN_AT_RESET_VOLATILE_UNTIL = 7,
        RM_WWN_AT_RESET = 8,
    };

    /// `type` is 0 for the volatile and 1 for the non-volatile names.
    typedef RM_STATUS RM_ChangeWWN_t(HBA_WWN wwpn, HBA_WWN newWwpn, HBA_WWN newWwnn, std::uint32_t type,
                                     std::uint32_t* activation);
    /// `type` is 0 for the names of the factory and 1 for the non-volatile ones.
    typedef RM_STATUS RM_RestoreWWN_t(HBA_WWN wwpn, std::uint32_t type, std::uint32_t* activation);

    enum RM_WwnType : std::uint32_t
    {
        RM_WWN_TYPE_VOLATILE = 0,
        RM_WWN_TYPE_NON_VOLATILE = 1,
        RM_WWN_TYPE_FACTORY = 2,
        RM_WWN_TYPE_CURRENT = 3,
        RM_WWN_TYPE_CONFIGURED = 4, ///< those in force from the next activation on
    };

    /// What kind of names was read.
    enum RM_WwnKind : std::uint32_t
    {
        RM_WWN_KIND_NONE = 0, ///< the adapter has no such names
        RM_WWN_KIND_VOLATILE = 1,
        RM_WWN_KIND_NON_VOLATILE = 2,
        RM_WWN_KIND_NOT_SUPPORTED = 3, ///< the adapter cannot have such names
    };

    struct RM_WwnNames
    {
        HBA_WWN wwpn;
        HBA_WWN wwnn;
        std::uint32_t kind;       ///< an RM_WwnKind
        std::uint32_t activation; ///< of configured names: an RM_WwnActivation
    };
    static_assert(sizeof(RM_WwnNames) == 24);

    /// `type` is an RM_WwnType. Where no names are configured, those in force are read as of RM_WWN_KIND_NONE.
    typedef RM_STATUS RM_ReadWWN_t(HBA_WWN wwpn, std::uint32_t type, RM_WwnNames* names);

    // Firmware, boot code and the port as a whole.

    /// Takes a file over into the library's own folder.
    typedef RM_STATUS RM_ImportHBAFileA_t(const char* file);
    /// Whether the firmware of a file is one for the adapter; the first two arguments are 0.
    typedef RM_STATUS RM_VerifyFirmwareA_t(std::uint32_t group, std::uint32_t flags, HBA_WWN wwpn, const char* file);
    /// Writes the firmware of an imported file to the flash memory; `flags` is 0.
    typedef RM_STATUS RM_DownloadFirmware_t(HBA_WWN wwpn, const char* file, std::uint32_t flags);
    /// `mode` is 1 for a restart of the firmware.
    typedef RM_STATUS RM_ResetHBA_t(HBA_WWN wwpn, std::uint32_t mode);
    /// `dynamic` gets 1 if the port changed at once, and 0 if it changes with the next reboot.
    typedef RM_STATUS RM_SetPortEnabled_t(HBA_WWN wwpn, std::uint32_t enabled, std::uint32_t* dynamic);
    /// Writes a numbered value of an adapter port, of the length and form that reading it gives.
    typedef RM_STATUS RM_SetAdapterAttribute_t(HBA_WWN wwpn, std::uint32_t id, const void* value, std::uint32_t length);
    typedef RM_STATUS RM_SetBootBiosState_t(HBA_WWN wwpn, std::uint32_t enabled);

    /// A program in the flash memory of an adapter.
    struct RM_FlashRegion
    {
        char programType[32];
        std::uint32_t programId[2];
        char version[32];
        char description[64];
        std::uint32_t startAddress; ///< of the region in the flash memory
        std::uint32_t length;       ///< bytes
        std::uint32_t next;         ///< start address of the region behind it, 0 for none
        std::uint32_t previous;     ///< likewise before it
        std::uint32_t isWakeup;     ///< not 0: the adapter starts this program
    };
    static_assert(sizeof(RM_FlashRegion) == 156);

    enum
    {
        RM_MAX_FLASH_REGIONS = 64,
    };

    struct RM_FlashList
    {
        std::uint32_t count; ///< one more than there are regions
        RM_FlashRegion entry[RM_MAX_FLASH_REGIONS];
    };
    static_assert(offsetof(RM_FlashList, entry) == 4);

    typedef RM_STATUS RM_DiagGetLoadListParams_t(HBA_WWN wwpn, RM_FlashList* list);

    /// Vital product data of a function as its chip stores them.
    struct RM_VpdArea
    {
        std::uint32_t length;    ///< bytes of `data` in use
        std::uint8_t data[4092]; ///< resources (PCI Local Bus 3.0, appendix I), from the first on
    };
    static_assert(sizeof(RM_VpdArea) == 4096 && offsetof(RM_VpdArea, data) == 4);

    typedef RM_STATUS RM_GetVPD_t(HBA_WWN wwpn, RM_VpdArea* area);

    // Driver parameters, of an adapter port and of the driver itself.

    /// The texts need not end in a zero byte. Fields from 32 to 52 are in native order.
    struct RM_DriverParam
    {
        char name[32];
        std::uint32_t lowRange;
        std::uint32_t highRange;
        std::uint32_t def;        ///< default, in the global list the value for all adapters
        std::uint32_t current;    ///< value in use
        std::uint16_t exportFlag; ///< 1 if the parameter is meant for users
        std::uint16_t dynamic;    ///< when a change takes effect, in the driver's code
        char help[80];
    };

    struct RM_DriverParamList
    {
        std::uint32_t count;
        RM_DriverParam entry[1];
    };
    static_assert(sizeof(RM_DriverParam) == 132 && offsetof(RM_DriverParamList, entry) == 4);
    static_assert(offsetof(RM_DriverParam, lowRange) == 32 && offsetof(RM_DriverParam, exportFlag) == 48 &&
                  offsetof(RM_DriverParam, help) == 52);

    typedef RM_STATUS RM_GetDriverParams_t(HBA_WWN wwpn, RM_DriverParamList* list);
    typedef RM_STATUS RM_GetDriverParamsGlobal_t(RM_DriverParamList* list);

    /// Bits of RM_SetDriverParam's control value.
    enum RM_DriverParamControl : std::uint32_t
    {
        RM_PARAM_PERMANENT = 1, ///< the value outlives the driver
        RM_PARAM_GLOBAL = 2,    ///< it holds for all adapters
    };

    /// `text` is "name=value", at most 255 characters.
    typedef RM_STATUS RM_SetDriverParam_t(HBA_WWN wwpn, const char* text, std::uint32_t control);

    // Dumps, of an adapter port.

    enum
    {
        RM_DUMP_PATH_SIZE = 256, ///< of a directory, and of a file's name, with the zero byte
        RM_MAX_RETENTION_COUNT = 20,
    };

    /// The first two arguments are 0.
    typedef RM_STATUS RM_GenerateDump_t(std::uint32_t group, std::uint32_t flags, HBA_WWN wwpn);
    /// `option` selects what is dumped; `flags` is 0.
    typedef RM_STATUS RM_GenerateEfdDump_t(HBA_WWN wwpn, std::int32_t option, std::uint32_t flags);
    /// `options` is a text of the firmware's own.
    typedef RM_STATUS RM_GenerateCoreDump_t(HBA_WWN wwpn, const char* options);
    typedef RM_STATUS RM_GetDumpDirectoryA_t(HBA_WWN wwpn, char* buffer, std::uint32_t size);
    typedef RM_STATUS RM_SetDumpDirectory_t(HBA_WWN wwpn, const char* directory);
    /// How many files the library keeps of a port.
    typedef RM_STATUS RM_GetDumpRetentionCount_t(HBA_WWN wwpn, std::uint32_t* count);
    typedef RM_STATUS RM_SetDumpRetentionCount_t(HBA_WWN wwpn, std::uint32_t count);
    typedef RM_STATUS RM_DeleteDumpFiles_t(HBA_WWN wwpn);

    struct RM_DumpFileName
    {
        char name[RM_DUMP_PATH_SIZE]; ///< without its directory
    };

    struct RM_DumpFileNames
    {
        std::uint32_t count;
        std::uint32_t reserved;
        RM_DumpFileName entry[1];
    };
    static_assert(sizeof(RM_DumpFileName) == 256 && offsetof(RM_DumpFileNames, entry) == 8);

    /// A list that says RM_ERROR_BUFFER_TOO_SMALL in place of RM_ERROR_MORE_DATA.
    typedef RM_STATUS RM_GetDumpFileNames_t(HBA_WWN wwpn, RM_DumpFileNames* names);

    // The trace that the firmware writes into its flash memory (FAT).

    /// Of all adapters.
    typedef RM_STATUS RM_RetrieveFATDump_t();
    typedef RM_STATUS RM_RetrieveFATDump2_t(HBA_WWN wwpn);
    /// The bytes select what is traced.
    typedef RM_STATUS RM_Set_BE_EventLogTraceLevel_t(HBA_WWN wwpn, std::uint32_t level, std::uint8_t byte0,
                                                     std::uint8_t byte1, std::uint8_t byte2, std::uint8_t byte3);

    /// What a module of the firmware traces.
    struct RM_EventLogModule
    {
        char module[48];
        char level[48];
        std::uint32_t portMask;
        std::uint32_t functionMask;
        std::uint32_t value;
        std::uint32_t reserved;
    };
    static_assert(sizeof(RM_EventLogModule) == 112 && offsetof(RM_EventLogModule, portMask) == 96);

    enum
    {
        RM_MAX_EVENT_LOG_MODULES = 64,
    };

    struct RM_EventLogConfig
    {
        std::uint32_t room; ///< in entries
        std::uint32_t reserved1[2];
        std::uint32_t count; ///< entries in use
        std::uint32_t reserved2[9];
        RM_EventLogModule entry[RM_MAX_EVENT_LOG_MODULES];
    };
    static_assert(sizeof(RM_EventLogConfig) == 7220 && offsetof(RM_EventLogConfig, count) == 12);

    typedef RM_STATUS RM_Get_BE_EventLogConfigDataAll_t(HBA_WWN wwpn, RM_EventLogConfig* config);
    typedef RM_STATUS RM_Set_BE_EventLogConfigDataModule_t(HBA_WWN wwpn, const RM_EventLogModule* module);

    // Virtual ports.

    struct RM_VPortEntry
    {
        HBA_WWN wwpn;
        HBA_WWN wwnn;
        std::uint32_t fcId;
        std::uint32_t state; ///< the HBA API's port state
    };

    struct RM_VPortList
    {
        std::uint32_t count;
        RM_VPortEntry entry[1];
    };
    static_assert(sizeof(RM_VPortEntry) == 24 && offsetof(RM_VPortList, entry) == 4);

    /// Virtual ports of the physical port `wwpn`.
    typedef RM_STATUS RM_VPList_t(HBA_WWN wwpn, RM_VPortList* list);

    struct RM_VPortAttributes
    {
        HBA_WWN wwpn;
        HBA_WWN wwnn;
        HBA_WWN fabricName; ///< zero without a fabric
        std::uint32_t fcId;
        std::uint32_t state;       ///< the HBA API's port state
        std::uint32_t targetCount; ///< targets that the virtual port sees
        std::uint32_t reserved;
        char symbolicName[256];
    };
    static_assert(sizeof(RM_VPortAttributes) == 296);
    static_assert(offsetof(RM_VPortAttributes, fcId) == 24 && offsetof(RM_VPortAttributes, symbolicName) == 40);

    typedef RM_STATUS RM_VPGetAttributes_t(HBA_WWN wwpn, HBA_WWN vport, RM_VPortAttributes* attributes);

    struct RM_VPortTarget
    {
        HBA_WWN wwpn;
        HBA_WWN wwnn;
        std::uint32_t fcId;
        std::uint32_t scsiBusNumber;
        std::uint32_t scsiTargetNumber;
    };

    struct RM_VPortTargetList
    {
        std::uint32_t count;
        RM_VPortTarget entry[1];
    };
    static_assert(sizeof(RM_VPortTarget) == 28 && offsetof(RM_VPortTargetList, entry) == 4);

    typedef RM_STATUS RM_VPListTargets_t(HBA_WWN wwpn, HBA_WWN vport, RM_VPortTargetList* list);

    // SCSI commands follow the HBA API: the response is that of the SCSI standard, cut at `responseSize`; a status
    // of RM_ERROR_CHECK_CONDITION fills `sense`. `lun` is the 8-byte LUN field as HBA_FCPID carries it.
    typedef RM_STATUS RM_VpScsiReportLUNs_t(HBA_WWN wwpn, HBA_WWN vport, HBA_WWN target, void* response,
                                            std::uint32_t responseSize, void* sense, std::uint32_t senseSize);
    typedef RM_STATUS RM_VpScsiInquiry_t(HBA_WWN wwpn, HBA_WWN vport, HBA_WWN target, HBA_UINT64 lun, std::uint8_t evpd,
                                         std::uint32_t page, void* response, std::uint32_t responseSize, void* sense,
                                         std::uint32_t senseSize);
    typedef RM_STATUS RM_VpScsiReadCapacity_t(HBA_WWN wwpn, HBA_WWN vport, HBA_WWN target, HBA_UINT64 lun,
                                              void* response, std::uint32_t responseSize, void* sense,
                                              std::uint32_t senseSize);
    typedef RM_STATUS RM_ScsiInquiry_t(HBA_WWN wwpn, HBA_WWN target, HBA_UINT64 lun, std::uint8_t evpd,
                                       std::uint32_t page, void* response, std::uint32_t responseSize, void* sense,
                                       std::uint32_t senseSize);

    /// The virtual machine that a virtual port is given to.
    struct RM_VirtualMachine
    {
        char name[256];
        char uuid[40];
    };
    static_assert(sizeof(RM_VirtualMachine) == 296 && offsetof(RM_VirtualMachine, uuid) == 256);

    typedef RM_STATUS RM_GetVMFromVPort_t(HBA_WWN wwpn, HBA_WWN vport, RM_VirtualMachine* machine);

    // Logical units of a target behind a physical port.

    struct RM_Lun
    {
        HBA_UINT64 fcpLun;
        std::uint32_t osLun;
        std::uint32_t blockLength; ///< bytes; 0 if unknown
    };

    struct RM_LunList
    {
        std::uint32_t count;
        std::uint32_t reserved;
        RM_Lun entry[1];
    };
    static_assert(sizeof(RM_Lun) == 16 && offsetof(RM_LunList, entry) == 8);

    typedef RM_STATUS RM_GetLunList_t(HBA_WWN wwpn, HBA_WWN target, RM_LunList* list);

    // Priority lanes: logical units that the adapter serves before others.

    /// A logical unit of a target.
    struct RM_OASLun
    {
        HBA_UINT64 fcpLun;       ///< LUN field, as HBA_FCPID carries it
        std::uint32_t osLun;     ///< number that the operating system has for the unit
        std::uint32_t laneState; ///< 1 for a unit that is served with priority, else 0
    };

    struct RM_OASLunList
    {
        std::uint32_t count;    ///< room in entries, then the number available
        std::uint32_t reserved; ///< aligns the entries
        RM_OASLun entry[1];     ///< as many as there is room for
    };
    static_assert(sizeof(RM_OASLun) == 16 && offsetof(RM_OASLun, osLun) == 8 && offsetof(RM_OASLun, laneState) == 12);
    static_assert(sizeof(RM_OASLunList) == 24 && offsetof(RM_OASLunList, entry) == 8);

    /// Whose setting is asked for.
    enum RM_LaneOption : std::uint32_t
    {
        RM_LANE_DRIVER = 0, ///< that of the running driver
        RM_LANE_CONFIG = 1, ///< that of the stored configuration
    };

    /// The lanes from a port to a target. `vport` is a virtual port of the port, or zero for the port itself.
    typedef RM_STATUS RM_GetOASLunList_t(HBA_WWN wwpn, HBA_WWN vport, HBA_WWN target, std::uint32_t option,
                                         RM_OASLunList* list);

    /// `lun` is the operating system's number of a unit, or -1 for all units of the target; `state` is 1 for a unit
    /// that is to be served with priority, else 0.
    typedef RM_STATUS RM_SetOASLunState_t(HBA_WWN wwpn, HBA_WWN target, HBA_WWN vport, std::int32_t lun,
                                          std::uint32_t state, std::uint32_t option);

    // Diagnostics. A call that starts a test gives it a handle, by which it is asked about and cancelled. Handles are
    // not 0.

    enum RM_LinkState : std::uint32_t
    {
        RM_LINK_DISABLED = 22,
    };

    enum RM_LoopbackType : std::uint32_t
    {
        RM_LOOPBACK_EXTERNAL = 0, ///< through a plug in the place of the cable
        RM_LOOPBACK_INTERNAL = 1,
    };

    /// State of a test. Any other is that of a test that has ended in an unknown way.
    enum RM_DiagState : std::uint32_t
    {
        RM_DIAG_STATE_STARTED = 1,
        RM_DIAG_STATE_RUNNING = 2,
        RM_DIAG_STATE_CANCELLED = 5,
        RM_DIAG_STATE_FINISHED = 6,
    };

    /// What a test came to.
    enum RM_DiagResult : std::uint32_t
    {
        RM_DIAG_RESULT_SUCCESS = 0,
        RM_DIAG_RESULT_ERROR = 1,
        RM_DIAG_RESULT_LINK_DOWN = 2,
        RM_DIAG_RESULT_TARGET_UNREACHABLE = 10,
    };

    struct RM_DiagResults
    {
        std::uint32_t reserved0;
        std::uint32_t state; ///< an RM_DiagState
        std::uint32_t reserved2;
        std::uint32_t cyclesCompleted; ///< those that failed included
        std::uint32_t executionTime;
        std::uint32_t result; ///< an RM_DiagResult
        std::uint32_t reserved6;
        std::uint32_t cyclesFailed;
        std::uint32_t reserved8[4];
    };
    static_assert(sizeof(RM_DiagResults) == 48);
    static_assert(offsetof(RM_DiagResults, state) == 4 && offsetof(RM_DiagResults, cyclesCompleted) == 12);
    static_assert(offsetof(RM_DiagResults, executionTime) == 16 && offsetof(RM_DiagResults, result) == 20);
    static_assert(offsetof(RM_DiagResults, cyclesFailed) == 28);

    /// `pattern` is a text of hexadecimal digits, `reserved` is 0, `haltOnError` is 0 or 1.
    typedef RM_STATUS RM_DiagEchoTestV2_t(HBA_WWN wwpn, HBA_WWN target, std::uint32_t cycles, std::uint32_t haltOnError,
                                          std::uint32_t* handle, std::uint32_t reserved, const char* pattern);
    /// `type` is an RM_LoopbackType.
    typedef RM_STATUS RM_DiagLoopBackTestV3_t(HBA_WWN wwpn, std::uint32_t type, std::uint32_t cycles,
                                              std::uint32_t haltOnError, std::uint32_t* handle, std::uint32_t reserved,
                                              const char* pattern);
    typedef RM_STATUS RM_DiagPciLoopBackTestV2_t(HBA_WWN wwpn, std::uint32_t cycles, std::uint32_t haltOnError,
                                                 std::uint32_t* handle, std::uint32_t reserved, const char* pattern);
    typedef RM_STATUS RM_DiagRunPOST_t(HBA_WWN wwpn, std::uint32_t* handle);
    /// RM_ERROR_TEST_RUNNING or RM_OK for a test that runs.
    typedef RM_STATUS RM_DiagGetResults_t(HBA_WWN wwpn, std::uint32_t handle, RM_DiagResults* results);
    /// For every test. A test that is cancelled ends some time later.
    typedef RM_STATUS RM_DiagCancelDiagnostic_t(HBA_WWN wwpn, std::uint32_t handle);

    /// State of a link test. Any other is that of a test that has finished.
    enum RM_DPortState : std::uint32_t
    {
        RM_DPORT_STATE_RUNNING = 4,
        RM_DPORT_STATE_CANCELLED = 5,
        RM_DPORT_STATE_FINISHED = 6,
    };

    enum RM_DPortPhaseId : std::uint8_t
    {
        RM_DPORT_ELECTRICAL_LOOPBACK = 210,
        RM_DPORT_OPTICAL_LOOPBACK = 211,
        RM_DPORT_REVERSE_OPTICAL_LOOPBACK = 212,
        RM_DPORT_LINK_TRAFFIC = 213,
        RM_DPORT_REVERSE_LINK_TRAFFIC = 214,
    };

    /// Of a phase; of a whole test 0 is the only one that is good.
    enum RM_DPortResult : std::uint8_t
    {
        RM_DPORT_PASSED = 0,
        RM_DPORT_SKIPPED = 1,
        RM_DPORT_FAILED = 2,
        RM_DPORT_STOPPED = 3,
    };

    enum RM_DPortPhaseFlag : std::uint8_t
    {
        RM_DPORT_HAS_ERRORS = 1, ///< the phase holds error masks and no latency
    };

    struct RM_DPortPhase
    {
        std::uint8_t result; ///< an RM_DPortResult
        std::uint8_t id;     ///< an RM_DPortPhaseId
        std::uint8_t flags;  ///< RM_DPortPhaseFlag
        std::uint8_t reserved;
        std::uint32_t latencyOrLocalErrors; ///< which of them the flags say
        std::uint32_t remoteErrors;
    };
    static_assert(sizeof(RM_DPortPhase) == 12 && offsetof(RM_DPortPhase, latencyOrLocalErrors) == 4);

    enum
    {
        RM_MAX_DPORT_PHASES = 37,
    };

    struct RM_DPortResults
    {
        std::uint32_t reserved0;
        std::uint32_t state; ///< an RM_DPortState
        std::uint32_t reserved8[3];
        std::uint32_t diagnosticStatus; ///< 0 if the test itself ran as it should
        std::uint32_t reserved24[6];
        std::uint8_t testResult; ///< 0 if the link passed
        std::uint8_t phaseCount; ///< may be above RM_MAX_DPORT_PHASES
        std::uint16_t reserved50;
        std::uint32_t roundTripLatency;
        std::uint32_t cableLength;
        std::uint16_t frameSize;
        std::uint16_t buffersRequired;
        RM_DPortPhase phases[RM_MAX_DPORT_PHASES];
        std::uint32_t reserved508;
    };
    static_assert(sizeof(RM_DPortResults) == 512);
    static_assert(offsetof(RM_DPortResults, state) == 4 && offsetof(RM_DPortResults, diagnosticStatus) == 20);
    static_assert(offsetof(RM_DPortResults, testResult) == 48 && offsetof(RM_DPortResults, phaseCount) == 49);
    static_assert(offsetof(RM_DPortResults, roundTripLatency) == 52 && offsetof(RM_DPortResults, cableLength) == 56);
    static_assert(offsetof(RM_DPortResults, frameSize) == 60 && offsetof(RM_DPortResults, buffersRequired) == 62);
    static_assert(offsetof(RM_DPortResults, phases) == 64);

    /// Tests the link with the help of the switch; `reserved` is 0.
    typedef RM_STATUS RM_DiagDPortTest_t(HBA_WWN wwpn, std::uint32_t reserved, std::uint32_t* handle);
    /// As RM_DiagGetResults.
    typedef RM_STATUS RM_DiagGetResultsDPort_t(HBA_WWN wwpn, std::uint32_t handle, RM_DPortResults* results);

    /// A target that a port sees. The library keeps the rest of the layout to itself.
    struct RM_FcpMapping
    {
        HBA_WWN wwpn;
        std::uint8_t reserved[304];
    };

    struct RM_FcpTargetMapping
    {
        std::uint32_t count;
        RM_FcpMapping entry[1];
    };
    static_assert(sizeof(RM_FcpTargetMapping) == 316 && offsetof(RM_FcpTargetMapping, entry) == 4);

    typedef RM_STATUS RM_GetFcpTargetMapping_t(HBA_WWN wwpn, RM_FcpTargetMapping* mapping);

    // Frame tagging, by adapters that are named as in the HBA API.

    /// Frames from `src_wwpn` to `tgt_wwpn` get `tag`.
    struct CPQFC_QosEntry
    {
        HBA_WWN src_wwpn;
        HBA_WWN tgt_wwpn;
        std::uint8_t reserved1[16];
        std::uint8_t tag;
        std::uint8_t reserved2[3];
    };

    struct CPQFC_QosTable
    {
        std::uint32_t count;
        CPQFC_QosEntry entry[1];
    };
    static_assert(sizeof(CPQFC_QosEntry) == 36 && offsetof(CPQFC_QosEntry, tag) == 32);
    static_assert(offsetof(CPQFC_QosTable, entry) == 4);

    typedef std::uint32_t CPQFC_GetNumberOfAdapters_t();
    typedef RM_STATUS CPQFC_OpenAdapter_t(const char* name, std::uint32_t* handle);
    typedef void CPQFC_CloseAdapter_t(std::uint32_t handle);
    /// A list as above, but that a count of 0 asks for the number available, which is then no failure.
    typedef RM_STATUS CPQFC_QoSGetConfig_t(std::uint32_t handle, CPQFC_QosTable* table);
    /// Takes the place of the adapter's table.
    typedef RM_STATUS CPQFC_QoSSetConfig_t(std::uint32_t handle, const CPQFC_QosTable* table);
    typedef RM_STATUS CPQFC_QoSGetGlobalFlag_t(std::uint32_t handle, std::uint32_t* state);
    typedef RM_STATUS CPQFC_QoSSetGlobalFlag_t(std::uint32_t handle, std::uint32_t state);

} // extern "C"
