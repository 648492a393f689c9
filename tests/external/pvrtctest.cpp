#include "pvr/pvrtc.h"

#include <gtest/gtest.h>

#include <algorithm>
#include <memory>
#include <random>
#include <string>
#include <vector>

using pvr::PvrtcBits;

namespace
{

using Bytes = std::vector<uint8_t>;

/// As the file has it: the pixels' codes, then colour B above colour A, whose lowest bit is the mode.
struct Block
{
    uint32_t codes;
    uint32_t colours;
};

constexpr uint32_t BLACK_TO_WHITE = 0xffff8000; // colour A black, B white, both opaque
constexpr uint32_t MODE = 1;

struct Image
{
    uint32_t width;
    Bytes rgba;

    std::string at(uint32_t x, uint32_t y) const
    {
        const uint8_t* pixel = &rgba[(size_t(y) * width + x) * 4];
        std::string text;
        for (int i = 0; i < 4; ++i)
            text += (i ? " " : "") + std::to_string(pixel[i]);
        return text;
    }
    int red(uint32_t x, uint32_t y) const { return rgba[(size_t(y) * width + x) * 4]; }
};

/// Decodes from and to allocations of exactly the right size, so that a sanitizer sees a byte too much.
Image decode(const std::vector<Block>& blocks, uint32_t width, uint32_t height, PvrtcBits bits)
{
    const size_t size = blocks.size() * 8;
    EXPECT_EQ(pvr::pvrtcSize(width, height, bits), size);
    const auto in = std::make_unique<uint8_t[]>(size);
    uint8_t* to = in.get();
    for (const Block& block : blocks)
        for (const uint32_t word : {block.codes, block.colours})
            for (unsigned shift = 0; shift < 32; shift += 8)
                *to++ = uint8_t(word >> shift);

    const size_t pixels = size_t(width) * height * 4;
    const auto out = std::make_unique<uint8_t[]>(pixels);
    EXPECT_TRUE(pvr::decodePvrtc(in.get(), size, width, height, bits, out.get()));
    return {width, Bytes(out.get(), out.get() + pixels)};
}

uint32_t getBlockWidth(PvrtcBits bits)
{
    return bits == PvrtcBits::FOUR ? 4 : 8;
}

/// A block's place: bits of row and column in turn, the row's first.
size_t twiddle(uint32_t x, uint32_t y, uint32_t columns, uint32_t rows)
{
    size_t place = 0;
    unsigned shift = 0;
    for (unsigned bit = 0; (1u << bit) < std::max(columns, rows); ++bit)
    {
        if ((1u << bit) < rows)
            place |= size_t(y >> bit & 1) << shift++;
        if ((1u << bit) < columns)
            place |= size_t(x >> bit & 1) << shift++;
    }
    return place;
}

// Fault caught: a colour's bits taken from the wrong place or widened wrongly. Equal blocks make a flat image; a
// channel of 5 bits c comes out as 8c + c/4, alpha of 4 bits as 17a.
TEST(Pvrtc, flatImagesAreExact)
{
    const struct
    {
        const char* name;
        uint32_t colours, codes;
        const char* expected;
    } cases[] = {
        // 1 10001 00110 1010: 17, 6, and blue 1010 widened to 10101 = 21: 136+4, 48+1, 168+5
        {"opaque A", 0xc4d4, 0, "140 49 173 255"},
        // 1 01110 11001 00111: 14, 25, 7: 112+3, 200+6, 56+1
        {"opaque B", 0xbb270000, ~0u, "115 206 57 255"},
        // 0 101 1001 0110 110: alpha 1010 = 10; 10011 = 19, 01100 = 12, blue 110 widened to 11011 = 27
        {"translucent A", 0x596c, 0, "156 99 222 170"},
        // 0 011 0110 1001 0111: alpha 0110 = 6; 01100 = 12, 10011 = 19, 01110 = 14
        {"translucent B", 0x36970000, ~0u, "99 156 115 102"},
        {"least alpha", 0x0ff00000, ~0u, "255 255 0 0"},
        {"greatest translucent alpha", 0x7fff0000, ~0u, "255 255 255 238"}, // 1110 = 14
        // 255 * 3 / 8 = 95.6, 255 * 5 / 8 = 159.4, 255 * 4 / 8 = 127.5
        {"3/8", BLACK_TO_WHITE, 0x55555555, "95 95 95 255"},
        {"5/8", BLACK_TO_WHITE, 0xaaaaaaaa, "159 159 159 255"},
        {"A of punch-through", BLACK_TO_WHITE | MODE, 0, "0 0 0 255"},
        {"4/8", BLACK_TO_WHITE | MODE, 0x55555555, "127 127 127 255"},
        {"punched through", BLACK_TO_WHITE | MODE, 0xaaaaaaaa, "127 127 127 0"},
        {"B of punch-through", BLACK_TO_WHITE | MODE, ~0u, "255 255 255 255"},
    };

    for (const auto& test : cases)
    {
        const Image image = decode(std::vector<Block>(4, {test.codes, test.colours}), 8, 8, PvrtcBits::FOUR);
        for (uint32_t y = 0; y < 8; ++y)
            for (uint32_t x = 0; x < 8; ++x)
                EXPECT_EQ(test.expected, image.at(x, y)) << test.name << " at " << x << ", " << y;
    }
}

// Fault caught: weights between block centres, their rounding, or the way round the edges. Of 2 x 2 blocks the
// first is opaque white, the others black and transparent, so a pixel has its share of 31 and of alpha 15.
TEST(Pvrtc, interpolatesBetweenCentres)
{
    const std::vector<Block> blocks = {{0, 0xfffe}, {0, 0}, {0, 0}, {0, 0}};
    const struct
    {
        PvrtcBits bits;
        uint32_t x, y;
        const char* expected;
    } cases[] = {
        {PvrtcBits::FOUR, 2, 2, "255 255 255 255"},
        {PvrtcBits::FOUR, 3, 2,
         "191 191 191 191"}, // 12/16: 372/2 + 372/64 = 186 + 5, 180 + 180/16 = 180 + 11
        {PvrtcBits::FOUR, 1, 2, "191 191 191 191"},
        {PvrtcBits::FOUR, 3, 3, "143 143 143 143"}, // 9/16: 279/2 + 279/64 = 139 + 4, 135 + 8
        {PvrtcBits::FOUR, 0, 2, "127 127 127 127"}, // 8/16: 124 + 3, 120 + 7
        {PvrtcBits::FOUR, 7, 2, "63 63 63 63"},     // 4/16, round the left edge: 62 + 1, 60 + 3
        {PvrtcBits::FOUR, 7, 7, "15 15 15 15"},     // 1/16: 31/2 + 0, 15 + 0
        {PvrtcBits::FOUR, 6, 6, "0 0 0 0"},
        {PvrtcBits::TWO, 4, 2, "255 255 255 255"},
        {PvrtcBits::TWO, 5, 2,
         "223 223 223 223"}, // 28/32: 868/4 + 868/128 = 217 + 6, 420/2 + 420/32 = 210 + 13
        {PvrtcBits::TWO, 5, 3,
         "167 167 167 166"},                    // 21/32: 651/4 + 651/128 = 162 + 5, 315/2 + 315/32 = 157 + 9
        {PvrtcBits::TWO, 0, 0, "63 63 63 63"},  // 4/8 of 2/4, 8/32: 62 + 1, 60 + 3
        {PvrtcBits::TWO, 15, 7, "23 23 23 23"}, // 3/8 of 1/4, 3/32: 93/4 + 0 = 23, 45/2 + 45/32 = 22 + 1
    };

    for (const auto& test : cases)
    {
        const Image image = decode(blocks, 2 * getBlockWidth(test.bits), 8, test.bits);
        EXPECT_EQ(test.expected, image.at(test.x, test.y)) << test.x << ", " << test.y;
    }
}

// Fault caught: pixels of a block read in the wrong order.
TEST(Pvrtc, codesGoRowByRow)
{
    // Codes 1 at (0, 0), 2 at (1, 0), 3 at (3, 3); bits at (0, 0), (1, 0), (7, 3).
    const Image four = decode(std::vector<Block>(4, {0xc0000009, BLACK_TO_WHITE}), 8, 8, PvrtcBits::FOUR);
    const Image two = decode(std::vector<Block>(4, {0x80000003, BLACK_TO_WHITE}), 16, 8, PvrtcBits::TWO);
    const struct
    {
        const Image& image;
        uint32_t x, y;
        int expected;
    } cases[] = {{four, 0, 0, 95}, {four, 1, 0, 159}, {four, 0, 1, 0}, {four, 2, 0, 0},  {four, 3, 3, 255},
                 {two, 0, 0, 255}, {two, 1, 0, 255},  {two, 0, 1, 0},  {two, 7, 3, 255}, {two, 6, 3, 0}};
    for (const auto& test : cases)
        EXPECT_EQ(test.expected, test.image.red(test.x, test.y)) << test.x << ", " << test.y;
}

// Fault caught: the modes of interpolated weights mixed up, the bits that say them taken for weights, or a wrong
// neighbour across a block's edge. Even rows have codes 3 1 3 1 (weights 8 3 8 3) for their even pixels, odd rows
// codes 0 for their odd ones; black to white, a weight w gives 255 w / 8.
TEST(Pvrtc, interpolatesWeights)
{
    constexpr uint32_t FOUR_WAYS = 0x00770076, ACROSS = 0x00670077, UPRIGHT = 0x00770077;
    const Block plainWhite = {~0u, BLACK_TO_WHITE};
    const struct
    {
        const char* name;
        uint32_t codes;
        bool hasPlainNeighbours; // in the right-hand column, every weight 8
        int rows[2][8];
    } cases[] = {
        // (8+3+0+0+2)/4 = 3 in row 0; (8+8+0+0+2)/4 = 4 and (3+3+0+0+2)/4 = 2 in row 1
        {"four ways", FOUR_WAYS, false, {{255, 95, 95, 95, 255, 95, 95, 95}, {127, 0, 63, 0, 127, 0, 63, 0}}},
        // (8+3+1)/2 = 6
        {"across", ACROSS, false, {{255, 191, 95, 191, 255, 191, 95, 191}, {0, 0, 0, 0, 0, 0, 0, 0}}},
        // (8+8+1)/2 = 8, (3+3+1)/2 = 3
        {"upright", UPRIGHT, false, {{255, 0, 95, 0, 255, 0, 95, 0}, {255, 0, 95, 0, 255, 0, 95, 0}}},
        // at the left edge of row 1 (8+0+1)/2 = 4; at the right edge of row 0 (3+8+1)/2 = 6 as before
        {"beside plain", ACROSS, true, {{255, 191, 95, 191, 255, 191, 95, 191}, {127, 0, 0, 0, 0, 0, 0, 0}}},
    };

    for (const auto& test : cases)
    {
        const Block block = {test.codes, BLACK_TO_WHITE | MODE};
        const Block right = test.hasPlainNeighbours ? plainWhite : block;
        const Image image = decode({block, block, right, right}, 16, 8, PvrtcBits::TWO);
        for (uint32_t y = 0; y < 8; ++y)
            for (uint32_t x = 0; x < 8; ++x)
                EXPECT_EQ(test.rows[y & 1][x], image.red(x, y)) << test.name << " at " << x << ", " << y;
    }
}

// Fault caught: blocks looked for in the wrong order. Each block's red is its place in the file.
TEST(Pvrtc, blocksLieInMortonOrder)
{
    const struct
    {
        uint32_t columns, rows;
        std::vector<unsigned> places; // row by row
    } cases[] = {
        {4, 4, {0, 2, 8, 10, 1, 3, 9, 11, 4, 6, 12, 14, 5, 7, 13, 15}},
        {8, 2, {0, 2, 4, 6, 8, 10, 12, 14, 1, 3, 5, 7, 9, 11, 13, 15}},
        {2, 8, {0, 2, 1, 3, 4, 6, 5, 7, 8, 10, 9, 11, 12, 14, 13, 15}},
    };

    std::vector<Block> blocks;
    for (uint32_t i = 0; i < 16; ++i)
        blocks.push_back({0, 0x8000 | i << 10});
    for (const PvrtcBits bits : {PvrtcBits::FOUR, PvrtcBits::TWO})
    {
        const uint32_t blockWidth = getBlockWidth(bits);
        for (const auto& test : cases)
        {
            const Image image = decode(blocks, test.columns * blockWidth, test.rows * 4, bits);
            for (uint32_t i = 0; i < 16; ++i)
            {
                const uint32_t x = i % test.columns * blockWidth + blockWidth / 2,
                               y = i / test.columns * 4 + 2;
                const int place = int(test.places[i]);
                EXPECT_EQ(place * 8 + place / 4, image.red(x, y)) << test.columns << " columns, block " << i;
            }
        }
    }
}

// Faults caught: an edge, or the seam between the strips that are decoded one after the other, treated otherwise
// than the inside: noise moved round by a block must come out moved, nothing else. Small images must be the corner
// of the smallest one with whole blocks. A sanitizer sees any byte beyond the buffers.
TEST(Pvrtc, everySizeIsTheSameAllRound)
{
    std::vector<std::pair<uint32_t, uint32_t>> sizes = {{2048, 8}, {8, 2048}};
    for (uint32_t height = 1; height <= 64; height *= 2)
        for (uint32_t width = 1; width <= 64; width *= 2)
            sizes.emplace_back(width, height);

    std::mt19937 random(3);
    for (const PvrtcBits bits : {PvrtcBits::FOUR, PvrtcBits::TWO})
    {
        const uint32_t blockWidth = getBlockWidth(bits);
        for (const auto& [width, height] : sizes)
        {
            const uint32_t columns = std::max(2u, width / blockWidth), rows = std::max(2u, height / 4);
            std::vector<Block> blocks(size_t(columns) * rows), moved = blocks;
            for (Block& block : blocks)
                block = {uint32_t(random()), uint32_t(random())};
            for (uint32_t y = 0; y < rows; ++y)
                for (uint32_t x = 0; x < columns; ++x)
                    moved[twiddle((x + 1) % columns, (y + 1) % rows, columns, rows)] =
                        blocks[twiddle(x, y, columns, rows)];

            const uint32_t wholeWidth = columns * blockWidth, wholeHeight = rows * 4;
            const Image image = decode(blocks, width, height, bits);
            const Image whole = decode(moved, wholeWidth, wholeHeight, bits);
            unsigned different = 0;
            for (uint32_t y = 0; y < height; ++y)
                for (uint32_t x = 0; x < width; ++x)
                    different +=
                        image.at(x, y) != whole.at((x + blockWidth) % wholeWidth, (y + 4) % wholeHeight);
            EXPECT_EQ(0u, different) << width << " x " << height << ", " << int(bits) << " bits";
        }
    }
}

// Fault caught: a jump where one block's pixels meet the next one's. From centre to centre red goes up by two of 31,
// which is 16.5 of 255 in 4 or 8 steps.
TEST(Pvrtc, gradientsAreSmooth)
{
    for (const PvrtcBits bits : {PvrtcBits::FOUR, PvrtcBits::TWO})
    {
        const uint32_t blockWidth = getBlockWidth(bits);
        std::vector<Block> blocks(32);
        for (uint32_t x = 0; x < 16; ++x)
            for (uint32_t y = 0; y < 2; ++y)
                blocks[twiddle(x, y, 16, 2)] = {0, 0x8000 | 2 * x << 10};
        const Image image = decode(blocks, 16 * blockWidth, 8, bits);
        for (uint32_t x = blockWidth / 2; x < 15 * blockWidth + blockWidth / 2; ++x)
        {
            const double ideal = 16.5 * double(x - blockWidth / 2) / blockWidth;
            EXPECT_NEAR(ideal, image.red(x, 5), 1.) << x;
        }
    }
}

// Fault caught: reading beyond data that is too short, and sides that Morton order does not know.
TEST(Pvrtc, refuses)
{
    const struct
    {
        uint32_t width, height;
        PvrtcBits bits;
        size_t size;
    } cases[] = {{8, 8, PvrtcBits::FOUR, 31},   {1, 1, PvrtcBits::FOUR, 31},
                 {16, 8, PvrtcBits::TWO, 31},   {32, 8, PvrtcBits::TWO, 63},
                 {0, 8, PvrtcBits::FOUR, 64},   {8, 0, PvrtcBits::TWO, 64},
                 {12, 8, PvrtcBits::FOUR, 64},  {8, 3, PvrtcBits::TWO, 64},
                 {~0u, 1, PvrtcBits::FOUR, 64}, {1u << 31, 1u << 31, PvrtcBits::FOUR, 64}};

    const Bytes data(64);
    for (const auto& test : cases)
    {
        uint8_t untouched = 1;
        EXPECT_FALSE(
            pvr::decodePvrtc(data.data(), test.size, test.width, test.height, test.bits, &untouched));
        EXPECT_EQ(1, untouched);
    }
}

} // namespace
