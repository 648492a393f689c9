#pragma once

#include "orv/vector.h"

#include <cstddef>
#include <cstdint>
#include <vector>

namespace orv::detail
{

/// For each value that a controller blends into: the others' value, and the one that it wrote itself.
///
/// A hash table by address, with open addressing; it only grows. Finding an entry allocates nothing.
class MixedPlaces
{
public:
    struct Place
    {
        const void* key = nullptr;
        uint32_t update = 0; ///< the last one that wrote here
        Vector4f base;       ///< the value of others, from before this controller's write or since
        Vector4f written;    ///< NaN at first
    };

    /// A place that is not known yet is added.
    Place& find(const void* key);

    /// Forgets all places.
    void clear();

    /// Of this controller, numbered from 1.
    void beginUpdate() { ++m_update; }
    uint32_t getUpdate() const { return m_update; }

private:
    Place& search(const void* key);
    void grow();

    std::vector<Place> m_places; ///< a power of two
    size_t m_count = 0;
    uint32_t m_update = 0;
};

} // namespace orv::detail
