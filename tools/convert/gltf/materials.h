#pragma once

#include "textures.h"

#include <assimp/types.h>

struct aiMaterial;

namespace convert::gltf
{

/// How a picture lies on a mesh.
struct UvPlacing
{
    unsigned channel = 0; ///< of texture coordinates
    aiVector2D offset{0.0f, 0.0f};
    aiVector2D scale{1.0f, 1.0f};
    float rotation = 0.0f; ///< radians

    bool operator==(const UvPlacing& other) const;
    bool movesNothing() const;

    /// As the file has it: scales, then turns, then moves.
    /// @param uv  v going down.
    aiVector2D apply(const aiVector2D& uv) const;
};

/// A material in libassimp's terms.
struct ReadMaterial
{
    std::unique_ptr<aiMaterial> material;
    UvPlacing placing; ///< of the first picture that counts, and so of all of them
};

ReadMaterial readMaterial(Source& source, Textures& textures, const Object& material);

} // namespace convert::gltf
