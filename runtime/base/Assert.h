// Assertions and tracing of the runtime. An assertion that fails is a program fault: it ends the process.
#pragma once

namespace cimple
{

/// Writes "FILE(LINE): FUNCTION(): assert: EXPRESSION" and an empty line to standard error, then aborts.
[[noreturn]] void assert_failed(const char* file, int line, const char* function, const char* expression);

/// Writes "TRACE: FILE(LINE): TEXT" to standard error.
void trace(const char* file, int line, const char* text);

/// Part of a path behind its last slash.
constexpr const char* base_name(const char* path)
{
    const char* name = path;
    for (; *path; ++path)
        if (*path == '/')
            name = path + 1;
    return name;
}

} // namespace cimple

#define CIMPLE_ASSERT(expression)                                                                                      \
    ((expression)                                                                                                      \
         ? static_cast<void>(0)                                                                                        \
         : ::cimple::assert_failed(::cimple::base_name(__FILE__), __LINE__, __PRETTY_FUNCTION__, #expression))

#define CIMPLE_TRACE(text) ::cimple::trace(::cimple::base_name(__FILE__), __LINE__, text)
