#pragma once

#include "source.h"

#include <memory>

struct aiCamera;
struct aiLight;

namespace convert::gltf
{

/// @param nodeName  of its node, by which libassimp finds it; it looks along the node's -z.
std::unique_ptr<aiCamera> readCamera(const Object& camera, const std::string& nodeName);

/// A light of KHR_lights_punctual. Colours stay linear, intensities candela or lux.
std::unique_ptr<aiLight> readLight(const Object& light, const std::string& nodeName);

} // namespace convert::gltf
