#include "broker/http/Spool.h"

#include <algorithm>
#include <atomic>
#include <cstdio>
#include <unistd.h>

namespace http
{

namespace
{

std::atomic<std::size_t> bytesOfAll = 0;

bool writeAt(int file, std::string_view bytes, std::size_t place)
{
    while (!bytes.empty())
    {
        const ssize_t written = pwrite(file, bytes.data(), bytes.size(), static_cast<off_t>(place));
        if (written <= 0)
            return false;
        bytes.remove_prefix(static_cast<std::size_t>(written));
        place += static_cast<std::size_t>(written);
    }
    return true;
}

} // namespace

struct Spool::File
{
    ~File()
    {
        if (stream)
            std::fclose(stream);
    }
    int number() const { return fileno(stream); }
    std::FILE* stream = std::tmpfile();
};

Spool::Spool() = default;

Spool::~Spool()
{
    bytesOfAll -= _tail;
}

bool Spool::append(std::string_view bytes)
{
    if (!_file)
        _file = std::make_unique<File>();
    if (bytesOfAll.fetch_add(bytes.size()) + bytes.size() <= mostBytes && _file->stream &&
        writeAt(_file->number(), bytes, _tail))
    {
        _tail += bytes.size();
        return true;
    }
    bytesOfAll -= bytes.size();
    return false;
}

std::size_t Spool::peek(char* bytes, std::size_t size) const
{
    const ssize_t read = pread(_file->number(), bytes, std::min(size, _tail - _head), static_cast<off_t>(_head));
    return read > 0 ? static_cast<std::size_t>(read) : 0;
}

void Spool::drop(std::size_t bytes)
{
    _head += bytes;
    if (!empty())
        return;
    bytesOfAll -= _tail;
    _head = _tail = 0;
    _file.reset();
}

} // namespace http
