#include "services/TagFile.h"

#include "agent/MethodCall.h"
#include "device/CurlTransfer.h"
#include "foundation/File.h"
#include "foundation/FilePaths.h"
#include "foundation/Text.h"
#include "foundation/Uri.h"
#include "services/TagTable.h"

#include <sys/stat.h>
#include <unistd.h>

#include <algorithm>
#include <cctype>
#include <cerrno>
#include <stdexcept>
#include <string_view>

namespace cimple
{

namespace
{

constexpr std::string_view schemeEnd = "://";

} // namespace

// --- from a client -------------------------------------------------------------------------------------

TagSource::TagSource(const std::string& uri)
{
    constexpr LogText notFound = {TVR_DBG, "ERROR:TVRHBA_FCTagService_Provider::Configuration file not found"};
    constexpr MethodEnd noFile = {0x100B}, noStatus = {5};

    const std::string path = localPathOf(uri);
    _file = path;
    _isFetched = downloadFileUsingCurl(uri, _file) == 0 && _file != path;
    TVR_LOG(TVR_DBG, "TVRHBA_FCTagService_Provider::filename is : %s", uriForLog(_file).c_str());
    struct stat status;
    if (stat(_file.c_str(), &status) == 0)
        return;
    if (errno == ENOENT)
        MethodCall::end(notFound, noFile);
    MethodCall::end({TVR_DBG, "ERROR: TVRHBA_FCTagService_Provider:: Can't stat Configuration file "}, noStatus);
}

TagSource::~TagSource()
{
    if (!_isFetched)
        return;
    struct stat status;
    if (stat(_file.c_str(), &status) != 0)
        TVR_LOG(TVR_DBG, "TVRHBA_FCTagService_Provider:: Can't stat file %s", _file.c_str());
    else if (unlink(_file.c_str()) == 0)
        TVR_LOG(TVR_DBG, "TVRHBA_FCTagService_Provider::: FC TAG Config file %s removed successfully", _file.c_str());
}

std::string TagSource::text() const
{
    std::optional<std::string> text = readTextFile(_file.c_str(), maximumTagFile + 1, O_NOFOLLOW);
    if (!text)
        throw std::runtime_error("cannot open file " + _file);
    if (text->size() > maximumTagFile)
        throw std::runtime_error("too large a file " + _file);
    return std::move(*text);
}

// --- to a client ---------------------------------------------------------------------------------------

namespace
{

/// Those that a file can be sent by. libcurl knows more, among them ways into files of this host.
constexpr std::string_view sendingSchemes[] = {"ftp", "http", "https", "tftp"};

/// A name that might end a login is none: it would be logged.
bool isName(const std::string& name)
{
    return isPlainFileName(name) &&
           std::ranges::none_of(name, [](unsigned char c) { return c == '@' || std::iscntrl(c); });
}

/// The part behind the last slash of the path of a URI; empty where it has no path. All before the last "@" is taken
/// for a login, as in the log.
std::string lastPart(std::string behindScheme)
{
    behindScheme.erase(0, behindScheme.rfind('@') + 1);
    const std::string place = behindScheme.substr(0, behindScheme.find_first_of("?#"));
    const std::size_t slash = place.rfind('/');
    return slash == std::string::npos ? std::string() : place.substr(slash + 1);
}

} // namespace

std::optional<TagTarget> tagTargetOf(const std::string& uri)
{
    const std::string folder = filePath(FilePath::TagTableFolder);
    const auto inFolder = [&](const std::string& name, bool isElsewhere) -> std::optional<TagTarget>
    {
        if (!isName(name))
            return std::nullopt;
        return TagTarget{folder + '/' + name, isElsewhere};
    };

    const std::size_t end = uri.find(schemeEnd);
    if (end == std::string::npos)
        return inFolder(uri, false);
    const std::string scheme = lowerCase(std::string_view(uri).substr(0, end));
    if (std::ranges::find(sendingSchemes, scheme) != std::end(sendingSchemes))
        return inFolder(lastPart(uri.substr(end + schemeEnd.size())), true);
    const std::string path = localPathOf(uri);
    const bool isFileOfFolder = uri.starts_with("file://") && path.starts_with(folder + '/');
    return isFileOfFolder ? inFolder(path.substr(folder.size() + 1), false) : std::nullopt;
}

} // namespace cimple
