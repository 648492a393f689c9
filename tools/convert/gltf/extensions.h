#pragma once

#include "source.h"

namespace convert::gltf
{

/// Throws a Fault for unknown required extensions; reports other unknown ones.
void checkExtensions(Source& source);

} // namespace convert::gltf
