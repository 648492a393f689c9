#pragma once

namespace orv
{
class SceneNode;
}

namespace view
{

struct SceneSize
{
    int solids = 0;
    long triangles = 0; ///< of each solid's mesh, whether or not it is in view
};

SceneSize measureScene(orv::SceneNode& scene);

} // namespace view
