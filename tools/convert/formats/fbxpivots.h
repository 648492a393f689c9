#pragma once

struct aiScene;

namespace convert
{

class Report;

/// Corrects FBX nodes with PreRotation and PostRotation. libassimp makes several nested nodes of such a node. If it is
/// animated, the keys of the last one have the whole transform, so the others would apply their part twice. Reports
/// rotations whose keys are so far apart that the path between them matters; the file defines it by Euler angles.
void correctFbx(aiScene& scene, Report& report);

} // namespace convert
