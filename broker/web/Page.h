// The page for people: files of the program that say nothing of the host. It asks the JSON interface for all it shows.
#pragma once

#include "broker/http/Site.h"

#include <span>
#include <string_view>

namespace web
{

struct PageFile
{
    std::string_view name;
    std::string_view type;
    std::string_view hash; ///< of the content
    std::string_view content;
};

/// Those of broker/web/page, written by cmake/EmbedPage.cmake.
std::span<const PageFile> pageFiles();

http::Site pageSite();

} // namespace web
