// A host whose service is called: what the methods answer, and what the log says of each call.
#pragma once

#include "tests/module/Host.h"

namespace module_test
{

struct Answer
{
    std::uint64_t value = 0;
    std::vector<broker::Property> out = {};
    std::vector<std::string> lines = {}; ///< of the method itself, without those of its head and of converted names

    /// A null where there is no such parameter.
    broker::Value at(const std::string& name) const;
    /// Empty for a null.
    std::string text(const std::string& name) const;
};

class ServiceHost : public Host
{
public:
    ServiceHost(const std::string& serviceClass, const std::string& scenario, Libraries libraries = {});

    /// Calls a method whose first log line is `entry`, with `port` as its target.
    Answer callOnPort(const std::string& method, const std::string& entry, std::vector<broker::Property> in = {});
    Answer call(const std::string& method, const std::string& entry, const std::vector<broker::Property>& in);
    /// Calls the method on another service, without a target and on a port that is not there: what it answers, and the
    /// lines that tell so.
    void expectRefusals(const std::string& method, const std::string& entry, const std::string& wrongService,
                        const std::string& wrongPort);
    /// The DeviceIDs of the ports after the refresh that is due; `port` is the first of them.
    std::vector<std::string> portsAfterRefresh();

    broker::Path service;
    broker::Path port;

private:
    const std::string _serviceClass;
};

} // namespace module_test
