// In-process stand-ins for the dynamic loader and the libraries: a host is data, and every call is counted.
#pragma once

#include "device/Loader.h"
#include "device/RmApi.h"
#include "foundation/Log.h"

#include <cstdint>
#include <deque>
#include <functional>
#include <map>
#include <set>
#include <string>
#include <vector>

struct FakePort
{
    HBA_PORTATTRIBUTES hba{};
    std::map<std::uint32_t, std::string> attributes; ///< bytes of the values by attribute number
    std::map<std::uint32_t, std::string> statistics;
};

struct FakeAdapter
{
    std::string name;
    HBA_ADAPTERATTRIBUTES hba{};
    std::map<std::uint32_t, std::string> attributes;
    std::vector<FakePort> ports;
    std::vector<HBA_FCPSCSIENTRY> mapping;
};

/// One at a time. While it lives, the loader opens only what it offers, and unloads at its end.
class FakeHost
{
public:
    FakeHost();
    ~FakeHost();

    std::vector<FakeAdapter> adapters;
    /// Statuses of the next calls of a function by name. 0 lets the function do its work, as an empty queue does.
    std::map<std::string, std::deque<int>> statuses;
    std::map<std::string, int> calls;
    /// What a function of this name does besides; it may throw.
    std::map<std::string, std::function<void()>> onCall;
    int openHandles = 0;

    // What the RM library answers beside attributes.
    std::map<std::uint32_t, std::string> serverAttributes;
    std::uint32_t driverType = 3;
    std::uint32_t isLocal = 1;
    std::map<std::uint32_t, std::uint32_t> features;
    std::vector<RM_DriverParam> driverParameters; ///< of every adapter and for all of them
    std::vector<RM_VPortEntry> vports;
    std::vector<RM_VPortTarget> vportTargets;
    std::vector<RM_Lun> luns;
    std::vector<RM_OASLun> lanes;
    /// Replaces LRM_GetOASLunList.
    std::function<RM_STATUS(HBA_WWN wwpn, HBA_WWN vport, HBA_WWN target, std::uint32_t option, RM_OASLunList*)>
        laneList;
    std::string reportLuns;
    RM_VpdArea vpd{};
    std::uint32_t beacon = RM_BEACON_OFF;
    RM_SffData transceiver{};
    RM_FlashList flash{1, {}}; ///< without a region
    std::string version = "7.1";
    /// Replaces LRM_GetDumpFileNames.
    std::function<RM_STATUS(RM_DumpFileNames*)> dumpList;
    RM_EventLogConfig eventLog{};
    std::string dumpArguments; ///< of the calls that set what is traced, as "3, 1 2 3 4; "

    // SCSI answers by page; page 0 is the standard Inquiry.
    std::map<std::uint32_t, std::string> inquiry;
    std::string capacity;
    std::string sense;

    /// Replaces RM_GetAttributeValue's answer.
    std::function<const void*(const void* buffer, std::uint32_t id, std::uint32_t* length, RM_STATUS* status)>
        attribute;
    /// Replaces HBA_GetFcpTargetMapping.
    std::function<HBA_STATUS(HBA_FCPTARGETMAPPING*)> mapping;

    // The dynamic loader.
    std::set<std::string> files = {"libHBAAPI.so.2", "liblrmapi.so"}; ///< that open
    std::set<std::string> absentSymbols;
    std::set<std::string> globalSymbols;  ///< that the global scope of the process has, too
    std::vector<std::string> loaderCalls; ///< "open FILE", "symbol FILE NAME", "close FILE"
    bool closeFails = false;

    /// An adapter named "Tavrin-F<n>" with `portCount` ports and one value for every attribute.
    FakeAdapter& addAdapter(unsigned portCount);

    /// Counts the call and takes its next status.
    int enter(const std::string& function);

private:
    cimple::DynamicLoader _previous;
};

/// One whose libraries are loaded.
struct LoadedHost : FakeHost
{
    LoadedHost() { cimple::loadAllLibraries(); }
};

/// The log's lines while it lives.
class LogCapture : public cimple::TVR_LoggerInterface
{
public:
    LogCapture() { cimple::TVR_Logger::instance().addSink(this); }
    ~LogCapture() override { cimple::TVR_Logger::instance().removeSink(this); }
    void logMessage(int level, const char*, unsigned, const char* message) override
    {
        lines.push_back(std::to_string(level) + " " + message);
    }
    void start() override {}
    void stop() override {}
    void clearLog() override {}

    /// How many lines are `line`: level, blank, text.
    long count(const std::string& line) const;
    /// The lines of levels below debug.
    std::vector<std::string> notable() const;

    std::vector<std::string> lines;
};

/// Eight bytes of a number, most significant first.
HBA_WWN wwn(std::uint64_t value);
/// Bytes of a number in native order.
std::string number(std::uint32_t value);
std::string counter(std::uint64_t value);
/// `count` mapping entries with consecutive LUNs.
std::vector<HBA_FCPSCSIENTRY> mappingOf(std::size_t count);
