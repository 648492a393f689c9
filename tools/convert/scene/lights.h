#pragma once

#include "convert/report.h"
#include "glo/glowriter.h"

#include <assimp/types.h>

struct aiCamera;
struct aiLight;

namespace convert
{

constexpr float SPENT = 0.02f; ///< of a light's strength: where it ends

/// Where a light ends that falls off by the square of the distance alone, in distances at which it lights in full (its
/// strength there is 1). The engine's lights fall in a straight line; this one lies near that curve.
constexpr float SQUARE_END = 2.5f;

/// @return false, with the loss reported, for a kind of light that the engine does not have.
bool convertLight(const aiLight& light, glo::LightDefinition& made, Report& report);

glo::CameraDefinition convertCamera(const aiCamera& camera);

/// From where it is to be, looking along -z, to its node.
/// @param node  the node's transform.
aiMatrix4x4 placeCamera(const aiCamera& camera, const aiMatrix4x4& node);

} // namespace convert
