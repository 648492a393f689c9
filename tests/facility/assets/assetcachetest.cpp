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

/// Claims names that begin with its letter, loads selected ones, and records the requests.
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

    // Of two loaders that claim a name, the one registered last is asked first.
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
