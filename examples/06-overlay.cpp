// Text over a frame: a title in the middle, figures at the sides.
//
//   build/default/examples/06-overlay --out overlay.png        (package fonts-dejavu-core)

#include "canvas.h"

using namespace orv;

static bool draw(Canvas& canvas)
{
    AssetCachePool& pool = *canvas.pool;
    const auto scene = canvas.makeScene();
    if (!canvas.add(createSphere(pool, 32, 64, Vector2f(1.0f, 1.0f)), scene, Colour4f(0.3f, 0.6f, 0.3f, 1.0f),
                    {}, 2.4f))
        return false;
    const auto camera = canvas.addCamera(scene, Vector3f(0.0f, 0.5f, 5.0f), {});
    RenderBlock block(canvas.renderer, scene, camera);
    block.setBackgroundColour(Colour4f(0.1f, 0.12f, 0.2f, 1.0f));
    const float right = float(canvas.getWidth()) - 12.0f;
    // [cookbook
    registerSource(pool, "/usr/share/fonts/truetype/dejavu", false);
    const auto font = get(*pool.getFontCache(), "DejaVuSans.ttf", 24); // pixels a line
    if (!font)
        return false; // the log says why
    Text text(pool, font, Colour4f::WHITE);
    text.add("Score\n1200", 12.0f, 10.0f); // pixels from the upper left
    text.add("Level 3", right, 10.0f, Text::Alignment::RIGHT);

    block.render();
    text.draw(*canvas.context); // one GL draw; text.clear() before other words
    // cookbook]
    return true;
}

int main(int argc, char** argv)
{
    return Canvas::run(argc, argv, "06-overlay", draw);
}
