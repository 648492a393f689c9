#pragma once

#include <cstdint>

namespace orv::detail
{

/// What was worked out from the bounds of meshes holds while this stays the same. GL thread only.
extern uint32_t g_boundsRevision;

/// For bounds that reach further than before, or that programs do not keep to any longer.
inline void boundsChanged()
{
    ++g_boundsRevision;
}

} // namespace orv::detail
