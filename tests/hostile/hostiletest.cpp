#include "loaders.h"
#include "nulldriver.h"
#include "seeds.h"
#include "watch.h"

#include "support/damage.h"
#include "support/gltest.h"
#include "support/tempdir.h"

#include "orv/appearance.h"
#include "orv/filestreamsource.h"
#include "orv/glo.h"
#include "orv/log.h"
#include "orv/scenenode.h"
#include "orv/shaderprogramcache.h"
#include "orv/texture2dcache.h"
#include "orv/texturecubecache.h"

#include <EGL/egl.h>

#include <filesystem>

#include <unistd.h>

using namespace hostile;

namespace
{

/// Attacks that fail print this many lines at most, or one fault would print thousands.
constexpr int MOST_FAILURES = 5;

class Attack
{
public:
    explicit Attack(Session& session) : m_session(session) {}

    void operator()(const Loader& loader, const std::string& what, const Bytes& file)
    {
        const std::string fault = m_failures < MOST_FAILURES ? m_session.attack(loader, file) : "";
        m_failures += !fault.empty();
        EXPECT_EQ("", fault) << loader.name << " " << what << ": " << messages().firstError;
        if (eglGetCurrentContext())
        {
            EXPECT_EQ(GLenum(GL_NO_ERROR), glGetError()) << loader.name << " " << what;
        }
    }

private:
    Session& m_session;
    int m_failures = 0;
};

/// The engine asks for the entry points of program binaries once: from then on this process has the real driver's.
bool g_hasDriverBinaries = false;

/// Without a context, with the null driver, every loader; the heap is watched.
class HostileTest : public testing::TestWithParam<const char*>
{
protected:
    void SetUp() override
    {
        if (g_hasDriverBinaries && loader.name == std::string("binary"))
            GTEST_SKIP() << "a test with the real driver ran before";
        nulldriver::install();
        heap().isReported = true;
    }

    void TearDown() override { glcalls::reset(); }

    const Loader& loader = *findLoader(GetParam());
};

std::vector<const char*> getLoaderNames()
{
    std::vector<const char*> names;
    for (const Loader& loader : LOADERS)
        names.push_back(loader.name);
    return names;
}

constexpr size_t LARGEST_SEED = 4096; ///< that is damaged; larger ones are nested deep already

/// Limits the damaged places of a seed to about 400, except for cuts.
size_t getStep(const Bytes& file)
{
    return 1 + file.size() / 400;
}

} // namespace

INSTANTIATE_TEST_SUITE_P(, HostileTest, testing::ValuesIn(getLoaderNames()),
                         [](const auto& test) { return test.param; });

// Faults caught: a sound file refused, or a wrong one that is accepted or refused for another reason.
TEST_P(HostileTest, seeds)
{
    Session session;
    Attack attack(session);
    int count = 0;
    for (const Seed& seed : makeSeeds())
    {
        if (seed.loader != loader.name)
            continue;
        ++count;
        attack(loader, seed.name, seed.file);
        EXPECT_EQ(seed.loads, session.wasLoaded()) << seed.name << ": " << messages().firstError;
        EXPECT_EQ(seed.error.empty(), messages().errors == 0) << seed.name << ": " << messages().firstError;
        EXPECT_EQ(0u, messages().firstError.find(seed.error)) << seed.name << ": " << messages().firstError;
    }
    EXPECT_LT(0, count);
}

// Faults caught: costs that do not follow from the size of what is read, see Session::attack().
TEST_P(HostileTest, costly)
{
    Session session;
    Attack attack(session);
    for (const Seed& seed : makeCostlyFiles())
    {
        if (seed.loader != loader.name)
            continue;
        attack(loader, seed.name, seed.file);
        EXPECT_EQ(seed.loads, session.wasLoaded()) << seed.name << ": " << messages().firstError;
        EXPECT_EQ(seed.error.empty(), messages().errors == 0) << seed.name << ": " << messages().firstError;
        EXPECT_EQ(0u, messages().firstError.find(seed.error)) << seed.name << ": " << messages().firstError;
    }
}

// Faults caught: whatever a damaged file can do, see Session::attack().
TEST_P(HostileTest, damage)
{
    Session session;
    Attack attack(session);
    for (const Seed& seed : makeSeeds())
    {
        if (seed.loader == loader.name && seed.file.size() <= LARGEST_SEED)
            support::forEachDamage(seed.file, getStep(seed.file),
                                   [&](const Bytes& damaged, const std::string& what)
                                   { attack(loader, seed.name + " " + what, damaged); });
    }
}

// Faults caught: those that fuzzing once found, whose inputs lie among the seeds.
TEST_P(HostileTest, corpus)
{
    Session session;
    Attack attack(session);
    int count = 0;
    const std::filesystem::path folder =
        std::filesystem::path(ORV_SOURCE_FOLDER "/fuzz/corpus") / loader.name;
    for (const auto& entry : std::filesystem::directory_iterator(folder))
    {
        attack(loader, entry.path().filename(), support::readFile(entry.path()));
        ++count;
    }
    EXPECT_LT(0, count);
}

// Fault caught: rules that cannot fail.
class HostileRules : public testing::Test
{
protected:
    using Load = bool (*)(Session&, const Bytes&, std::string&);

    HostileRules()
    {
        nulldriver::install();
        heap().isReported = true;
    }

    ~HostileRules() override { glcalls::reset(); }

    /// The broken rule of a loader with an input of eight bytes.
    static std::string faultOf(Load load)
    {
        const auto little = [](const Bytes&) { return size_t(1); };
        Session session;
        return session.attack({"test", load, little, 1 << 12, false}, Bytes(8));
    }

    static bool startsWith(const std::string& text, const char* start) { return text.rfind(start, 0) == 0; }
};

TEST_F(HostileRules, loadersSayWhatIsWrong)
{
    EXPECT_EQ("", faultOf([](Session&, const Bytes&, std::string&) { return true; }));
    EXPECT_EQ("refused without a message",
              faultOf([](Session&, const Bytes&, std::string&) { return false; }).substr(0, 25));
    const auto findFault = [](Session&, const Bytes&, std::string& fault)
    {
        fault = "a fault";
        return true;
    };
    EXPECT_PRED2(startsWith, faultOf(findFault), "a fault");
}

TEST_F(HostileRules, nothingIsLeftInGl)
{
    const auto leaveName = [](Session&, const Bytes&, std::string&)
    {
        GLuint name;
        glGenTextures(1, &name);
        return true;
    };
    EXPECT_PRED2(startsWith, faultOf(leaveName), "left in GL: ");
}

TEST_F(HostileRules, filesCostWhatTheyWeigh)
{
    const auto readOften = [](Session& session, const Bytes&, std::string&)
    {
        const auto stream = session.openFile();
        for (int i = 0; i < 1000; ++i)
            stream->read(&i, 0);
        return true;
    };
    EXPECT_PRED2(startsWith, faultOf(readOften), "1000 reads of a file of 8 bytes");
    const auto logMuch = [](Session&, const Bytes&, std::string&)
    {
        for (int i = 0; i <= 200; ++i)
            ORV_LOG_INFO("a record");
        return true;
    };
    EXPECT_PRED2(startsWith, faultOf(logMuch), "201 records, more than 200");
    const auto makeLargeTexture = [](Session&, const Bytes&, std::string&)
    {
        glTexImage2D(GL_TEXTURE_2D, 0, GL_RGBA, 1000, 1000, 0, GL_RGBA, GL_UNSIGNED_BYTE, "");
        return true;
    };
    EXPECT_PRED2(startsWith, faultOf(makeLargeTexture), "4000000 bytes of pixels");
    const auto takeMuch = [](Session&, const Bytes&, std::string&) { return Bytes(1000000).size() > 0; };
    EXPECT_PRED2(startsWith, faultOf(takeMuch), "took 10");
}

/// The driver's allocations are not counted.
class HostileDriverTest : public support::GlTest
{
protected:
    void SetUp() override
    {
        GlTest::SetUp();
        heap().isReported = false;
        g_hasDriverBinaries = true;
    }
};

// Faults caught: damage that the engine passes on and a real driver stumbles over, or GL errors left behind.
TEST_F(HostileDriverTest, sparseDamage)
{
    Session session;
    Attack attack(session);
    for (const Seed& seed : makeSeeds())
    {
        const Loader& loader = *findLoader(seed.loader);
        attack(loader, seed.name, seed.file);
        if (seed.file.size() > LARGEST_SEED)
            continue;
        int index = 0;
        support::forEachDamage(seed.file, 1 + seed.file.size() / 10,
                               [&](const Bytes& damaged, const std::string& what)
                               {
                                   if (++index % 97 == 0)
                                       attack(loader, seed.name + " " + what, damaged);
                               });
    }
}

// Faults caught: a directory or a file of more than two gigabytes that is taken for a file, or read whole.
TEST_F(HostileDriverTest, whatIsNoFile)
{
    const support::TempDir directory;
    const auto pool = orv::makeShared<orv::AssetCachePool>();
    pool->registerSource(orv::makeShared<orv::FileStreamSource>(directory.path().c_str()));
    const auto root = orv::makeShared<orv::SceneNode>("root");
    const auto loadAll = [&](const std::string& start)
    {
        const auto name = [&start](const char* suffix) { return start + suffix; };
        EXPECT_FALSE(pool->getTexture2DCache()->get(name(".png").c_str()));
        EXPECT_FALSE(pool->getTextureCubeCache()->get(name(".png").c_str()));
        EXPECT_FALSE(pool->getShaderProgramCache()->get(name(".sp").c_str()));
        EXPECT_FALSE(orv::loadAppearance(*pool, name(".ap").c_str())->getShaderProgram());
        EXPECT_FALSE(orv::loadGloFile(*pool, root, name(".glo").c_str()));
    };
    for (const char* suffix : {".png", ".sp", ".ap", ".glo"})
    {
        std::filesystem::create_directory(directory.path(std::string("folder") + suffix));
        const std::string path = directory.write(std::string("huge") + suffix, std::string());
        ASSERT_EQ(0, truncate64(path.c_str(), int64_t(3) << 30));
    }
    heap().start();
    loadAll("folder");
    loadAll("huge");
    EXPECT_GT(size_t(1) << 20, heap().largest);
}
