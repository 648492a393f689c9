#pragma once

#include <cstdint>
#include <string>

namespace headless
{

/// Writes a PNG, whole or not at all: to a temporary name beside it first, then renamed.
/// @param path   "-" for standard output, which is flushed; part of a picture may be there then on failure.
/// @param rgba   width x height x 4 bytes, top row first.
/// @param error  set to "path: reason" on failure.
bool writePng(const std::string& path, int width, int height, const uint8_t* rgba, std::string& error);

} // namespace headless
