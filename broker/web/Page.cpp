#include "broker/web/Page.h"

#include <string>

namespace web
{

namespace
{

/// A browser asks each time whether its copy is still the one of this program.
void give(const PageFile& file, const httplib::Request& request, httplib::Response& response)
{
    const std::string tag = '"' + std::string(file.hash) + '"';
    response.set_header("ETag", tag);
    response.set_header("Cache-Control", "no-cache");
    if (request.get_header_value("If-None-Match").find(tag) != std::string::npos)
        response.status = 304;
    else
        response.set_content(file.content.data(), file.content.size(), std::string(file.type));
}

} // namespace

http::Site pageSite()
{
    http::Site site;
    for (const PageFile& file : pageFiles())
        site.push_back({"GET", file.name == "index.html" ? "/" : "/" + std::string(file.name), http::Entrance::open,
                        [&file](const httplib::Request& request, httplib::Response& response, const http::Caller&)
                        { give(file, request, response); }});
    return site;
}

} // namespace web
