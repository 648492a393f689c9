// A picture, drawn again after its GL context was lost: the same to the last bit.
//
//   build/default/examples/09-lostcontext --out lostcontext.png

#include "canvas.h"

#include <cstdio>

using namespace orv;

/// All objects that hold assets, together, so that they can be dropped and made again.
struct Show
{
    SharedPtr<SceneNode> scene;
    SharedPtr<RenderBlock> block;

    bool start(Canvas& canvas)
    {
        canvas.context = makeShared<RenderContext>();
        canvas.renderer = makeShared<SimpleRenderer>(canvas.context, canvas.pool);
        scene = canvas.makeScene();
        const auto ball = createSphere(*canvas.pool, 32, 64, Vector2f(1.0f, 1.0f));
        if (!canvas.add(ball, scene, Colour4f(0.7f, 0.4f, 0.8f, 1.0f), {}, 2.0f))
            return false;
        const auto camera = canvas.addCamera(scene, Vector3f(0.0f, 1.0f, 5.0f), {});
        block = makeShared<RenderBlock>(canvas.renderer, scene, camera);
        block->setBackgroundColour(Colour4f(0.2f, 0.22f, 0.25f, 1.0f));
        return true;
    }
};

static bool draw(Canvas& canvas)
{
    Show show;
    if (!show.start(canvas))
        return false;
    show.block->render();
    const auto before = canvas.readPixels();
    if (!canvas.loseContext()) // from here on the new one is current
        return false;
    // [cookbook
    show = Show(); // scenes, renderers and blocks hold GL objects that are gone
    canvas.renderer = nullptr;
    canvas.context = nullptr;
    canvas.pool->forgetContext(); // makes no GL call
    if (!show.start(canvas))      // makes everything again
        return false;
    show.block->render();
    // cookbook]
    const bool isSame = canvas.readPixels() == before;
    std::printf("the picture after is %s\n", isSame ? "the same" : "another one");
    return isSame;
}

int main(int argc, char** argv)
{
    return Canvas::run(argc, argv, "09-lostcontext", draw);
}
