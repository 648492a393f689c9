#pragma once

#include "orv/detail/digestmaker.h"

#include <cstddef>

namespace orv::detail
{

/// MD5 (RFC 1321) in pieces: start, take in any number of blocks of bytes, finish once.

void md5_init(Md5State& state);
void md5_append(Md5State& state, const unsigned char* data, std::size_t length);
void md5_finish(Md5State& state, std::array<unsigned char, 16>& digest);

} // namespace orv::detail
