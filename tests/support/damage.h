#pragma once

#include <cstddef>
#include <cstdint>
#include <functional>
#include <string>
#include <vector>

namespace support
{

using Bytes = std::vector<uint8_t>;

/// Calls use with damaged copies of a file, the same ones on every run, and what was done to each:
///
///     cut     to every length below its size
///     byte    one byte made 0, 255, or another in one bit
///     number  four bytes made a count or size that is huge, negative, or just beyond what is there
///     splice  a block taken out, doubled, moved elsewhere, or repeated fifty times, as deep nesting does
///     random  up to eight bytes random
///
/// @param step  all but cuts are done at every step-th place.
void forEachDamage(const Bytes& file, size_t step,
                   const std::function<void(const Bytes& damaged, const std::string& what)>& use);

} // namespace support
