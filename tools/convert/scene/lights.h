#pragma once

#include "convert/report.h"
#include "glo/glowriter.h"

#include <assimp/types.h>

struct aiCamera;
struct aiLight;

namespace convert
{

constexpr float SPENT = 0.02f; ///< share of a light's strength at which it counts as faded

/// The end of a light with inverse-square attenuation, in multiples of the distance at which its strength is 1. The
/// engine's linear attenuation to this end is close to that curve.
constexpr float SQUARE_END = 2.5f;

/// @return false, with the loss reported, for a kind of light that the engine does not have.
bool convertLight(const aiLight& light, glo::LightDefinition& made, Report& report);

glo::CameraDefinition convertCamera(const aiCamera& camera);

/// The transform from a camera or light that looks along -z to its node.
/// @param node  the node's transform.
aiMatrix4x4 placeCamera(const aiCamera& camera, const aiMatrix4x4& node);

} // namespace convert
