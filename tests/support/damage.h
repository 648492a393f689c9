#pragma once

#include <cstddef>
#include <cstdint>
#include <functional>
#include <string>
#include <vector>

namespace support
{

using Bytes = std::vector<uint8_t>;

/// Calls use with the file cut to every length from 0 to one below its size (every step-th; the first 64 and
/// the last lengths always).
void forEachCut(const Bytes& file, const std::function<void(const Bytes& cut, size_t length)>& use,
                size_t step = 1);

/// Calls use with copies of the file in which one byte each is changed to 0, 0xff, and with a bit turned.
/// @param step  every step-th offset; the first 64 always.
void forEachSpoiledByte(const Bytes& file,
                        const std::function<void(const Bytes& spoiled, size_t offset)>& use, size_t step = 1);

/// Calls use with count copies in which 1 to 8 random bytes are random; the same ones on every run.
void forEachRandomDamage(const Bytes& file, int count,
                         const std::function<void(const Bytes& spoiled, int index)>& use, uint32_t seed = 1);

} // namespace support
