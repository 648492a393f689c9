#pragma once

#include "orv/vector.h"

#include <cstddef>
#include <vector>

namespace convert
{

/// What a track is to have at a time.
struct Sample
{
    double seconds = 0.0;
    orv::Vector4f value; ///< x, y, z, 0; of a rotation its axis and its angle in radians
};

/// Finds the samples to keep as keys that the engine interpolates between: the first, the last, and as many between
/// them that what it makes of the others is within an error.
/// @param samples  in the order of their times; two at one time are a jump, which is kept if it is larger than the error.
/// @param error    of the length of the difference; of rotations, radians.
/// @return their places, ascending.
std::vector<size_t> chooseKeys(const std::vector<Sample>& samples, bool areRotations, double error);

} // namespace convert
