// Waves that run over a ball, by a shader program of one's own: samples/ripple.
//
//   build/default/examples/07-shader --out shader.png

#include "canvas.h"

using namespace orv;

static bool draw(Canvas& canvas)
{
    AssetCachePool& pool = *canvas.pool;
    const auto scene = canvas.makeScene();
    const auto camera = canvas.addCamera(scene, Vector3f(0.0f, 0.6f, 4.0f), {});
    RenderBlock block(canvas.renderer, scene, camera);
    block.setBackgroundColour(Colour4f(0.93f, 0.92f, 0.88f, 1.0f));
    // [cookbook
    registerSource(pool, SAMPLES_FOLDER "/ripple", false); // ripple.ap, ripple.sp, ripple.vert, ripple.frag
    const auto ball = createSphere(pool, 64, 128, Vector2f(1.0f, 1.0f));
    const auto ripple = loadAppearance(pool, "ripple.ap");
    if (!ball || !ripple->getShaderProgram())
        return false;                                                           // the log says why
    ripple->setProperty("M_RIPPLE_COLOUR", Vector4f(0.2f, 0.65f, 0.85f, 1.0f)); // bound in ripple.sp
    ball->setAppearance(ripple);
    // cookbook]
    ball->setRotation(quaternionFromAxisAngle(Vector3f::Y_AXIS, Anglef::fromDegrees(-90.0f)));
    ball->setScale(Vector3f(2.2f, 2.2f, 2.2f));
    ball->setParent(scene);
    // [cookbook
    block.update(0.4f); // each frame: TIME in the shaders, in seconds
    block.render();
    // cookbook]
    return true;
}

int main(int argc, char** argv)
{
    return Canvas::run(argc, argv, "07-shader", draw);
}
