// Small scenarios for the tests.
#pragma once

#include "simulator/ScenarioReader.h"

namespace tvrsim
{

constexpr Wwn portA = 0x1000'027A'0000'00A0, portB = 0x1000'027A'0000'00B0;
constexpr Wwn vport = 0x2001'027A'0000'00A0;
constexpr Wwn disks = 0x5063'D200'0000'0001, tape = 0x5063'D200'0000'0002;

/// One adapter of two ports: the first sees both targets and has a virtual port, the second sees the disks.
inline constexpr const char* twoPorts = R"({
  "targets": [
    {"name": "disks", "wwpn": "5063D20000000001", "fcId": "0x10203", "units": [
      {"lun": 300, "blocks": 10, "blockLength": 4096},
      {"lun": 0, "blocks": 4294967297, "serialNumber": "S0", "vendor": "V", "product": "PRODUCT", "revision": "1.2",
       "designators": [{"value": "6000AABBCCDDEEFF0011223344556677"}, {"type": 1, "text": "abc"}]}
    ]},
    {"name": "tape", "wwpn": "50:63:d2:00:00:00:00:02", "units": [{"lun": 1, "deviceType": 1,
      "checkConditions": [{"command": "inquiry", "times": 2, "key": 6, "code": "0x29"}]}]}
  ],
  "adapters": [{"name": "Tavrin-A", "nodeWwn": "2000027A000000A0", "optionRomVersion": "1.0",
    "features": {"201": 1, "0x1AE": 0},
    "attributes": {"subadapterId": "7", "nodeSymbolicName": null, "sliMode": 4},
    "ports": [
      {"wwpn": "1000027A000000A0", "scsiBus": 3, "targets": ["tape", "disks"], "fabricName": "100000000000FAB1",
       "statistics": {"txFrames": "0xFFFFFFFFFFFFFFFF", "rxFrames": 5},
       "pci": {"type": 4, "vendorId": "0x1234", "baseAddress1": 16909060, "area": [7, 8]},
       "virtualPorts": [{"wwpn": "2001027A000000A0", "targets": ["disks"],
                         "virtualMachine": {"name": "guest", "uuid": "u-1"}}]},
      {"wwpn": "1000027A000000B0", "scsiBus": 4, "targets": ["disks"]}
    ]}]
})";

} // namespace tvrsim
