#include "broker/metrics/Series.h"

#include "broker/values/Utf8.h"

#include <algorithm>
#include <cmath>

namespace metrics
{

using prometheus::MetricType;

std::string labelText(std::string_view text)
{
    constexpr std::size_t mostBytes = 128;
    std::string result;
    while (!text.empty())
    {
        const auto byte = static_cast<unsigned char>(text.front());
        const std::size_t length = byte < 0x80 ? 1 : broker::longCharacter(text);
        const bool control = byte < 0x20 || byte == 0x7F || (length == 2 && byte == 0xC2 && text[1] < '\xA0');
        const std::string_view character = length == 0 ? "?" : control ? " " : text.substr(0, length);
        const bool leads = character == " " && result.empty();
        if (result.size() + character.size() > mostBytes)
            break;
        if (!leads)
            result += character;
        text.remove_prefix(std::max<std::size_t>(length, 1));
    }
    result.resize(result.find_last_not_of(' ') + 1);
    return result;
}

std::size_t Series::placeOf(const FamilyName& family)
{
    const auto [place, isNew] = _places.try_emplace(family.name, _families.size());
    if (isNew)
    {
        _families.push_back({family.name, family.help, family.type, {}});
        _seen.emplace_back();
    }
    return place->second;
}

void Series::add(const FamilyName& family, const Labels& labels, double value)
{
    if (!std::isfinite(value))
        return;
    prometheus::ClientMetric sample;
    for (const auto& [name, text] : labels)
        sample.label.push_back({name, labelText(text)});
    constexpr std::size_t mostSamples = 65536; // of a family
    const std::size_t place = placeOf(family);
    if (_families[place].metric.size() >= mostSamples)
        return;
    if (!_seen[place].insert(sample.label).second)
        return;
    (family.type == MetricType::Counter ? sample.counter.value : sample.gauge.value) = value;
    _families[place].metric.push_back(std::move(sample));
}

} // namespace metrics
