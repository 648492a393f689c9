#pragma once

#include "source.h"

namespace convert::gltf
{

/// The values of an animation channel over time, in seconds.
struct Track
{
    enum class Way
    {
        LINE,
        STEP,
        SPLINE
    };
    Way way = Way::LINE;
    std::vector<float> times; ///< ascending
    Column values; ///< a SPLINE has three for each time: the tangent before, the value, the tangent after

    /// Of a time's value.
    size_t getElement(size_t key) const { return way == Way::SPLINE ? 3 * key + 1 : key; }
};

/// Throws a Fault for missing or inconsistent parts.
/// @param components  of a value.
Track readTrack(Source& source, const Object& animation, const Object& channel, unsigned components);

/// @param key    the time is between this one's and the next one's.
/// @param value  receives the track's number of components.
void evaluateSpline(const Track& track, size_t key, double time, float* value);

/// The first key holds before its time, the last one after its.
/// @param value  likewise; untouched if there are no keys.
void evaluate(const Track& track, double time, float* value);

} // namespace convert::gltf
