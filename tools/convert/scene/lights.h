#pragma once

#include "convert/report.h"
#include "glo/glowriter.h"

#include <assimp/types.h>

struct aiCamera;
struct aiLight;

namespace convert
{

constexpr float SPENT = 0.02f; ///< of a light's strength: where it ends

/// @return false, with the loss reported, for a kind of light that the engine does not have.
bool convertLight(const aiLight& light, glo::LightDefinition& made, Report& report);

glo::CameraDefinition convertCamera(const aiCamera& camera);

/// From where it is to be, looking along -z, to its node.
/// @param node  the node's transform.
aiMatrix4x4 placeCamera(const aiCamera& camera, const aiMatrix4x4& node);

} // namespace convert
