#include "broker/metrics/Exposition.h"

#include "broker/values/Value.h"

#include <prometheus/text_serializer.h>

#include <algorithm>
#include <array>
#include <charconv>

namespace metrics
{

using prometheus::MetricFamily;
using prometheus::MetricType;

namespace
{

// --- what a client likes ------------------------------------------------------------------------------------------

std::string_view trimmed(std::string_view text)
{
    const auto first = std::min(text.find_first_not_of(" \t"), text.size());
    text.remove_prefix(first);
    return text.substr(0, text.find_last_not_of(" \t") + 1);
}

/// Takes the part before the mark off the text.
std::string_view cutOff(std::string_view& text, char mark)
{
    const std::size_t end = std::min(text.find(mark), text.size());
    const std::string_view part = text.substr(0, end);
    text.remove_prefix(std::min(end + 1, text.size()));
    return trimmed(part);
}

/// One range of an Accept header (RFC 9110).
struct Range
{
    std::string type;
    std::string version = {};
    double quality = 1;
};

Range readRange(std::string_view text)
{
    Range range{broker::lowerCase(cutOff(text, ';'))};
    while (!text.empty())
    {
        std::string_view parameter = cutOff(text, ';');
        const std::string name = broker::lowerCase(cutOff(parameter, '='));
        if (name == "version")
            range.version = trimmed(parameter);
        if (name == "q" &&
            std::from_chars(parameter.data(), parameter.data() + parameter.size(), range.quality).ec != std::errc())
            range.quality = 0;
    }
    return range;
}

// --- OpenMetrics --------------------------------------------------------------------------------------------------

struct Kind
{
    const char* type;
    std::string_view suffix; ///< of samples, which the family's name lacks
};

Kind kindOf(const MetricFamily& family)
{
    if (family.type == MetricType::Counter)
        return {"counter", "_total"};
    return family.name.ends_with("_info") ? Kind{"info", "_info"} : Kind{"gauge", ""};
}

/// The unit that the name ends in; empty for a number of things.
std::string_view unitOf(std::string_view name)
{
    static constexpr std::array<std::string_view, 7> units{"bytes_per_second", "bytes", "seconds", "celsius", "volts",
                                                           "amperes",          "watts"};
    const auto* unit = std::ranges::find_if(units, [&](std::string_view u) { return name.ends_with(u); });
    return unit == units.end() ? std::string_view() : *unit;
}

void appendEscaped(std::string& out, std::string_view text)
{
    for (const char c : text)
    {
        if (c == '\n')
            out += "\\n";
        else
            out.append(c == '\\' || c == '"' ? "\\" : "").push_back(c);
    }
}

void appendNumber(std::string& out, double number)
{
    std::array<char, 32> text{};
    out.append(text.data(), std::to_chars(text.data(), text.data() + text.size(), number).ptr);
}

void appendLabels(std::string& out, const std::vector<prometheus::ClientMetric::Label>& labels)
{
    char before = '{';
    for (const auto& label : labels)
    {
        out.append(1, before).append(label.name).append("=\"");
        appendEscaped(out, label.value);
        out += '"';
        before = ',';
    }
    if (!labels.empty())
        out += '}';
}

void appendFamily(std::string& out, const MetricFamily& family)
{
    const Kind kind = kindOf(family);
    const std::string_view name = std::string_view(family.name).substr(0, family.name.size() - kind.suffix.size());
    out.append("# TYPE ").append(name).append(" ").append(kind.type).append("\n");
    if (const std::string_view unit = unitOf(name); !unit.empty())
        out.append("# UNIT ").append(name).append(" ").append(unit).append("\n");
    out.append("# HELP ").append(name).append(" ");
    appendEscaped(out, family.help);
    out += '\n';
    for (const prometheus::ClientMetric& sample : family.metric)
    {
        out.append(name).append(kind.suffix);
        appendLabels(out, sample.label);
        out += ' ';
        appendNumber(out, family.type == MetricType::Counter ? sample.counter.value : sample.gauge.value);
        out += '\n';
    }
}

} // namespace

Format formatFor(std::string_view accept)
{
    double openMetrics = 0, plain = 0;
    while (!accept.empty())
    {
        const Range range = readRange(cutOff(accept, ','));
        const bool knownVersion = range.version.empty() || range.version == "1.0.0" || range.version == "0.0.1";
        if (range.type == "application/openmetrics-text" && knownVersion)
            openMetrics = std::max(openMetrics, range.quality);
        if (range.type == "text/plain" || range.type == "text/*")
            plain = std::max(plain, range.quality);
    }
    return openMetrics > plain ? Format::openMetrics : Format::prometheus;
}

const char* contentType(Format format)
{
    return format == Format::openMetrics ? "application/openmetrics-text; version=1.0.0; charset=utf-8"
                                         : "text/plain; version=0.0.4; charset=utf-8";
}

std::string exposition(const Families& families, Format format)
{
    if (format == Format::prometheus)
        return prometheus::TextSerializer().Serialize(families);
    std::string text;
    for (const MetricFamily& family : families)
        appendFamily(text, family);
    return text + "# EOF\n";
}

} // namespace metrics
