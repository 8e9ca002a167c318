#include "foundation/WebLaunchConfig.h"

#include "foundation/File.h"
#include "foundation/FilePaths.h"
#include "foundation/Log.h"
#include "foundation/Text.h"

namespace cimple
{

namespace
{

constexpr std::size_t lineBuffer = 256;
constexpr std::size_t maximumSize = 64 * 1024;

std::string_view withoutLineEnd(std::string_view line)
{
    if (line.ends_with('\n'))
        line.remove_suffix(1);
    if (line.ends_with('\r'))
        line.remove_suffix(1);
    return line;
}

} // namespace

String parseWebLaunchUrl(std::string_view text)
{
    Line_Reader lines(text);
    while (const auto next = lines.next(lineBuffer))
    {
        const std::string_view line = withoutLineEnd(*next);
        const std::size_t blanks = line.find_first_not_of(" \t\n\v\f\r");
        if (blanks != std::string_view::npos && line[blanks] != '#')
            return String(line.substr(blanks));
    }
    return String();
}

WebLaunchConfig::WebLaunchConfig()
{
    const std::string path = filePath(FilePath::WebLaunchConfig);
    if (const auto text = readTextFile(path.c_str(), maximumSize))
        _url = parseWebLaunchUrl(*text);
    else
        TVR_LOG(TVR_INFO, "WebLaunch config file '%s' not found.", path.c_str());
}

} // namespace cimple
