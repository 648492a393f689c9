#pragma once

#include "pvr/pixelpair.h"

#include <cstdint>
#include <cstring>

/// A PVRTC block in the form that the decoder uses.
namespace pvr::pvrtc
{

constexpr unsigned HEIGHT = 4; // pixels of a block; its width is 4 or 8
constexpr unsigned BLOCK_BYTES = 8;

/// How the weights of a block of 8 x 4 are stored.
enum class Mode : uint8_t
{
    PLAIN,
    INTERPOLATED,        // only every other pixel has a weight, the rest has the mean of the four around it
    INTERPOLATED_ACROSS, // the mean of the left and right one
    INTERPOLATED_UPRIGHT // the mean of those above and below
};

/// Colours A and B: of a block, sums over several blocks, or the step from pixel to pixel.
struct Colours
{
    PixelPair a;
    PixelPair b;

    Colours operator+(const Colours& other) const { return {a + other.a, b + other.b}; }
    Colours operator-(const Colours& other) const { return {a - other.a, b - other.b}; }
    Colours operator*(uint16_t factor) const { return {a * factor, b * factor}; }
    Colours operator*(const PixelPair& factors) const { return {a * factors, b * factors}; }
};

struct Block
{
    Colours colours;
    /// For each row how its pixels are mixed, from the lowest bits upwards. 8 x 4: B's weight in eighths, a byte for
    /// each pixel, those to be interpolated being 0. 4 x 4: 32 bits for each pair of pixels, a place in PAIR_TABLE.
    uint64_t weights[HEIGHT];
    Mode mode; // 8 x 4 alone
};

/// How two pixels are mixed: the weights of A and B in each channel, together 8, or 0 where alpha becomes 0.
struct alignas(16) PairWeights
{
    uint16_t a[8];
    uint16_t b[8];

    Colours load() const
    {
        Colours weights;
        std::memcpy(&weights.a, a, sizeof a);
        std::memcpy(&weights.b, b, sizeof b);
        return weights;
    }
};

/// Weights of the pairs in blocks of 4 x 4, by two codes (the first pixel's below) and, above them, whether the block
/// is a punch-through one.
struct PairTable
{
    static constexpr uint32_t PUNCH_THROUGH = 16;
    PairWeights pairs[32] = {};

    constexpr PairTable()
    {
        constexpr uint16_t WEIGHTS[2][4] = {{0, 3, 5, 8}, {0, 4, 4, 8}};
        for (unsigned i = 0; i < 32; ++i)
        {
            for (unsigned channel = 0; channel < 8; ++channel)
            {
                const bool isPunchThrough = i & PUNCH_THROUGH;
                const unsigned code = (channel < 4 ? i : i >> 2) & 3;
                const bool isCleared = isPunchThrough && code == 2 && channel % 4 == 3;
                const uint16_t weight = WEIGHTS[isPunchThrough][code];
                pairs[i].a[channel] = isCleared ? 0 : 8 - weight;
                pairs[i].b[channel] = isCleared ? 0 : weight;
            }
        }
    }
};

inline constexpr PairTable PAIR_TABLE;

/// WIDTH is 4 or 8.
/// \param bytes BLOCK_BYTES of them
template <unsigned WIDTH>
void unpackBlock(const uint8_t* bytes, Block& block);

/// One value for the channels of each pixel.
inline PixelPair spread(uint32_t first, uint32_t second)
{
    const uint16_t a = uint16_t(first), b = uint16_t(second);
    return PixelPair{a, a, a, a, b, b, b, b};
}

} // namespace pvr::pvrtc
