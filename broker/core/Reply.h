// What operations of the broker answer, and the arguments that several of them share.
#pragma once

#include "broker/values/Value.h"

#include <optional>
#include <string>
#include <vector>

namespace broker
{

/// Status of an operation; `message` says more when it is not CMPI_RC_OK.
struct Outcome
{
    CMPIrc status = CMPI_RC_OK;
    std::string message = {};

    bool ok() const { return status == CMPI_RC_OK; }
};

/// Instances; empty unless the status is OK.
struct Reply : Outcome
{
    std::vector<Object> objects = {};
};

/// Object paths; empty unless the status is OK.
struct NamesReply : Outcome
{
    std::vector<Path> paths = {};
};

struct MethodReply : Outcome
{
    Value returnValue = {};
    std::vector<Property> out = {};
};

/// Nothing means all properties, an empty list none.
using PropertyList = std::optional<std::vector<std::string>>;

/// Filters of the association operations; an empty text is no filter.
struct AssociationFilter
{
    std::string assocClass = {}; ///< for references: the result class
    std::string resultClass = {};
    std::string role = {};
    std::string resultRole = {};
};

/// "CIM_ERR_NOT_FOUND" and the like; "CMPI status N" for a number without a name.
std::string statusName(CMPIrc status);

} // namespace broker
