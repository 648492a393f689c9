#include "orv/assetcache.h"

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

namespace
{

struct Note : public Shared
{
    ORV_CLASS_NAME("Note")
};

using NoteCache = AssetCache<Note>;

/// Claims names that begin with its letter, makes those that it is told to, and tells what it was asked.
class NoteLoader : public AssetLoader<Note>
{
public:
    NoteLoader(char letter, std::string& asked) : m_letter(letter), m_asked(asked) {}

    SharedPtr<Note> load(AssetCache<Note>& cache, const char*) override
    {
        m_asked += m_letter;
        if (createsAs)
            cache.add(makeShared<Note>(), createsAs);
        return result;
    }

    bool isKnown(const char* name) override { return name[0] == m_letter; }

    SharedPtr<Note> result;
    const char* createsAs = nullptr;

private:
    char m_letter;
    std::string& m_asked;
};

} // namespace

// Fault caught: loaders asked in another order, which decides who reads a file that several could.
TEST(AssetCache, loadersThatClaimTheNameGoFirst)
{
    const struct
    {
        const char* letters; ///< Of the loaders in the order registered.
        const char* name;
        const char* order;
    } cases[] = {{"AB", "Bee", "BA"}, {"AB", "Ape", "AB"}, {"ABA", "Ape", "AAB"}};
    for (const auto& test : cases)
    {
        std::string asked;
        const auto cache = makeShared<NoteCache>();
        for (const char* letter = test.letters; *letter; ++letter)
            cache->registerLoader(makeShared<NoteLoader>(*letter, asked));
        EXPECT_FALSE(cache->get(test.name));
        EXPECT_EQ(test.order, asked);
        EXPECT_FALSE(cache->get(test.name));
        EXPECT_EQ(std::string(test.order) + test.order, asked) << "a failure was remembered";
    }

    // Of two that claim it the one registered last goes first.
    std::string asked;
    const auto cache = makeShared<NoteCache>();
    const auto first = makeShared<NoteLoader>('A', asked), last = makeShared<NoteLoader>('A', asked);
    first->result = makeShared<Note>();
    last->result = makeShared<Note>();
    cache->registerLoader(first);
    cache->registerLoader(last);
    EXPECT_EQ(last->result, cache->get("Ape"));
}

TEST(AssetCache, names)
{
    LogCapture log;
    std::string asked;
    const auto cache = makeShared<NoteCache>();
    const auto loader = makeShared<NoteLoader>('o', asked);
    loader->result = makeShared<Note>();
    cache->registerLoader(loader);
    EXPECT_FALSE(cache->get(nullptr) || cache->exists(nullptr) || cache->exists("orv#x"));
    EXPECT_EQ(loader->result, cache->get("orv#x"));
    EXPECT_EQ(0, log.count('W'));
    EXPECT_EQ(loader->result, cache->get("orv:x"));
    EXPECT_EQ(1, log.count('W'));
    EXPECT_EQ("o", asked);
    const auto replacement = makeShared<Note>();
    cache->add(replacement, "orv:x");
    EXPECT_EQ(replacement, cache->get("orv#x"));
}

// Fault caught: what a loader stored on its way left in the cache under the name that it failed to load.
TEST(AssetCache, loaderThatCreatesUnderTheSameName)
{
    std::string asked;
    const auto cache = makeShared<NoteCache>();
    const auto loader = makeShared<NoteLoader>('x', asked);
    loader->createsAs = "x";
    cache->registerLoader(loader);
    EXPECT_FALSE(cache->get("x"));
    EXPECT_FALSE(cache->exists("x"));
    loader->result = makeShared<Note>();
    EXPECT_EQ(loader->result, cache->get("x"));
    EXPECT_EQ(loader->result, cache->get("x"));
    EXPECT_EQ("xx", asked);
}

// Fault caught: assets in use thrown out, or unused ones kept because they have two names.
TEST(AssetCache, flushDropsWhatOnlyTheCacheHolds)
{
    const auto cache = makeShared<NoteCache>();
    const auto held = makeShared<Note>();
    cache->add(held, "held");
    cache->add(held, "held too");
    cache->add(makeShared<Note>(), "alone");
    {
        const auto twice = makeShared<Note>();
        cache->add(twice, "twice");
        cache->add(twice, "as well");
        cache->add(twice, nullptr);
    }
    cache->add(makeShared<Note>(), nullptr);
    cache->add(held, nullptr);
    cache->add(SharedPtr<Note>(), "empty");
    cache->flush();
    int count = 0;
    cache->forEachAsset([&](const SharedPtr<Note>& asset) { count += asset == held ? 1 : 100; });
    EXPECT_EQ(3, count);
}

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
