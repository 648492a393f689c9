// The cost of decoding compressed textures in software: millions of texels a second of each decoder, ETC1 beside
// Android's libETC1 if it was installed at build time.
//
// "Noise" is random blocks, the worst case for code with branches; "picture" is what libETC1's encoder made of a
// smooth picture. libETC1 writes three bytes a texel, these decoders four. The best of several runs counts, since other
// work on the machine can only add time.

#include "pvr/etc1.h"
#include "pvr/pvrtc.h"

#ifdef ORV_BENCH_LIBETC1
#include <ETC1/etc1.h>
#endif

#include <algorithm>
#include <chrono>
#include <cmath>
#include <cstdio>
#include <random>
#include <vector>

namespace
{

constexpr uint32_t SIDE = 1024; // texels
constexpr int RUNS = 25;

using Bytes = std::vector<uint8_t>;

Bytes makeNoise(size_t size)
{
    std::mt19937 random(1);
    Bytes bytes(size);
    std::generate(bytes.begin(), bytes.end(), [&random] { return uint8_t(random()); });
    return bytes;
}

template <class Decode>
void report(const char* name, const Decode& decode)
{
    using Clock = std::chrono::steady_clock;
    double best = HUGE_VAL;
    for (int i = 0; i < RUNS; ++i)
    {
        const Clock::time_point start = Clock::now();
        decode();
        best = std::min(best, std::chrono::duration<double>(Clock::now() - start).count());
    }
    std::printf("  %-24s %7.0f\n", name, SIDE * SIDE / best * 1e-6);
}

void reportEtc1(const char* name, const Bytes& data, uint8_t* rgba)
{
    report(name, [&] { pvr::decodeEtc1(data.data(), data.size(), SIDE, SIDE, rgba); });
}

void reportPvrtc(const char* name, const Bytes& data, pvr::PvrtcBits bits, uint8_t* rgba)
{
    report(name, [&] { pvr::decodePvrtc(data.data(), data.size(), SIDE, SIDE, bits, rgba); });
}

#ifdef ORV_BENCH_LIBETC1
constexpr unsigned RGB_BYTES = 3;

Bytes encodePicture()
{
    Bytes rgb;
    for (uint32_t y = 0; y < SIDE; ++y)
        for (uint32_t x = 0; x < SIDE; ++x)
            for (const float wave : {0.011f, 0.017f, 0.029f})
                rgb.push_back(
                    uint8_t(127.5f + 127.0f * std::sin(wave * float(x)) * std::cos(wave * float(y))));

    Bytes encoded(pvr::etc1Size(SIDE, SIDE));
    etc1_encode_image(rgb.data(), SIDE, SIDE, RGB_BYTES, SIDE * RGB_BYTES, encoded.data());
    return encoded;
}

void reportLibEtc1(const char* name, const Bytes& data, uint8_t* rgb)
{
    report(name, [&] { etc1_decode_image(data.data(), rgb, SIDE, SIDE, RGB_BYTES, SIDE * RGB_BYTES); });
}
#endif

} // namespace

int main()
{
    const Bytes noise = makeNoise(pvr::etc1Size(SIDE, SIDE));
    Bytes rgba(size_t(SIDE) * SIDE * 4);
    std::printf("Decoding %u x %u texels, megatexels a second\n", SIDE, SIDE);

    reportEtc1("ETC1 noise", noise, rgba.data());
#ifdef ORV_BENCH_LIBETC1
    reportLibEtc1("  libETC1", noise, rgba.data());
    const Bytes picture = encodePicture();
    reportEtc1("ETC1 picture", picture, rgba.data());
    reportLibEtc1("  libETC1", picture, rgba.data());
#else
    std::printf("    libETC1: not installed\n");
#endif
    reportPvrtc("PVRTC 4 bits noise", noise, pvr::PvrtcBits::FOUR, rgba.data());
    reportPvrtc("PVRTC 2 bits noise", noise, pvr::PvrtcBits::TWO, rgba.data());
    return 0;
}
