#pragma once

#include "orv/assetloader.h"
#include "orv/export.h"

namespace orv
{

class Texture2D;

/// Loads PVR files as 2D textures, their top row first.
///
/// Formats: RGBA 8888, BGRA 8888, RGB 888, RGB 565, RGBA 4444, RGBA 5551, LA 88, L 8, A 8 (and the first forms of
/// 4444 and 5551, with alpha on top), ETC1, and PVRTC with 2 or 4 bits, with or without alpha; in legacy headers
/// of 44 and 52 bytes and in version 3, of either byte order. Cube maps, arrays and volumes are refused. A file
/// declared to be sRGB is treated as any other.
///
/// ETC1 and PVRTC stay compressed where GL has the extension (PVRTC only if the picture is square); elsewhere, and
/// for pictures stored with their bottom row first, they are decoded and take four bytes per pixel in GL. The size
/// in bytes that the texture reports is what GL holds.
///
/// Mipmaps are the file's own and never made here. They are used if they go down to a single pixel and both sides
/// are powers of two; otherwise OpenGL ES 2.0 would draw the texture black, so its largest level alone is loaded
/// (a warning says so). Minification is LINEAR_MIPMAP_NEAREST with mipmaps and LINEAR without; power-of-two sizes
/// repeat, others clamp.
class ORV_API PvrTextureLoader : public AssetLoader<Texture2D>
{
public:
    ~PvrTextureLoader() override;

    /// @param cache  a Texture2DCache.
    /// @return empty if there is no such file, or if it cannot be used. The log says why, unless the name ends in
    ///         something other than ".pvr" and the file is no PVR file: that is for other loaders to report.
    SharedPtr<Texture2D> load(AssetCache<Texture2D>& cache, const char* name) override;
    bool isKnown(const char* name) override;
};

} // namespace orv
