// All that a client can change or have done, in one list.
#pragma once

#include "tests/module/Host.h"
#include "tests/support/FileServer.h"

#include <functional>
#include <string>
#include <vector>

namespace module_test
{

/// A small host that has a part for each of the changes.
extern const char* const changeableHost;

struct Change
{
    std::string name;
    /// The status of the request, and the return value of a method: "CIM_ERR_OK 0" when all went well.
    std::function<std::string(broker::Broker&)> ask;
};

/// Looks up what is to be changed; the host has settled. The server gets what they fetch. Files go to the current
/// directory. In their order they succeed any number of times.
std::vector<Change> changesOf(Host& host, test_support::FileServer& server);

/// Takes away the lane that some changes make, if it is there.
void removeLane(broker::Broker& broker);

/// Firmware for the adapter of `changeableHost`.
std::string changeableFirmware();

} // namespace module_test
