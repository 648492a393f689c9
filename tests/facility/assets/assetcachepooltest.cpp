#include "orv/assetcachepool.h"

#include "orv/memorystreamsource.h"
#include "orv/meshutil.h"
#include "orv/shaderprogramcache.h"
#include "orv/texture2dcache.h"
#include "orv/texturecubecache.h"

#include "facilitytest.h"
#include "support/tempdir.h"

using namespace orv;
using support::LogCapture;

using AssetCachePoolTest = support::GlTest;

// Fault caught: an application's file put in the place of a built-in asset, or sources that miss a cache.
TEST_F(AssetCachePoolTest, sourcesReachEveryCacheBehindTheBuiltIns)
{
    const support::TempDir directory;
    directory.write("orv#white.png", "not a picture");
    directory.write("own.txt", "own");
    const auto pool = makeShared<AssetCachePool>();
    registerSource(*pool, directory.path().c_str(), false);
    const auto check = [](const auto& cache)
    {
        EXPECT_TRUE(cache.getStream("own.txt"));
        ASSERT_TRUE(cache.getStream("orv#white.png"));
        EXPECT_EQ(957, cache.getStream("orv#white.png")->size());
        EXPECT_TRUE(cache.getStream("luvane#blur.sp"));
        EXPECT_FALSE(cache.getStream("missing.txt"));
    };
    check(*pool);
    check(*pool->getMeshCache());
    check(*pool->getTexture2DCache());
    check(*pool->getTextureCubeCache());
    check(*pool->getShaderProgramCache());
    EXPECT_FALSE(pool->getCacheStream("own.txt", false));
    setCacheSource(*pool, directory.path().c_str());
    EXPECT_TRUE(pool->getCacheStream("own.txt", false));
    EXPECT_TRUE(pool->getShaderProgramCache()->getCacheStream("own.txt", false));

    LogCapture log;
    registerSource(*pool, directory.path().c_str(), true);
    EXPECT_FALSE(pool->getStream("missing.txt"));
    EXPECT_EQ(1, log.countMessage("Error: pointer operator on null. class: StreamSource"));
}

// Fault caught: GL objects that outlive their pool, which an application collects with every level it loads.
TEST_F(AssetCachePoolTest, nothingLivesOnInGl)
{
    LogCapture log;
    {
        const auto pool = makeShared<AssetCachePool>();
        SharedPtr<Texture2D> texture = pool->getTexture2DCache()->get("orv#white.png");
        SharedPtr<ShaderProgram> program = pool->getShaderProgramCache()->get("orv#error.sp");
        Mesh::Ptr mesh = createCubeMesh(*pool->getMeshCache(), Vector2f(1, 1));
        pool->flush();
        EXPECT_EQ(2u, glcalls::liveNames(glcalls::Kind::BUFFER).size()) << "in use";
        EXPECT_EQ(texture, pool->getTexture2DCache()->get("orv#white.png"));
        texture = nullptr;
        program = nullptr;
        mesh = nullptr;
        pool->flush();
        pool->flush();
        EXPECT_EQ("", glcalls::describeLiveNames());
        EXPECT_TRUE(pool->getTexture2DCache()->get("orv#white.png")) << "loaded anew";
        pool->flush();
        EXPECT_EQ(1, pool->sharedGetCount());
    }
    EXPECT_EQ("", glcalls::describeLiveNames());
    EXPECT_EQ(0, log.count('E')) << log.text();
}

// Fault caught: names deleted that belong to the new context by now, or dead assets handed out after a flush.
TEST_F(AssetCachePoolTest, lostContextMakesNoGlCalls)
{
    LogCapture log;
    auto pool = makeShared<AssetCachePool>();
    SharedPtr<Texture2D> texture = pool->getTexture2DCache()->get("orv#white.png");
    Mesh::Ptr mesh = createSquareMesh(*pool->getMeshCache(), Vector2f(1, 1));
    replaceContext();
    glcalls::reset();
    pool->release();
    EXPECT_TRUE(mesh->getVertexBuffer()->isLost());
    EXPECT_EQ(0u, texture->getId());
    mesh = nullptr;
    texture = nullptr;
    pool->flush();
    EXPECT_EQ(0u, glcalls::total());
    EXPECT_NE(0u, pool->getTexture2DCache()->get("orv#white.png")->getId());
    pool->flush();
    pool = nullptr;
    EXPECT_EQ("", glcalls::describeLiveNames());
    EXPECT_EQ(0, log.count('E')) << log.text();
}
