#pragma once

#include "orv/detail/gloreader.h"
#include "orv/glo.h"
#include "orv/mesh.h"
#include "orv/sharedptr.h"

#include <map>
#include <string>
#include <vector>

namespace orv
{

class AssetCachePool;

namespace detail
{

/// A geometry of a scene file in the GL: a mesh for each primitive set, over one vertex buffer.
struct GloGeometry
{
    std::vector<SharedPtr<Mesh>> meshes;
    int jointCount = 0; ///< one more than the highest joint that a vertex names
};

/// Gives the geometries of a scene file to the GL while the file is read. So a load needs memory for the largest of them
/// only, and the processor's caches still hold what it uploads.
class GloGeometries final : public GeometryReceiver
{
public:
    /// @param fileName  for messages; borrowed.
    GloGeometries(AssetCachePool& pool, MeshData wanted, const char* fileName);

    /// @param geometry  its vertex bytes are freed after the upload.
    /// @return false, after logging, if an index is out of range or GL refuses the data.
    bool receive(glo::Geometry& geometry, glo::FileVersion version) override;

    /// @return the first of that name, null if there is none.
    const GloGeometry* find(const std::string& name) const;

private:
    bool make(glo::Geometry& geometry, glo::FileVersion version, GloGeometry& made);

    AssetCachePool& m_pool;
    MeshData m_wanted;
    const char* m_fileName;
    std::map<std::string, GloGeometry> m_geometries;
};

} // namespace detail

} // namespace orv
