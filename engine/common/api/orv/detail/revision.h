#pragma once

#include "orv/export.h"

#include <cstdint>

namespace orv::detail
{

/// The last number handed out; nextRevision() alone touches it.
extern ORV_API uint64_t g_lastRevision;

/// A number that no other call in this process returns, and never 0.
///
/// Objects stamp themselves with one whenever they change. Two equal stamps therefore mean the same object in
/// the same state, so code that remembers a stamp needs neither a pointer (which might dangle) nor a comparison
/// of values. While g_lastRevision stays the same nothing has changed that a draw depends on, but the transforms of
/// nodes. GL thread only, like everything that is stamped.
inline uint64_t nextRevision()
{
    return ++g_lastRevision;
}

} // namespace orv::detail
