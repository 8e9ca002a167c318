// The text that monitoring gets, and in which format.
#include "broker/metrics/Exposition.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <cmath>
#include <limits>

namespace
{

using namespace metrics;
using prometheus::MetricType;
using testing::ElementsAre;

constexpr FamilyName bytes{"fc_sent_bytes_total", MetricType::Counter, "Bytes."};
constexpr FamilyName heat{"fc_heat_celsius", MetricType::Gauge, "Heat of \"it\",\nin C:\\"};
constexpr FamilyName info{"fc_card_info", MetricType::Gauge, "A card."};

Families someFamilies()
{
    Series series;
    series.add(bytes, {{"port", "a"}}, 18446744073709551615.0);
    series.add(heat, {}, -0.0355);
    series.add(bytes, {{"port", "b"}, {"kind", R"(x"\y)"}}, 7);
    series.add(info, {{"card", "TV"}}, 1);
    return series.families();
}

TEST(Exposition, OpenMetricsNamesFamiliesWithoutSuffixes)
{
    EXPECT_EQ(exposition(someFamilies(), Format::openMetrics),
              "# TYPE fc_sent_bytes counter\n"
              "# UNIT fc_sent_bytes bytes\n"
              "# HELP fc_sent_bytes Bytes.\n"
              "fc_sent_bytes_total{port=\"a\"} 18446744073709551616\n"
              "fc_sent_bytes_total{port=\"b\",kind=\"x\\\"\\\\y\"} 7\n"
              "# TYPE fc_heat_celsius gauge\n"
              "# UNIT fc_heat_celsius celsius\n"
              "# HELP fc_heat_celsius Heat of \\\"it\\\",\\nin C:\\\\\n"
              "fc_heat_celsius -0.0355\n"
              "# TYPE fc_card info\n"
              "# HELP fc_card A card.\n"
              "fc_card_info{card=\"TV\"} 1\n"
              "# EOF\n");
    EXPECT_EQ(exposition({}, Format::openMetrics), "# EOF\n");
}

TEST(Exposition, PrometheusNamesFamiliesAsTheirSamples)
{
    const std::string text = exposition(someFamilies(), Format::prometheus);
    EXPECT_THAT(text, testing::HasSubstr("# TYPE fc_sent_bytes_total counter\n"
                                         "fc_sent_bytes_total{port=\"a\"} 1.844674407370955e+19\n"
                                         "fc_sent_bytes_total{port=\"b\",kind=\"x\\\"\\\\y\"} 7\n"));
    EXPECT_THAT(text, testing::HasSubstr("# TYPE fc_card_info gauge\n"));
    EXPECT_THAT(text, testing::Not(testing::HasSubstr("EOF")));
}

TEST(Exposition, TheClientsHeaderDecides)
{
    const struct
    {
        const char* accept;
        Format format;
    } rows[] = {
        {"", Format::prometheus},
        {"*/*", Format::prometheus},
        {"text/plain", Format::prometheus},
        {"application/openmetrics-text", Format::openMetrics},
        {"application/openmetrics-text; version=1.0.0; charset=utf-8", Format::openMetrics},
        {"application/openmetrics-text;version=1.0.0,application/openmetrics-text;version=0.0.1;q=0.75,"
         "text/plain;version=0.0.4;q=0.5,*/*;q=0.1",
         Format::openMetrics},
        {"text/plain;q=0.9, Application/OpenMetrics-Text ; Version=1.0.0 ; Q=0.8", Format::prometheus},
        {"text/plain, application/openmetrics-text", Format::prometheus},
        {"application/openmetrics-text;q=0", Format::prometheus},
        {"application/openmetrics-text;q=, text/html", Format::prometheus},
        {"application/openmetrics-text;version=7.0.0", Format::prometheus},
        {";;,,=;q==", Format::prometheus},
    };
    for (const auto& row : rows)
        EXPECT_EQ(formatFor(row.accept), row.format) << row.accept;
}

TEST(Series, LabelsAreBoundedText)
{
    EXPECT_EQ(labelText("  OPTENNA \t SFP\n"), "OPTENNA   SFP");
    EXPECT_EQ(labelText("47 °C"), "47 °C");
    EXPECT_EQ(labelText("a\xC3(\xFF\x01z\x7F"), "a?(? z");
    EXPECT_EQ(labelText("a\xC2\x85z"), "a z") << "a control character of two bytes";
    EXPECT_EQ(labelText("\xE2\x82"), "??") << "cut off";
    EXPECT_EQ(labelText(std::string(1000, 'x')).size(), 128u);
    EXPECT_EQ(labelText(std::string(127, 'x') + "é"), std::string(127, 'x')) << "no half a character";
    EXPECT_EQ(labelText(" \n"), "");
}

TEST(Series, ASampleStandsOnceAndIsANumber)
{
    Series series;
    series.add(heat, {{"port", "a"}}, 1);
    series.add(heat, {{"port", "a "}}, 2); // another port that becomes the same text
    series.add(heat, {{"port", "b"}}, std::numeric_limits<double>::infinity());
    series.add(heat, {{"port", "c"}}, std::nan(""));
    ASSERT_EQ(series.families().size(), 1u);
    ASSERT_EQ(series.families()[0].metric.size(), 1u);
    EXPECT_EQ(series.families()[0].metric[0].gauge.value, 1);
}

} // namespace
