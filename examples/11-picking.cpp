// Picking: a ray through a pixel, and a box around the nearest solid that it hits.
//
//   build/default/examples/11-picking --out picking.png

#include "canvas.h"

#include <algorithm>
#include <cmath>
#include <cstdio>

using namespace orv;

// [cookbook
/// A ray from the eye through a pixel. @param x,y  from the upper left.
static Ray makeRay(const Camera& camera, float x, float y, int width, int height)
{
    // The field of view spans the shorter side, here at a distance of 1.
    const float pixel =
        2.0f * std::tan(camera.getFieldOfView().radians() * 0.5f) / float(std::min(width, height));
    const Vector3f direction((x - float(width) * 0.5f) * pixel, (float(height) * 0.5f - y) * pixel, -1.0f);
    return transform(Ray{Vector3f(), normalize(direction)}, camera.getWorldTransform());
}
// cookbook]

static bool draw(Canvas& canvas)
{
    AssetCachePool& pool = *canvas.pool;
    registerSource(pool, SCENES_FOLDER, false);
    const auto scene = canvas.makeScene();
    const auto model = loadGloFile(pool, scene, "windmill.glo", MeshData::GEOMETRY);
    if (!model)
        return false;
    const auto camera = canvas.addCamera(scene, Vector3f(3.5f, 2.6f, 7.0f), Vector3f(0.0f, 1.7f, 0.0f));
    RenderBlock block(canvas.renderer, scene, camera);
    block.setBackgroundColour(Colour4f(0.62f, 0.74f, 0.85f, 1.0f));
    block.render();
    const auto lines = makeShared<DebugLines>(pool);
    // [cookbook
    // the model was loaded with MeshData::GEOMETRY
    const Ray ray = makeRay(*camera, 190.0f, 60.0f, canvas.getWidth(), canvas.getHeight());
    const auto hits = pick(*scene, ray); // the nearest first
    if (hits.empty())
        return false;
    std::printf("%s, %.2f away\n", hits[0].solid->getName(), double(hits[0].distance));
    const Box box = getWorldBounds(*hits[0].solid).box;
    lines->addBox(box.lowest, box.highest, Matrix4f::IDENTITY, Colour4f::RED);
    lines->draw(*canvas.context, *camera);
    // cookbook]
    return true;
}

int main(int argc, char** argv)
{
    return Canvas::run(argc, argv, "11-picking", draw);
}
