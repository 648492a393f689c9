#pragma once

#include "pictures.h"

namespace convert
{

bool isWebp(const std::vector<uint8_t>& bytes);

/// All functions here return false for a damaged file.
bool readWebpHeader(const std::vector<uint8_t>& bytes, PictureHeader& header);

/// Refuses animations.
bool decodeWebp(const std::vector<uint8_t>& bytes, DecodedPicture& picture);

} // namespace convert
