// Families of samples as they are collected, for either text format.
#pragma once

#include <prometheus/metric_family.h>

#include <map>
#include <set>
#include <string>
#include <string_view>
#include <utility>
#include <vector>

namespace metrics
{

using Families = std::vector<prometheus::MetricFamily>;
using Labels = std::vector<std::pair<const char*, std::string>>;

/// What a family is: the names of counters end in _total, those of gauges that say something by their labels in _info.
struct FamilyName
{
    const char* name;
    prometheus::MetricType type;
    const char* help;
};

/// Text of a device as the value of a label: of bounded length, in UTF-8, without control characters and without blanks
/// at its ends.
std::string labelText(std::string_view text);

class Series
{
public:
    /// Values that are no finite numbers are left out, and so are a sample whose labels the family has already, for
    /// devices may claim to be one another, and the samples of a family beyond a great many.
    void add(const FamilyName& family, const Labels& labels, double value);
    const Families& families() const { return _families; }

private:
    std::size_t placeOf(const FamilyName& family);

    using Key = std::vector<prometheus::ClientMetric::Label>;
    Families _families;
    std::map<std::string, std::size_t, std::less<>> _places; ///< in _families, by name
    std::vector<std::set<Key>> _seen;                        ///< by place
};

} // namespace metrics
