#include "glotest.h"
#include "scenetest.h"

#include "orv/animationcontroller.h"
#include "orv/animationgroup.h"
#include "orv/renderblock.h"

#include <cstdlib>
#include <new>

using namespace orv;

namespace
{

/// Of this thread, by C++ code; what the GL driver takes from malloc() does not count.
thread_local unsigned allocations = 0;

} // namespace

// Not to be put in place of calls: the compiler would find free() on what came from new.
[[gnu::noinline]] void* operator new(size_t size, const std::nothrow_t&) noexcept
{
    ++allocations;
    return std::malloc(size > 0 ? size : 1);
}

[[gnu::noinline]] void* operator new(size_t size)
{
    void* memory = operator new(size, std::nothrow);
    return memory ? memory : (std::abort(), nullptr);
}

[[gnu::noinline]] void operator delete(void* memory) noexcept
{
    std::free(memory);
}

[[gnu::noinline]] void operator delete(void* memory, size_t) noexcept
{
    std::free(memory);
}

using AllocationTest = SceneTest;

// Fault caught: a frame that makes texts, lists or nodes anew, be it animated, skinned, mirrored or in stereo.
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

    const auto mirror = makeShared<Appearance>();
    mirror->setShaderProgram(makeProgram(
        "attribute vec3 a_position; void main() { gl_Position = vec4(a_position, 1.0); }",
        "uniform sampler2D u_mirror; void main() { gl_FragColor = texture2D(u_mirror, vec2(0.5)); }",
        {{"u_mirror", "M_MIRROR_TEXTURE"}}));
    addSquare(Vector3f(), 1.0f, mirror);
    camera->setStereo(3.0f, 0.1f);

    AnimationController controller(loaded->getAnimationGroup());
    RenderBlock block(renderer, scene, camera);
    const auto drawFrame = [&]
    {
        controller.update(0.3f);
        block.update(0.3f);
        block.render();
    };
    for (int i = 0; i < 3; ++i)
        drawFrame(); // lists find their size, programs are linked
    const unsigned before = allocations;
    for (int i = 0; i < 4; ++i)
        drawFrame();
    EXPECT_EQ(before, allocations);
}
