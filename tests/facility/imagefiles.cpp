#include "imagefiles.h"

#define STB_IMAGE_WRITE_IMPLEMENTATION
#define STB_IMAGE_WRITE_STATIC
#define STBI_WRITE_NO_STDIO
#pragma GCC diagnostic push
#pragma GCC diagnostic ignored "-Wunused-function"
#include <stb/stb_image_write.h>
#pragma GCC diagnostic pop

namespace imagefiles
{

namespace
{

void append(void* file, void* data, int size)
{
    const auto* bytes = static_cast<const uint8_t*>(data);
    static_cast<Bytes*>(file)->insert(static_cast<Bytes*>(file)->end(), bytes, bytes + size);
}

} // namespace

Bytes encode(const std::string& suffix, int width, int height, int channels, const Bytes& pixels)
{
    Bytes file;
    const void* data = pixels.data();
    if (suffix == "png")
        stbi_write_png_to_func(append, &file, width, height, channels, data, width * channels);
    else if (suffix == "jpg")
        stbi_write_jpg_to_func(append, &file, width, height, channels, data, 95);
    else if (suffix == "bmp")
        stbi_write_bmp_to_func(append, &file, width, height, channels, data);
    else
        stbi_write_tga_to_func(append, &file, width, height, channels, data);
    return file;
}

Bytes encodeFlat(const std::string& suffix, int width, int height, int channels, uint8_t value)
{
    return encode(suffix, width, height, channels, Bytes(size_t(width * height * channels), value));
}

} // namespace imagefiles
