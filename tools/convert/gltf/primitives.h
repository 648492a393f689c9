#pragma once

#include "skins.h"
#include "source.h"

#include "materials.h"

#include <assimp/mesh.h>

#include <memory>

namespace convert::gltf
{

/// How to convert a primitive.
struct PrimitiveUse
{
    std::string name;           ///< of the mesh
    std::vector<float> weights; ///< of the morph targets; missing ones are 0
    UvPlacing placing;          ///< of the material's pictures
    const Skin* skin = nullptr; ///< null: none
    bool isMoving = false;      ///< other shapes become other meshes, so none is reported as lost
};

/// Reads one primitive of a mesh: only vertices in use, deformed by the weights of its morph targets.
/// @return null if it has nothing to draw (reported).
std::unique_ptr<aiMesh> readPrimitive(Source& source, const Object& primitive, const PrimitiveUse& use);

} // namespace convert::gltf
