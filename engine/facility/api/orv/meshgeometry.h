#pragma once

#include "orv/export.h"
#include "orv/shared.h"
#include "orv/sharedptr.h"
#include "orv/vector.h"

#include <cstddef>
#include <cstdint>
#include <vector>

namespace orv
{

class Mesh;

/// The vertices of meshes in memory, for those who ask where they are: GL does not give them back.
class ORV_API MeshVertices : public Shared
{
public:
    ORV_CLASS_NAME("MeshVertices")
    using Ptr = SharedPtr<MeshVertices>;

    /// What moves a vertex: up to four joints, by their numbers, and their shares, which add up to 1.
    struct Influence
    {
        uint8_t joints[4] = {0, 0, 0, 0};
        float weights[4] = {1.0f, 0.0f, 0.0f, 0.0f};
    };

    std::vector<Vector3f> places;      ///< in the mesh's own space
    std::vector<Influence> influences; ///< as many as places, or none for meshes without joints
};

/// Shares as the built-in programs make them of weights: that add up to 1 or, where the weights do not add up to more than
/// 0, with all for the first joint. Joint numbers beyond 255 become that.
/// @param joints  numbers; the nearest whole ones count.
ORV_API MeshVertices::Influence makeInfluence(const Vector4f& joints, const Vector4f& weights);

/// Sets the bounds of a mesh and of its joints to those of vertices that it draws.
/// @param indices  which; null for all. Each has to be one of a vertex.
ORV_API void setBounds(Mesh& mesh, const MeshVertices& vertices, const unsigned short* indices,
                       std::size_t count);

} // namespace orv
