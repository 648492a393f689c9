// A transparent ball before two others.
//
//   build/default/examples/12-glass --out glass.png

#include "canvas.h"

using namespace orv;

static bool draw(Canvas& canvas)
{
    AssetCachePool& pool = *canvas.pool;
    const auto scene = canvas.makeScene();
    const auto makeBall = [&] { return createSphere(pool, 32, 64, Vector2f(1.0f, 1.0f)); };
    if (!canvas.add(makeBall(), scene, Colour4f(0.85f, 0.3f, 0.2f, 1.0f), {-1.2f, 0.0f, -1.0f}, 1.4f) ||
        !canvas.add(makeBall(), scene, Colour4f(0.9f, 0.75f, 0.2f, 1.0f), {1.2f, 0.0f, -1.0f}, 1.4f))
        return false;
    const auto ball =
        canvas.add(makeBall(), scene, Colour4f(0.3f, 0.7f, 0.8f, 1.0f), {0.0f, 0.0f, 1.0f}, 2.0f);
    if (!ball)
        return false;
    // [cookbook
    // An appearance blends if its blend factors differ from the defaults. Blended solids are drawn after all
    // others, farthest first.
    Appearance& glass = *ball->getAppearance();
    glass.setBlendFactors(BlendFactor::SRC_ALPHA, BlendFactor::SRC_ALPHA, BlendFactor::ONE_MINUS_SRC_ALPHA,
                          BlendFactor::ONE_MINUS_SRC_ALPHA);
    glass.setDepthWriteEnabled(false); // does not hide glass behind it
    glass.setProperty("M_OPACITY", 0.4f);
    glass.setProperty("M_SPECULAR_COLOUR", Vector4f(1.0f, 1.0f, 1.0f, 1.0f));
    glass.setProperty("M_SHININESS", 60.0f);
    // cookbook]
    const auto camera = canvas.addCamera(scene, Vector3f(0.0f, 0.8f, 6.0f), {});
    RenderBlock block(canvas.renderer, scene, camera);
    block.setBackgroundColour(Colour4f(0.93f, 0.93f, 0.9f, 1.0f));
    block.render();
    return true;
}

int main(int argc, char** argv)
{
    return Canvas::run(argc, argv, "12-glass", draw);
}
