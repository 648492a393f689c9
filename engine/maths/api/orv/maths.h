#pragma once

#include "orv/export.h"

namespace orv
{

/// The fast inverse square root, 1 / sqrt(x): a guess from the bits of x, then one Newton step.
/// Deliberately approximate: for positive x within 0.2 % (relative).
ORV_API float invSqrt(float x);

/// 0 for 0, else 1 / invSqrt(x), and as approximate. Where every bit counts, use std::sqrt.
ORV_API float sqrt(float x);

/// The standard library's remainder, taken in double precision and rounded to float.
ORV_API float fmod(float x, float y);

} // namespace orv
