#include "foundation/File.h"

#include <fcntl.h>
#include <sys/stat.h>
#include <unistd.h>

#include <algorithm>
#include <cerrno>

namespace cimple
{

namespace
{

bool anybodyMayWrite(int folder)
{
    struct stat status;
    return fstat(folder, &status) == 0 && (status.st_mode & S_IWOTH) != 0;
}

/// Descriptor or -1. The folder is opened first, so that what is asked of it holds for the file opened in it.
int openInFolder(const std::string& path, int flags)
{
    const std::size_t slash = path.rfind('/');
    const std::string folderName = slash == std::string::npos ? "." : path.substr(0, slash + 1);
    const int folder = open(folderName.c_str(), O_PATH | O_DIRECTORY | O_CLOEXEC);
    if (folder < 0)
        return -1;
    if (anybodyMayWrite(folder))
        flags |= O_NOFOLLOW;
    const char* name = path.c_str() + (slash == std::string::npos ? 0 : slash + 1);
    const int file = openat(folder, name, flags, S_IRUSR | S_IWUSR | S_IRGRP | S_IROTH);
    const int error = errno;
    close(folder);
    errno = error;
    return file;
}

} // namespace

File openForWriting(const char* path, WriteMode mode)
{
    const bool append = mode == WriteMode::Append;
    const int access = append ? O_RDWR | O_APPEND : O_WRONLY | O_TRUNC;
    const int file = openInFolder(path, access | O_CREAT | O_CLOEXEC | O_NONBLOCK | O_NOCTTY);
    if (file < 0)
        return nullptr;
    std::FILE* stream = fdopen(file, append ? "a+" : "w");
    if (!stream)
        close(file);
    return File(stream);
}

std::optional<std::string> readTextFile(const char* path, std::size_t limit)
{
    const File file(std::fopen(path, "re"));
    if (!file)
        return std::nullopt;
    std::string text;
    char part[4096]; // files are far below their limits
    while (text.size() < limit)
    {
        const std::size_t size = std::fread(part, 1, std::min(sizeof part, limit - text.size()), file.get());
        if (size == 0)
            break;
        text.append(part, size);
    }
    return text;
}

} // namespace cimple
