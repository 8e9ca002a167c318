// How the body of a method ends.
#pragma once

#include "agent/LogText.h"

#include <cstdint>
#include <cxxabi.h>
#include <exception>

namespace cimple
{

/// CIM_Service.StartService and its like: "Failed".
inline constexpr std::uint32_t methodFailed = 4;

/// Thrown by the head of a method to end it: with a return value, or, where `status` is not 0, with that
/// Provider_Status and no value.
struct MethodEnd
{
    std::uint32_t value;
    int status = 0;
};

/// What `body` answers; an exception other than a MethodEnd is logged, and the answer is `failed`.
template <class Answer, class Body> Answer unlessThrown(Answer failed, Body body)
{
    try
    {
        return body();
    }
    catch (const MethodEnd&)
    {
        throw;
    }
    catch (const abi::__forced_unwind&) // the end of the thread
    {
        throw;
    }
    catch (const std::exception& error)
    {
        TVR_LOG(TVR_ERR, "A method ended with an exception: %s", error.what());
    }
    catch (...)
    {
        TVR_LOG(TVR_ERR, "A method ended with an exception");
    }
    return failed;
}

/// Runs the body of a method and hands its return value to `store`; answers the Provider_Status.
template <class Body, class Store> int methodOutcome(Body body, Store store)
{
    try
    {
        store(unlessThrown<std::uint32_t>(methodFailed, body));
    }
    catch (const MethodEnd& end)
    {
        if (end.status != 0)
            return end.status;
        store(end.value);
    }
    return 0;
}

/// Runs a change of an instance; answers its Provider_Status, which is `failed` where its head names none.
template <class Body> int changeOutcome(int failed, Body body)
{
    try
    {
        return unlessThrown<int>(failed, body);
    }
    catch (const MethodEnd& end)
    {
        return end.status != 0 ? end.status : failed;
    }
}

} // namespace cimple
