// A scene drawn into a texture that is shown on the sides of a cube.
//
//   build/default/examples/04-texture --out texture.png

#include "canvas.h"

using namespace orv;

static bool draw(Canvas& canvas)
{
    AssetCachePool& pool = *canvas.pool;
    const auto inner = canvas.makeScene();
    if (!canvas.add(createSphere(pool, 24, 48, Vector2f(1.0f, 1.0f)), inner, Colour4f(1.0f, 0.6f, 0.1f, 1.0f),
                    {}, 2.0f))
        return false;
    const auto innerCamera = canvas.addCamera(inner, Vector3f(0.0f, 0.0f, 4.0f), {});
    const auto scene = canvas.makeScene();
    const auto cube = canvas.add(createCube(pool, Vector2f(1.0f, 1.0f)), scene, Colour4f::WHITE, {});
    if (!cube)
        return false;
    const auto camera = canvas.addCamera(scene, Vector3f(3.2f, 2.4f, 4.0f), {});
    RenderBlock block(canvas.renderer, scene, camera); // uses the current viewport, that of the surface
    block.setBackgroundColour(Colour4f(0.88f, 0.88f, 0.85f, 1.0f));
    // [cookbook
    const auto picture = pool.getTexture2DCache()->create(256, 256, Texture::Format::RGB,
                                                          Texture::Type::UNSIGNED_BYTE, nullptr, "picture");
    const auto target =
        makeShared<RenderTarget>(picture, nullptr, true, false); // with depth, without stencil
    if (!picture || !target->isComplete())
        return false;                                     // the log says why
    picture->setMinFilter(Texture2D::FilterMode::LINEAR); // mipmaps are not updated
    cube->getAppearance()->setProperty("M_DIFFUSE_TEXTURE", picture);

    RenderBlock into(canvas.renderer, inner, innerCamera);
    into.setRenderTarget(target); // fills it; no viewport is needed
    into.setBackgroundColour(Colour4f(0.1f, 0.3f, 0.5f, 1.0f));
    into.render(); // each frame, or when the picture changes; before the block that shows it
    block.render();
    // cookbook]
    return true;
}

int main(int argc, char** argv)
{
    return Canvas::run(argc, argv, "04-texture", draw);
}
