// The lines of the logs, put together and written without the heap: a process that has run out of memory still logs.
#pragma once

#include <cstdarg>
#include <cstddef>
#include <memory>
#include <string_view>

namespace cimple
{

/// A formatted message of any length; short ones need no memory. One that finds no memory is cut.
class Log_Message
{
public:
    Log_Message(const char* format, std::va_list args) __attribute__((format(printf, 2, 0)));
    const char* text() const { return _long ? _long.get() : _short; }

private:
    char _short[1024];
    std::unique_ptr<char[]> _long;
};

/// Collects a line for an open file. Up to its room it is written with one call, so that the lines of processes that
/// share a file stay whole.
class Log_Line
{
public:
    explicit Log_Line(int file) : _file(file) {}
    ~Log_Line();
    Log_Line(const Log_Line&) = delete;
    Log_Line& operator=(const Log_Line&) = delete;

    /// The log's own text, as it is.
    void append(std::string_view text);
    /// Short text of a printf format.
    void appendf(const char* format, ...) __attribute__((format(printf, 2, 3)));
    /// Text from anywhere: control characters appear as `\n`, `\t`, `\x1b`, so that nothing in it starts a line of its
    /// own. A line feed at its very end stays one, and makes the result true.
    bool append_message(std::string_view text);

private:
    void flush();

    static constexpr std::size_t room = 5 * 1024; // a message of 1,023 bytes that are all escaped, and what precedes it

    int _file;
    std::size_t _size = 0;
    char _text[room];
};

} // namespace cimple
