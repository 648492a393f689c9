// Smooth motion: one figure at ten times of a second, from left to right, in three rows.
//
// Its walk has three keys. The upper row plays them as they are, in steps; the middle row interpolates between them; in the
// lower row a second controller, limited to one arm, fades in and waves. Lines show the node hierarchy.
//
//   build/default/examples/smoothmotion --out figures.png

#include "headless/headless.h"
#include "headless/png.h"

#include <orv/orv.h>

#include <cstdio>
#include <cstring>
#include <map>
#include <string>

using namespace orv;

namespace
{

constexpr int MOMENTS = 10;
constexpr int WIDTH = 120; // of one picture, in pixels
constexpr int HEIGHT = 200;

/// A joint with a box that hangs from it, or stands on it.
SharedPtr<SceneNode> addLimb(AssetCachePool& pool, const SharedPtr<SceneNode>& parent, const char* name,
                             const Vector3f& place, const Vector3f& halfSize, float boxHeight)
{
    const auto joint = makeShared<SceneNode>(name);
    joint->setPosition(place);
    joint->setParent(parent);
    const SharedPtr<Solid> box = createCube(pool, Vector2f(1.0f, 1.0f));
    box->setScale(halfSize);
    box->setPosition(Vector3f(0.0f, boxHeight, 0.0f));
    box->setParent(joint);
    return joint;
}

std::map<std::string, SharedPtr<SceneNode>> makeFigure(AssetCachePool& pool,
                                                       const SharedPtr<SceneNode>& scene)
{
    std::map<std::string, SharedPtr<SceneNode>> limbs;
    const auto hip = addLimb(pool, scene, "hip", {0.0f, 1.0f, 0.0f}, {0.22f, 0.3f, 0.13f}, 0.35f);
    limbs["left leg"] = addLimb(pool, hip, "left leg", {-0.13f, 0, 0}, {0.08f, 0.45f, 0.09f}, -0.5f);
    limbs["right leg"] = addLimb(pool, hip, "right leg", {0.13f, 0, 0}, {0.08f, 0.45f, 0.09f}, -0.5f);
    limbs["left arm"] = addLimb(pool, hip, "left arm", {-0.32f, 0.6f, 0}, {0.06f, 0.35f, 0.07f}, -0.3f);
    limbs["right arm"] = addLimb(pool, hip, "right arm", {0.32f, 0.6f, 0}, {0.06f, 0.35f, 0.07f}, -0.3f);
    addLimb(pool, hip, "head", {0.0f, 0.75f, 0.0f}, {0.14f, 0.16f, 0.14f}, 0.15f);
    return limbs;
}

/// Swings a limb from one angle to another and back, in degrees.
void addSwing(AnimationGroup& group, const SharedPtr<SceneNode>& limb, const Vector3f& axis, float from,
              float to)
{
    std::vector<AnimationKey<Vector4f>> keys;
    for (int i = 0; i < 3; ++i)
        keys.push_back({float(i) * 0.5f, Vector4f(axis, Anglef::fromDegrees(i == 1 ? to : from).radians())});
    group.addAnimation(createAnimationChannel<Vector4f>(makeShared<AnimationKeySequence<Vector4f>>(keys),
                                                        makeShared<SceneNodeRotationAnimator>(limb)));
}

void drawRow(int row, const SharedPtr<RenderContext>& context, const SharedPtr<AssetCachePool>& pool)
{
    const auto scene = makeShared<SceneNode>("scene");
    auto limbs = makeFigure(*pool, scene);
    const SceneNode* const hip = limbs["left leg"]->getParent();
    const auto light = makeShared<Light>("sun");
    light->setLightType(Light::LightType::DIRECTIONAL);
    light->setAmbientLevel(0.4f);
    light->setPosition(Vector3f(3.0f, 2.0f, 2.0f));
    light->setParent(scene);
    point(*light, Vector3f());
    const auto camera = makeShared<Camera>("camera");
    camera->setFieldOfView(Anglef::fromDegrees(18.0f));
    camera->setPosition(Vector3f(4.0f, 1.9f, 3.6f));
    camera->setParent(scene);
    point(*camera, Vector3f(0.0f, 1.0f, 0.0f));

    const auto walk = makeShared<AnimationGroup>();
    addSwing(*walk, limbs["left leg"], Vector3f::X_AXIS, 35.0f, -35.0f);
    addSwing(*walk, limbs["right leg"], Vector3f::X_AXIS, -35.0f, 35.0f);
    addSwing(*walk, limbs["left arm"], Vector3f::X_AXIS, -25.0f, 25.0f);
    addSwing(*walk, limbs["right arm"], Vector3f::X_AXIS, 25.0f, -25.0f);
    const auto wave = makeShared<AnimationGroup>(); // of the whole figure
    for (const auto& limb : limbs)
        addSwing(*wave, limb.second, Vector3f::Z_AXIS, 130.0f, 165.0f);

    AnimationController walking(walk);
    walking.setInterpolated(row > 0);
    AnimationController waving(wave);
    waving.setInterpolated(true);
    waving.setSubtree(limbs["right arm"]);
    waving.setWeight(0.0f);
    if (row == 2)
        waving.fadeWeight(1.0f, 0.4f);

    RenderBlock block(makeShared<SimpleRenderer>(context, pool), scene, camera);
    block.setBackgroundColour(Colour4f(0.84f, 0.86f, 0.89f, 1.0f));
    block.getBackground().setViewportOnly(true);
    const auto lines = makeShared<DebugLines>(*pool);
    lines->setDepthTested(false);
    for (int i = 0; i < MOMENTS; ++i)
    {
        walking.update(i > 0 ? 1.0f / MOMENTS : 0.0f);
        waving.update(i > 0 ? 1.0f / MOMENTS : 0.0f); // after the controller below it
        block.setViewport(i * WIDTH, (2 - row) * HEIGHT, WIDTH, HEIGHT);
        block.render();
        lines->clear();
        lines->addSkeleton(*hip, Colour4f(0.1f, 0.4f, 0.8f, 0.5f));
        lines->draw(*context, *camera);
    }
}

} // namespace

int main(int argc, char** argv)
{
    const std::string path = argc == 3 && !std::strcmp(argv[1], "--out") ? argv[2] : "";
    if (path.empty())
    {
        std::fprintf(stderr, "usage: smoothmotion --out figures.png\n");
        return 2;
    }
    headless::Options options;
    options.width = MOMENTS * WIDTH;
    options.height = 3 * HEIGHT;
    options.samples = 4;
    std::string error;
    const auto gl = headless::Context::create(options, error);
    if (!gl)
    {
        std::fprintf(stderr, "%s\n", error.c_str());
        return 1;
    }
    const auto pool = makeShared<AssetCachePool>();
    const auto context = makeShared<RenderContext>();
    for (int row = 0; row < 3; ++row)
        drawRow(row, context, pool);
    const auto pixels = gl->readPixels();
    pool->release(); // the GL objects go with the context, which ends with the program
    if (!headless::writePng(path, options.width, options.height, pixels.data(), error))
    {
        std::fprintf(stderr, "%s\n", error.c_str());
        return 1;
    }
    std::printf("wrote %s\n", path.c_str());
    return 0;
}
