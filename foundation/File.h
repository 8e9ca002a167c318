// Opening, reading and replacing the files of the program. Only regular files are touched: a pipe, a device or a socket
// in the place of one is a failure and cannot block.
#pragma once

#include "runtime/base/RegularFile.h"

#include <cstddef>
#include <optional>
#include <string>
#include <string_view>

namespace cimple
{

/// A file that is open for reading and appending.
struct Appendable
{
    File_Descriptor file = File_Descriptor();
    bool isRootsWay = false; ///< nobody but root could have led the path to it
};

/// Opens for reading and appending, creating the file with 0644; none with errno on failure. A symbolic link at the end
/// is followed where nobody but root could have made it, and never with O_NOFOLLOW in the `flags`.
Appendable openForAppending(const char* path, int flags = 0);

/// Whether both are the same file.
bool isSame(const File_Descriptor& one, const File_Descriptor& other);
/// Whether two paths name the same file, or the same place for one that is not there yet.
bool isSameFile(const char* one, const char* other);

/// Whether a name from a client names a file of a folder: not empty, no folder in it, and neither of the dot entries.
bool isPlainFileName(std::string_view name);

/// Makes a file for what a client sends or asks for, in the current directory and for this user alone. None with errno
/// where the name has a folder in it or is none, or where anything stands under it, a link included.
File_Descriptor createNamedFile(const std::string& name);

/// The first `limit` bytes of a file; nothing, with errno, if it does not open or cannot be read. `flags` are further
/// ones of open(), such as O_NOFOLLOW.
std::optional<std::string> readTextFile(const char* path, std::size_t limit, int flags = 0);

/// Makes a new file with this text, for the process's user alone. False with errno, and nothing made, where something
/// stands under the name already, be it a link to nowhere, or the text does not reach the disk. Nobody sees a part.
bool createTextFile(const char* path, std::string_view text);

enum class Replacement
{
    Unchanged,  ///< the file has this text
    Done,       ///< the file was replaced or made
    NotOpened,  ///< there is no way to the file
    NotWritten, ///< the text did not reach the disk
};
constexpr bool failed(Replacement replacement)
{
    return replacement == Replacement::NotOpened || replacement == Replacement::NotWritten;
}

/// Gives a file a new text in one step: readers and whoever comes after a crash find the old text or the new one,
/// whole. The text is written to a temporary file beside it, which takes the file's place once it is on the disk. On a
/// failure, told in errno, the file is as before and nothing is left beside it. The file keeps its permissions but for
/// others' write bits; a new one has 0644. A symbolic link stays and the file behind it is replaced, where nobody but
/// root could have led it there; other links are refused.
Replacement replaceFile(const char* path, std::string_view text) noexcept;

} // namespace cimple
