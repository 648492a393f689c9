#pragma once

#include "document.h"

namespace convert::gltf
{

/// Takes apart what EXT_meshopt_compression has packed. Throws a Fault.
/// @param compression  the extension's object in the buffer view.
/// @param packed       the bytes that it names.
Bytes decompressMeshopt(const Object& compression, Span packed);

} // namespace convert::gltf
