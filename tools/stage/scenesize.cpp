#include "scenesize.h"

#include "solidvisitor.h"

#include "orv/indexbuffer.h"
#include "orv/mesh.h"

#include <algorithm>

namespace view
{

SceneSize measureScene(orv::SceneNode& scene)
{
    SceneSize size;
    forEachSolid(scene,
                 [&size](orv::Solid& solid)
                 {
                     ++size.solids;
                     if (solid.getMesh() && solid.getMesh()->getIndexBuffer())
                         size.triangles += std::max(getTriangleCount(*solid.getMesh()->getIndexBuffer()), 0);
                 });
    return size;
}

} // namespace view
