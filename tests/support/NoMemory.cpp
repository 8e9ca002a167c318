#include "tests/support/NoMemory.h"

#include "tests/support/Sanitized.h"

#include <atomic>
#include <cerrno>
#include <pthread.h>
#include <sys/mman.h>

namespace
{

thread_local test_support::NoMemory* current = nullptr;
std::atomic<std::ptrdiff_t> live{0};

bool isRefused()
{
    return current && current->refusesNext();
}

bool isRefused(std::size_t size)
{
    if (current)
        current->noteSize(size);
    return isRefused();
}

void* noBlock()
{
    errno = ENOMEM;
    return nullptr;
}

void* counted(void* block)
{
    live += block != nullptr;
    return block;
}

} // namespace

namespace test_support
{

NoMemory::NoMemory(std::size_t after, std::size_t count) : _after(after), _count(count)
{
    current = this;
}

NoMemory::~NoMemory()
{
    current = nullptr;
}

std::ptrdiff_t NoMemory::liveBlocks()
{
    return live;
}

bool NoMemory::refusesNext()
{
    if (_asked++ < _after || _refused == _count)
        return false;
    ++_refused;
    return true;
}

} // namespace test_support

extern "C"
{
#if TVR_SANITIZED
    void* __real_malloc(std::size_t size);
    void* __real_calloc(std::size_t count, std::size_t size);
    void* __real_realloc(void* block, std::size_t size);
#else
    // The C library's, under the names that it keeps for replacements of this kind.
    void* __libc_malloc(std::size_t size);
    void* __libc_calloc(std::size_t count, std::size_t size);
    void* __libc_realloc(void* block, std::size_t size);
#endif
    void __real_free(void* block);
    void* __real_mmap(void* at, std::size_t size, int access, int flags, int file, off_t offset);
    int __real_pthread_setspecific(pthread_key_t key, const void* value);
    int __real_pthread_create(pthread_t* thread, const pthread_attr_t* attributes, void* (*proc)(void*), void* arg);
}

namespace
{

#if TVR_SANITIZED
constexpr auto ownMalloc = __real_malloc;
constexpr auto ownCalloc = __real_calloc;
constexpr auto ownRealloc = __real_realloc;
#else
constexpr auto ownMalloc = __libc_malloc;
constexpr auto ownCalloc = __libc_calloc;
constexpr auto ownRealloc = __libc_realloc;
#endif

void* takeBlock(std::size_t size)
{
    return isRefused(size) ? noBlock() : ownMalloc(size);
}

void* takeZeroes(std::size_t count, std::size_t size)
{
    return isRefused(count * size) ? noBlock() : ownCalloc(count, size);
}

void* moveBlock(void* block, std::size_t size)
{
    return isRefused() ? noBlock() : ownRealloc(block, size);
}

} // namespace

// The linker sends the calls of the program's own objects here (--wrap).
extern "C"
{
    void* __wrap_malloc(std::size_t size)
    {
        return counted(takeBlock(size));
    }
    void* __wrap_calloc(std::size_t count, std::size_t size)
    {
        return counted(takeZeroes(count, size));
    }
    void* __wrap_realloc(void* block, std::size_t size)
    {
        return block ? moveBlock(block, size) : counted(moveBlock(block, size));
    }
    void __wrap_free(void* block)
    {
        live -= block != nullptr;
        __real_free(block);
    }
    void* __wrap_mmap(void* at, std::size_t size, int access, int flags, int file, off_t offset)
    {
        return isRefused() ? (noBlock(), MAP_FAILED) : __real_mmap(at, size, access, flags, file, offset);
    }
    int __wrap_pthread_setspecific(pthread_key_t key, const void* value)
    {
        return value && isRefused() ? ENOMEM : __real_pthread_setspecific(key, value);
    }
    int __wrap_pthread_create(pthread_t* thread, const pthread_attr_t* attributes, void* (*proc)(void*), void* arg)
    {
        return isRefused() ? EAGAIN : __real_pthread_create(thread, attributes, proc, arg);
    }
}

#if TVR_SANITIZED

void* operator new(std::size_t size)
{
    void* block = takeBlock(size);
    return block ? block : throw std::bad_alloc();
}
void* operator new[](std::size_t size)
{
    return operator new(size);
}
void* operator new(std::size_t size, const std::nothrow_t&) noexcept
{
    return takeBlock(size);
}
void* operator new[](std::size_t size, const std::nothrow_t&) noexcept
{
    return takeBlock(size);
}
void operator delete(void* block) noexcept
{
    __real_free(block);
}
void operator delete[](void* block) noexcept
{
    __real_free(block);
}
void operator delete(void* block, std::size_t) noexcept
{
    __real_free(block);
}
void operator delete[](void* block, std::size_t) noexcept
{
    __real_free(block);
}

#else

// The calls of the shared libraries, operator new among them: the program's symbols stand before theirs.
extern "C"
{
    void* malloc(std::size_t size)
    {
        return takeBlock(size);
    }
    void* calloc(std::size_t count, std::size_t size)
    {
        return takeZeroes(count, size);
    }
    void* realloc(void* block, std::size_t size)
    {
        return moveBlock(block, size);
    }
}

#endif
