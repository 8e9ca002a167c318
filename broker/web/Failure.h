// What a question of the JSON interface fails with.
#pragma once

#include "broker/core/Reply.h"

#include <stdexcept>
#include <string>

namespace web
{

/// A question that is wrong; the text names what is wrong with it.
class ArgumentFailure : public std::runtime_error
{
public:
    using std::runtime_error::runtime_error;
};

/// A question for something that there is none of.
class NothingThere : public std::runtime_error
{
public:
    using std::runtime_error::runtime_error;
};

/// An exception as it is told: a status of HTTP and the text of the JSON.
struct ToldFailure
{
    int status;
    std::string json;
};

/// The exception that is being handled.
ToldFailure tellCurrentException();

} // namespace web
