#include "orv/texture.h"

#include "gltexture.h"

#include <cstddef>

namespace orv
{

namespace
{

/// Indexed by Texture::Format, for 8-bit channels.
constexpr unsigned BYTES_PER_PIXEL[] = {4, 3, 2, 1, 1, 1};

template <class Enum, class Value, std::size_t N>
Value find(const Value (&table)[N], Enum value, Value otherwise)
{
    const auto index = uint32_t(value);
    return index < N ? table[index] : otherwise;
}

} // namespace

unsigned Texture::getBytesPerPixel(Format format, Type type)
{
    const unsigned bytes = find(BYTES_PER_PIXEL, format, 0u);
    if (bytes == 0)
        return 0;
    switch (type)
    {
    case Type::UNSIGNED_BYTE: return bytes;
    case Type::UNSIGNED_SHORT: return 2 * bytes;
    case Type::UNSIGNED_SHORT_4_4_4_4:
    case Type::UNSIGNED_SHORT_5_5_5_1:
    case Type::UNSIGNED_SHORT_5_6_5: return 2;
    default: return 0;
    }
}

Texture::Format Texture::getFormat(int channelCount)
{
    switch (channelCount)
    {
    case 1: return Format::ALPHA;
    case 2: return Format::LUMINANCE_ALPHA;
    case 3: return Format::RGB;
    default: return Format::RGBA;
    }
}

namespace detail
{

unsigned getGlTextureFormat(Texture::Format format)
{
    return find(GL_TEXTURE_FORMATS, format, unsigned(GL_INVALID_ENUM));
}

unsigned getGlTextureType(Texture::Type type)
{
    return find(GL_TEXTURE_TYPES, type, unsigned(GL_INVALID_ENUM));
}

int getGlFilterMode(TextureParameters::FilterMode mode)
{
    return find(GL_FILTER_MODES, mode, -1);
}

int getGlWrapMode(TextureParameters::WrapMode mode)
{
    return find(GL_WRAP_MODES, mode, -1);
}

bool isMipmapFilter(TextureParameters::FilterMode mode)
{
    return mode >= TextureParameters::FilterMode::NEAREST_MIPMAP_NEAREST &&
           mode <= TextureParameters::FilterMode::LINEAR_MIPMAP_LINEAR;
}

bool isPowerOfTwo(unsigned width, unsigned height)
{
    return width != 0 && height != 0 && (width & (width - 1)) == 0 && (height & (height - 1)) == 0;
}

} // namespace detail

} // namespace orv
