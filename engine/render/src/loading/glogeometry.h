#pragma once

#include "orv/detail/glorecords.h"
#include "orv/glo.h"
#include "orv/sharedptr.h"

#include <vector>

namespace orv
{

class AssetCachePool;
class Mesh;

namespace detail
{

/// A geometry of a scene file in the GL: a mesh for each primitive set, over one vertex buffer.
struct GloGeometry
{
    std::vector<SharedPtr<Mesh>> meshes;
    int jointCount = 0; ///< one more than the highest joint that a vertex names
};

/// @param geometry  its vertex bytes are freed after the upload.
/// @param fileName  for messages.
/// @return false, after logging, if an index is out of range or GL refuses the data.
bool makeGeometry(AssetCachePool& pool, glo::Geometry& geometry, glo::FileVersion version,
                  const char* fileName, MeshData wanted, GloGeometry& made);

} // namespace detail

} // namespace orv
