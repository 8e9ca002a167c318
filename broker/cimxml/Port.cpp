#include "broker/cimxml/Port.h"

#include "broker/cimxml/Decode.h"
#include "broker/cimxml/Operations.h"
#include "broker/http/Connection.h"
#include "broker/http/Memory.h"

#include <exception>
#include <memory>

namespace cimxml
{

namespace
{

/// The response, from within the operation. A client of HTTP 1.1 misses the last chunk of one that broke off, any other
/// the end of the document.
bool deliver(broker::Broker& broker, Pulls& pulls, const Message& message, const http::Caller& caller,
             httplib::DataSink& sink)
{
    try
    {
        std::size_t given = 0;
        const auto give = [&](std::string_view part)
        {
            given += part.size();
            return sink.write(part.data(), part.size());
        };
        bool whole = false;
        {
            const http::Connection::Hurry hurry;
            whole = answer(broker, pulls, message, give, caller);
        }
        http::giveBackMemory(given);
        if (whole)
            sink.done();
        return whole;
    }
    catch (const std::exception&)
    {
        return false;
    }
}

void answerTo(broker::Broker& broker, Pulls& pulls, const httplib::Request& request, httplib::Response& response,
              const http::Caller& caller)
{
    constexpr char type[] = "application/xml; charset=\"utf-8\"";
    try
    {
        const auto message = std::make_shared<const Message>(request.body);
        const auto provide = [&broker, &pulls, message, caller](std::size_t, httplib::DataSink& sink)
        { return deliver(broker, pulls, *message, caller, sink); };
        response.set_header("CIMOperation", "MethodResponse");
        if (request.version == "HTTP/1.0")
        {
            response.set_content_provider(type, provide);
            http::Connection::current().endBehindResponse();
        }
        else
            response.set_chunked_content_provider(type, provide);
    }
    catch (const HttpRefusal& refusal)
    {
        response.status = refusal.status;
        response.set_header("CIMError", refusal.header);
    }
}

} // namespace

http::Site site(broker::Broker& broker)
{
    const auto pulls = std::make_shared<Pulls>();
    return {{"POST", "*", http::Entrance::program,
             [&broker, pulls](const httplib::Request& request, httplib::Response& response, const http::Caller& caller)
             { answerTo(broker, *pulls, request, response, caller); }}};
}

} // namespace cimxml
