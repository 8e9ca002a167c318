// A Fibre Channel adapter: one function of a card, with its ports.
#pragma once

#include "device/Adapter.h"

namespace cimple
{

class AttributeBlock;

/// Adapter facts. The constructor throws std::exception if the HBA API cannot open the adapter or describe its first
/// port, or the RM library does not know that port. A value that cannot be read keeps its default.
class FCAdapterAttributes : public AdapterAttributes
{
public:
    explicit FCAdapterAttributes(const std::string& adapterName);

    std::string manufacturer;
    std::string serialNumber;
    std::string model;
    std::string modelDescription;
    std::string nodeSymbolicName; ///< of the RM library, or the HBA API's if that does not give it
    std::string hardwareVersion;
    std::string driverVersion;
    std::string optionROMVersion;
    std::string firmwareVersion;
    std::string driverName;
    std::string nodeWWN;   ///< 16 upper-case hexadecimal digits
    std::string port0WWPN; ///< likewise
    std::uint32_t vendorSpecificID = 0;
    std::uint32_t numberOfPorts = 0;             ///< as reported, however large
    std::uint32_t boardTemperature = 0;          ///< degrees Celsius
    std::uint32_t boardTemperatureState = 0;     ///< bits 16 to 23 of the library's word
    std::uint32_t boardTemperatureThreshold = 0; ///< degrees Celsius
    std::uint32_t deviceID = 0;
    std::uint32_t modelID = 0;
    std::uint32_t driverType = 0;
    std::uint32_t diagVersion = 0;
    std::uint32_t portNumber = 0;
    std::uint32_t functionType = 0;
    std::uint32_t sliMode = 0;
    std::uint32_t pciFunctionNumber = 0;
    std::uint32_t pciBusNumber = 0;
    std::string ieeeAddress; ///< six pairs of lower-case digits with colons between
    std::string bootBiosVersion;
    std::string kernelVersion;
    std::string initialFirmware;
    std::string operationalFirmware;
    std::string firmwareOnFlash;
    std::string fcUniversalVersion;
    std::string fcX86BiosVersion;
    std::string fcEfiVersion;
    std::string fcFcodeVersion;
    std::string ulpFirmwareVersion;
    std::string ulpFirmwareName;
    std::string spFirmwareVersion;
    std::string spFirmwareName;
    std::string sli1FirmwareName;
    std::string sli2FirmwareName;
    std::string sli3FirmwareName;
    std::string subadapterID; ///< empty on most adapters
    bool bootCodeEnabled = false;

private:
    void readHbaAttributes(const std::string& adapterName);
    void readRmAttributes();
};

class FCAdapterStatistics : public AdapterStatistics
{};

class FCAdapter : public Adapter
{
public:
    /// Ports that cannot be read are left out. Throws what FCAdapterAttributes throws.
    FCAdapter(const std::string& adapterName, std::uint32_t number);
    ~FCAdapter() override;
    const std::string& getName() const override { return name; }
    const std::uint32_t& getAdapterNumber() const override { return adapterNumber; }
    const std::uint32_t& getFunctionType() const override { return functionType; }
    FCAdapterAttributes* getAttributes() const override { return static_cast<FCAdapterAttributes*>(attributes.get()); }
    FCAdapterStatistics* getStatistics() const override { return static_cast<FCAdapterStatistics*>(statistics.get()); }
    unsigned getPortCount() const override { return static_cast<unsigned>(ports.size()); }
    std::vector<Port*>& getPorts() override { return ports; }
    Port* getPort(unsigned index) const override { return ports.at(index); }
    void rescanTargets() override;
};

} // namespace cimple
