#pragma once

#include <cstdint>

namespace orv::detail
{

/// The GL call that draws a mesh, once its vertices and indices are bound.
struct DrawCall
{
    enum class Kind : uint32_t
    {
        NOTHING, ///< there is nothing to draw
        IN_ORDER,
        INDEXED
    };

    Kind kind = Kind::NOTHING;
    unsigned mode = 0;             ///< GL's primitive
    int count = 0;                 ///< indices, or vertices where there are none
    const void* indices = nullptr; ///< in memory; null for those of the bound element buffer

    void issue() const; ///< as often as there are solids with this mesh
};

} // namespace orv::detail
