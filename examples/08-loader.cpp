// Textures without files: a loader of one's own makes chequers of any number of fields.
//
//   build/default/examples/08-loader --out loader.png

#include "canvas.h"

#include <cstdlib>
#include <cstring>
#include <vector>

using namespace orv;

// [cookbook
/// "chequers:8" is a texture of 8 x 8 fields.
class ChequerLoader : public AssetLoader<Texture2D>
{
public:
    bool isKnown(const char* name) override { return std::strncmp(name, "chequers:", 9) == 0; }

    SharedPtr<Texture2D> load(AssetCache<Texture2D>& cache, const char* name) override
    {
        const int fields = isKnown(name) ? std::atoi(name + 9) : 0;
        if (fields < 1 || fields > 64)
            return nullptr; // other loaders are asked
        std::vector<unsigned char> pixels;
        for (int i = 0; i < 64 * 64; ++i)
            pixels.push_back((i % 64 * fields / 64 + i / 64 * fields / 64) % 2 ? 255 : 90);
        return static_cast<Texture2DCache&>(cache).create(64, 64, Texture::Format::LUMINANCE,
                                                          Texture::Type::UNSIGNED_BYTE, pixels.data(), name);
    }
};
// cookbook]

static bool draw(Canvas& canvas)
{
    AssetCachePool& pool = *canvas.pool;
    const auto scene = canvas.makeScene();
    const auto cube =
        canvas.add(createCube(pool, Vector2f(1.0f, 1.0f)), scene, Colour4f(1.0f, 0.85f, 0.5f, 1.0f), {});
    if (!cube)
        return false;
    // [cookbook
    pool.getTexture2DCache()->registerLoader(makeShared<ChequerLoader>());
    const auto texture = pool.getTexture2DCache()->get("chequers:8"); // .ap files can use this name too
    // cookbook]
    if (!texture)
        return false;
    cube->getAppearance()->setProperty("M_DIFFUSE_TEXTURE", texture);
    const auto camera = canvas.addCamera(scene, Vector3f(2.6f, 2.2f, 4.0f), {});
    RenderBlock block(canvas.renderer, scene, camera);
    block.setBackgroundColour(Colour4f(0.35f, 0.4f, 0.5f, 1.0f));
    block.render();
    return true;
}

int main(int argc, char** argv)
{
    return Canvas::run(argc, argv, "08-loader", draw);
}
