// Three cubes; the middle one is hidden, together with the ball on it.
//
//   build/default/examples/02-hide --out hide.png

#include "canvas.h"

using namespace orv;

static bool draw(Canvas& canvas)
{
    const auto scene = canvas.makeScene();
    SharedPtr<Solid> cubes[3];
    for (int i = 0; i < 3; ++i)
    {
        const Colour4f colour = i == 0 ? Colour4f::RED : i == 1 ? Colour4f::GREEN : Colour4f::BLUE;
        cubes[i] = canvas.add(createCube(*canvas.pool, Vector2f(1.0f, 1.0f)), scene, colour,
                              Vector3f(float(i - 1) * 2.6f, 0.0f, 0.0f), 0.8f);
        const auto ball = createSphere(*canvas.pool, 24, 48, Vector2f(1.0f, 1.0f));
        if (!canvas.add(ball, cubes[i], Colour4f::WHITE, Vector3f(0.0f, 1.5f, 0.0f)))
            return false;
    }
    const auto camera = canvas.addCamera(scene, Vector3f(0.0f, 2.5f, 8.0f), Vector3f(0.0f, 0.5f, 0.0f));
    RenderBlock block(canvas.renderer, scene, camera);
    block.setBackgroundColour(Colour4f(0.9f, 0.9f, 0.88f, 1.0f));
    // [cookbook
    block.setRenderFlags(SceneNode::VISIBLE); // once: this block leaves out what is hidden
    cubes[1]->setVisible(false);              // and everything below it; true shows it again
    block.render();
    // cookbook]
    return true;
}

int main(int argc, char** argv)
{
    return Canvas::run(argc, argv, "02-hide", draw);
}
