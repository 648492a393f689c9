#pragma once

#include <gtest/gtest.h>

#include <cstdint>
#include <ostream>
#include <string>
#include <vector>

namespace support
{

struct Rgba
{
    uint8_t r = 0, g = 0, b = 0, a = 255;

    bool operator==(const Rgba&) const = default;
};

std::ostream& operator<<(std::ostream& stream, const Rgba& colour);

/// Whether no channel (alpha included) differs by more than tolerance.
bool isNear(const Rgba& a, const Rgba& b, int tolerance);

/// A picture in memory, top row first; (0, 0) is the upper left pixel.
struct Picture
{
    int width = 0, height = 0;
    std::vector<uint8_t> rgba;

    /// All pixels of one colour.
    static Picture filled(int width, int height, const Rgba& colour);

    /// @return transparent black outside the picture, after a test failure.
    Rgba pixel(int x, int y) const;
    void setPixel(int x, int y, const Rgba& colour);

    /// The mean colour of all pixels, rounded.
    Rgba average() const;
};

/// The whole surface of the current context, whatever framebuffer is bound.
Picture readFrame();

/// A region of the bound framebuffer; x, y its lower left corner, as GL counts.
Picture readFramebuffer(int x, int y, int width, int height);

/// Reads a PNG file; a test failure and an empty picture if it cannot be read.
Picture readPng(const std::string& path);

struct Tolerance
{
    int perChannel = 2;         ///< of 255; a pixel beyond it differs
    double differingShare = 0.; ///< of all pixels, that may differ: 0 to 1
};

/// On difference writes NAME-actual.png, NAME-expected.png and NAME-difference.png (differences amplified)
/// into the working directory and says so.
///
///     EXPECT_TRUE(comparePictures("mirror", expected, readFrame()));
testing::AssertionResult comparePictures(const std::string& name, const Picture& expected,
                                         const Picture& actual, const Tolerance& tolerance = {});

/// The same beside a PNG that is kept in the source tree. With ORV_ACCEPT_PICTURES in the environment, as "./run accept"
/// has it, the picture is written there instead, to be looked at before it is committed.
/// @param path  of the kept PNG; its name is NAME.
testing::AssertionResult compareWithKept(const std::string& path, const Picture& actual,
                                         const Tolerance& tolerance = {});

/// The means of square blocks of side x side pixels; remainders at the right and lower edges are dropped.
Picture shrink(const Picture& picture, int side);

/// For a failed check of single pixels: writes NAME-actual.png and says where.
std::string savePicture(const std::string& name, const Picture& actual);

} // namespace support
