#pragma once

#include "source.h"

#include <memory>

struct aiCamera;
struct aiLight;

namespace convert::gltf
{

/// @param nodeName  of the node that it is in and looks along -z from, which is what libassimp knows it by.
std::unique_ptr<aiCamera> readCamera(const Object& camera, const std::string& nodeName);

/// A light of KHR_lights_punctual. Colours stay shares of light, intensities candela or lux.
std::unique_ptr<aiLight> readLight(const Object& light, const std::string& nodeName);

} // namespace convert::gltf
