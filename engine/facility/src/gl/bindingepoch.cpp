#include "orv/detail/bindingepoch.h"

namespace orv::detail
{

uint64_t g_bindingEpoch = 0;

} // namespace orv::detail
