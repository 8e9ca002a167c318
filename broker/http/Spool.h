// What a client has not taken yet of a response, in a file without a name.
#pragma once

#include <cstddef>
#include <memory>
#include <string_view>

namespace http
{

/// A queue of bytes. All spools together hold so many at the most; one that nothing goes into has no file.
class Spool
{
public:
    static constexpr std::size_t mostBytes = std::size_t{512} << 20;

    Spool();
    ~Spool();
    Spool(const Spool&) = delete;
    Spool& operator=(const Spool&) = delete;

    bool empty() const { return _head == _tail; }
    /// False where there is no room.
    bool append(std::string_view bytes);
    /// The first bytes, at most `size` of them; 0 where they cannot be read. They stay until drop() takes them out.
    std::size_t peek(char* bytes, std::size_t size) const;
    void drop(std::size_t bytes);

private:
    struct File;
    std::unique_ptr<File> _file;
    std::size_t _head = 0, _tail = 0;
};

} // namespace http
