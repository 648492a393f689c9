#pragma once

#include "source.h"

namespace convert::gltf
{

/// Throws a Fault if the file needs extensions that nobody here knows; reports those that it could do without.
void checkExtensions(Source& source);

} // namespace convert::gltf
