#include "model/UnitNames.h"

#include "schema/CIM_StorageVolume.h"

#include <iterator>

namespace cimple
{

namespace
{

/// Types of a designator (SPC-4, 7.8.6.1), and formats of the name that one of type 3 has, in its first four bits.
constexpr std::uint32_t typeNaa = 3;
constexpr unsigned naaIeeeExtended = 1, naaLocal = 2, naaIeee = 5, naaIeeeRegisteredExtended = 6;

String hexadecimalFrom(const Descriptor& designator, std::size_t first)
{
    // The designator's two numbers are the head of the record, its bytes what follows.
    const auto* record = reinterpret_cast<const std::uint8_t*>(&designator);
    String text;
    bytesRangeToHex({record, sizeof designator}, first, designator.designatorLength, text);
    return text;
}

/// What a volume says of its name, by the type of its designator. Null texts are left unset.
struct NameFormatRow
{
    std::uint16_t format;
    std::uint16_t nameSpace;
    const char* otherFormat;
    const char* otherNameSpace;
};

constexpr NameFormatRow nameFormats[] = {
    {6, 1, nullptr, "Vendor specific"},
    {5, 4, nullptr, nullptr},
    {10, 3, nullptr, nullptr},
    {9, 2, nullptr, nullptr},
    {1, 1, "Relative target port identifier", "Relative target port idientifier"},
    {1, 1, "Target port group", "Target port group"},
    {1, 1, "Logical port group", "Logical unit group"},
    {1, 1, "MD5 logical unit identifier", "MD5 logical unit identifier"},
    {1, 1, "SCSI name std::string", "SCSI name std::string"},
};

} // namespace

String refinedName(const Descriptor& designator, const char* identifier)
{
    if (designator.designatorType != typeNaa)
        return identifier;
    switch (designator.value[0] >> 4)
    {
    case naaIeeeExtended:
    case naaLocal:
    case naaIeee:
        return hexadecimalFrom(designator, 2);
    case naaIeeeRegisteredExtended:
        return hexadecimalFrom(designator, 1);
    default:
        return identifier;
    }
}

void setNameFormat(CIM_StorageVolume& volume, const Descriptor& designator)
{
    const std::uint32_t type = designator.designatorType;
    if (type >= std::size(nameFormats))
        return;
    const NameFormatRow& row = nameFormats[type];
    volume.NameFormat.set(row.format);
    volume.NameNamespace.set(row.nameSpace);
    if (row.otherFormat)
        volume.OtherNameFormat.set(row.otherFormat);
    if (row.otherNameSpace)
        volume.OtherNameNamespace.set(row.otherNameSpace);
}

} // namespace cimple
