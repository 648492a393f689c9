#include "mixedplaces.h"

#include <limits>
#include <utility>

namespace orv::detail
{

namespace
{

constexpr size_t FEWEST_PLACES = 16;

} // namespace

MixedPlaces::Place& MixedPlaces::find(const void* key)
{
    if (m_count * 4 >= m_places.size() * 3)
        grow();
    Place& place = search(key);
    if (!place.key)
    {
        place.key = key;
        place.written.x = std::numeric_limits<float>::quiet_NaN();
        ++m_count;
    }
    return place;
}

/// @return the key's place, or the free one where it belongs; there is always one.
MixedPlaces::Place& MixedPlaces::search(const void* key)
{
    const uint64_t hash = uint64_t(reinterpret_cast<uintptr_t>(key)) * 0x9E3779B97F4A7C15u;
    size_t i = size_t(hash >> 32);
    for (;; ++i)
    {
        Place& place = m_places[i & (m_places.size() - 1)];
        if (place.key == key || !place.key)
            return place;
    }
}

void MixedPlaces::grow()
{
    std::vector<Place> places(m_places.empty() ? FEWEST_PLACES : m_places.size() * 2);
    std::swap(places, m_places);
    for (const Place& place : places)
    {
        if (place.key)
            search(place.key) = place;
    }
}

void MixedPlaces::clear()
{
    for (Place& place : m_places)
        place = {};
    m_count = 0;
}

} // namespace orv::detail
