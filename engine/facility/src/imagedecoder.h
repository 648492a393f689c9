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

/// Unpacks a deflate stream (RFC 1951), which the PNG decoder can do anyway.
/// @param packed  with at least two bytes of anything behind the stream.
/// @return false unless it unpacks to exactly size bytes.
bool inflate(const unsigned char* packed, int packedSize, unsigned char* bytes, int size);

} // namespace orv::detail
