// Breaches of the CMPI contract by a provider, collected for tests and for the tool's exit code.
#pragma once

#include <cstddef>
#include <mutex>
#include <string>
#include <vector>

namespace broker
{

/// One breach, with the operation during which it was seen.
struct Violation
{
    std::string text;
};

class Violations
{
public:
    void add(std::string text);
    std::vector<Violation> all() const;
    void clear();

private:
    /// A provider that errs on every instance of a large host must not fill the memory.
    static constexpr std::size_t limit = 10000;
    mutable std::mutex _mutex;
    std::vector<Violation> _list;
};

} // namespace broker
