#include "orv/detail/resource.h"

#include "orv/detail/bindingepoch.h"

#include "facilitytest.h"

using namespace orv;
using namespace orv::detail;
using support::LogCapture;

using ResourceTest = support::GlTest;

// Fault caught: a wrong step in the life cycle, which deletes a name twice or leaks it.
TEST_F(ResourceTest, lifeCycle)
{
    const struct
    {
        const char* steps; ///< (a)llocate, (d)eallocate, (r)elease; all but the last one may fail.
        bool result;       ///< Of the last.
        Resource::State state;
        int refusals;
    } cases[] = {{"d", false, Resource::RELEASED, 0},     {"r", true, Resource::RELEASED, 0},
                 {"aa", false, Resource::ALLOCATED, 1},   {"ad", true, Resource::DEALLOCATED, 0},
                 {"ar", true, Resource::RELEASED, 0},     {"da", false, Resource::RELEASED, 1},
                 {"ra", false, Resource::RELEASED, 1},    {"adr", false, Resource::DEALLOCATED, 0},
                 {"ada", false, Resource::DEALLOCATED, 1}};
    for (const auto& test : cases)
    {
        LogCapture log;
        glcalls::resetCounts();
        BufferResource resource;
        bool result = false;
        for (const char* step = test.steps; *step; ++step)
            result = *step == 'a'   ? resource.allocate()
                     : *step == 'd' ? resource.deallocate()
                                    : resource.release();
        EXPECT_EQ(test.result, result) << test.steps;
        EXPECT_EQ(test.state, resource.getState()) << test.steps;
        EXPECT_EQ(test.state == Resource::ALLOCATED, resource.getId() != 0) << test.steps;
        EXPECT_EQ(test.state == Resource::DEALLOCATED ? 1u : 0u, glcalls::count(glDeleteBuffers))
            << test.steps;
        EXPECT_EQ(test.refusals, log.countMessage("Cannot allocate resource more than once")) << test.steps;
        resource.deallocate();
    }
}

// Fault caught: an object that GL refused taken for one with a name.
TEST_F(ResourceTest, refusedNamesAreReleased)
{
    glcalls::refuseNames(glGenBuffers);
    glcalls::refuseNames(glGenTextures);
    glcalls::setDropped(glCreateProgram);
    glcalls::setDropped(glCreateShader);
    const struct
    {
        SharedPtr<GlResource> resource;
        const char* message;
    } cases[] = {{makeShared<BufferResource>(), "Failed to create OpenGL buffer"},
                 {makeShared<ProgramResource>(), "Failed to create OpenGL program"},
                 {makeShared<ShaderResource>(ShaderResource::Kind::VERTEX), "Failed to create OpenGL shader"},
                 {makeShared<TextureResource>(), "Failed to create OpenGL texture"}};
    for (const auto& test : cases)
    {
        LogCapture log;
        EXPECT_FALSE(test.resource->allocate());
        EXPECT_EQ(Resource::RELEASED, test.resource->getState());
        EXPECT_EQ(1, log.countMessage(test.message));
    }
}

// Fault caught: a live object dropped without a message, or deleted while its owner uses it.
TEST_F(ResourceTest, flushDeletesWhatOnlyTheCacheHolds)
{
    LogCapture log;
    detail::ResourceCache cache;
    const auto held = makeShared<TextureResource>();
    const auto released = makeShared<ProgramResource>();
    cache.add(held);
    cache.add(makeShared<ShaderResource>(ShaderResource::Kind::VERTEX)); // never allocated
    const auto dropped = new BufferResource;
    cache.add(SharedPtr<Resource>(dropped));
    cache.add(released);
    cache.add(SharedPtr<Resource>());
    held->allocate();
    dropped->allocate();
    released->allocate();
    const unsigned int lostName = released->getId();
    released->release();

    const uint64_t epoch = detail::g_bindingEpoch;
    cache.flush();
    EXPECT_NE(epoch, detail::g_bindingEpoch) << "deleting unbinds, which contexts have to notice";
    EXPECT_EQ(Resource::ALLOCATED, held->getState());
    EXPECT_EQ(1, released->sharedGetCount());
    EXPECT_TRUE(glcalls::liveNames(glcalls::Kind::BUFFER).empty());
    EXPECT_EQ(1u, glcalls::liveNames(glcalls::Kind::TEXTURE).size());

    glcalls::resetCounts();
    cache.release();
    EXPECT_EQ(0u, glcalls::total());
    EXPECT_EQ(Resource::RELEASED, held->getState());
    EXPECT_EQ(1, held->sharedGetCount());
    EXPECT_EQ("", log.text());
    glDeleteProgram(lostName);
}

// Fault caught: a program that fails to start and logs an assertion for each remaining object.
TEST_F(ResourceTest, droppingACacheTellsOnceWhatIsLeft)
{
    auto cache = makeShared<detail::ResourceCache>();
    const auto held = makeShared<TextureResource>();
    cache->add(held);
    for (int i = 0; i < 30; ++i)
    {
        const auto texture = makeShared<TextureResource>();
        cache->add(texture);
        texture->allocate();
    }
    held->allocate();
    LogCapture log;
    cache = nullptr;
    EXPECT_EQ(1, log.countMessage("ORV_ASSERT: m_state != Resource::ALLOCATED"));
    EXPECT_TRUE(log.contains("left behind: 30;")) << log.text();
    EXPECT_EQ(2, log.count('E'));
    EXPECT_EQ(31u, glcalls::liveNames(glcalls::Kind::TEXTURE).size());
    held->deallocate();
    for (const GLuint name : glcalls::liveNames(glcalls::Kind::TEXTURE))
        glDeleteTextures(1, &name);
}

TEST_F(ResourceTest, droppingALiveObjectIsLogged)
{
    GLuint name = 0;
    glGenTextures(1, &name);
    LogCapture log;
    makeShared<TextureResource>(name);
    EXPECT_EQ(1, log.countMessage("ORV_ASSERT: m_state != Resource::ALLOCATED"));
    EXPECT_EQ(1u, glcalls::liveNames(glcalls::Kind::TEXTURE).size());
    glDeleteTextures(1, &name);
}
