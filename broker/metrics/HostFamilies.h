// What is told of a host's cards, ports, transceivers and software: a family is a row, and so is the class that it is
// read from.
#pragma once

#include "broker/metrics/Series.h"

#include "broker/health/Health.h"

#include <span>

namespace metrics
{

struct FamilyRow : FamilyName
{
    /// Adds the row's samples of one instance to the series. `labels` tell the instance.
    using Read = void (*)(Series& series, const FamilyRow& row, const broker::Object& object, const Labels& labels);

    Read read = nullptr;
    const char* property = "";
    double divisor = 1; ///< from the property's unit to the family's
    const broker::Measure* measure = nullptr;
};

struct SourceRow
{
    const char* className;
    Labels (*labels)(const broker::Object& object);
    std::span<const FamilyRow> families;
    /// Adds what is told of several instances together; null for nothing.
    void (*together)(Series& series, const std::vector<broker::Object>& objects) = nullptr;
};

/// In the order in which they are told.
std::span<const SourceRow> hostSources();

/// The samples of the instances of one class.
void read(Series& series, const SourceRow& source, const std::vector<broker::Object>& objects);

} // namespace metrics
