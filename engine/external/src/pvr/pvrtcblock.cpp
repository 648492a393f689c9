#include "pvr/pvrtcblock.h"

namespace pvr::pvrtc
{
namespace
{

uint32_t readLittleEndian(const uint8_t* bytes)
{
    return bytes[0] | uint32_t(bytes[1]) << 8 | uint32_t(bytes[2]) << 16 | uint32_t(bytes[3]) << 24;
}

/// One of the pixels, twice.
PixelPair repeat(const PixelPair& pair, unsigned index)
{
    using Pixels [[gnu::vector_size(16)]] = uint64_t;
    const uint64_t pixel = Pixels(pair)[index];
    return PixelPair(Pixels{pixel, pixel});
}

/// \param mask all bits of a channel set or none
PixelPair select(const PixelPair& mask, const PixelPair& ifSet, const PixelPair& ifNot)
{
    return (mask & ifSet) | (~mask & ifNot);
}

/// A block's colours A and B as a pair, with 5 bits in each channel, alpha's 4 doubled.
/// \param bits A and, above it, B: each 1:5:5:5 opaque or 0:3:4:4:4 translucent (A:R:G:B), A's last bit not being its own
PixelPair unpackColours(uint32_t bits)
{
    using Signed [[gnu::vector_size(16)]] = int16_t;
    const PixelPair both = spread(bits & 0xffff, bits >> 16);
    const PixelPair isOpaque = PixelPair(Signed(both) < 0);

    // Each channel is brought to the bits from 14 down.
    constexpr PixelPair OPAQUE = {0x7c00, 0x03e0, 0x001e, 0, 0x7c00, 0x03e0, 0x001f, 0};
    constexpr PixelPair TRANSLUCENT = {0x0f00, 0x00f0, 0x000e, 0x7000, 0x0f00, 0x00f0, 0x000f, 0x7000};
    const PixelPair value = select(isOpaque, (both & OPAQUE) * makePair(1 << 0, 1 << 5, 1 << 10, 0),
                                   (both & TRANSLUCENT) * makePair(1 << 3, 1 << 7, 1 << 11, 1));

    // Of its 5 bits there, colours of 4 bits lack one, those of 3 bits two.
    constexpr PixelPair LACK_OPAQUE = {0, 0, 1, 0, 0, 0, 0, 0};
    constexpr PixelPair LACK_TRANSLUCENT = {1, 1, 0, 0, 1, 1, 1, 0};
    constexpr PixelPair LACK_TWO = {0, 0, 3, 0, 0, 0, 0, 0};
    const PixelPair repeated = (value >> 14 & select(isOpaque, LACK_OPAQUE, LACK_TRANSLUCENT)) |
                               (value >> 13 & LACK_TWO & ~isOpaque);
    return value >> 10 | repeated | (isOpaque & makePair(0, 0, 0, 30));
}

/// Spreads four codes of two bits over 16 bits each.
uint64_t spreadCodes(uint64_t codes)
{
    codes = (codes | codes << 28) & 0x0000000f0000000f;
    return (codes | codes << 14) & 0x0003000300030003;
}

/// Weights 0, 3, 5, 8 for codes 0 to 3.
uint64_t weighCodes(uint64_t codes)
{
    const uint64_t spread = spreadCodes(codes);
    return 3 * spread - (spread >> 1 & 0x0001000100010001);
}

/// Weights 0 or 8 for eight bits.
uint64_t weighBits(uint64_t bits)
{
    const uint64_t spread = spreadCodes(bits);
    return ((spread | spread << 7) & 0x0101010101010101) * 8;
}

/// Weights of a block of 4 x 4.
void unpackWeights4(uint32_t codes, bool isPunchThrough, Block& block)
{
    const uint64_t kind = isPunchThrough ? PairTable::PUNCH_THROUGH * 0x100000001 : 0;
    for (uint64_t& weights : block.weights)
    {
        weights = kind | (codes & 15) | uint64_t(codes & 0xf0) << 28;
        codes >>= 8;
    }
}

/// Weights of a block of 8 x 4.
///
/// Where they are interpolated, the lowest bit of the first pixel, and perhaps of the centre one, says how; these
/// pixels then have codes of one bit, of which codes of two are made.
void unpackWeights8(uint32_t codes, bool isPlain, Block& block)
{
    block.mode = Mode::PLAIN;
    if (isPlain)
    {
        for (unsigned y = 0; y < HEIGHT; ++y)
            block.weights[y] = weighBits(codes >> 8 * y & 0xff);
        return;
    }

    constexpr unsigned CENTRE = 20; // where the code of pixel (4, 2) lies
    const auto repeatHighBit = [&codes](unsigned place)
    { codes = (codes & ~(1u << place)) | (codes >> 1 & 1u << place); };

    block.mode = Mode::INTERPOLATED;
    if (codes & 1)
    {
        block.mode = codes >> CENTRE & 1 ? Mode::INTERPOLATED_UPRIGHT : Mode::INTERPOLATED_ACROSS;
        repeatHighBit(CENTRE);
    }
    repeatHighBit(0);
    for (unsigned y = 0; y < HEIGHT; ++y)
        block.weights[y] = weighCodes(codes >> 8 * y & 0xff) << 8 * (y & 1);
}

} // namespace

template <unsigned WIDTH>
void unpackBlock(const uint8_t* bytes, Block& block)
{
    const uint32_t codes = readLittleEndian(bytes);
    const uint32_t colours = readLittleEndian(bytes + 4);
    const bool isModeSet = colours & 1;
    const PixelPair both = unpackColours(colours);
    block.colours = {repeat(both, 0), repeat(both, 1)};
    if constexpr (WIDTH == 4)
        unpackWeights4(codes, isModeSet, block);
    else
        unpackWeights8(codes, !isModeSet, block);
}

template void unpackBlock<4>(const uint8_t* bytes, Block& block);
template void unpackBlock<8>(const uint8_t* bytes, Block& block);

} // namespace pvr::pvrtc
