#pragma once

#include <cstdint>

namespace orv::detail
{

/// Kept by what draws have in common (programs, materials, meshes), for code that sorts draws: says the number that the
/// object was given, with nothing to look up. GL thread only.
struct DrawMark
{
    uint64_t round = 0;  ///< of numbering, a revision; numbers of other rounds no longer hold
    uint32_t number = 0; ///< from 0, in the order in which objects were met
};

} // namespace orv::detail
