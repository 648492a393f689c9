#pragma once

#include "textures.h"

#include <assimp/types.h>

struct aiMaterial;

namespace convert::gltf
{

/// A texture transform.
struct UvPlacing
{
    unsigned channel = 0; ///< of texture coordinates
    aiVector2D offset{0.0f, 0.0f};
    aiVector2D scale{1.0f, 1.0f};
    float rotation = 0.0f; ///< radians

    bool operator==(const UvPlacing& other) const;
    bool movesNothing() const;

    /// As in the file: scales, then rotates, then moves.
    /// @param uv  with v down.
    aiVector2D apply(const aiVector2D& uv) const;
};

/// A material in libassimp's terms.
struct ReadMaterial
{
    std::unique_ptr<aiMaterial> material;
    UvPlacing placing; ///< of the first relevant picture, used for all
};

ReadMaterial readMaterial(Source& source, Textures& textures, const Object& material);

} // namespace convert::gltf
