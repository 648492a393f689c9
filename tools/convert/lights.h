#pragma once

#include "glo/glowriter.h"
#include "report.h"

#include <assimp/types.h>

struct aiCamera;
struct aiLight;

namespace convert
{

/// @param isGltf  whose cone angles are taken from the axis, not from edge to edge.
/// @return false, with the loss reported, for a kind of light that the engine does not have.
bool convertLight(const aiLight& light, bool isGltf, glo::LightDefinition& made, Report& report);

glo::CameraDefinition convertCamera(const aiCamera& camera, bool isGltf);

/// From where it is to be, looking along -z, to its node.
/// @param node  the node's transform.
aiMatrix4x4 placeCamera(const aiCamera& camera, const aiMatrix4x4& node);

} // namespace convert
