#pragma once

#include "orv/memorystreamsource.h"

namespace orv
{

/// The engine's own assets, named "orv#...", which are compiled into the library: shader sources and programs, two
/// materials and four tiny pictures. The streams read them where they lie, for the life of the process.
/// @return empty without memory for the source.
ORV_API SharedPtr<MemoryStreamSource> create_memfilesource_orv();

/// The same for the client framework's effects, named "luvane#...".
ORV_API SharedPtr<MemoryStreamSource> create_memfilesource_luvane();

} // namespace orv
