#include "support/picture.h"

#include "headless/headless.h"
#include "headless/png.h"

#include <EGL/egl.h>
#include <GLES2/gl2.h>

#define STB_IMAGE_IMPLEMENTATION
#define STB_IMAGE_STATIC
#define STBI_ONLY_PNG
#pragma GCC diagnostic push
#pragma GCC diagnostic ignored "-Wunused-function"
#include <stb/stb_image.h>
#pragma GCC diagnostic pop

#include <algorithm>
#include <cstdlib>

namespace support
{

namespace
{

constexpr int DIFFERENCE_GAIN = 8; // a channel off by 32 shows as white

int largestDifference(const Rgba& a, const Rgba& b)
{
    return std::max({std::abs(a.r - b.r), std::abs(a.g - b.g), std::abs(a.b - b.b), std::abs(a.a - b.a)});
}

Picture makeDifference(const Picture& a, const Picture& b)
{
    Picture difference = Picture::filled(a.width, a.height, {});
    for (size_t i = 0; i < a.rgba.size(); ++i)
    {
        if (i % 4 != 3)
            difference.rgba[i] = uint8_t(std::min(std::abs(a.rgba[i] - b.rgba[i]) * DIFFERENCE_GAIN, 255));
    }
    return difference;
}

std::string save(const std::string& path, const Picture& picture)
{
    std::string error;
    if (picture.width <= 0 || picture.height <= 0)
        return path + ": empty picture";
    if (!headless::writePng(path, picture.width, picture.height, picture.rgba.data(), error))
        return error;
    return path;
}

} // namespace

std::ostream& operator<<(std::ostream& stream, const Rgba& colour)
{
    return stream << '(' << +colour.r << ' ' << +colour.g << ' ' << +colour.b << ' ' << +colour.a << ')';
}

bool isNear(const Rgba& a, const Rgba& b, int tolerance)
{
    return largestDifference(a, b) <= tolerance;
}

Picture Picture::filled(int width, int height, const Rgba& colour)
{
    Picture picture{width, height, {}};
    for (int i = 0; i < width * height; ++i)
        picture.rgba.insert(picture.rgba.end(), {colour.r, colour.g, colour.b, colour.a});
    return picture;
}

Rgba Picture::pixel(int x, int y) const
{
    if (x < 0 || y < 0 || x >= width || y >= height)
    {
        ADD_FAILURE() << "pixel " << x << ", " << y << " is outside " << width << " x " << height;
        return {0, 0, 0, 0};
    }
    const uint8_t* bytes = &rgba[(size_t(y) * size_t(width) + size_t(x)) * 4];
    return {bytes[0], bytes[1], bytes[2], bytes[3]};
}

void Picture::setPixel(int x, int y, const Rgba& colour)
{
    const uint8_t bytes[] = {colour.r, colour.g, colour.b, colour.a};
    if (x >= 0 && y >= 0 && x < width && y < height)
        std::copy(bytes, bytes + 4, &rgba[(size_t(y) * size_t(width) + size_t(x)) * 4]);
}

Rgba Picture::average() const
{
    const size_t count = rgba.size() / 4;
    if (count == 0)
    {
        ADD_FAILURE() << "an empty picture has no average";
        return {0, 0, 0, 0};
    }
    size_t sums[4] = {};
    for (size_t i = 0; i < rgba.size(); ++i)
        sums[i % 4] += rgba[i];
    const auto mean = [&](int channel) { return uint8_t((sums[channel] + count / 2) / count); };
    return {mean(0), mean(1), mean(2), mean(3)};
}

Picture readFrame()
{
    EGLint width = 0, height = 0;
    EGLSurface surface = eglGetCurrentSurface(EGL_DRAW);
    eglQuerySurface(eglGetCurrentDisplay(), surface, EGL_WIDTH, &width);
    eglQuerySurface(eglGetCurrentDisplay(), surface, EGL_HEIGHT, &height);
    GLint bound = 0;
    glGetIntegerv(GL_FRAMEBUFFER_BINDING, &bound);
    glBindFramebuffer(GL_FRAMEBUFFER, 0);
    Picture frame = readFramebuffer(0, 0, width, height);
    glBindFramebuffer(GL_FRAMEBUFFER, GLuint(bound));
    return frame;
}

Picture readFramebuffer(int x, int y, int width, int height)
{
    return {width, height, headless::readFramebuffer(x, y, width, height)};
}

Picture readPng(const std::string& path)
{
    Picture picture;
    int channels = 0;
    stbi_uc* pixels = stbi_load(path.c_str(), &picture.width, &picture.height, &channels, 4);
    if (!pixels)
    {
        ADD_FAILURE() << path << ": " << stbi_failure_reason();
        return {};
    }
    picture.rgba.assign(pixels, pixels + size_t(picture.width) * size_t(picture.height) * 4);
    stbi_image_free(pixels);
    return picture;
}

testing::AssertionResult comparePictures(const std::string& name, const Picture& expected,
                                         const Picture& actual, const Tolerance& tolerance)
{
    const bool isSameSize = expected.width == actual.width && expected.height == actual.height;
    const int count = expected.width * expected.height;
    int differing = 0, largest = 0;
    std::string firstPlace;
    for (int i = 0; isSameSize && i < count; ++i)
    {
        const int x = i % expected.width;
        const int y = i / expected.width;
        const int difference = largestDifference(expected.pixel(x, y), actual.pixel(x, y));
        largest = std::max(largest, difference);
        if (difference > tolerance.perChannel && differing++ == 0)
            firstPlace = std::to_string(x) + ", " + std::to_string(y);
    }
    if (isSameSize && differing <= tolerance.differingShare * count)
        return testing::AssertionSuccess();

    testing::AssertionResult failure = testing::AssertionFailure() << name << ": ";
    if (!isSameSize)
        failure << "expected " << expected.width << " x " << expected.height << " pixels, came "
                << actual.width << " x " << actual.height;
    else
        failure << differing << " of " << count << " pixels differ by more than " << tolerance.perChannel
                << " (largest " << largest << ", first at " << firstPlace << ")";
    failure << "\n  " << save(name + "-actual.png", actual) << "\n  "
            << save(name + "-expected.png", expected);
    if (isSameSize)
        failure << "\n  " << save(name + "-difference.png", makeDifference(expected, actual));
    return failure;
}

testing::AssertionResult compareWithKept(const std::string& path, const Picture& actual,
                                         const Tolerance& tolerance)
{
    std::string error;
    if (std::getenv("ORV_ACCEPT_PICTURES"))
    {
        const bool isWritten =
            headless::writePng(path, actual.width, actual.height, actual.rgba.data(), error);
        return isWritten ? testing::AssertionSuccess() : testing::AssertionFailure() << error;
    }
    const std::string::size_type start = path.rfind('/') + 1;
    const std::string name = path.substr(start, path.rfind('.') - start);
    testing::AssertionResult result = comparePictures(name, readPng(path), actual, tolerance);
    if (!result)
        result << "\n  Look at them. If the new one is right, \"./run accept\" puts it in the place of "
               << path;
    return result;
}

Picture shrink(const Picture& picture, int side)
{
    Picture small = Picture::filled(picture.width / side, picture.height / side, {});
    for (int y = 0; y < small.height; ++y)
    {
        for (int x = 0; x < small.width; ++x)
        {
            Picture block = Picture::filled(side, side, {});
            for (int i = 0; i < side * side; ++i)
                block.setPixel(i % side, i / side, picture.pixel(x * side + i % side, y * side + i / side));
            small.setPixel(x, y, block.average());
        }
    }
    return small;
}

std::string savePicture(const std::string& name, const Picture& actual)
{
    return save(name + "-actual.png", actual);
}

} // namespace support
