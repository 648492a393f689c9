#include "imagedecoder.h"

#include "jpegcheck.h"
#include "orv/detail/loadscope.h"

#include <algorithm>
#include <climits>
#include <cstdlib>
#include <cstring>

namespace
{

/// stb_image trusts sizes in the file; no block that it allocates may be larger than this.
thread_local std::size_t t_largestBlock = 0;

/// Zeroed, since truncated files leave pixels and tables unwritten: old heap contents must not appear in a picture.
void* takeBlock(std::size_t size)
{
    return size <= t_largestBlock ? std::calloc(1, size) : nullptr;
}

void* resizeBlock(void* block, std::size_t size)
{
    return size <= t_largestBlock ? std::realloc(block, size) : nullptr;
}

/// stb_image copies nothing from or to null for some damaged files, which memcpy does not allow.
void* copyBytes(void* to, const void* from, std::size_t count)
{
    return count > 0 ? std::memcpy(to, from, count) : to;
}

} // namespace

// The only source that implements stb_image: all static, from memory to memory, only the four formats. Its assertions
// must not stop the program.
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
#define STBI_MALLOC(size) takeBlock(size)
#define STBI_REALLOC(block, size) resizeBlock(block, size)
#define STBI_FREE(block) std::free(block)
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

const std::size_t DECODER_BYTES = 1 << 15; ///< for the decoder's own records

/// A format, and how many decoded bytes one byte of such a file can stand for. A file that claims more is damaged or
/// was made to exhaust memory.
struct Density
{
    bool isJpeg;
    std::size_t bytesPerByte;
};

Density getDensity(const unsigned char* file, std::size_t size)
{
    const auto startsWith = [=](const char* start)
    { return size >= std::strlen(start) && std::memcmp(file, start, std::strlen(start)) == 0; };
    // Deflate reaches 1032 : 1, and a pixel of one bit becomes up to four bytes.
    if (startsWith("\x89PNG"))
        return {false, size > 24 && file[24] >= 8 ? 1032u * 4 : 1032u * 8 * 4}; // bits of a sample
    // 18 blocks of one bit, 16 of brightness and 2 of colour, for 32 x 32 pixels of three bytes.
    if (startsWith("\xff\xd8"))
        return {true, 1400};
    // One bit for a pixel of up to four bytes.
    if (startsWith("BM"))
        return {false, 32};
    // TGA: two bytes for a run of 128 pixels.
    return {false, 256};
}

/// Bytes of the decoded pixels; a JPEG has blocks of up to 32 x 32.
std::size_t getDecodedBytes(int width, int height, int channels, bool isJpeg)
{
    const std::size_t margin = isJpeg ? 31 : 0;
    return (std::size_t(width) + margin) * (std::size_t(height) + margin) * std::size_t(channels);
}

} // namespace

unsigned char* decodeImage(const unsigned char* file, std::size_t size, int& width, int& height,
                           int& channelCount)
{
    if (!file || size == 0 || size > INT_MAX || !isSoundJpeg(file, size))
        return nullptr;
    int w = 0;
    int h = 0;
    int channels = 0;
    t_largestBlock = DECODER_BYTES;
    const bool isKnown = stbi_info_from_memory(file, int(size), &w, &h, &channels);
    h = std::abs(std::max(h, -INT_MAX)); // a BMP with its top row first has a negative height
    if (!isKnown || w < 1 || h < 1 || channels < 1 || w > STBI_MAX_DIMENSIONS || h > STBI_MAX_DIMENSIONS)
        return nullptr;
    const Density density = getDensity(file, size);
    const std::size_t bytes = getDecodedBytes(w, h, channels, density.isJpeg);
    if (bytes / density.bytesPerByte > size ||
        !LoadScope::takePicture(uint64_t(w) * uint64_t(h) * uint64_t(channels), size))
        return nullptr;
    // A PNG takes up to four times its final size while it is inflated, a JPEG has two bytes a coefficient.
    t_largestBlock = 4 * bytes + 2 * size + DECODER_BYTES;

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
