#pragma once

#include "orv/detail/revision.h"
#include "orv/export.h"

#include <cstdint>

namespace orv::detail
{

/// A new revision whenever code outside the draw path has changed a GL binding; only bindingsChanged() writes it.
extern ORV_API uint64_t g_bindingEpoch;

/// To be called after every glBind*, glUseProgram, glDelete* or vertex array call that does not go through a
/// RenderContext. Each context then forgets what it remembers about bindings before its next draw. (Applications
/// call RenderContext::forgetBindings().)
inline void bindingsChanged()
{
    g_bindingEpoch = nextRevision();
}

} // namespace orv::detail
