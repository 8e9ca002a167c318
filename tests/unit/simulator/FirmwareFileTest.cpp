#include "simulator/FirmwareFile.h"

#include <gtest/gtest.h>

using namespace tvrsim;

namespace
{

TEST(FirmwareFile, HasTheFormOfItsDescription)
{
    const std::string text = "TVRSIM-FIRMWARE 1\nfamily: TV3202\nversion: 12.8.1.0\nchecksum: CBF43926\n\n123456789";
    EXPECT_EQ(firmwareText("TV3202", "12.8.1.0", "123456789"), text);
    const auto file = readFirmware(text);
    ASSERT_TRUE(file);
    EXPECT_EQ(file->family, "TV3202");
    EXPECT_EQ(file->version, "12.8.1.0");
    EXPECT_TRUE(file->isWhole);
    EXPECT_FALSE(readFirmware(text + "x")->isWhole);
    for (std::size_t length = 0; length < text.find("\n\n") + 2; ++length)
        EXPECT_FALSE(readFirmware(text.substr(0, length))) << length;
}

} // namespace
