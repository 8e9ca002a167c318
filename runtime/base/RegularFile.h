// Files under names that somebody else may have put something else under: a pipe, a device, a folder.
#pragma once

#include <cstddef>
#include <fcntl.h>
#include <sys/types.h>
#include <utility>

namespace cimple
{

/// An open file, closed at the end of its life; -1 stands for none. Closing keeps errno.
class File_Descriptor
{
public:
    explicit File_Descriptor(int file = -1) : _file(file) {}
    File_Descriptor(File_Descriptor&& other) noexcept : _file(std::exchange(other._file, -1)) {}
    File_Descriptor& operator=(File_Descriptor&& other) noexcept
    {
        std::swap(_file, other._file);
        return *this;
    }
    ~File_Descriptor() { close(); }

    explicit operator bool() const { return _file >= 0; }
    int get() const { return _file; }
    /// False with errno if what was written did not reach its place.
    bool close();

private:
    int _file;
};

/// Opens a regular file; `flags` and `mode` are those of open(). Anything else under the name is refused with errno,
/// without being opened for its effects, and cannot block. A relative path starts at `folder`.
File_Descriptor open_regular(const char* path, int flags, mode_t mode = 0, int folder = AT_FDCWD);

/// Reads on until `size` bytes are there or the file ends; their count, or -1.
ssize_t read_up_to(int file, char* out, std::size_t size);

/// False with errno if not all could be written.
bool write_all(int file, const char* data, std::size_t size);

} // namespace cimple
