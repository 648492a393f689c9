#pragma once

#include "pictures.h"

namespace convert
{

/// A plain sky for metals to mirror, as a cube map in a grid: pale at the horizon, blue above, with a dark ground.
DecodedPicture makeSky();

} // namespace convert
