#pragma once

#include "orv/export.h"

#include <cstdint>

namespace orv
{

// Exported from here on: instantiations of exported templates are only if their arguments are.
class ORV_API Texture2D;
class ORV_API TextureCube;

/// Pixel layouts of both kinds of texture.
struct ORV_API Texture
{
    /// Which components a pixel has.
    enum class Format : int32_t
    {
        RGBA = 0,
        RGB = 1,
        LUMINANCE_ALPHA = 2,
        LUMINANCE = 3,
        ALPHA = 4,
        DEPTH = 5
    };

    /// How the components of a pixel are stored.
    enum class Type : int32_t
    {
        UNSIGNED_BYTE = 0,
        UNSIGNED_SHORT = 1,
        UNSIGNED_SHORT_4_4_4_4 = 2,
        UNSIGNED_SHORT_5_5_5_1 = 3,
        UNSIGNED_SHORT_5_6_5 = 4
    };

    /// 0 for a format or type outside its enum.
    static unsigned getBytesPerPixel(Format format, Type type);

    /// The format that an image with this number of 8-bit channels is uploaded as; one channel is ALPHA.
    /// @param channelCount  1 to 4.
    static Format getFormat(int channelCount);
};

/// How a texture is sampled: a plain record.
struct TextureParameters
{
    /// How a texture is read between its pixels.
    enum class FilterMode : int32_t
    {
        NEAREST = 0,
        LINEAR = 1,
        NEAREST_MIPMAP_NEAREST = 2,
        NEAREST_MIPMAP_LINEAR = 3,
        LINEAR_MIPMAP_NEAREST = 4,
        LINEAR_MIPMAP_LINEAR = 5
    };

    /// What lies beyond the edges of a texture.
    enum class WrapMode : int32_t
    {
        REPEAT = 0,
        CLAMP = 1,
        MIRRORED_REPEAT = 2
    };

    /// All four at once.
    constexpr TextureParameters(FilterMode min, FilterMode mag, WrapMode horizontal, WrapMode vertical)
        : minFilter(min)
        , magFilter(mag)
        , horizontalWrap(horizontal)
        , verticalWrap(vertical)
    {
    }

    FilterMode minFilter; ///< How it is read when it is drawn smaller, larger, and beyond its edges.
    FilterMode magFilter;
    WrapMode horizontalWrap;
    WrapMode verticalWrap;
};

namespace detail
{

/// GL_INVALID_ENUM for a value outside the enum.
unsigned getGlTextureFormat(Texture::Format format);
unsigned getGlTextureType(Texture::Type type);
/// -1 for a value outside the enum.
int getGlFilterMode(TextureParameters::FilterMode mode);
int getGlWrapMode(TextureParameters::WrapMode mode);

/// Whether the mode reads from mipmaps.
bool isMipmapFilter(TextureParameters::FilterMode mode);
/// Whether both are powers of two (0 is not).
bool isPowerOfTwo(unsigned width, unsigned height);

} // namespace detail

} // namespace orv
