// The module's named semaphores. They outlive a process that a signal ended, until one that gets its number meets them.
#pragma once

#include <cstddef>
#include <filesystem>
#include <semaphore.h>
#include <string>
#include <sys/types.h>

namespace test_support
{

/// How many a process has in the system.
inline std::size_t semaphoresOf(pid_t process)
{
    const std::string ending = "_" + std::to_string(process);
    std::size_t count = 0;
    for (const auto& entry : std::filesystem::directory_iterator("/dev/shm"))
    {
        const std::string name = entry.path().filename();
        count += name.starts_with("sem.TVR") && name.ends_with(ending);
    }
    return count;
}

/// Takes away what an ended process of this number left.
inline void forgetSemaphoresOf(pid_t process)
{
    for (const char* name : {"/TVR_RM_INIT_LIB_", "/TVR_RM_INIT_LIB_DONE_"})
        sem_unlink((name + std::to_string(process)).c_str());
}

} // namespace test_support
