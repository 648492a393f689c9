#pragma once

#include "orv/export.h"

#include <cstdint>

namespace orv::detail
{

/// The last number handed out; nextRevision() alone touches it.
extern ORV_API uint64_t g_lastRevision;

/// A number that no other call in this process returns, and never 0.
///
/// Objects take one whenever they change. Equal revisions mean the same object in the same state, so code that
/// remembers a revision needs neither a pointer (which might dangle) nor a comparison of values. While g_lastRevision
/// stays the same, nothing that a draw depends on has changed, except the transforms of nodes. GL thread only, like
/// everything that has a revision.
inline uint64_t nextRevision()
{
    return ++g_lastRevision;
}

} // namespace orv::detail
