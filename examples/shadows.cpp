// Shadows: a figure that walks past a fence in the light of a spot, in four poses. The fence is a cut-out, a sheet with
// holes.
//
//   build/default/examples/shadows --out shadows.png

#include "headless/headless.h"
#include "headless/png.h"

#include <orv/orv.h>

#include <cmath>
#include <cstdio>
#include <cstring>
#include <string>
#include <vector>

using namespace orv;

namespace
{

constexpr int WIDTH = 480; // of one of four pictures
constexpr int HEIGHT = 300;

SharedPtr<Appearance> makeMaterial(AssetCachePool& pool, const char* program, const Vector4f& colour)
{
    const auto material = makeShared<Appearance>();
    material->setShaderProgram(pool.getShaderProgramCache()->get(program));
    material->setProperty("M_DIFFUSE_COLOUR", colour);
    material->setProperty("M_AMBIENT_COLOUR", colour);
    return material;
}

/// A box that hangs from a joint, or stands on it.
SharedPtr<SceneNode> addLimb(AssetCachePool& pool, const SharedPtr<Appearance>& material,
                             const SharedPtr<SceneNode>& parent, const Vector3f& place, const Vector3f& half,
                             float boxHeight)
{
    const auto joint = makeShared<SceneNode>();
    joint->setPosition(place);
    joint->setParent(parent);
    const SharedPtr<Solid> box = createCube(pool, Vector2f(1.0f, 1.0f));
    box->setAppearance(material);
    box->setScale(half);
    box->setPosition(Vector3f(0.0f, boxHeight, 0.0f));
    box->setParent(joint);
    return joint;
}

struct Figure
{
    SharedPtr<SceneNode> hip;
    SharedPtr<SceneNode> limbs[4]; ///< left leg, right leg, left arm, right arm
};

Figure makeFigure(AssetCachePool& pool, const SharedPtr<SceneNode>& scene)
{
    const auto material =
        makeMaterial(pool, "orv#max_ppl.sp$DIFF$SPEC$AMBI", Vector4f(0.8f, 0.5f, 0.3f, 1.0f));
    material->setProperty("M_SPECULAR_COLOUR", Vector4f(0.2f, 0.2f, 0.2f, 1.0f));
    Figure figure;
    figure.hip = addLimb(pool, material, scene, {}, {0.22f, 0.3f, 0.13f}, 0.35f);
    const auto add = [&](const Vector3f& place, const Vector3f& half, float boxHeight)
    { return addLimb(pool, material, figure.hip, place, half, boxHeight); };
    figure.limbs[0] = add({-0.13f, 0.0f, 0.0f}, {0.08f, 0.45f, 0.09f}, -0.5f);
    figure.limbs[1] = add({0.13f, 0.0f, 0.0f}, {0.08f, 0.45f, 0.09f}, -0.5f);
    figure.limbs[2] = add({-0.32f, 0.6f, 0.0f}, {0.06f, 0.35f, 0.07f}, -0.3f);
    figure.limbs[3] = add({0.32f, 0.6f, 0.0f}, {0.06f, 0.35f, 0.07f}, -0.3f);
    add({0.0f, 0.75f, 0.0f}, {0.14f, 0.16f, 0.14f}, 0.15f);
    return figure;
}

/// @param time  seconds; two steps in each.
void walk(Figure& figure, float time)
{
    figure.hip->setPosition(Vector3f(-1.3f + time * 1.5f, 0.97f, 0.5f));
    figure.hip->setRotation(quaternionFromAxisAngle(Vector3f::Y_AXIS, Anglef::fromDegrees(90.0f)));
    for (int i = 0; i < 4; ++i)
    {
        const float side = i == 0 || i == 3 ? 1.0f : -1.0f;
        const float angle = side * 32.0f * std::sin(time * 6.2832f);
        figure.limbs[i]->setRotation(quaternionFromAxisAngle(Vector3f::X_AXIS, Anglef::fromDegrees(angle)));
    }
}

/// A lattice of bars: holes where its picture has alpha 0.
void addFence(AssetCachePool& pool, const SharedPtr<SceneNode>& scene)
{
    constexpr int SIDE = 32;
    std::vector<unsigned char> texels(SIDE * SIDE * 4, 255);
    for (int i = 0; i < SIDE * SIDE; ++i)
        texels[size_t(i) * 4 + 3] = i % SIDE % 16 < 4 || i / SIDE % 16 < 4 ? 255 : 0;
    const auto material =
        makeMaterial(pool, "orv#max_ppl.sp$DIFF$AMBI$CUTOFF", Vector4f(0.35f, 0.4f, 0.35f, 1.0f));
    material->setProperty("M_DIFFUSE_TEXTURE", pool.getTexture2DCache()->create(
                                                   SIDE, SIDE, Texture::Format::RGBA,
                                                   Texture::Type::UNSIGNED_BYTE, texels.data(), nullptr));
    material->setCullingMode(CullingMode::CULL_NONE);
    const SharedPtr<Solid> fence = createSquare(pool, Vector2f(6.0f, 2.0f));
    fence->setAppearance(material);
    fence->setPosition(Vector3f(0.6f, 0.6f, 1.5f));
    fence->setScale(Vector3f(3.6f, 1.2f, 1.0f));
    fence->setParent(scene);
}

SharedPtr<SceneNode> makeScene(AssetCachePool& pool)
{
    const auto scene = makeShared<SceneNode>("scene");
    const SharedPtr<Solid> ground = createCube(pool, Vector2f(1.0f, 1.0f));
    ground->setAppearance(makeMaterial(pool, "orv#max_ppl.sp$DIFF$AMBI", Vector4f(0.75f, 0.75f, 0.7f, 1.0f)));
    ground->setScale(Vector3f(6.0f, 0.1f, 6.0f));
    ground->setPosition(Vector3f(0.0f, -0.1f, 0.0f));
    ground->setParent(scene);
    addFence(pool, scene);

    const auto spot = makeShared<Light>("spot");
    spot->setLightType(Light::LightType::SPOT);
    spot->setAmbientLevel(0.25f);
    spot->setSpotInnerAngle(Anglef::fromDegrees(34.0f));
    spot->setSpotOuterAngle(Anglef::fromDegrees(48.0f));
    spot->setPosition(Vector3f(2.2f, 4.6f, 5.2f));
    spot->setParent(scene);
    point(*spot, Vector3f(0.2f, 0.4f, 0.2f));
    return scene;
}

void draw(const SharedPtr<RenderContext>& context, const SharedPtr<AssetCachePool>& pool)
{
    const SharedPtr<SceneNode> scene = makeScene(*pool);
    Figure figure = makeFigure(*pool, scene);
    const auto camera = makeShared<Camera>("camera");
    camera->setFieldOfView(Anglef::fromDegrees(30.0f));
    camera->setPosition(Vector3f(-2.5f, 3.0f, 7.5f));
    point(*camera, Vector3f(0.2f, 0.5f, 0.2f));

    RenderBlock block(makeShared<SimpleRenderer>(context, pool), scene, camera);
    block.setBackgroundColour(Colour4f(0.09f, 0.1f, 0.13f, 1.0f));
    block.getBackground().setViewportOnly(true);
    const auto shadows = makeShared<ShadowMap>(context, pool);
    shadows->attach(*scene);
    for (int i = 0; i < 4; ++i)
    {
        walk(figure, float(i) * 0.42f);
        shadows->render(*scene, camera.get());
        block.setViewport(i % 2 * WIDTH, (1 - i / 2) * HEIGHT, WIDTH, HEIGHT);
        block.render();
    }
}

} // namespace

int main(int argc, char** argv)
{
    orv::setLogLevel(orv::LogLevel::WARNING);
    const std::string path = argc == 3 && !std::strcmp(argv[1], "--out") ? argv[2] : "";
    if (path.empty())
    {
        std::fprintf(stderr, "usage: shadows --out shadows.png\n");
        return 2;
    }
    headless::Options options;
    options.width = 2 * WIDTH;
    options.height = 2 * HEIGHT;
    options.samples = 4;
    std::string error;
    const auto gl = headless::Context::create(options, error);
    if (!gl)
    {
        std::fprintf(stderr, "%s\n", error.c_str());
        return 1;
    }
    const auto pool = makeShared<AssetCachePool>();
    draw(makeShared<RenderContext>(), pool);
    pool->flush();
    pool->flush();
    if (!headless::writePng(path, options.width, options.height, gl->readPixels().data(), error))
    {
        std::fprintf(stderr, "%s\n", error.c_str());
        return 1;
    }
    std::printf("wrote %s\n", path.c_str());
    return 0;
}
