// Semaphores of this process under names that other processes can foresee.
#pragma once

#include <memory>
#include <semaphore.h>
#include <string>
#include <sys/types.h>

namespace cimple
{

/// Made anew: what stands under the name was left by a process that died with this one's id, or put there by somebody,
/// and is removed unopened. Where the name cannot be had the log says so, and a semaphore without a name serves.
///
/// In a child of a fork the parent's semaphores are not touched.
class ProcessSemaphore : public std::enable_shared_from_this<ProcessSemaphore>
{
public:
    ProcessSemaphore(const std::string& name, unsigned value);
    /// Takes the name away, too.
    ~ProcessSemaphore();
    ProcessSemaphore(const ProcessSemaphore&) = delete;
    ProcessSemaphore& operator=(const ProcessSemaphore&) = delete;

    /// This process made it.
    bool isOwn() const noexcept;
    int value() const noexcept;
    void wait() noexcept;
    void post() noexcept;
    /// The semaphore lives on for those who have it.
    void removeName() noexcept;

private:
    const std::string _name;
    const pid_t _process;
    sem_t _unnamed{};
    sem_t* _semaphore; ///< by the name, or `_unnamed`
    bool _nameStands;
};

} // namespace cimple
