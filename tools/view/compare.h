#pragma once

#include <cstdint>
#include <string>
#include <vector>

namespace view
{

/// RGBA, 8 bits each, top row first.
struct PngPicture
{
    int width = 0;
    int height = 0;
    std::vector<uint8_t> rgba;
};

/// @return false, with "path: reason" in error, if it cannot be read.
bool readPng(const std::string& path, PngPicture& picture, std::string& error);

/// How much two pictures may differ.
struct Tolerance
{
    int perChannel = 2;   ///< of 255: pixels that differ by more in any channel count
    double percent = 0.0; ///< of all pixels that may differ
};

/// "8" or "8,0.5". @return false if it is neither.
bool parseTolerance(const std::string& text, Tolerance& tolerance);

struct Difference
{
    size_t pixels = 0;    ///< that differ by more than the tolerance
    double percent = 0.0; ///< of all pixels
    int largest = 0;      ///< of all channels
    int x = 0;            ///< its position, from the upper left
    int y = 0;
    bool isTolerable = true;
    PngPicture picture; ///< how much each channel differs, eight times as bright
};

/// Compares two pictures of one size, alpha included; the difference picture has no alpha.
Difference comparePictures(const PngPicture& reference, const PngPicture& actual, const Tolerance& tolerance);

/// For a person: "12 of 4800 pixels (0.25 %) differ by more than 2, the most by 37 at 10, 20".
std::string describe(const Difference& difference, const Tolerance& tolerance);

} // namespace view
