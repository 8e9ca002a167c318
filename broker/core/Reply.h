// What operations of the broker answer, and the arguments that several of them share.
#pragma once

#include "broker/values/Value.h"

#include <functional>
#include <optional>
#include <stdexcept>
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

/// Takes the results of an operation one by one as the provider gives them, on the thread and under the locks of its
/// call. False: no more are wanted, and the provider is told that it failed. What was taken of an operation that fails
/// in the end is a part of nothing.
template <class Result> struct Sink
{
    std::function<bool(Result&&)> take;
    /// Whether objects of the provider die before the end of its call once it leaves them alone, so that a result of
    /// any size needs the room of a few. One that it comes back to later is a violation then.
    bool forgets = false;
};
using ObjectSink = Sink<Object>;
using PathSink = Sink<Path>;

/// Runs an operation that gives its results to a sink, and collects them.
template <class Operation> Reply collectObjects(Operation operation)
{
    Reply reply;
    std::vector<Object> objects;
    static_cast<Outcome&>(reply) = operation(ObjectSink{[&](Object&& object)
                                                        {
                                                            objects.push_back(std::move(object));
                                                            return true;
                                                        }});
    if (reply.ok())
        reply.objects = std::move(objects);
    return reply;
}

template <class Operation> NamesReply collectPaths(Operation operation)
{
    NamesReply reply;
    std::vector<Path> paths;
    static_cast<Outcome&>(reply) = operation(PathSink{[&](Path&& path)
                                                      {
                                                          paths.push_back(std::move(path));
                                                          return true;
                                                      }});
    if (reply.ok())
        reply.paths = std::move(paths);
    return reply;
}

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

/// An operation that failed.
class CimError : public std::runtime_error
{
public:
    explicit CimError(const Outcome& outcome);

    CMPIrc status() const { return _status; }

private:
    CMPIrc _status;
};

/// For lists of what failed where the rest is shown: "Class: text".
std::string failureText(const std::string& className, const CimError& error);

/// The answer itself; throws CimError where it is a failure.
template <class Answer> Answer checked(Answer answer)
{
    if (!answer.ok())
        throw CimError(answer);
    return answer;
}

} // namespace broker
