#include "device/ProcessSemaphore.h"

#include "foundation/Log.h"

#include <cerrno>
#include <cstring>
#include <fcntl.h>
#include <unistd.h>

namespace cimple
{

namespace
{

/// For a race with somebody who puts a file under the name again and again.
constexpr int maxTries = 8;

/// Null, with the reason in errno, if the name cannot be had.
sem_t* openAnew(const char* name, unsigned value)
{
    for (int i = 0; i < maxTries; ++i)
    {
        sem_unlink(name);
        sem_t* semaphore = sem_open(name, O_CREAT | O_EXCL, 0644, value);
        if (semaphore != SEM_FAILED)
            return semaphore;
        if (errno == EEXIST)
            continue;
        const int error = errno;
        sem_unlink(name); // the name may stand although there was no memory for the semaphore
        errno = error;
        break;
    }
    return nullptr;
}

} // namespace

ProcessSemaphore::ProcessSemaphore(const std::string& name, unsigned value)
    : _name(name), _process(getpid()), _semaphore(openAnew(name.c_str(), value)), _nameStands(_semaphore)
{
    if (_semaphore)
        return;
    TVR_LOG(TVR_ERR, "Semaphore %s cannot be made: %s. One without a name takes its place.", name.c_str(),
            std::strerror(errno));
    sem_init(&_unnamed, 0, value);
    _semaphore = &_unnamed;
}

ProcessSemaphore::~ProcessSemaphore()
{
    removeName();
    if (!isOwn())
        return;
    if (_semaphore == &_unnamed)
        sem_destroy(_semaphore);
    else
        sem_close(_semaphore);
}

bool ProcessSemaphore::isOwn() const noexcept
{
    return _process == getpid();
}

int ProcessSemaphore::value() const noexcept
{
    int value = 0;
    sem_getvalue(_semaphore, &value);
    return value;
}

void ProcessSemaphore::wait() noexcept
{
    while (sem_wait(_semaphore) != 0 && errno == EINTR)
        ;
}

void ProcessSemaphore::post() noexcept
{
    sem_post(_semaphore);
}

void ProcessSemaphore::removeName() noexcept
{
    if (_nameStands && isOwn())
        sem_unlink(_name.c_str());
    _nameStands = false;
}

} // namespace cimple
