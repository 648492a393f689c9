#pragma once

struct aiScene;

namespace convert
{

class Report;

/// Puts right what libassimp makes of FBX nodes with rotations before and after their own (PreRotation, PostRotation):
/// such a node is several, one in the other, and where it moves, the keys of the last have all of the transform, which
/// the others would then apply again.
/// Reports rotations whose keys lie so far apart that the way between them matters, which the file has by angles.
void correctFbx(aiScene& scene, Report& report);

} // namespace convert
