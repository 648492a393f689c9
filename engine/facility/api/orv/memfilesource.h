#pragma once

#include "orv/memorystreamsource.h"

namespace orv
{

/// The engine's own assets, named "orv#...", which are compiled into the library: shader sources and programs, two
/// materials and four tiny pictures. They are unpacked once, by the first call, and stay so as long as the library.
/// @return empty, with an error record, without memory for them (some 50 KB).
ORV_API SharedPtr<MemoryStreamSource> create_memfilesource_orv();

/// The same for the client framework's effects, named "luvane#..." (some 20 KB).
ORV_API SharedPtr<MemoryStreamSource> create_memfilesource_luvane();

} // namespace orv
