#include "compare.h"

#include <algorithm>
#include <cmath>
#include <cstdio>
#include <cstdlib>

#define STB_IMAGE_IMPLEMENTATION
#define STB_IMAGE_STATIC
#define STBI_ONLY_PNG
#pragma GCC diagnostic push
#pragma GCC diagnostic ignored "-Wunused-function"
#include <stb/stb_image.h>
#pragma GCC diagnostic pop

namespace view
{

namespace
{

constexpr int GAIN = 8; // a difference of 32 shows as full intensity

} // namespace

bool readPng(const std::string& path, PngPicture& picture, std::string& error)
{
    int channels = 0;
    stbi_uc* pixels = stbi_load(path.c_str(), &picture.width, &picture.height, &channels, 4);
    if (!pixels)
    {
        error = path + ": cannot be read as a PNG picture: " + stbi_failure_reason();
        return false;
    }
    picture.rgba.assign(pixels, pixels + size_t(picture.width) * size_t(picture.height) * 4);
    stbi_image_free(pixels);
    return true;
}

bool parseTolerance(const std::string& text, Tolerance& tolerance)
{
    char* end = nullptr;
    const double perChannel = std::strtod(text.c_str(), &end);
    double percent = 0.0;
    bool isWhole = end != text.c_str();
    if (isWhole && *end == ',')
    {
        const char* const start = end + 1;
        percent = std::strtod(start, &end);
        isWhole = end != start;
    }
    if (!isWhole || *end || !(perChannel >= 0.0 && perChannel <= 255.0) ||
        !(percent >= 0.0 && percent <= 100.0))
        return false;
    tolerance.perChannel = int(perChannel);
    tolerance.percent = percent;
    return true;
}

Difference comparePictures(const PngPicture& reference, const PngPicture& actual, const Tolerance& tolerance)
{
    Difference difference;
    difference.picture = {actual.width, actual.height, std::vector<uint8_t>(actual.rgba.size(), 255)};
    for (size_t pixel = 0; pixel < actual.rgba.size(); pixel += 4)
    {
        int most = 0;
        for (size_t channel = 0; channel < 4; ++channel)
        {
            const int off = std::abs(reference.rgba[pixel + channel] - actual.rgba[pixel + channel]);
            most = std::max(most, off);
            if (channel < 3)
                difference.picture.rgba[pixel + channel] = uint8_t(std::min(off * GAIN, 255));
        }
        difference.pixels += most > tolerance.perChannel;
        if (most > difference.largest)
        {
            difference.largest = most;
            difference.x = int(pixel / 4 % size_t(actual.width));
            difference.y = int(pixel / 4 / size_t(actual.width));
        }
    }
    const size_t all = actual.rgba.size() / 4;
    difference.percent = all > 0 ? 100.0 * double(difference.pixels) / double(all) : 0.0;
    difference.isTolerable = difference.percent <= tolerance.percent;
    return difference;
}

std::string describe(const Difference& difference, const Tolerance& tolerance)
{
    char text[160];
    std::snprintf(text, sizeof text, "%zu of %zu pixels (%.3g %%) differ by more than %d", difference.pixels,
                  difference.picture.rgba.size() / 4, difference.percent, tolerance.perChannel);
    std::string line = text;
    if (difference.largest > 0)
        line += ", the most by " + std::to_string(difference.largest) + " at " +
                std::to_string(difference.x) + ", " + std::to_string(difference.y);
    return line;
}

} // namespace view
