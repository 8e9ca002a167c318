// Static objects that outlive every thread.
#pragma once

#include <utility>

namespace cimple
{

/// Holds a static object that is never destroyed: threads may still use it while the process ends. What it owns stays
/// reachable from the image.
template <class T> class Immortal
{
public:
    template <class... Args> explicit Immortal(Args&&... args) : _object(std::forward<Args>(args)...) {}
    ~Immortal() {}
    Immortal(const Immortal&) = delete;
    Immortal& operator=(const Immortal&) = delete;
    T& operator*() { return _object; }
    T* operator->() { return &_object; }

private:
    union
    {
        T _object;
    };
};

} // namespace cimple
