#include "broker/web/Failure.h"

#include "broker/values/Json.h"

#include <nlohmann/json.hpp>

#include <algorithm>
#include <array>
#include <new>

namespace web
{

using namespace broker;

namespace
{

struct StatusRow
{
    CMPIrc cim;
    int http;
};

constexpr std::array<StatusRow, 8> statuses{{
    {CMPI_RC_ERR_ACCESS_DENIED, 403},
    {CMPI_RC_ERR_INVALID_NAMESPACE, 404},
    {CMPI_RC_ERR_INVALID_PARAMETER, 400},
    {CMPI_RC_ERR_INVALID_CLASS, 404},
    {CMPI_RC_ERR_NOT_FOUND, 404},
    {CMPI_RC_ERR_NOT_SUPPORTED, 501},
    {CMPI_RC_ERR_METHOD_NOT_FOUND, 404},
    {CMPI_RC_ERR_METHOD_NOT_AVAILABLE, 501},
}};

/// Others are failures of what stands behind this port.
int httpStatus(CMPIrc cim)
{
    constexpr int behind = 502;
    const auto* row = std::ranges::find(statuses, cim, &StatusRow::cim);
    return row == statuses.end() ? behind : row->http;
}

ToldFailure told(int status, const char* kind, std::string_view text, const std::string& cim = {})
{
    constexpr std::size_t longestText = 1000; // of which a client may have given a part
    Json error{{"kind", kind}};
    if (!cim.empty())
        error["status"] = cim;
    error["text"] = text.substr(0, longestText);
    return {status, jsonText({{"error", std::move(error)}})};
}

} // namespace

ToldFailure tellCurrentException()
{
    try
    {
        throw;
    }
    catch (const CimError& error)
    {
        const int status = httpStatus(error.status());
        constexpr int unsupported = 501;
        return told(status, status == unsupported ? "unsupported" : "cim", error.what(), statusName(error.status()));
    }
    catch (const ArgumentFailure& failure)
    {
        return told(400, "argument", failure.what());
    }
    catch (const NothingThere& failure)
    {
        return told(404, "argument", failure.what());
    }
    catch (const std::bad_alloc&)
    {
        // A list of JSON wants memory even when it is freed.
        return {503, R"({"error":{"kind":"unready","text":"there is no memory for the answer"}})"};
    }
    catch (const std::exception& error)
    {
        return told(500, "internal", error.what());
    }
    catch (...)
    {
        return told(500, "internal", "the answer could not be made");
    }
}

} // namespace web
