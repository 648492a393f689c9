#include "pictures.h"

#include "webp.h"

#include "headless/pngcompression.h"

#include "orv/image.h"
#include "orv/memorystream.h"

#include <algorithm>
#include <array>
#include <climits>
#include <cmath>
#include <cstdlib>
#include <cstring>
#include <new>

// The engine decodes the four formats that it reads. Here are the others, and the headers of all.
#define STB_IMAGE_IMPLEMENTATION
#define STB_IMAGE_STATIC
#define STBI_NO_STDIO
#define STBI_MAX_DIMENSIONS 16384
#pragma GCC diagnostic push
#pragma GCC diagnostic ignored "-Wunused-function"
#include <stb/stb_image.h>
#pragma GCC diagnostic pop
#define STB_IMAGE_RESIZE_IMPLEMENTATION
#define STB_IMAGE_RESIZE_STATIC
#include <stb/stb_image_resize.h>
#define STBIW_ZLIB_COMPRESS headless::compressForPng
#define STB_IMAGE_WRITE_IMPLEMENTATION
#define STB_IMAGE_WRITE_STATIC
#define STBI_WRITE_NO_STDIO
#include <stb/stb_image_write.h>

namespace convert
{

namespace
{

/// Decoded bytes that the engine always allows for each byte of a JPEG or PNG.
constexpr size_t MOST_PER_BYTE = 1000;

bool hasMark(const std::vector<uint8_t>& bytes, size_t offset, const char* mark)
{
    const size_t length = std::strlen(mark);
    return bytes.size() >= offset + length && std::memcmp(bytes.data() + offset, mark, length) == 0;
}

bool endsWithMark(const std::vector<uint8_t>& bytes, const std::string& mark)
{
    constexpr size_t TAIL = 4096; // longer than data that some programs append
    const auto start = bytes.end() - std::ptrdiff_t(std::min(bytes.size(), TAIL));
    return std::search(start, bytes.end(), mark.begin(), mark.end(),
                       [](uint8_t a, char b) { return a == uint8_t(b); }) != bytes.end();
}

/// A chunk can add an alpha channel to three channels; the decoder's header function does not read it.
bool mayHaveColourKey(const std::vector<uint8_t>& bytes)
{
    const std::string mark = "tRNS";
    return std::search(bytes.begin(), bytes.end(), mark.begin(), mark.end(),
                       [](uint8_t a, char b) { return a == uint8_t(b); }) != bytes.end();
}

/// The format by the first bytes, as an extension; "" for one that the engine does not read. TGA has no signature.
std::string recognise(const std::vector<uint8_t>& bytes)
{
    const struct
    {
        const char* mark;
        const char* extension;
    } formats[] = {
        {"\x89PNG", ".png"}, {"\xff\xd8", ".jpg"}, {"BM", ".bmp"}, {"GIF8", ""}, {"8BPS", ""},
        {"#?RADIANCE", ""},  {"#?RGBE", ""},       {"P5", ""},     {"P6", ""},   {"\x53\x80\xf6\x34", ""},
    };
    for (const auto& format : formats)
    {
        if (hasMark(bytes, 0, format.mark))
            return format.extension;
    }
    return ".tga";
}

bool decodeAsEngine(const std::vector<uint8_t>& bytes, DecodedPicture& picture)
{
    orv::MemoryStream stream(bytes.data(), int(bytes.size()));
    const orv::Image image(stream);
    if (!image.data())
        return false;
    picture = {image.width(), image.height(), image.channelCount(), {}};
    picture.data.assign(image.data(), image.data() + picture.getPixelCount() * size_t(picture.channels));
    return true;
}

bool decodeOther(const std::vector<uint8_t>& bytes, DecodedPicture& picture)
{
    stbi_uc* data = stbi_load_from_memory(bytes.data(), int(bytes.size()), &picture.width, &picture.height,
                                          &picture.channels, 0);
    if (!data)
        return false;
    picture.data.assign(data, data + picture.getPixelCount() * size_t(picture.channels));
    stbi_image_free(data);
    return true;
}

void setChannels(DecodedPicture& picture, int channels, int (*source)(int channel))
{
    std::vector<uint8_t> data;
    data.reserve(picture.getPixelCount() * size_t(channels));
    for (size_t pixel = 0; pixel < picture.getPixelCount(); ++pixel)
    {
        for (int channel = 0; channel < channels; ++channel)
        {
            const int from = source(channel);
            data.push_back(from < 0 ? 255 : picture.data[pixel * size_t(picture.channels) + size_t(from)]);
        }
    }
    picture.data = std::move(data);
    picture.channels = channels;
}

/// Of a pixel of at least three channels.
int getBrightness(const uint8_t* pixel)
{
    return (pixel[0] * 77 + pixel[1] * 151 + pixel[2] * 28) / 256;
}

/// On average, red, green and blue hardly differ.
bool isGrey(const DecodedPicture& picture)
{
    constexpr uint64_t SLACK = 8;
    if (picture.channels < 3)
        return true;
    uint64_t difference = 0;
    for (size_t i = 0; i < picture.data.size(); i += size_t(picture.channels))
    {
        const auto [least, most] = std::minmax({picture.data[i], picture.data[i + 1], picture.data[i + 2]});
        difference += uint64_t(most - least);
    }
    return difference <= SLACK * picture.getPixelCount();
}

} // namespace

bool readHeader(const std::vector<uint8_t>& bytes, PictureHeader& header)
{
    constexpr size_t PVR_LEGACY_MARK = 44; // offset
    if (hasMark(bytes, 0, "PVR\3") || hasMark(bytes, PVR_LEGACY_MARK, "PVR!"))
    {
        header.extension = ".pvr";
        header.isWhole = true;
        return true;
    }
    if (isWebp(bytes))
        return readWebpHeader(bytes, header);
    if (bytes.empty() || bytes.size() > INT_MAX ||
        !stbi_info_from_memory(bytes.data(), int(bytes.size()), &header.width, &header.height,
                               &header.channels))
        return false;
    header.extension = recognise(bytes);
    if (header.extension == ".png" && (header.channels == 1 || header.channels == 3) &&
        mayHaveColourKey(bytes))
        ++header.channels;
    const bool hasEnd = (header.extension == ".jpg" && endsWithMark(bytes, "\xff\xd9")) ||
                        (header.extension == ".png" && endsWithMark(bytes, "IEND"));
    const size_t decoded = size_t(header.width) * size_t(header.height) * size_t(header.channels);
    header.isWhole = hasEnd && decoded / MOST_PER_BYTE <= bytes.size();
    return true;
}

bool decodePicture(const std::vector<uint8_t>& bytes, const PictureHeader& header, DecodedPicture& picture)
{
    if (isWebp(bytes))
        return decodeWebp(bytes, picture);
    return header.extension.empty() ? decodeOther(bytes, picture) : decodeAsEngine(bytes, picture);
}

std::vector<uint8_t> encodePng(const DecodedPicture& picture)
{
    std::vector<uint8_t> bytes;
    const auto append = [](void* context, void* data, int size)
    {
        auto& target = *static_cast<std::vector<uint8_t>*>(context);
        target.insert(target.end(), static_cast<uint8_t*>(data), static_cast<uint8_t*>(data) + size);
    };
    if (!stbi_write_png_to_func(append, &bytes, picture.width, picture.height, picture.channels,
                                picture.data.data(), 0))
        throw std::bad_alloc();
    return bytes;
}

void resize(DecodedPicture& picture, int width, int height, bool wraps)
{
    DecodedPicture made{width, height, picture.channels, {}};
    made.data.resize(made.getPixelCount() * size_t(made.channels));
    const int alpha = picture.hasAlphaChannel() ? picture.channels - 1 : STBIR_ALPHA_CHANNEL_NONE;
    const int done = stbir_resize_uint8_generic(picture.data.data(), picture.width, picture.height, 0,
                                                made.data.data(), width, height, 0, picture.channels, alpha,
                                                0, wraps ? STBIR_EDGE_WRAP : STBIR_EDGE_CLAMP,
                                                STBIR_FILTER_DEFAULT, STBIR_COLORSPACE_LINEAR, nullptr);
    if (!done) // only without memory
        throw std::bad_alloc();
    picture = std::move(made);
}

void spreadGrey(DecodedPicture& picture)
{
    if (picture.channels == 1)
        setChannels(picture, 3, [](int) { return 0; });
    else if (picture.channels == 2)
        setChannels(picture, 4, [](int channel) { return channel < 3 ? 0 : 1; });
}

void dropAlpha(DecodedPicture& picture)
{
    spreadGrey(picture);
    if (picture.channels == 4)
        setChannels(picture, 3, [](int channel) { return channel; });
}

void setAlpha(DecodedPicture& picture, DecodedPicture opacity)
{
    dropAlpha(picture);
    setChannels(picture, 4, [](int channel) { return channel < 3 ? channel : -1; });
    dropAlpha(opacity);
    if (opacity.width != picture.width || opacity.height != picture.height)
        resize(opacity, picture.width, picture.height, false);
    for (size_t pixel = 0; pixel < picture.getPixelCount(); ++pixel)
        picture.data[pixel * 4 + 3] = uint8_t(getBrightness(&opacity.data[pixel * 3]));
}

bool makeNormals(DecodedPicture& heights)
{
    constexpr float STEEPNESS = 2.0f; // of a step from black to white over two pixels
    if (!isGrey(heights))
        return false;
    dropAlpha(heights);
    DecodedPicture made{heights.width, heights.height, 3, {}};
    made.data.reserve(heights.data.size());
    const auto height = [&](int x, int y)
    {
        const size_t column = size_t((x + heights.width) % heights.width);
        const size_t row = size_t((y + heights.height) % heights.height);
        return float(heights.data[(row * size_t(heights.width) + column) * 3]) / 255.0f;
    };
    for (int y = 0; y < heights.height; ++y)
    {
        for (int x = 0; x < heights.width; ++x)
        {
            const float right = STEEPNESS * (height(x - 1, y) - height(x + 1, y));
            const float up = STEEPNESS * (height(x, y + 1) - height(x, y - 1));
            const float scale = 127.0f / std::sqrt(right * right + up * up + 1.0f);
            for (const float component : {right, up, 1.0f})
                made.data.push_back(uint8_t(128.0f + component * scale));
        }
    }
    heights = std::move(made);
    return true;
}

void makeOcclusion(DecodedPicture& picture, float strength, bool isShare)
{
    constexpr float GAMMA = 2.2f; // the engine's own
    std::array<uint8_t, 256> table{};
    for (size_t i = 0; i < table.size(); ++i)
    {
        const float light = 1.0f + strength * (float(i) / 255.0f - 1.0f);
        table[i] = uint8_t(std::lround(255.0f * (isShare ? std::pow(light, 1.0f / GAMMA) : light)));
    }
    spreadGrey(picture);
    const size_t channels = size_t(picture.channels);
    for (size_t at = 0; at < picture.data.size(); at += channels)
        std::fill_n(&picture.data[at], 3, table[picture.data[at]]);
}

Transparency getTransparency(const DecodedPicture& picture)
{
    constexpr uint8_t MOST = 250; // tolerates traces of compression and drawing programs
    constexpr uint8_t LEAST = 5;
    if (!picture.hasAlphaChannel())
        return Transparency::NONE;
    bool transparent = false;
    bool visible = false;
    const size_t step = size_t(picture.channels);
    for (size_t i = step - 1; i < picture.data.size(); i += step)
    {
        transparent = transparent || picture.data[i] < MOST;
        visible = visible || picture.data[i] > LEAST;
    }
    return !visible ? Transparency::ALL : transparent ? Transparency::SOME : Transparency::NONE;
}

bool hasHoles(const DecodedPicture& picture, float threshold)
{
    const size_t step = size_t(picture.channels);
    bool found = false;
    for (size_t i = step - 1; picture.hasAlphaChannel() && i < picture.data.size(); i += step)
        found = found || float(picture.data[i]) < threshold * 255.0f;
    return found;
}

bool isAllOrNothing(const DecodedPicture& picture)
{
    constexpr uint8_t FULL = 224;
    constexpr uint8_t NONE = 32;
    constexpr size_t RARE = 20;
    const size_t step = size_t(picture.channels);
    size_t between = 0;
    for (size_t i = step - 1; picture.hasAlphaChannel() && i < picture.data.size(); i += step)
        between += picture.data[i] > NONE && picture.data[i] < FULL ? 1 : 0;
    return between <= picture.getPixelCount() / RARE;
}

float getMean(const DecodedPicture& picture, int channel)
{
    const size_t step = size_t(picture.channels);
    const size_t first = picture.channels >= 3 ? size_t(std::min(channel, picture.channels - 1)) : 0;
    uint64_t sum = 0;
    for (size_t i = first; i < picture.data.size(); i += step)
        sum += picture.data[i];
    return float(double(sum) / (255.0 * double(picture.getPixelCount())));
}

} // namespace convert
