#include "md5.h"

#include "orv/detail/littleendian.h"

#include <algorithm>

namespace orv::detail
{

namespace
{

/// floor(2^32 * |sin(i + 1)|), one for each of the 64 steps.
constexpr std::array<uint32_t, 64> STEP_CONSTANTS = {
    0xd76aa478, 0xe8c7b756, 0x242070db, 0xc1bdceee, 0xf57c0faf, 0x4787c62a, 0xa8304613, 0xfd469501,
    0x698098d8, 0x8b44f7af, 0xffff5bb1, 0x895cd7be, 0x6b901122, 0xfd987193, 0xa679438e, 0x49b40821,
    0xf61e2562, 0xc040b340, 0x265e5a51, 0xe9b6c7aa, 0xd62f105d, 0x02441453, 0xd8a1e681, 0xe7d3fbc8,
    0x21e1cde6, 0xc33707d6, 0xf4d50d87, 0x455a14ed, 0xa9e3e905, 0xfcefa3f8, 0x676f02d9, 0x8d2a4c8a,
    0xfffa3942, 0x8771f681, 0x6d9d6122, 0xfde5380c, 0xa4beea44, 0x4bdecfa9, 0xf6bb4b60, 0xbebfbc70,
    0x289b7ec6, 0xeaa127fa, 0xd4ef3085, 0x04881d05, 0xd9d4d039, 0xe6db99e5, 0x1fa27cf8, 0xc4ac5665,
    0xf4292244, 0x432aff97, 0xab9423a7, 0xfc93a039, 0x655b59c3, 0x8f0ccc92, 0xffeff47d, 0x85845dd1,
    0x6fa87e4f, 0xfe2ce6e0, 0xa3014314, 0x4e0811a1, 0xf7537e82, 0xbd3af235, 0x2ad7d2bb, 0xeb86d391,
};

/// Left rotation of each step: four per round, repeated four times.
constexpr int ROTATIONS[4][4] = {{7, 12, 17, 22}, {5, 9, 14, 20}, {4, 11, 16, 23}, {6, 10, 15, 21}};

uint32_t rotateLeft(uint32_t value, int count)
{
    return (value << count) | (value >> (32 - count));
}

void writeWords(const uint32_t* words, int count, unsigned char* bytes)
{
    for (int i = 0; i < count * 4; ++i)
        bytes[i] = static_cast<unsigned char>(words[i / 4] >> (i % 4 * 8));
}

/// The round's mixing function and the block word that the step takes in.
uint32_t mix(int step, uint32_t b, uint32_t c, uint32_t d, int& wordIndex)
{
    switch (step / 16)
    {
    case 0: wordIndex = step; return (b & c) | (~b & d);
    case 1: wordIndex = (5 * step + 1) % 16; return (b & d) | (c & ~d);
    case 2: wordIndex = (3 * step + 5) % 16; return b ^ c ^ d;
    default: wordIndex = 7 * step % 16; return c ^ (b | ~d);
    }
}

void takeBlock(std::array<uint32_t, 4>& words, const unsigned char* block)
{
    auto [a, b, c, d] = words;
    for (int step = 0; step < 64; ++step)
    {
        int wordIndex = 0;
        const uint32_t mixed = mix(step, b, c, d, wordIndex);
        const uint32_t sum = a + mixed + STEP_CONSTANTS[step] + readLittleEndian(block + wordIndex * 4);
        a = d;
        d = c;
        c = b;
        b += rotateLeft(sum, ROTATIONS[step / 16][step % 4]);
    }
    words = {words[0] + a, words[1] + b, words[2] + c, words[3] + d};
}

} // namespace

void md5_init(Md5State& state)
{
    state.words = {0x67452301, 0xefcdab89, 0x98badcfe, 0x10325476};
    state.length = 0;
}

void md5_append(Md5State& state, const unsigned char* data, std::size_t length)
{
    while (length > 0)
    {
        const std::size_t filled = state.length % state.block.size();
        const std::size_t count = std::min(length, state.block.size() - filled);
        std::copy_n(data, count, state.block.begin() + filled);
        state.length += count;
        data += count;
        length -= count;
        if (state.length % state.block.size() == 0)
            takeBlock(state.words, state.block.data());
    }
}

void md5_finish(Md5State& state, std::array<unsigned char, 16>& digest)
{
    const uint32_t bitLength[2] = {uint32_t(state.length << 3), uint32_t(state.length >> 29)};
    unsigned char encodedLength[8];
    writeWords(bitLength, 2, encodedLength);

    // A one bit, then zeros up to 8 bytes short of a whole block, then the length.
    constexpr std::array<unsigned char, 64> PADDING = {0x80};
    const std::size_t filled = state.length % state.block.size();
    md5_append(state, PADDING.data(), (filled < 56 ? 56 : 120) - filled);
    md5_append(state, encodedLength, sizeof(encodedLength));
    writeWords(state.words.data(), 4, digest.data());
}

} // namespace orv::detail
