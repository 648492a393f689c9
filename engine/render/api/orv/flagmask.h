#pragma once

#include <cstdint>

namespace orv
{

/// Names a set of scene node flags and which of them are on by default.
///
/// Nodes store a flag as its wanted state XOR its inverted bit, so a new node (all bits 0) has every flag in
/// its default state: off, or on for an inverted flag.
struct FlagMask
{
    uint32_t mask = 0;     ///< the flag bits that are meant
    uint32_t inverted = 0; ///< those of them that are on by default

    constexpr FlagMask() = default;
    /// The same two.
    constexpr explicit FlagMask(uint32_t meantBits, uint32_t invertedBits = 0)
        : mask(meantBits)
        , inverted(invertedBits)
    {
    }
};

} // namespace orv
