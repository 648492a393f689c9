#pragma once

#include <cstddef>

namespace orv::detail
{

/// Decodes a JPEG, PNG, BMP or TGA file to 8-bit channels, as many as the file has, top row first.
///
/// Refuses, before any pixel memory is taken, what Image promises to refuse.
/// @return width x height x channelCount bytes to be freed with freeDecodedImage(); null if it cannot be
///         decoded, and the sizes stay unchanged.
unsigned char* decodeImage(const unsigned char* file, std::size_t size, int& width, int& height,
                           int& channelCount);

void freeDecodedImage(unsigned char* pixels);

} // namespace orv::detail
