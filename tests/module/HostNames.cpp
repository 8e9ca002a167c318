#include "tests/module/HostNames.h"

#include <algorithm>
#include <cerrno>
#include <cstring>
#include <netdb.h>
#include <sys/socket.h>
#include <unistd.h>

namespace module_test
{

namespace
{

HostNames answers; ///< set before the module's threads start

/// What a hostent of one address points to.
struct Work
{
    char* aliases[1];
    char* addresses[2];
    char address[4];
    char name[256];
};

} // namespace

void setHostNames(const HostNames& names)
{
    answers = names;
}

} // namespace module_test

// The executable's symbols stand before those of the C library, for the module too.
extern "C"
{

    __attribute__((visibility("default"))) int gethostname(char* name, std::size_t size) noexcept
    {
        using namespace module_test;
        if (!answers.shortName)
            return errno = EPERM, -1;
        std::strncpy(name, answers.shortName->c_str(), size);
        return 0;
    }

    __attribute__((visibility("default"))) int gethostbyname_r(const char*, hostent* entry, char* buffer,
                                                               std::size_t size, hostent** result, int* error)
    {
        using namespace module_test;
        *result = nullptr;
        if (answers.resolving)
            answers.resolving();
        if (!answers.address)
            return *error = HOST_NOT_FOUND, 0; // a name that is not found is no error of the call
        if (size < std::max(sizeof(Work), answers.room))
            return ERANGE;
        Work work = {};
        std::copy(answers.address->address.begin(), answers.address->address.end(), work.address);
        answers.address->canonicalName.copy(work.name, sizeof(work.name) - 1);
        std::memcpy(buffer, &work, sizeof(work));
        auto* at = reinterpret_cast<Work*>(buffer);
        at->addresses[0] = at->address;
        *entry = {at->name, at->aliases, AF_INET, sizeof(at->address), at->addresses};
        *result = entry;
        return 0;
    }

} // extern "C"
