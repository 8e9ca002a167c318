// The two logs that a host shows, and their entries as people read them.
#pragma once

#include "broker/values/Value.h"

#include <span>
#include <string>
#include <vector>

namespace broker
{

/// An entry; what it does not tell is empty.
struct LogLine
{
    std::string time; ///< "2026-11-22 18:30:00.123456"
    std::string severity;
    std::string text;
};

/// The CreationTimeStamp of an entry or a record, as in LogLine; empty where it has none.
std::string creationTime(const Object& entry);

struct LogKind
{
    const char* id;
    const char* name;
    const char* idPrefix; ///< of the InstanceID of its TVRHBA_RecordLog
    const char* absence;  ///< what is said where there is none
    const char* entryClass;
    bool newestFirst; ///< in the order of its instances
    LogLine (*line)(const Object& entry);
};

extern const LogKind providerLogKind;
extern const LogKind driverLogKind;

/// Whether a TVRHBA_RecordLog is the one of that kind.
bool isLogOf(const LogKind& kind, const Object& log);
/// The oldest first.
void sortEntries(const LogKind& kind, std::vector<Object>& entries);

} // namespace broker
