#include "runtime/base/RegularFile.h"

#include <cerrno>
#include <sys/stat.h>
#include <unistd.h>

namespace cimple
{

namespace
{

/// Sets errno for all but regular files.
bool is_regular(const struct stat& status)
{
    if (S_ISREG(status.st_mode))
        return true;
    errno = S_ISDIR(status.st_mode) ? EISDIR : S_ISLNK(status.st_mode) ? ELOOP : EINVAL;
    return false;
}

} // namespace

bool File_Descriptor::close()
{
    if (_file < 0)
        return true;
    const int before = errno;
    if (::close(std::exchange(_file, -1)) != 0)
        return false;
    errno = before;
    return true;
}

File_Descriptor open_regular(const char* path, int flags, mode_t mode, int folder)
{
    struct stat status;
    // Looked at before, since opening a device may have effects, and after, since another may have taken its place.
    if (fstatat(folder, path, &status, flags & O_NOFOLLOW ? AT_SYMLINK_NOFOLLOW : 0) == 0 && !is_regular(status))
        return File_Descriptor();
    File_Descriptor file(openat(folder, path, flags | O_NONBLOCK | O_NOCTTY | O_CLOEXEC, mode));
    // What the call itself has made is regular; given up, it would stay behind.
    if (file && !(flags & O_EXCL) && (fstat(file.get(), &status) != 0 || !is_regular(status)))
        return File_Descriptor();
    return file;
}

ssize_t read_up_to(int file, char* out, std::size_t size)
{
    std::size_t used = 0;
    while (used < size)
    {
        const ssize_t count = read(file, out + used, size - used);
        if (count < 0 && errno == EINTR)
            continue;
        if (count < 0)
            return -1;
        if (count == 0)
            break;
        used += static_cast<std::size_t>(count);
    }
    return static_cast<ssize_t>(used);
}

bool write_all(int file, const char* data, std::size_t size)
{
    while (size != 0)
    {
        const ssize_t count = write(file, data, size);
        if (count < 0 && errno == EINTR)
            continue;
        if (count <= 0)
            return false;
        data += count;
        size -= static_cast<std::size_t>(count);
    }
    return true;
}

} // namespace cimple
