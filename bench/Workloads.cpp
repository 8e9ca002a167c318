#include "bench/Workloads.h"

#include <cstdlib>
#include <cstring>
#include <new>

using namespace cimple;

namespace bench
{

Ref<TVRHBA_Card> makeCard(std::size_t number)
{
    const String serial("VM" + std::to_string(10'000'000 + number));
    const String model("TFC-2602-M");
    Ref<TVRHBA_Card> card(create<TVRHBA_Card>(true));
    card->CreationClassName.set("TVRHBA_Card");
    card->Tag.set(serial);
    card->OtherIdentifyingInfo.set(serial);
    card->Name.set(model);
    card->Manufacturer.set("Tavrin Corporation");
    card->Model.set(model);
    card->Description.set("Tavrin TFC-2602-M 16Gb 2-port PCIe Fibre Channel Adapter");
    card->SerialNumber.set(serial);
    card->TVRSerialNumber.set(serial);
    card->PartNumber.set(model);
    card->PackageType.set(9);
    card->ElementName.set("TVR FCHBA:TFC-2602-M:" + std::to_string(number));
    card->Version.set("0000000b");
    return card;
}

Ref<TVRHBA_FCPort> makePort(std::size_t number)
{
    Ref<TVRHBA_FCPort> port(create<TVRHBA_FCPort>(true));
    port->SystemCreationClassName.set("CIM_ComputerSystem");
    port->SystemName.set("storage-host-17.example.net");
    port->CreationClassName.set("TVRHBA_FCPort");
    port->DeviceID.set("10000090FA" + std::to_string(100'000 + number));
    return port;
}

CloneFloor::CloneFloor(const Instance* instance) : _size(instance->__meta_class->size), _instance(instance)
{
    for (std::size_t i = 0; i < instance->__meta_class->num_meta_features; i++)
    {
        const Meta_Property* property = as_property(instance->__meta_class->meta_features[i]);
        if (!property)
            continue;
        if (property->subscript != 0)
            _arrays.push_back(property->offset);
        else if (property->type == STRING)
            _strings.push_back(property->offset);
        else if (property->type == DATETIME)
            _datetimes.push_back(property->offset);
    }
}

void CloneFloor::run() const
{
    auto* copy = static_cast<char*>(std::malloc(_size));
    const auto* from = reinterpret_cast<const char*>(_instance);
    std::memcpy(copy, from, _size);
    for (std::size_t offset : _strings)
        new (copy + offset) String(*reinterpret_cast<const String*>(from + offset));
    for (std::size_t offset : _datetimes)
        new (copy + offset) Datetime(*reinterpret_cast<const Datetime*>(from + offset));
    for (std::size_t offset : _arrays)
        new (copy + offset) Array_Base(*reinterpret_cast<const Array_Base*>(from + offset));
    asm volatile("" : : "r"(copy) : "memory");
    for (std::size_t offset : _strings)
        reinterpret_cast<String*>(copy + offset)->~String();
    for (std::size_t offset : _datetimes)
        reinterpret_cast<Datetime*>(copy + offset)->~Datetime();
    for (std::size_t offset : _arrays)
        reinterpret_cast<Array_Base*>(copy + offset)->~Array_Base();
    std::free(copy);
}

} // namespace bench
