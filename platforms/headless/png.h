#pragma once

#include <cstdint>
#include <string>

namespace headless
{

/// Writes a PNG completely or not at all: first to a temporary name beside it, then renamed; a device or
/// pipe is written to directly.
/// @param path   "-" for standard output, which is flushed; on failure a part may have been written.
/// @param rgba   width x height x 4 bytes, top row first.
/// @param error  set to "path: reason" on failure.
bool writePng(const std::string& path, int width, int height, const uint8_t* rgba, std::string& error);

} // namespace headless
