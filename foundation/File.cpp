#include "foundation/File.h"

#include <sys/random.h>
#include <sys/stat.h>
#include <unistd.h>

#include <algorithm>
#include <cerrno>
#include <cinttypes>
#include <climits>
#include <cstdint>
#include <cstdio>
#include <exception>
#include <utility>

namespace cimple
{

namespace
{

constexpr mode_t newFile = S_IRUSR | S_IWUSR | S_IRGRP | S_IROTH;

/// A file's folder, held open so that what is asked of it holds for what is opened in it, and the name there.
struct Place
{
    File_Descriptor folder;
    std::string name;
};

File_Descriptor openFolder(const char* path, int flags = 0, int start = AT_FDCWD)
{
    return File_Descriptor(openat(start, path, O_PATH | O_DIRECTORY | O_CLOEXEC | flags));
}

Place placeOf(std::string_view path)
{
    const std::size_t slash = path.rfind('/');
    if (slash == std::string_view::npos)
        return {openFolder("."), std::string(path)};
    return {openFolder(std::string(path.substr(0, slash + 1)).c_str()), std::string(path.substr(slash + 1))};
}

/// What stands at a place; nothing, with errno, if that is unknown or nothing stands there.
std::optional<struct stat> statusAt(const Place& place)
{
    struct stat status;
    if (fstatat(place.folder.get(), place.name.c_str(), &status, AT_SYMLINK_NOFOLLOW) != 0)
        return std::nullopt;
    return status;
}

} // namespace

// --- opening and reading -------------------------------------------------------------------------------

bool isPlainFileName(std::string_view name)
{
    return !name.empty() && name != "." && name != ".." &&
           name.find_first_of(std::string_view("/\0", 2)) == std::string_view::npos;
}

File_Descriptor createNamedFile(const std::string& name)
{
    if (!isPlainFileName(name))
    {
        errno = EINVAL;
        return File_Descriptor();
    }
    return open_regular(name.c_str(), O_WRONLY | O_CREAT | O_EXCL | O_NOFOLLOW, S_IRUSR | S_IWUSR);
}

std::optional<std::string> readTextFile(const char* path, std::size_t limit, int flags)
{
    const File_Descriptor file = open_regular(path, O_RDONLY | flags);
    if (!file)
        return std::nullopt;
    std::string text;
    char part[4096]; // files are far below their limits
    for (;;)
    {
        const ssize_t size = read_up_to(file.get(), part, std::min(sizeof part, limit - text.size()));
        if (size < 0)
            return std::nullopt;
        if (size == 0)
            return text;
        text.append(part, static_cast<std::size_t>(size));
    }
}

// --- links ---------------------------------------------------------------------------------------------

namespace
{

bool isRootsAlone(const struct stat& status)
{
    return status.st_uid == 0 && (status.st_mode & (S_IWGRP | S_IWOTH)) == 0;
}

bool isRootsAlone(const File_Descriptor& folder)
{
    struct stat status;
    return fstat(folder.get(), &status) == 0 && isRootsAlone(status);
}

/// True where only root can rename what is root's: others may make entries of their own at most.
bool keepsRootsEntries(const File_Descriptor& folder)
{
    struct stat status;
    return fstat(folder.get(), &status) == 0 &&
           (isRootsAlone(status) || (status.st_uid == 0 && (status.st_mode & S_ISVTX) != 0));
}

/// Walks to the folder of a link's target; none if another than root could lead the way, or on a further link.
File_Descriptor walkAsRoot(const File_Descriptor& start, std::string_view target)
{
    File_Descriptor folder = target.starts_with('/') ? openFolder("/") : openFolder(".", 0, start.get());
    for (;;)
    {
        target.remove_prefix(std::min(target.find_first_not_of('/'), target.size()));
        const std::size_t slash = target.find('/');
        if (slash == std::string_view::npos || !folder)
            return isRootsAlone(folder) ? std::move(folder) : File_Descriptor();
        if (!keepsRootsEntries(folder))
            return File_Descriptor();
        folder = openFolder(std::string(target.substr(0, slash)).c_str(), O_NOFOLLOW, folder.get());
        target.remove_prefix(slash);
    }
}

/// Goes on to what the link at the place points to; false with errno where root must not follow.
bool followLink(Place& place)
{
    char buffer[PATH_MAX];
    const ssize_t size = readlinkat(place.folder.get(), place.name.c_str(), buffer, sizeof buffer);
    if (size < 0)
        return false;
    const std::string_view target(buffer, static_cast<std::size_t>(size));
    File_Descriptor folder = isRootsAlone(place.folder) ? walkAsRoot(place.folder, target) : File_Descriptor();
    errno = ELOOP;
    if (!folder)
        return false;
    place = {std::move(folder), std::string(target.substr(target.rfind('/') + 1))};
    const auto status = statusAt(place);
    errno = ELOOP;
    return !status || isRootsAlone(*status);
}

} // namespace

// --- appending -----------------------------------------------------------------------------------------

namespace
{

bool isSame(const struct stat& one, const struct stat& other)
{
    return one.st_dev == other.st_dev && one.st_ino == other.st_ino;
}

} // namespace

bool isSame(const File_Descriptor& one, const File_Descriptor& other)
{
    struct stat status;
    struct stat otherStatus;
    return fstat(one.get(), &status) == 0 && fstat(other.get(), &otherStatus) == 0 && isSame(status, otherStatus);
}

bool isSameFile(const char* one, const char* other)
{
    struct stat status;
    struct stat otherStatus;
    if (stat(one, &status) == 0 && stat(other, &otherStatus) == 0 && isSame(status, otherStatus))
        return true;
    const Place place = placeOf(one);
    const Place otherPlace = placeOf(other);
    return place.name == otherPlace.name && isSame(place.folder, otherPlace.folder);
}

Appendable openForAppending(const char* path, int flags)
{
    Place place = placeOf(path);
    if (!place.folder)
        return {};
    // The same folder, so that nobody puts another in its place meanwhile.
    const bool isRootsWay = isSame(walkAsRoot(openFolder("."), path), place.folder);
    const auto status = statusAt(place);
    if (status && S_ISLNK(status->st_mode) && (flags & O_NOFOLLOW) == 0 && !followLink(place))
        return {};
    flags |= O_RDWR | O_APPEND | O_CREAT | O_NOFOLLOW;
    return {open_regular(place.name.c_str(), flags, newFile, place.folder.get()), isRootsWay};
}

// --- replacing -----------------------------------------------------------------------------------------

namespace
{

/// A new file under a name that nobody can foresee, removed at the end unless it has taken another's place.
class TemporaryFile
{
public:
    TemporaryFile(const File_Descriptor& folder, mode_t mode) : _folder(folder)
    {
        for (int tries = 0; tries < 100 && !_file; ++tries)
        {
            chooseName();
            _file = open_regular(_name, O_WRONLY | O_CREAT | O_EXCL | O_NOFOLLOW, mode, folder.get());
            if (!_file && errno != EEXIST)
                break;
        }
        _isThere = static_cast<bool>(_file);
    }
    ~TemporaryFile()
    {
        const int error = errno;
        if (_isThere)
            unlinkat(_folder.get(), _name, 0);
        errno = error;
    }
    TemporaryFile(const TemporaryFile&) = delete;
    TemporaryFile& operator=(const TemporaryFile&) = delete;

    explicit operator bool() const { return _isThere; }

    bool setOwner(uid_t user, gid_t group) { return fchown(_file.get(), user, group) == 0; }
    bool setMode(mode_t mode) { return fchmod(_file.get(), mode) == 0; }
    bool write(std::string_view text)
    {
        return write_all(_file.get(), text.data(), text.size()) && fsync(_file.get()) == 0 && _file.close();
    }
    /// False if anything stands under the name.
    bool appearAs(const char* name) { return linkat(_folder.get(), _name, _folder.get(), name, 0) == 0; }
    bool takePlaceOf(const char* name)
    {
        _isThere = renameat(_folder.get(), _name, _folder.get(), name) != 0;
        return !_isThere;
    }

private:
    void chooseName()
    {
        std::uint64_t number = 0;
        if (getrandom(&number, sizeof number, GRND_NONBLOCK) != sizeof number)
            number = static_cast<std::uint64_t>(getpid()); // foreseeable, and made exclusively all the same
        std::snprintf(_name, sizeof _name, ".tvr-%016" PRIx64, number);
    }

    const File_Descriptor& _folder;
    File_Descriptor _file;
    char _name[32];
    bool _isThere = false;
};

bool holds(const Place& place, std::string_view text)
{
    const File_Descriptor file = open_regular(place.name.c_str(), O_RDONLY | O_NOFOLLOW, 0, place.folder.get());
    if (!file)
        return false;
    std::string content(text.size() + 1, '\0');
    const ssize_t size = read_up_to(file.get(), content.data(), content.size());
    return size >= 0 && std::string_view(content.data(), static_cast<std::size_t>(size)) == text;
}

/// So that a crash does not bring the old file back; the new one is whole in any case.
void syncFolder(const File_Descriptor& folder)
{
    const File_Descriptor readable(openat(folder.get(), ".", O_RDONLY | O_DIRECTORY | O_CLOEXEC));
    if (readable)
        fsync(readable.get());
}

Replacement replaceAt(const Place& place, std::string_view text)
{
    const auto old = statusAt(place);
    if (old ? !S_ISREG(old->st_mode) : errno != ENOENT)
    {
        errno = old ? EINVAL : errno;
        return Replacement::NotOpened;
    }
    if (old && holds(place, text))
        return Replacement::Unchanged;

    TemporaryFile file(place.folder, old ? S_IRUSR | S_IWUSR : newFile);
    if (!file)
        return Replacement::NotOpened;
    if (old)
        file.setOwner(old->st_uid, old->st_gid); // where the process may: readers of the old file stay readers
    if (old && !file.setMode(old->st_mode & (S_IRWXU | S_IRGRP | S_IXGRP | S_IROTH | S_IXOTH)))
        return Replacement::NotWritten;
    if (!file.write(text) || !file.takePlaceOf(place.name.c_str()))
        return Replacement::NotWritten;
    syncFolder(place.folder);
    return Replacement::Done;
}

} // namespace

bool createTextFile(const char* path, std::string_view text)
{
    const Place place = placeOf(path);
    if (!place.folder)
        return false;
    TemporaryFile file(place.folder, S_IRUSR | S_IWUSR);
    return file && file.write(text) && file.appearAs(place.name.c_str());
}

Replacement replaceFile(const char* path, std::string_view text) noexcept
try
{
    Place place = placeOf(path);
    if (!place.folder)
        return Replacement::NotOpened;
    const auto status = statusAt(place);
    if (status && S_ISLNK(status->st_mode) && !followLink(place))
        return Replacement::NotOpened;
    return replaceAt(place, text);
}
catch (const std::exception&)
{
    errno = ENOMEM;
    return Replacement::NotOpened;
}

} // namespace cimple
