#include "pvr/pvrtc.h"

#include "pvr/pvrtcblock.h"

#include <algorithm>
#include <cstring>

namespace pvr
{

using namespace pvrtc;

namespace
{

constexpr unsigned PIXEL_BYTES = 4;
constexpr uint32_t MIN_BLOCKS = 2; // each way
constexpr uint32_t STRIP = 64;     // blocks side by side that are unpacked at a time

/// Sums over neighbouring blocks (weights of WIDTH * HEIGHT altogether) brought to 8 bits.
template <unsigned WIDTH>
PixelPair toBytes(const PixelPair& sums)
{
    // With blocks of 4 x 4, s / 2 + s / 64, both rounded down, is (s less its lowest bit) * 33 / 64. Alpha's sums
    // are twice what counts: s / 2 + s / 32 is (s less its lowest bit) * 34 / 64. 8 x 4 has one more bit to lose.
    constexpr uint16_t KEPT = WIDTH == 4 ? 0xfffe : 0xfffc;
    constexpr int SHIFT = WIDTH == 4 ? 6 : 7;
    return (sums & KEPT) * makePair(33, 33, 33, 34) >> SHIFT;
}

/// Line y of a block of 8 x 4 whose every other weight is known.
uint64_t interpolateWeights(const Block* above, const Block* here, const Block* below, unsigned y)
{
    // In even rows the even pixels' weights are known, in odd rows the odd pixels'.
    const bool isOdd = y & 1;
    const uint64_t known = here->weights[y];
    const uint64_t across =
        (known << 8) + (known >> 8) + (isOdd ? here[-1].weights[y] >> 56 : here[1].weights[y] << 56);
    const uint64_t upright = (y > 0 ? here->weights[y - 1] : above->weights[HEIGHT - 1]) +
                             (y < HEIGHT - 1 ? here->weights[y + 1] : below->weights[0]);

    constexpr uint64_t ONES = 0x0101010101010101;
    uint64_t means = 0;
    switch (here->mode)
    {
    case Mode::INTERPOLATED_ACROSS: means = (across + ONES) >> 1; break;
    case Mode::INTERPOLATED_UPRIGHT: means = (upright + ONES) >> 1; break;
    default: means = (across + upright + 2 * ONES) >> 2; break;
    }
    const uint64_t unknown = isOdd ? 0x000f000f000f000f : 0x0f000f000f000f00;
    return known | (means & unknown);
}

/// \param weights the pair's in their lowest bits
template <unsigned WIDTH>
PixelPair mix(const Colours& sums, uint64_t weights)
{
    const PixelPair a = toBytes<WIDTH>(sums.a);
    const PixelPair b = toBytes<WIDTH>(sums.b);
    if constexpr (WIDTH == 4)
    {
        const Colours pair = PAIR_TABLE.pairs[weights & 31].load();
        return (a * pair.a + b * pair.b) >> 3;
    }
    return (a * 8 + (b - a) * spread(weights & 15, weights >> 8 & 15)) >> 3;
}

/// Rows of unpacked blocks, each with the neighbours left and right of the strip at its ends.
struct BlockRows
{
    const Block* above;
    const Block* here;
    const Block* below;
};

/// Decodes line y (0 to 3) of `count` blocks.
/// \param rgba starts half a block before the first one and ends as much after the last: both halves are undefined
template <unsigned WIDTH>
void decodeLine(const BlockRows& rows, uint32_t count, unsigned y, uint8_t* rgba)
{
    // Half way down a block its own colours have all the weight.
    constexpr unsigned CENTRE = HEIGHT / 2;
    const Block* nearest = y < CENTRE ? rows.above : rows.below;
    const uint16_t nearestWeight = uint16_t(y < CENTRE ? CENTRE - y : y - CENTRE);
    const uint16_t ownWeight = HEIGHT - nearestWeight;

    Colours column = nearest[0].colours * nearestWeight + rows.here[0].colours * ownWeight;
    uint64_t weights = 0;
    for (uint32_t i = 1; i <= count + 1; ++i)
    {
        // From the centre of the block before to the centre of this one.
        const Colours nextColumn = nearest[i].colours * nearestWeight + rows.here[i].colours * ownWeight;
        const Colours step = nextColumn - column;
        uint64_t nextWeights = rows.here[i].weights[y];
        if (WIDTH == 8 && i <= count && rows.here[i].mode != Mode::PLAIN)
            nextWeights = interpolateWeights(rows.above + i, rows.here + i, rows.below + i, y);
        weights = weights >> 32 | nextWeights << 32;

        Colours sums = column * WIDTH + step * spread(0, 1);
        for (unsigned x = 0; x < WIDTH; x += 2)
        {
            putPair(rgba, mix<WIDTH>(sums, weights));
            rgba += 2 * PIXEL_BYTES;
            weights >>= 128 / WIDTH;
            sums = sums + step + step;
        }
        column = nextColumn;
        weights = nextWeights;
    }
}

/// Blocks lie in Morton order: the bits of column and row take turns in a block's index, the row's first, as long
/// as both have bits left. A coordinate is kept as its bits in their places.
struct Morton
{
    uint64_t columnMask = 0;
    uint64_t rowMask = 0;

    Morton(uint32_t columns, uint32_t rows)
    {
        uint64_t place = 1;
        for (uint32_t bit = 1; bit < columns || bit < rows; bit <<= 1)
        {
            if (bit < rows)
            {
                rowMask |= place;
                place <<= 1;
            }
            if (bit < columns)
            {
                columnMask |= place;
                place <<= 1;
            }
        }
    }
};

/// The next coordinate; after the last comes 0.
uint64_t next(uint64_t coordinate, uint64_t mask)
{
    return (coordinate - mask) & mask;
}

uint32_t countBlocks(uint32_t pixels, uint32_t blockSide)
{
    return std::max(MIN_BLOCKS, pixels / blockSide + (pixels % blockSide != 0));
}

/// Unpacks `count` blocks side by side, of a row and from a column on; both in Morton form.
template <unsigned WIDTH>
void unpackRow(const uint8_t* data, const Morton& morton, uint64_t row, uint64_t column, uint32_t count,
               Block* blocks)
{
    for (uint32_t i = 0; i < count; ++i)
    {
        unpackBlock<WIDTH>(data + (row | column) * BLOCK_BYTES, blocks[i]);
        column = next(column, morton.columnMask);
    }
}

/// Decodes in strips from top to bottom, with three rows of blocks unpacked at a time.
template <unsigned WIDTH>
void decodeImage(const uint8_t* data, uint32_t width, uint32_t height, uint8_t* rgba)
{
    const Morton morton(countBlocks(width, WIDTH), countBlocks(height, HEIGHT));
    const uint32_t blocksAcross = std::max(width / WIDTH, 1u);
    const uint32_t count = std::min(STRIP, blocksAcross); // both are powers of two
    uint64_t before = morton.columnMask; // the column left of the strip: the last one at first

    for (uint32_t firstBlock = 0; firstBlock < blocksAcross; firstBlock += count)
    {
        Block blocks[3][1 + STRIP + 1];
        const auto unpack = [&](uint64_t row, Block* to)
        { unpackRow<WIDTH>(data, morton, row, before, count + 2, to); };

        unpack(morton.rowMask, blocks[0]); // above the first row lies the last
        unpack(0, blocks[1]);
        uint64_t row = 0;
        uint8_t* out = rgba + size_t(firstBlock) * WIDTH * PIXEL_BYTES;
        for (uint32_t y = 0; y < height; ++y)
        {
            const uint32_t blockRow = y / HEIGHT;
            if (y % HEIGHT == 0)
            {
                row = next(row, morton.rowMask);
                unpack(row, blocks[(blockRow + 2) % 3]);
            }
            const BlockRows rows = {blocks[blockRow % 3], blocks[(blockRow + 1) % 3],
                                    blocks[(blockRow + 2) % 3]};
            uint8_t line[(STRIP + 1) * WIDTH * PIXEL_BYTES];
            decodeLine<WIDTH>(rows, count, y % HEIGHT, line);
            std::memcpy(out, line + WIDTH / 2 * PIXEL_BYTES, std::min(width, count * WIDTH) * PIXEL_BYTES);
            out += size_t(width) * PIXEL_BYTES;
        }
        for (uint32_t i = 0; i < count; ++i)
            before = next(before, morton.columnMask);
    }
}

bool isPowerOfTwo(uint32_t value)
{
    return value != 0 && (value & (value - 1)) == 0;
}

} // namespace

uint64_t pvrtcSize(uint32_t width, uint32_t height, PvrtcBits bits)
{
    const uint32_t blockWidth = bits == PvrtcBits::TWO ? 8 : 4;
    return uint64_t(countBlocks(width, blockWidth)) * countBlocks(height, HEIGHT) * BLOCK_BYTES;
}

bool decodePvrtc(const uint8_t* data, size_t size, uint32_t width, uint32_t height, PvrtcBits bits,
                 uint8_t* rgba)
{
    if (!isPowerOfTwo(width) || !isPowerOfTwo(height) || size < pvrtcSize(width, height, bits))
        return false;

    if (bits == PvrtcBits::TWO)
        decodeImage<8>(data, width, height, rgba);
    else
        decodeImage<4>(data, width, height, rgba);
    return true;
}

} // namespace pvr
