#include "imagedecoder.h"

#include "jpegcheck.h"

#include <climits>
#include <cstring>

namespace
{

/// stb_image copies nothing from or to null for some damaged files, which memcpy does not allow.
void* copyBytes(void* to, const void* from, std::size_t count)
{
    return count > 0 ? std::memcpy(to, from, count) : to;
}

} // namespace

// The one place where stb_image becomes code: everything static, memory in and memory out, the four formats
// alone. Its assertions must not stop the program.
#define STB_IMAGE_IMPLEMENTATION
#define STB_IMAGE_STATIC
#define STBI_NO_STDIO
#define STBI_NO_LINEAR
#define STBI_NO_HDR
#define STBI_ONLY_JPEG
#define STBI_ONLY_PNG
#define STBI_ONLY_BMP
#define STBI_ONLY_TGA
#define STBI_NO_FAILURE_STRINGS
#define STBI_MAX_DIMENSIONS 16384
#define STBI_ASSERT(condition) ((void)0)
#define memcpy copyBytes
#pragma GCC diagnostic push
#pragma GCC diagnostic ignored "-Wunused-function"
#include <stb/stb_image.h>
#pragma GCC diagnostic pop
#undef memcpy

namespace orv::detail
{

namespace
{

const std::size_t MAX_DECODED_BYTES = std::size_t(256) << 20;

/// The densest file of all: a one-bit palette PNG, where deflate reaches 1032 : 1 and each bit becomes four
/// bytes.
const std::size_t MAX_BYTES_PER_FILE_BYTE = 1032 * 8 * 4;

} // namespace

unsigned char* decodeImage(const unsigned char* file, std::size_t size, int& width, int& height,
                           int& channelCount)
{
    if (!file || size == 0 || size > INT_MAX || !hasSoundHuffmanTables(file, size))
        return nullptr;
    int w = 0;
    int h = 0;
    int channels = 0;
    if (!stbi_info_from_memory(file, int(size), &w, &h, &channels) || w < 1 || h < 1 || channels < 1 ||
        w > STBI_MAX_DIMENSIONS || h > STBI_MAX_DIMENSIONS)
        return nullptr;
    const std::size_t bytes = std::size_t(w) * std::size_t(h) * std::size_t(channels);
    if (bytes > MAX_DECODED_BYTES || bytes / MAX_BYTES_PER_FILE_BYTE > size)
        return nullptr;

    unsigned char* pixels = stbi_load_from_memory(file, int(size), &w, &h, &channels, 0);
    if (!pixels)
        return nullptr;
    width = w;
    height = h;
    channelCount = channels;
    return pixels;
}

void freeDecodedImage(unsigned char* pixels)
{
    stbi_image_free(pixels);
}

} // namespace orv::detail
