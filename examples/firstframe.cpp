// A first frame: a lit cube, a camera and a light, drawn without a window and written as a picture.
//
//   build/default/examples/firstframe firstframe.png

#include "headless/headless.h"
#include "headless/png.h"

#include <orv/orv.h>

#include <cstdio>

namespace
{

/// Draws to the current GL context; what it makes is gone again when it returns.
bool draw(const orv::SharedPtr<orv::AssetCachePool>& pool, int width, int height)
{
    const auto context = orv::makeShared<orv::RenderContext>();
    const auto renderer = orv::makeShared<orv::SimpleRenderer>(context, pool);

    const auto scene = orv::makeShared<orv::SceneNode>("scene");
    const orv::SharedPtr<orv::Solid> cube = orv::createCube(*pool, orv::Vector2f(1.0f, 1.0f));
    if (!cube)
        return false; // the log says why
    cube->setAppearance(orv::loadAppearance(*pool, "orv#default_pvl.ap"));
    cube->setParent(scene, false);

    const auto light = orv::makeShared<orv::Light>("lamp");
    light->setPosition(orv::Vector3f(2.0f, 5.0f, 4.0f));
    light->setParent(scene, false);

    const auto camera = orv::makeShared<orv::Camera>("camera");
    camera->setPosition(orv::Vector3f(3.0f, 2.5f, 4.0f));
    camera->setParent(scene, false);
    orv::point(*camera, orv::Vector3f(0.0f, 0.0f, 0.0f));

    const auto block = orv::makeShared<orv::RenderBlock>(renderer, scene, camera);
    block->setViewport(0, 0, width, height);
    block->setBackgroundColour(orv::Colour4f(0.15f, 0.2f, 0.3f, 1.0f));
    block->render();
    return true;
}

} // namespace

int main(int argc, char** argv)
{
    // The engine owns no window: it draws with whatever GL context is current. This one has no window at all.
    headless::Options options;
    options.width = 400;
    options.height = 300;
    std::string error;
    const auto gl = headless::Context::create(options, error);
    if (!gl)
    {
        std::fprintf(stderr, "no GL context: %s\n", error.c_str());
        return 1;
    }

    const auto pool = orv::makeShared<orv::AssetCachePool>();
    const bool drawn = draw(pool, options.width, options.height);

    // Nothing uses the assets any more: the first flush drops them, the second what they were made of.
    pool->flush();
    pool->flush();
    if (!drawn)
        return 1;

    const char* path = argc > 1 ? argv[1] : "firstframe.png";
    if (!headless::writePng(path, options.width, options.height, gl->readPixels().data(), error))
    {
        std::fprintf(stderr, "%s\n", error.c_str());
        return 1;
    }
    std::printf("wrote %s\n", path);
    return 0;
}
