#include "orv/detail/boundsrevision.h"

namespace orv::detail
{

uint32_t g_boundsRevision = 0;

} // namespace orv::detail
