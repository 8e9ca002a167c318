// What is read of instances, and that they have what the tables read.
#include "broker/metrics/HostFamilies.h"
#include "broker/metrics/Exposition.h"
#include "broker/values/ClassInfo.h"
#include "schema/Repository.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <algorithm>
#include <set>
#include <sstream>

namespace
{

using namespace broker;
using namespace metrics;
using prometheus::MetricType;
using testing::AllOf;
using testing::HasSubstr;
using testing::Not;

const ClassInfo& classNamed(const char* name)
{
    static const ClassTable classes(&cimple::the_repository);
    return *classes.find(name);
}

const SourceRow& sourceOf(const std::string& className)
{
    return *std::ranges::find(hostSources(), className, &SourceRow::className);
}

TEST(HostFamilies, AreNamedAsTheirTypesWantIt)
{
    std::set<std::string> names;
    std::string before;
    for (const SourceRow& source : hostSources())
        for (const FamilyRow& row : source.families)
        {
            const std::string name = row.name;
            EXPECT_TRUE(name == before || names.insert(name).second) << name << " stands twice";
            before = name;
            EXPECT_THAT(name, testing::StartsWith("tavrin_fc_"));
            EXPECT_EQ(name.ends_with("_total"), row.type == MetricType::Counter) << name;
            EXPECT_TRUE(std::string(row.help).ends_with(".")) << name;
        }
}

TEST(HostFamilies, ReadPropertiesThatTheClassHas)
{
    for (const SourceRow& source : hostSources())
        for (const FamilyRow& row : source.families)
        {
            std::vector<const char*> properties{row.property};
            if (row.measure)
                properties = {row.measure->value, row.measure->highAlarm, row.measure->highWarning,
                              row.measure->lowWarning, row.measure->lowAlarm};
            for (const char* property : properties)
                EXPECT_TRUE(!property || !*property || classNamed(source.className).property(property))
                    << row.name << " reads " << property;
        }
}

/// Lines of samples, without those of families.
std::string samplesOf(const char* className, Object object)
{
    object.path.className = className;
    Series series;
    read(series, sourceOf(className), {object});
    std::istringstream text(exposition(series.families(), Format::openMetrics));
    std::string samples;
    for (std::string line; std::getline(text, line);)
        if (!line.starts_with('#'))
            samples += line + "\n";
    return samples;
}

TEST(HostFamilies, APortHasItsStateAndSpeed)
{
    const auto withStatus = [](std::uint16_t status, std::uint64_t speed = 8'000'000'000)
    {
        return samplesOf("TVRHBA_FCPort", {{},
                                           {{"DeviceID", Value::string("10AA")},
                                            {"OperationalStatus", Value::array(CMPI_uint16, {Value::uint16(status)})},
                                            {"Speed", Value::uint64(speed)}}});
    };
    EXPECT_THAT(withStatus(2), AllOf(HasSubstr("tavrin_fc_port_up{port=\"10AA\"} 1\n"),
                                     HasSubstr("tavrin_fc_port_state{port=\"10AA\",state=\"up\"} 1\n"),
                                     HasSubstr("tavrin_fc_port_state{port=\"10AA\",state=\"offline\"} 0\n"),
                                     HasSubstr("tavrin_fc_port_reset_needed{port=\"10AA\"} 0\n"),
                                     HasSubstr("tavrin_fc_port_speed_bytes_per_second{port=\"10AA\"} 1e+09\n"),
                                     Not(HasSubstr("max_speed"))));
    EXPECT_THAT(withStatus(32789), AllOf(HasSubstr("tavrin_fc_port_up{port=\"10AA\"} 0\n"),
                                         HasSubstr("tavrin_fc_port_reset_needed{port=\"10AA\"} 1\n")));
    EXPECT_THAT(withStatus(99), AllOf(HasSubstr("tavrin_fc_port_up{port=\"10AA\"} 0\n"),
                                      HasSubstr("tavrin_fc_port_state{port=\"10AA\",state=\"unknown\"} 1\n")));
    EXPECT_THAT(withStatus(2, 0), Not(HasSubstr("speed"))) << "a link of unknown speed";
    EXPECT_THAT(withStatus(1, 0), HasSubstr("tavrin_fc_port_speed_bytes_per_second{port=\"10AA\"} 0\n"));
}

TEST(HostFamilies, ATransceiverIsMeasuredInBaseUnits)
{
    const auto withPower = [](float power)
    {
        return samplesOf("TVRHBA_Transceiver", {{},
                                                {{"Tag", Value::string("10AA:SN1")},
                                                 {"TxBiasCurrent", Value::real32(6.82F)},
                                                 {"RxPower", Value::real32(power)},
                                                 {"RxPowerHighAlarm", Value::real32(1.5849F)},
                                                 {"RxPowerHighWarning", Value::real32(1)},
                                                 {"RxPowerLowWarning", Value::real32(0.0355F)},
                                                 {"RxPowerLowAlarm", Value::real32(0.0282F)}}});
    };
    constexpr char receive[] = "tavrin_fc_transceiver_beyond_threshold{port=\"10AA\",measure=\"receive power\",level=";
    const std::string warning = std::string(receive) + "\"warning\"} ";
    const std::string alarm = std::string(receive) + "\"alarm\"} ";
    EXPECT_THAT(
        withPower(0.421F),
        AllOf(HasSubstr("tavrin_fc_transceiver_bias_current_amperes{port=\"10AA\"} 0.00682\n"),
              Not(HasSubstr("bias_current_threshold")), // it has none
              Not(HasSubstr("measure=\"bias current\"")),
              HasSubstr("tavrin_fc_transceiver_receive_power_watts{port=\"10AA\"} 0.000421\n"),
              HasSubstr("tavrin_fc_transceiver_receive_power_threshold_watts{port=\"10AA\",threshold=\"low alarm\"} "
                        "2.82e-05\n"),
              HasSubstr(warning + "0\n"), HasSubstr(alarm + "0\n")));
    EXPECT_THAT(withPower(0.03F), AllOf(HasSubstr(warning + "1\n"), HasSubstr(alarm + "0\n")));
    EXPECT_THAT(withPower(0.01F), AllOf(HasSubstr(warning + "1\n"), HasSubstr(alarm + "1\n")));
    EXPECT_THAT(withPower(2), AllOf(HasSubstr(warning + "1\n"), HasSubstr(alarm + "1\n")));
}

TEST(HostFamilies, SoftwareIsToldByItsKind)
{
    const auto software = [](std::uint16_t classification, const char* version)
    {
        return samplesOf("TVRHBA_SoftwareIdentity",
                         {{},
                          {{"Name", Value::string("N")},
                           {"VersionString", Value::string(version)},
                           {"Classifications", Value::array(CMPI_uint16, {Value::uint16(classification)})},
                           {"IdentityInfoType", Value::array(CMPI_string, {Value::string("TAVRIN:PORT_WWPN")})},
                           {"IdentityInfoValue", Value::array(CMPI_string, {Value::string("10AA")})}}});
    };
    EXPECT_THAT(software(10, "1.2"),
                HasSubstr("tavrin_fc_firmware_info{port=\"10AA\",name=\"N\",version=\"1.2\"} 1\n"));
    EXPECT_THAT(software(2, "1.2"), HasSubstr("tavrin_fc_driver_info{port=\"10AA\",name=\"N\",version=\"1.2\"} 1\n"));
    EXPECT_THAT(software(11, "1.2"), Not(HasSubstr("_info"))) << "boot code";
    EXPECT_THAT(software(10, ""), Not(HasSubstr("_info")));
}

} // namespace
