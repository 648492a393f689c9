#pragma once

#include "orv/assetcachepool.h"
#include "orv/detail/gloformat.h"
#include "orv/detail/glorecords.h"
#include "orv/solid.h"

#include <cstdint>
#include <map>
#include <memory>
#include <string>
#include <vector>

namespace view
{

/// The vertices of a geometry, in memory.
struct MeshVertices
{
    std::vector<orv::Vector3f> positions;
    std::vector<orv::Vector4f> joints;  ///< numbers; empty where the geometry has no skin
    std::vector<orv::Vector4f> weights; ///< as many as joints
};

/// What one primitive set of a geometry draws, as triangles; empty for points and lines.
struct MeshTriangles
{
    std::shared_ptr<const MeshVertices> vertices;
    std::vector<uint16_t> indices; ///< three a triangle, wound as they are drawn
};

MeshVertices readVertices(const orv::detail::glo::Geometry& geometry, orv::detail::glo::FileVersion version);
std::vector<uint16_t> readTriangles(const orv::detail::glo::PrimitiveSet& set, uint32_t vertexCount);

/// What the meshes of a scene hold, which themselves have given it to the GL.
class SceneMeshes
{
public:
    /// Reads a scene file once more.
    /// @param pool  into which that file, and nothing else, was loaded just now.
    void load(const std::string& path, const orv::AssetCachePool& pool);

    void add(const orv::Mesh& mesh, MeshTriangles triangles); ///< the mesh has to stay

    /// @return null for a mesh that is not known.
    const MeshTriangles* find(const orv::Mesh* mesh) const;

    /// Where a solid's vertices are in the world now, as its transform or its joints put them. Of a mesh that is not
    /// known: places all over its bounding sphere.
    void placeVertices(const orv::Solid& solid, std::vector<orv::Vector3f>& places) const;

private:
    std::map<const orv::Mesh*, MeshTriangles> m_meshes;
};

} // namespace view
