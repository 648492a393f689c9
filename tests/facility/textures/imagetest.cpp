#include "orv/image.h"

#include "imagefiles.h"
#include "orv/memorystream.h"
#include "support/logcapture.h"

#include <gtest/gtest.h>

#include <climits>

using namespace orv;
using imagefiles::Bytes;
using support::LogCapture;

namespace
{

SharedPtr<Image> decode(const Bytes& file)
{
    MemoryStream stream(file.data(), int(file.size()));
    return makeShared<Image>(stream);
}

/// Byte i is i.
Bytes counting(size_t count)
{
    Bytes bytes(count);
    for (size_t i = 0; i < count; ++i)
        bytes[i] = uint8_t(i);
    return bytes;
}

Bytes pixelsOf(const Image& image)
{
    return Bytes(image.data(), image.data() + image.width() * image.height() * image.channelCount());
}

/// A bitmap header for 24-bit pixels, and no pixels.
Bytes bitmapHeader(unsigned width, unsigned height)
{
    Bytes file = imagefiles::encodeFlat("bmp", 1, 1, 3);
    for (size_t i = 0; i < 4; ++i)
    {
        file[18 + i] = uint8_t(width >> 8 * i);
        file[22 + i] = uint8_t(height >> 8 * i);
    }
    return file;
}

} // namespace

// Faults caught: a format left out of the decoder, channels converted, or rows upside down.
TEST(Image, decodesEveryFormatTopRowFirst)
{
    const struct
    {
        const char* suffix;
        int channels;
    } cases[] = {{"png", 1}, {"png", 2}, {"png", 3}, {"png", 4}, {"bmp", 3},
                 {"tga", 1}, {"tga", 2}, {"tga", 3}, {"tga", 4}};
    for (const auto& test : cases)
    {
        const Bytes pixels = counting(size_t(3 * 2 * test.channels));
        const auto image = decode(imagefiles::encode(test.suffix, 3, 2, test.channels, pixels));
        ASSERT_TRUE(image->data()) << test.suffix << test.channels;
        EXPECT_TRUE(image->width() == 3 && image->height() == 2);
        EXPECT_EQ(test.channels, image->channelCount()) << test.suffix;
        EXPECT_EQ(pixels, pixelsOf(*image)) << test.suffix << test.channels;
    }

    // A bitmap with its top row first says so by a negative height.
    Bytes topDown = imagefiles::encode("bmp", 1, 2, 3, {10, 20, 30, 40, 50, 60});
    for (size_t i = 0; i < 4; ++i)
        topDown[22 + i] = i == 0 ? 0xFE : 0xFF;
    const auto flipped = decode(topDown);
    ASSERT_TRUE(flipped->data());
    EXPECT_EQ(2, flipped->height());
    EXPECT_EQ((Bytes{40, 50, 60, 10, 20, 30}), pixelsOf(*flipped));

    Bytes split(16 * 16 * 3, 0);
    std::fill(split.begin(), split.begin() + 8 * 16 * 3, uint8_t(255));
    const auto photo = decode(imagefiles::encode("jpg", 16, 16, 3, split));
    ASSERT_TRUE(photo->data());
    EXPECT_GT(photo->data()[0], 240);
    EXPECT_LT(photo->data()[15 * 16 * 3], 15);
}

// Fault caught: 16-bit channels read as twice as many bytes, beyond what the texture upload expects.
TEST(Image, sixteenBitChannelsBecomeEight)
{
    const Bytes greyPng = {0x89, 0x50, 0x4e, 0x47, 0x0d, 0x0a, 0x1a, 0x0a, 0x00, 0x00, 0x00, 0x0d, 0x49, 0x48,
                           0x44, 0x52, 0x00, 0x00, 0x00, 0x01, 0x00, 0x00, 0x00, 0x01, 0x10, 0x00, 0x00, 0x00,
                           0x00, 0x6a, 0xee, 0x47, 0x16, 0x00, 0x00, 0x00, 0x0b, 0x49, 0x44, 0x41, 0x54, 0x78,
                           0x9c, 0x63, 0x68, 0x70, 0x00, 0x00, 0x01, 0x43, 0x00, 0xc1, 0x5f, 0xd4, 0x95, 0x0d,
                           0x00, 0x00, 0x00, 0x00, 0x49, 0x45, 0x4e, 0x44, 0xae, 0x42, 0x60, 0x82};
    const auto image = decode(greyPng);
    ASSERT_TRUE(image->data());
    EXPECT_EQ(1, image->channelCount());
    EXPECT_EQ(0x80, image->data()[0]);
}

// Fault caught: hundreds of megabytes taken for a file of a few bytes.
TEST(Image, badFilesHaveNoData)
{
    EXPECT_FALSE(decode({})->data());
    EXPECT_FALSE(decode(Bytes(1000, uint8_t('x')))->data());
    EXPECT_TRUE(decode(bitmapHeader(20, 20))->data());
    EXPECT_FALSE(decode(bitmapHeader(100, 100))->data());
    EXPECT_FALSE(decode(bitmapHeader(20000, 1))->data());
    EXPECT_FALSE(decode(bitmapHeader(100, unsigned(-100)))->data());
    EXPECT_FALSE(decode(bitmapHeader(1, 0x80000000))->data());
}

TEST(Image, refusesSizesThatCannotBe)
{
    const struct
    {
        int width;
        int height;
        int channels;
        bool isMade;
    } cases[] = {{2, 2, 4, true},   {0, 5, 1, true},  {-1, 2, 4, false},
                 {2, -1, 4, false}, {2, 2, 0, false}, {INT_MAX, INT_MAX, INT_MAX, false}};
    for (const auto& test : cases)
    {
        LogCapture log;
        const Image image(test.width, test.height, test.channels, nullptr);
        EXPECT_EQ(test.isMade, image.data() != nullptr) << test.width;
        EXPECT_EQ(test.isMade ? 0 : 1, log.count('E')) << test.width;
    }
}

// Fault caught: rows cut at the wrong stride, or a rectangle that reaches outside and is read there.
TEST(Image, cropCutsToTheSource)
{
    const Bytes pixels = counting(10 * 10 * 2);
    const Image source(10, 10, 2, pixels.data());
    const struct
    {
        int x, y, width, height;
        int wantedX, wantedY, wantedWidth, wantedHeight;
        bool warns;
    } cases[] = {
        {2, 3, 4, 5, 2, 3, 4, 5, false},   {0, 0, 10, 10, 0, 0, 10, 10, false},
        {-5, 3, 20, 0, 0, 3, 10, 1, true}, {50, 60, 2, 2, 9, 9, 1, 1, true},
        {8, 8, 5, -7, 8, 8, 2, 1, true},   {9, 9, INT_MAX, INT_MAX, 9, 9, 1, 1, true},
    };
    for (const auto& test : cases)
    {
        LogCapture log;
        const auto result = Image::crop(source, test.x, test.y, test.width, test.height);
        ASSERT_TRUE(result);
        EXPECT_EQ(test.warns ? 1 : 0, log.count('W'));
        ASSERT_TRUE(result->width() == test.wantedWidth && result->height() == test.wantedHeight);
        Bytes wanted;
        for (int y = test.wantedY; y < test.wantedY + test.wantedHeight; ++y)
        {
            const auto row = pixels.begin() + (y * 10 + test.wantedX) * 2;
            wanted.insert(wanted.end(), row, row + test.wantedWidth * 2);
        }
        EXPECT_EQ(wanted, pixelsOf(*result)) << test.x;
    }

    LogCapture log;
    EXPECT_FALSE(Image::crop(Image(-1, 1, 1, nullptr), 0, 0, 1, 1));
    EXPECT_EQ(1, log.countMessage("Cannot crop: source image has no data."));
}
