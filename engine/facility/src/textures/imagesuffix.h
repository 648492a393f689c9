#pragma once

#include "orv/textsuffix.h"

namespace orv::detail
{

/// Whether a name ends like an image file that the texture loaders read, in either case of letters.
inline bool hasImageSuffix(const char* name)
{
    for (const char* suffix : {".jpg", ".jpeg", ".bmp", ".png", ".tga"})
    {
        if (endsWithI(name, suffix))
            return true;
    }
    return false;
}

} // namespace orv::detail
