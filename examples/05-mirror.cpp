// Two cubes before a mirror, which shows their other sides.
//
//   build/default/examples/05-mirror --out mirror.png

#include "canvas.h"

using namespace orv;

static bool draw(Canvas& canvas)
{
    AssetCachePool& pool = *canvas.pool;
    registerSource(pool, SAMPLES_FOLDER "/showpiece", false);
    const auto scene = canvas.makeScene();
    const Vector2f once(1.0f, 1.0f);
    if (!canvas.add(createCube(pool, once), scene, Colour4f(0.8f, 0.2f, 0.2f, 1.0f), {-1.1f, 0.6f, 1.2f},
                    0.6f) ||
        !canvas.add(createSphere(pool, 24, 48, once), scene, Colour4f(0.2f, 0.5f, 0.9f, 1.0f),
                    {1.0f, 0.7f, 0.6f}, 1.4f))
        return false;
    // [cookbook
    // A mirror is a flat solid whose shader program binds M_MIRROR_TEXTURE, such as mirror.sp of the samples.
    const auto mirror = createSquare(pool, Vector2f(1.0f, 1.0f));
    if (!mirror)
        return false;
    mirror->setAppearance(loadAppearance(pool, "mirror.ap"));
    mirror->setScale(Vector3f(6.0f, 3.0f, 1.0f));
    mirror->setPosition(Vector3f(0.0f, 1.5f, -1.5f)); // it reflects on its +z side
    mirror->setParent(scene);
    // cookbook]
    const auto camera = canvas.addCamera(scene, Vector3f(1.5f, 2.4f, 7.5f), Vector3f(0.0f, 1.0f, 0.0f));
    RenderBlock block(canvas.renderer, scene, camera);
    block.setBackgroundColour(Colour4f(0.78f, 0.8f, 0.78f, 1.0f));
    block.render();
    return true;
}

int main(int argc, char** argv)
{
    return Canvas::run(argc, argv, "05-mirror", draw);
}
