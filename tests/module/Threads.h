// Threads that this process cannot have.
#pragma once

namespace module_test
{

/// While on, pthread_create answers EAGAIN, as at the limit of threads of a user or a container.
void refuseThreads(bool refused);

} // namespace module_test
