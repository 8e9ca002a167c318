#include "broker/tvrcim/CheckFiles.h"

#include "broker/host/ReadableText.h"
#include "foundation/File.h"
#include "foundation/FilePaths.h"
#include "foundation/HostInformation.h"
#include "foundation/Log.h"
#include "foundation/LogDataFile.h"
#include "foundation/TvrConfigFile.h"
#include "foundation/WebLaunchConfig.h"
#include "runtime/base/TextLines.h"

#include <algorithm>
#include <array>
#include <cerrno>
#include <cstring>
#include <filesystem>
#include <optional>

#include <unistd.h>

namespace tvrcim
{

namespace fs = std::filesystem;
using namespace cimple;
using broker::Json;

using namespace broker;

namespace
{

/// A file as the user of this process has it.
struct File
{
    explicit File(std::string name, std::size_t limit = 1024 * 1024) : path(std::move(name))
    {
        text = readTextFile(path.c_str(), limit);
        error = text ? 0 : errno;
        const std::string folder = fs::path(path).parent_path();
        folderTakesFiles = access(folder.c_str(), W_OK | X_OK) == 0;
        isWritable = access(path.c_str(), W_OK) == 0;
    }

    bool isThere() const { return error != ENOENT && error != ENOTDIR; }
    std::string folder() const { return fs::path(path).parent_path(); }
    Json facts() const
    {
        return {{"path", path}, {"exists", isThere()}, {"readable", text.has_value()}, {"writable", isWritable}};
    }

    std::string path;
    std::optional<std::string> text;
    int error = 0;
    bool isWritable = false;
    bool folderTakesFiles = false;
};

/// `text` goes on with a sentence behind the file's path, or with a colon.
Finding finding(State state, const char* subject, const File& file, const std::string& text,
                const std::string& remedy = {})
{
    return {state, subject, file.path + text, remedy, file.facts()};
}

Finding unreadable(const char* subject, const File& file)
{
    return finding(State::wrong, subject, file, std::string(" cannot be read: ") + std::strerror(file.error),
                   "put a regular file there that the server's user may read, or take it away");
}

// --- the settings of the cache

/// A line that is accepted sets one of the settings, so that two sets that differ in all agree in it.
bool isAccepted(std::string_view line)
{
    CacheSettings one{.refreshAdapterData = false, .refreshSANData = false, .cacheTimeout = 1};
    CacheSettings other{.refreshAdapterData = true, .refreshSANData = true, .cacheTimeout = 2};
    parseSettings(line, one);
    parseSettings(line, other);
    return one.refreshAdapterData == other.refreshAdapterData || one.refreshSANData == other.refreshSANData ||
           one.cacheTimeout == other.cacheTimeout;
}

std::vector<std::string> passedOver(std::string_view text)
{
    constexpr std::size_t lineBuffer = 1024;
    std::vector<std::string> lines;
    Line_Reader reader(text);
    while (const auto next = reader.next(lineBuffer))
    {
        const std::string_view line = trim(*next);
        if (!line.empty() && !line.starts_with('#') && !isAccepted(line))
            lines.emplace_back(line);
    }
    return lines;
}

const char* yesOrNo(bool flag)
{
    return flag ? "yes" : "no";
}

std::string settingsText(const CacheSettings& settings)
{
    return "cache of " + countText(static_cast<std::uint64_t>(settings.cacheTimeout), "minute", "minutes") +
           ", refresh of adapters " + yesOrNo(settings.refreshAdapterData) + ", of the SAN " +
           yesOrNo(settings.refreshSANData);
}

Finding withSettings(Finding found, const CacheSettings& settings)
{
    found.facts["cacheTimeout"] = settings.cacheTimeout;
    found.facts["refreshAdapterData"] = settings.refreshAdapterData;
    found.facts["refreshSANData"] = settings.refreshSANData;
    return found;
}

Finding settings()
{
    const char* subject = "settings";
    const File file(filePath(FilePath::ProviderConfig));
    CacheSettings settings;
    if (file.isThere() && !file.text)
        return unreadable(subject, file);
    if (file.text)
        parseSettings(*file.text, settings);
    const std::string says = settingsText(settings);
    const std::vector<std::string> bad = passedOver(file.text.value_or(""));
    if (!bad.empty())
    {
        Finding found = finding(State::warning, subject, file,
                                " has " + countText(bad.size(), "line that is", "lines that are") +
                                    " passed over, as '" + shortened(bad.front(), 60) + "'; " + says,
                                "the timeout is a number from 1 to 30, the others are TRUE or FALSE");
        found.facts["passedOver"] = bad;
        return withSettings(std::move(found), settings);
    }
    if (!file.folderTakesFiles)
        return withSettings(finding(State::warning, subject, file, " cannot be written; " + says,
                                    "let the server's user write to " + file.folder() + ", or changes end with it"),
                            settings);
    return withSettings(file.isThere() ? finding(State::ok, subject, file, ": " + says)
                                       : finding(State::note, subject, file, " is not there yet; " + says),
                        settings);
}

Finding managementPage()
{
    const char* subject = "management page";
    const File file(filePath(FilePath::WebLaunchConfig));
    if (!file.isThere())
        return finding(State::note, subject, file, " is not there: no page is published");
    if (!file.text)
        return unreadable(subject, file);
    const std::string url = parseWebLaunchUrl(*file.text).c_str();
    if (url.empty())
        return finding(State::warning, subject, file, " names no page", "write the page's URL into it, or remove it");
    Finding found = finding(State::ok, subject, file, " names " + url);
    found.facts["url"] = url;
    return found;
}

// --- logs

const char* faultText(LogDataFault fault)
{
    switch (fault)
    {
    case LogDataFault::None:
        break;
    case LogDataFault::ModeMissing:
        return "the mode is missing";
    case LogDataFault::ModeInvalid:
        return "the mode is none of 0 to 4";
    case LogDataFault::LevelMissing:
        return "the level is missing";
    case LogDataFault::LevelInvalid:
        return "the level is none of 0 to 5";
    case LogDataFault::EnabledMissing:
        return "the third number, 1 for enabled, is missing";
    case LogDataFault::EnabledInvalid:
        return "the third number, 1 for enabled, is negative";
    case LogDataFault::PathMissing:
        return "the second line, the log file, is missing";
    }
    return "";
}

std::string modeText(const LogData& data)
{
    static constexpr std::array places{"nowhere", "in memory", "in a file", "nowhere", "in memory and a file"};
    return std::string("logs ") + places[static_cast<std::size_t>(data.mode)] + ", mode " + std::to_string(data.mode) +
           ", level " + std::to_string(data.level) + (*data.enabled ? "" : ", disabled");
}

Finding withLogData(Finding found, const LogData& data)
{
    found.facts["mode"] = data.mode;
    found.facts["level"] = data.level;
    found.facts["enabled"] = *data.enabled != 0;
    return found;
}

Finding logSettings(const File& file, const LogData& data)
{
    const char* subject = "log settings";
    if (!file.isThere())
        return finding(State::note, subject, file, " is not there: errors alone are logged");
    if (!file.text)
        return unreadable(subject, file);
    if (data.fault != LogDataFault::None)
        return finding(State::wrong, subject, file, std::string(" cannot be used: ") + faultText(data.fault),
                       "write 'mode,level,1' and the log file into its two lines, as 2,5,1, or remove it");
    if (!file.folderTakesFiles)
        return withLogData(finding(State::warning, subject, file, " cannot be written; " + modeText(data),
                                   "let the server's user write to " + file.folder() + ", or changes end with it"),
                           data);
    const bool isSilent = !*data.enabled || !(modeWritesFile(data.mode) || modeWritesRing(data.mode));
    return withLogData(finding(isSilent ? State::warning : State::ok, subject, file, ": " + modeText(data),
                               isSilent ? "'tvrcim --hardware log' switches it on" : ""),
                       data);
}

std::string remedyForFolder(const std::string& folder)
{
    std::error_code error;
    return fs::is_directory(folder, error) ? "let the server's user write to " + folder : "mkdir -p " + folder;
}

Finding logFile(const char* subject, const std::string& path)
{
    constexpr std::size_t head = 16;
    constexpr std::uintmax_t large = 1 << 30;
    const File file(path, head);
    if (!path.starts_with('/'))
        return finding(State::wrong, subject, file, " is no absolute path", "name another in the log settings");
    if (!file.isThere())
    {
        if (file.folderTakesFiles)
            return finding(State::ok, subject, file, " is not there yet");
        return finding(State::warning, subject, file, " cannot be made", remedyForFolder(file.folder()));
    }
    if (!file.text)
        return unreadable(subject, file);
    std::error_code error;
    const std::uintmax_t size = fs::file_size(path, error);
    const std::string says = " has " + sizeText(error ? 0 : size);
    const char* remedy = "";
    State state = State::ok;
    if (!file.isWritable)
    {
        state = State::warning;
        remedy = "it cannot be written: let the server's user do so";
    }
    else if (!error && size >= large)
    {
        state = State::warning;
        remedy = "the method ClearLog of TVRHBA_RecordLog empties it";
    }
    Finding found = finding(state, subject, file, says, remedy);
    found.facts["size"] = error ? 0 : size;
    return found;
}

Finding driverLog()
{
    const char* subject = "driver log";
    const File file(filePath(FilePath::SystemLog), 1);
    if (!file.isThere())
        return finding(State::note, subject, file, " is not there: the driver's lines are not shown",
                       "install rsyslog, and have it write kern.* there");
    if (file.text)
        return finding(State::ok, subject, file, " can be read");
    Finding found = unreadable(subject, file);
    found.state = State::warning; // all else works without
    return found;
}

void checkLogs(Findings& findings)
{
    const File file(filePath(IsReadOnlyFS() ? FilePath::LogDataFallback : FilePath::LogData),
                    logDataFirstLine + logDataSecondLine);
    const LogData data = parseLogData(file.text.value_or(""));
    const bool isUsed = file.text && data.fault == LogDataFault::None;
    findings.push_back(logSettings(file, data));
    if (!isUsed)
        findings.push_back(logFile("error log", filePath(FilePath::FfdcLog)));
    else if (modeWritesFile(data.mode))
        findings.push_back(logFile("log", data.path));
    findings.push_back(driverLog());
}

} // namespace

Findings checkFiles()
{
    Findings findings;
    if (geteuid() != 0)
        findings.push_back({State::note, "user", "files are looked at as the user " + std::to_string(geteuid()),
                            "run this as the user of the CIM server, which is root for most"});
    findings.push_back(settings());
    findings.push_back(managementPage());
    checkLogs(findings);
    return findings;
}

} // namespace tvrcim
