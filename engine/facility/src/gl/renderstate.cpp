#include "orv/renderstate.h"

#include "orv/log.h"

#include <cmath>

namespace orv::detail
{

bool allowLineWidth(float pixels)
{
    if (pixels > 0.0f)
        return true;
    ORV_LOG_ERROR("Line width %g is not above 0; the old one is kept.", double(pixels));
    return false;
}

bool allowSize(const char* of, int width, int height)
{
    if (width >= 0 && height >= 0)
        return true;
    ORV_LOG_ERROR("%s of %d x %d is negative; the old one is kept.", of, width, height);
    return false;
}

bool allowNumbers(const char* of, float first, float second)
{
    if (!std::isnan(first) && !std::isnan(second))
        return true;
    ORV_LOG_ERROR("%s is not a number; the old one is kept.", of);
    return false;
}

} // namespace orv::detail
