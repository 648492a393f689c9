#pragma once

#include "skins.h"
#include "source.h"

#include "materials.h"

#include <assimp/mesh.h>

#include <memory>

namespace convert::gltf
{

/// What a primitive is to become.
struct PrimitiveUse
{
    std::string name;           ///< of the mesh
    std::vector<float> weights; ///< of the morph targets; those that are missing are 0
    UvPlacing placing;          ///< of the material's pictures
    const Skin* skin = nullptr; ///< null: none
    bool isMoving = false;      ///< other shapes are other meshes, so that none are lost
};

/// Reads one primitive of a mesh: only vertices that it uses, in the shape that the weights of its morph targets give.
/// @return null if there is nothing to draw in it (reported).
std::unique_ptr<aiMesh> readPrimitive(Source& source, const Object& primitive, const PrimitiveUse& use);

} // namespace convert::gltf
