#include "runtime/base/Assert.h"

#include <cstdio>
#include <cstdlib>

namespace cimple
{

void assert_failed(const char* file, int line, const char* function, const char* expression)
{
    std::fprintf(stderr, "%s(%d): %s(): assert: %s\n\n", file, line, function, expression);
    std::abort();
}

void trace(const char* file, int line, const char* text)
{
    std::fprintf(stderr, "TRACE: %s(%d): %s\n", file, line, text);
}

} // namespace cimple
