// Logs, diagnostic tests, and methods that are called.
#include "broker/web/Asking.h"

namespace web
{

std::string logs(const Question&)
{
    return "[]";
}
std::string logEntries(const Question&)
{
    return "[]";
}
std::string diagnostics(const Question&)
{
    return "{}";
}
std::string methods(const Question&)
{
    return "[]";
}
std::string call(const Question&)
{
    return "{}";
}

} // namespace web
