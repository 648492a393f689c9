#pragma once

#include "source.h"

namespace convert::gltf
{

/// Throws a Fault if the file needs extensions that are not known; reports those that it could do without.
void checkExtensions(Source& source);

} // namespace convert::gltf
