#include "counterchecks.h"
#include "scenetest.h"

#include "orv/framecounters.h"

using namespace orv;

using RendererCountersTest = SceneTest;

// Faults caught: calls beside the frame's; triangles, bytes and left out solids that are others.
TEST_F(RendererCountersTest, aFrameTakesWhatGlHears)
{
    const auto near = addSquare(Vector3f(0, 0, 0), 1.0f, makePaint(Colour4f::RED));
    addSquare(Vector3f(0, 0, 100), 1.0f, makePaint(Colour4f::RED));
    const auto cube = createCube(*pool, Vector2f(1, 1));
    cube->setParent(scene);
    render();
    EXPECT_EQ(0u, renderer->getCounters().getCalls());
    renderer->setCounted(true);
    const auto check = [&](uint32_t draws, uint32_t triangles, uint32_t culled)
    {
        const glcalls::Scope gl;
        render();
        const FrameCounters counters = renderer->getCounters();
        expectSame(counters, "frame");
        EXPECT_EQ(glcalls::total(), counters.getCalls());
        EXPECT_EQ(count({"glBindTexture"}), counters.textures);
        EXPECT_EQ(count({"glBindFramebuffer"}), counters.targets);
        EXPECT_EQ(draws, counters.draws);
        EXPECT_EQ(triangles, counters.triangles);
        EXPECT_EQ(culled, counters.culled);
        EXPECT_EQ(0u, counters.uploadBytes);
    };
    check(3, 16, 0);
    renderer->setCulled(true);
    for (int i = 0; i < 3; ++i)
        check(2, 14, 1);
    camera->setStereo(10.0f, 0.1f);
    check(4, 28, 2);
    camera->setStereo(10.0f, 0.0f);
    near->setPosition(Vector3f(0, 0, 50));
    cube->setPosition(Vector3f(0, 0, 50));
    for (int i = 0; i < 3; ++i) // one by one, and then the whole
        check(0, 0, 3);

    const FrameCounters before = countGlCalls();
    const unsigned char pixels[6 * 2 * 4] = {};
    pool->getTexture2DCache()->create(6, 2, Texture::Format::RGBA, Texture::Type::UNSIGNED_BYTE, pixels,
                                      nullptr);
    EXPECT_EQ(6u * 2 * 4, (countGlCalls() - before).uploadBytes);
    const FrameCounters between = countGlCalls();
    createSquare(*pool, Vector2f(1, 1));
    EXPECT_EQ(4u * 8 * 4 + 6 * 2, (countGlCalls() - between).uploadBytes);
}
