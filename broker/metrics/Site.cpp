#include "broker/metrics/Site.h"

#include "broker/metrics/Collector.h"
#include "broker/metrics/Exposition.h"

namespace metrics
{

http::Site site(broker::Broker& broker, const std::string& nameSpace)
{
    const auto collector = std::make_shared<Collector>(broker, nameSpace);
    return {{"GET", "/metrics", http::Entrance::reader,
             [collector](const httplib::Request& request, httplib::Response& response, const http::Caller&)
             {
                 const auto families = collector->collect();
                 if (!families)
                 {
                     response.status = 503;
                     response.set_content("the provider has not answered yet\n", "text/plain");
                     return;
                 }
                 const Format format = formatFor(request.get_header_value("Accept"));
                 response.set_header("Vary", "Accept");
                 response.set_content(exposition(*families, format), contentType(format));
             }}};
}

} // namespace metrics
