#pragma once

#include "pictures.h"

namespace convert
{

bool isWebp(const std::vector<uint8_t>& bytes);

/// @return false if it is damaged; so do all here.
bool readWebpHeader(const std::vector<uint8_t>& bytes, PictureHeader& header);

/// Of a moving picture, none.
bool decodeWebp(const std::vector<uint8_t>& bytes, DecodedPicture& picture);

} // namespace convert
