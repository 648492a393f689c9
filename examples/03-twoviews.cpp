// One scene twice: through a camera, and from above in a corner.
//
//   build/default/examples/03-twoviews --out twoviews.png

#include "canvas.h"

using namespace orv;

static bool draw(Canvas& canvas)
{
    const auto scene = canvas.makeScene();
    for (int i = 0; i < 9; ++i)
    {
        const Vector3f place(float(i % 3 - 1) * 2.0f, 0.0f, float(i / 3 - 1) * 2.0f);
        const Colour4f colour(0.3f + float(i % 3) * 0.3f, 0.5f, 0.3f + float(i / 3) * 0.3f, 1.0f);
        if (!canvas.add(createCube(*canvas.pool, Vector2f(1.0f, 1.0f)), scene, colour, place, 0.5f))
            return false;
    }
    const auto camera = canvas.addCamera(scene, Vector3f(3.0f, 3.0f, 8.0f), Vector3f(-1.2f, 0.0f, 0.0f));
    const auto mapCamera = canvas.addCamera(scene, Vector3f(0.0f, 10.0f, 0.01f), Vector3f(0.0f, 0.0f, 0.0f));
    // [cookbook
    RenderBlock block(canvas.renderer, scene, camera);
    block.setBackgroundColour(Colour4f(0.85f, 0.88f, 0.9f, 1.0f));
    RenderBlock map(canvas.renderer, scene, mapCamera);
    map.setViewport(10, 10, 120, 90); // pixels, from the lower left
    map.setBackgroundColour(Colour4f(0.2f, 0.25f, 0.3f, 1.0f));
    map.getBackground().setViewportOnly(true); // otherwise it would clear the large view

    block.render(); // each frame
    map.render();
    // cookbook]
    return true;
}

int main(int argc, char** argv)
{
    return Canvas::run(argc, argv, "03-twoviews", draw);
}
