#include "runtime/log/LogLine.h"

#include "runtime/base/RegularFile.h"

#include <algorithm>
#include <cstdio>
#include <cstring>
#include <new>

namespace cimple
{

// --- message -------------------------------------------------------------------------------------------

Log_Message::Log_Message(const char* format, std::va_list args)
{
    std::va_list again; // each try uses up its list
    va_copy(again, args);
    const int size = std::vsnprintf(_short, sizeof _short, format, args);
    if (size < 0)
        _short[0] = '\0';
    else if (static_cast<std::size_t>(size) >= sizeof _short)
    {
        const std::size_t whole = static_cast<std::size_t>(size) + 1;
        _long.reset(new (std::nothrow) char[whole]);
        if (_long)
            std::vsnprintf(_long.get(), whole, format, again);
    }
    va_end(again);
}

// --- line ----------------------------------------------------------------------------------------------

namespace
{

bool is_control(char c)
{
    return static_cast<unsigned char>(c) < 0x20 || c == 0x7f;
}

struct Escape
{
    explicit Escape(char c)
    {
        switch (c)
        {
        case '\n':
            std::strcpy(text, "\\n");
            break;
        case '\r':
            std::strcpy(text, "\\r");
            break;
        case '\t':
            std::strcpy(text, "\\t");
            break;
        default:
            // Not by printf: a client's text may be megabytes of them, for which all who log wait.
            constexpr const char* digits = "0123456789abcdef";
            const auto byte = static_cast<unsigned char>(c);
            const char escaped[] = {'\\', 'x', digits[byte >> 4], digits[byte & 15], '\0'};
            std::memcpy(text, escaped, sizeof text);
        }
    }
    char text[5];
};

} // namespace

Log_Line::~Log_Line()
{
    flush();
}

void Log_Line::flush()
{
    write_all(_file, _text, _size); // a log has nowhere to report its own failures
    _size = 0;
}

void Log_Line::append(std::string_view text)
{
    while (!text.empty())
    {
        if (_size == room)
            flush();
        const std::size_t size = text.copy(_text + _size, room - _size);
        _size += size;
        text.remove_prefix(size);
    }
}

void Log_Line::appendf(const char* format, ...)
{
    char text[512];
    std::va_list args;
    va_start(args, format);
    const int size = std::vsnprintf(text, sizeof text, format, args);
    va_end(args);
    if (size > 0)
        append(text);
}

bool Log_Line::append_message(std::string_view text)
{
    const bool ends = text.ends_with('\n');
    if (ends)
        text.remove_suffix(1);
    while (!text.empty())
    {
        const auto control = std::find_if(text.begin(), text.end(), is_control);
        append({text.begin(), control});
        if (control == text.end())
            break;
        append(Escape(*control).text);
        text = {control + 1, text.end()};
    }
    if (ends)
        append("\n");
    return ends;
}

} // namespace cimple
