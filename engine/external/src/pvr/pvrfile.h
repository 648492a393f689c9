#pragma once

#include "pvr/pvrformat.h"

#include <cstddef>
#include <string>
#include <vector>

namespace pvr
{

/// One size of the picture. Each level has half the sides of the one before, rounded down, at least 1.
struct Level
{
    uint32_t width;  ///< pixels
    uint32_t height; ///< pixels
    size_t offset;   ///< from the file's first byte
    size_t size;     ///< bytes
};

/// The contents of a PVR file. Made by parse().
struct PvrFile
{
    Format format = Format::RGBA_8888;
    bool bigEndian = false;
    bool bottomRowFirst = false;
    std::vector<Level> levels; ///< the largest first; at least one, each within the file

    uint32_t width() const { return levels.front().width; }
    uint32_t height() const { return levels.front().height; }

    /// Whether the levels go down to a single pixel.
    bool isComplete() const { return levels.back().width == 1 && levels.back().height == 1; }
};

/// Whether the first bytes are those of a PVR file.
bool isPvr(const uint8_t* data, size_t size);

/// Reads the headers of a PVR file, not its pixels.
///
/// Legacy headers of 44 and 52 bytes and version 3, of either byte order, that hold one picture with its mipmaps.
/// Cube maps, arrays and volumes are refused, and so are formats that are not in Format; the error names them.
///
/// Not used: metadata (a version 3 picture has its top row first, whatever its metadata says), masks (but for the
/// alpha of legacy PVRTC files), the colour space (sRGB is treated as plain colour: the bytes reach the shader
/// unchanged), premultiplication, and the legacy flags about tiling, bump maps and mipmaps (their count decides).
/// In legacy files the bit count, the surface size and the number of surfaces may be 0; otherwise they must agree with
/// the rest. Twiddled pixels are refused, except for PVRTC, whose blocks always are.
/// \param error receives what is wrong, naming the field
/// \return false, with `file` unchanged, if the file cannot be used
bool parse(const uint8_t* data, size_t size, PvrFile& file, std::string& error);

} // namespace pvr
