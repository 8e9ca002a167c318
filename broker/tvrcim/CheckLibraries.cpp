#include "broker/tvrcim/CheckLibraries.h"

#include "broker/host/ReadableText.h"
#include "device/Bindings.h"
#include "device/CurlLibrary.h"
#include "device/ForeignText.h"

#include <algorithm>
#include <filesystem>
#include <initializer_list>

#include <dlfcn.h>
#include <link.h>

namespace tvrcim
{

using namespace cimple;
using broker::Json;

using namespace broker;

namespace
{

struct Attempt
{
    std::string file;
    void* library;
    std::string failure;
};

std::vector<Attempt> attempts;

void* openAndNote(const char* file, int mode)
{
    void* library = dlopen(file, mode);
    const char* failure = library ? nullptr : dlerror();
    attempts.push_back({file, library, failure ? failure : ""});
    return library;
}

/// What the loader of the module's libraries opens, and in vain.
std::vector<Attempt> openAll()
{
    DynamicLoader noting = dynamicLoaderInUse();
    noting.open = openAndNote;
    const DynamicLoader previous = setDynamicLoader(noting);
    attempts.clear();
    loadAllLibraries();
    setDynamicLoader(previous);
    return attempts;
}

void note(Library& library, const Attempt& attempt)
{
    library.tried.push_back(attempt.file);
    if (!attempt.library)
    {
        library.failures.push_back(attempt.failure);
        return;
    }
    library.file = attempt.file;
    library.path = pathOfLibrary(attempt.library);
}

/// "/lib/libHBAAPI.so.2 (libHBAAPI.so.2.0.2)": the name behind a link has the version.
std::string placeText(const Library& library)
{
    std::error_code error;
    const std::filesystem::path behind = std::filesystem::canonical(library.path, error);
    const std::string name = behind.filename();
    const bool isLink = !error && name != std::filesystem::path(library.path).filename();
    return library.path + (isLink ? " (" + name + ")" : "");
}

std::string joined(const std::vector<std::string>& texts, const char* separator)
{
    std::string text;
    for (const std::string& part : texts)
        text += (text.empty() ? "" : separator) + part;
    return text;
}

/// The entry points of some families that the module calls.
struct Called
{
    explicit Called(std::initializer_list<Family> families)
    {
        for (std::size_t row = 0; row < entryPoints.size(); ++row)
        {
            const EntryPoint& point = entryPoints[row];
            if (point.use != called || std::ranges::find(families, point.family) == families.end())
                continue;
            count++;
            if (!resolveEntry(row))
                absent.emplace_back(point.name);
        }
    }

    std::uint64_t count = 0;
    std::vector<std::string> absent;
};

const std::initializer_list<Family> rmFamilies{Family::rmDual, Family::lrmOnly, Family::rmOnly};

Finding foundLibrary(const char* subject, const Library& library, const Called& entries)
{
    Finding finding{.subject = subject, .text = placeText(library)};
    finding.facts = {{"path", library.path}, {"called", entries.count}, {"absent", entries.absent}};
    if (entries.absent.empty())
    {
        finding.text += ", has all " + std::to_string(entries.count) + " entry points";
        return finding;
    }
    finding.state = entries.absent.size() < entries.count ? State::warning : State::wrong;
    finding.text += ", lacks " + std::to_string(entries.absent.size()) + " of " + std::to_string(entries.count) +
                    " entry points: " + shortened(joined(entries.absent, ", "), 200);
    finding.remedy = "install a newer version of it: what needs these fails";
    return finding;
}

Finding absentLibrary(const char* subject, const Library& library, const char* remedy)
{
    return {State::missing, subject, joined(library.failures, "; "), remedy, Json{{"path", nullptr}}};
}

std::string rmVersion()
{
    char text[256] = {};
    return RM_GetVersion(text, sizeof text) == RM_OK ? foreignText(text) : std::string();
}

Finding curl()
{
    const char* subject = "libcurl";
    void* library = openCurl(RTLD_LAZY | RTLD_LOCAL);
    if (!library)
        return {State::note, subject, "is not there: firmware by URI cannot be installed",
                "install the package libcurl4", Json{{"path", nullptr}}};
    const std::string path = pathOfLibrary(library);
    dlclose(library);
    return {State::ok, subject, path, "", Json{{"path", path}}};
}

} // namespace

std::string pathOfLibrary(void* library)
{
    const link_map* map = nullptr;
    if (dlinfo(library, RTLD_DI_LINKMAP, &map) != 0 || !map)
        return {};
    return std::filesystem::path(map->l_name).lexically_normal();
}

Libraries::Libraries()
{
    for (const Attempt& attempt : openAll())
        note(attempt.file.starts_with("libHBA") ? _hbaApi : _rm, attempt);
}

std::string Libraries::absence() const
{
    return "no library of adapters can be opened, so that there is nothing to show (" + joined(_hbaApi.tried, ", ") +
           ", " + joined(_rm.tried, ", ") + "): 'tvrcim --hardware check' tells what is missing";
}

bool Libraries::allFound() const
{
    return hbaApiLibrary() && _rm.found();
}

Findings Libraries::findings(bool initialised) const
{
    Findings findings{hbaApi(), rm(initialised)};
    if (_rm.found())
        findings.push_back(tagging());
    findings.push_back(curl());
    return findings;
}

/// The RM library where that serves the HBA API as well; null where nothing does.
const Library* Libraries::hbaApiLibrary() const
{
    if (_hbaApi.found())
        return &_hbaApi;
    const Called entries({Family::hbaApi});
    return _rm.found() && entries.absent.size() < entries.count ? &_rm : nullptr;
}

Finding Libraries::hbaApi() const
{
    const char* subject = "HBA API library";
    if (const Library* library = hbaApiLibrary())
        return foundLibrary(subject, *library, Called({Family::hbaApi}));
    return absentLibrary(subject, _hbaApi, "install the HBA API library, such as the package libhbaapi2");
}

Finding Libraries::rm(bool initialised) const
{
    const char* subject = "RM library";
    if (!_rm.found())
        return absentLibrary(subject, _rm, "install the management library of the adapters' vendor");
    Finding finding = foundLibrary(subject, _rm, Called(rmFamilies));
    const std::string version = initialised ? rmVersion() : "";
    if (!version.empty())
        finding.text.insert(placeText(_rm).size(), ", version " + version);
    finding.facts["version"] = version.empty() ? Json() : Json(version);
    return finding;
}

/// These are in the global scope of the process once an RM library has brought them there.
Finding Libraries::tagging() const
{
    const Called entries({Family::vendorQos, Family::vendorClose});
    const std::string count = std::to_string(entries.count);
    Finding finding{.subject = "frame tagging", .text = "has all " + count + " entry points"};
    finding.facts = {{"called", entries.count}, {"absent", entries.absent}};
    if (!entries.absent.empty())
    {
        finding.state = State::note;
        finding.text =
            "is not offered: " + std::to_string(entries.absent.size()) + " of " + count + " entry points are absent";
    }
    return finding;
}

} // namespace tvrcim
