#pragma once

#include "orv/vector.h"

#include <cstddef>
#include <vector>

namespace convert
{

/// A sample of a track.
struct Sample
{
    double seconds = 0.0;
    orv::Vector4f value; ///< x, y, z, 0; of a rotation its axis and its angle in radians
};

/// Chooses the samples to keep as keys for interpolation: the first, the last, and enough between them that the
/// interpolated values of the others are within an error.
/// @param samples  in the order of their times; two at one time are a jump, which is kept if it is larger than the error.
/// @param error    of the length of the difference; of rotations, radians.
/// @return their indices, ascending.
std::vector<size_t> chooseKeys(const std::vector<Sample>& samples, bool areRotations, double error);

} // namespace convert
