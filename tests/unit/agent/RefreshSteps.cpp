// The agent's tests build no model.
#include "agent/RefreshSteps.h"

namespace cimple
{

const RefreshSteps refreshSteps = {};

} // namespace cimple
