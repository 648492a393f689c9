#pragma once

#include "source.h"

#include <assimp/matrix4x4.h>

struct aiMesh;

namespace convert::gltf
{

/// The joints of a skin.
struct Skin
{
    std::vector<std::string> joints;   ///< names of their nodes
    std::vector<aiMatrix4x4> inverses; ///< from the mesh to each joint in the bind pose
};

/// @param nodeNames  by number of node.
Skin readSkin(Source& source, const Object& skin, const std::vector<std::string>& nodeNames);

/// Gives a mesh the bones that move its vertices.
/// @param joints, weights  sets of four for each vertex; of the same length.
void addBones(aiMesh& mesh, const Skin& skin, const std::vector<Column>& joints,
              const std::vector<Column>& weights, Report& report);

/// @param values  as the file has them, column by column.
aiMatrix4x4 toMatrix(std::span<const float> values);

} // namespace convert::gltf
