// Opening the files that the program reads and writes.
#pragma once

#include <cstddef>
#include <cstdio>
#include <memory>
#include <optional>
#include <string>

namespace cimple
{

struct CloseFile
{
    void operator()(std::FILE* file) const { std::fclose(file); }
};
using File = std::unique_ptr<std::FILE, CloseFile>;

enum class WriteMode
{
    Truncate, ///< as "w"
    Append,   ///< as "a+"
};

/// Opens for writing, creating the file with 0644; null with errno on failure. In a folder that anybody may write to,
/// a symbolic link is refused. A pipe without a reader is an error and never blocks.
File openForWriting(const char* path, WriteMode mode);

/// The first `limit` bytes of a file; nothing, with errno, if it does not open. What opens but cannot be read is empty.
std::optional<std::string> readTextFile(const char* path, std::size_t limit);

} // namespace cimple
