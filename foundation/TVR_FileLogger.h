// The log sink that writes lines to a text file. The file grows until a client clears it.
#pragma once

#include "foundation/File.h"
#include "foundation/Log.h"
#include "runtime/values/String.h"

namespace cimple
{

/// Works in modes 2 and 4. Registered with the logger from construction to destruction.
class TVR_FileLogger final : public TVR_LoggerInterface
{
public:
    TVR_FileLogger();
    ~TVR_FileLogger() override;

    /// Moves the log to another file, which is created if need be; `errorsOnly` drops all but critical messages and
    /// errors. A file with other text is appended to where root alone could have led the path to it, and never emptied.
    /// Returns 0, or -1 with the old file still in use.
    int validateAndSetPath(const char* path, bool errorsOnly);
    /// The same for a path that a client names, who must not get at other files of the host: an absolute path of a new
    /// file, an empty one of this user, or a log that this module wrote; without a link at its end or control
    /// characters, none of the module's other files, and such that the data file can keep it. The path in use stays,
    /// whoever named it.
    int validateAndSetClientPath(const String& path);
    /// Empty when no path is set.
    String getPath() const;

    void logMessage(int level, const char* file, unsigned line, const char* message) override;
    void start() override;
    void stop() override;
    void clearLog() override;
    unsigned takes() const override;

private:
    friend class TVR_Logger;

    enum class NamedBy
    {
        Administrator,
        Client,
    };
    /// validateAndSetPath() under the logger's mutex.
    int setPath(const char* path, bool errorsOnly, NamedBy namedBy = NamedBy::Administrator);
    /// Has all messages written to the open file if this is its path.
    bool keepPath(const String& path);
    // The mutex is held.
    void reopen();
    bool isOurs(const File_Descriptor& file) const;
    unsigned levels() const;

    mutable Mutex _mutex; ///< taken after the logger's
    String _path;
    File_Descriptor _file;
    bool _isOurs = false; ///< the file may be emptied
    bool _errorsOnly = false;
};

} // namespace cimple
