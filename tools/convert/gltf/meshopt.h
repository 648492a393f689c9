#pragma once

#include "document.h"

namespace convert::gltf
{

/// Decodes EXT_meshopt_compression. Throws a Fault.
/// @param compression  the extension's object in the buffer view.
/// @param packed       the bytes that it names.
Bytes decompressMeshopt(const Object& compression, Span packed);

} // namespace convert::gltf
