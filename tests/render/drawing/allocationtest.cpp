#include "glotest.h"
#include "scenetest.h"

#include "support/allocation.h"

#include "orv/animationcontroller.h"
#include "orv/animationgroup.h"
#include "orv/motionblurrenderer.h"
#include "orv/renderblock.h"

using namespace orv;

using AllocationTest = SceneTest;

// Fault caught: a frame that makes texts, lists or nodes again, be it animated, skinned, mirrored, in stereo or of
// velocities.
TEST_F(AllocationTest, framesAllocateNothing)
{
    glo::GloScene file = makeFullScene();
    file.materials[1].techniques[0].opacity = 0.5f;
    std::vector<uint8_t> bytes;
    std::string error;
    ASSERT_TRUE(glo::writeGlo(file, bytes, error)) << error;
    const auto source = makeShared<GloTestSource>();
    source->set("test.glo", bytes);
    pool->registerSource(source);
    const Glo::Ptr loaded = loadGloFile(*pool, scene, "test.glo");
    ASSERT_TRUE(loaded);

    addSquare(Vector3f(), 1.0f, makeMirror());
    camera->setStereo(3.0f, 0.1f);
    renderer->setOpaqueGrouped(true);

    AnimationController controller(loaded->getAnimationGroup());
    RenderBlock block(renderer, scene, camera);
    RenderBlock velocities(makeShared<MotionBlurRenderer>(renderContext, pool), scene, camera);
    const auto drawFrame = [&]
    {
        controller.update(0.3f);
        block.update(0.3f);
        block.render();
        velocities.render();
    };
    for (int i = 0; i < 3; ++i)
        drawFrame(); // lists find their size, programs are linked
    const uint64_t before = support::countAllocations();
    for (int i = 0; i < 4; ++i)
        drawFrame();
    EXPECT_EQ(before, support::countAllocations());
}

// Fault caught: a still frame that computes world matrices again, or sends values that GL has.
TEST_F(AllocationTest, stillFramesDoNothingTwice)
{
    const auto red = makePaint(Colour4f(1.0f, 0.0f, 0.0f, 1.0f));
    const auto blue = makePaint(Colour4f(0.0f, 0.0f, 1.0f, 1.0f));
    const auto solid = addSquare(Vector3f(-1.0f, 0.0f, 0.0f), 1.0f, red);
    addSquare(Vector3f(0.0f, 0.0f, 0.0f), 0.5f, red);
    addSquare(Vector3f(1.0f, 0.0f, 0.0f), 1.0f, blue);
    renderFrame();
    renderFrame();

    // Only a matrix that is not recomputed keeps such a mark.
    Matrix4f& world = const_cast<Matrix4f&>(solid->getWorldTransform());
    world.columns[3].y += 0.25f;
    const Matrix4f marked = world;
    glcalls::resetCounts();
    const uint64_t before = support::countAllocations();
    render();
    EXPECT_EQ(before, support::countAllocations());
    EXPECT_EQ(marked, solid->getWorldTransform());

    EXPECT_EQ(3u, glcalls::count(glDrawElements));
    EXPECT_EQ(3u, glcalls::count(glUniformMatrix4fv)); // each solid has its own place
    EXPECT_EQ(2u, glcalls::count(glUniform4fv));       // red, blue
    // A mesh is two buffers and one attribute. The frame begins with one program and all 16 vertex arrays, and
    // leaves an array and two buffers; before the first texture, the active unit is unknown.
    EXPECT_EQ(8u + 3u * 3u + 17u + 4u, glcalls::total());
}
