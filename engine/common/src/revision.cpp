#include "orv/detail/revision.h"

namespace orv::detail
{

uint64_t g_lastRevision = 0;

} // namespace orv::detail
