#include "orv/detail/loadscope.h"

#include "orv/loadlimits.h"

#include "orv/appearance.h"
#include "orv/assetcachepool.h"
#include "orv/detail/assetpath.h"
#include "orv/fontcache.h"
#include "orv/memorystreamsource.h"
#include "orv/shaderprogramcache.h"
#include "orv/texture2dcache.h"
#include "orv/texturecubecache.h"
#include "orv/vertexbuffercache.h"

#include "facilitytest.h"
#include "imagefiles.h"

#include <algorithm>
#include <cstring>
#include <functional>
#include <limits>

using namespace orv;
using detail::LoadScope;
using support::LogCapture;

namespace
{

constexpr uint64_t MEGABYTE = uint64_t(1) << 20;

/// Files in memory under any spelling of their name, with a record of requests.
class SpelledSource : public StreamSource
{
public:
    bool exists(const char* name) const override
    {
        ++asked;
        if (whenAsked)
            std::function<void()>(std::move(whenAsked))();
        return m_files.count(plain(name)) > 0;
    }

    SharedPtr<Stream> open(const char* name, bool) override
    {
        ++opened;
        if (whenOpened)
            std::function<void()>(std::move(whenOpened))();
        const auto& file = m_files.at(plain(name));
        return makeShared<MemoryStream>(file.data(), int(file.size()));
    }

    const char* getName() const override { return "spelled"; }

    void add(const std::string& name, const imagefiles::Bytes& file) { m_files[name] = file; }
    void add(const std::string& name, const std::string& text)
    {
        m_files[name] = imagefiles::Bytes(text.begin(), text.end());
    }

    mutable std::function<void()> whenAsked; ///< once
    std::function<void()> whenOpened;
    mutable int asked = 0;
    int opened = 0;

private:
    static std::string plain(const std::string& name) { return name.substr(name.rfind('/') + 1); }

    std::map<std::string, imagefiles::Bytes> m_files;
};

class LoadTest : public FacilityTest
{
protected:
    void SetUp() override
    {
        GlTest::SetUp();
        pool = makeShared<AssetCachePool>();
        files = makeShared<SpelledSource>();
        pool->registerSource(files);
    }

    void TearDown() override
    {
        setLoadLimits({});
        FacilityTest::TearDown();
    }

    void flush() override { pool->flush(); }

    /// An appearance file that repeats a line, with the number of the repetition for each "%".
    SharedPtr<Appearance> loadLines(const std::string& line, int count)
    {
        std::string text = "1.0\n";
        for (int i = 0; i < count; ++i)
        {
            for (const char c : line)
                text += c == '%' ? std::to_string(i) : std::string(1, c);
            text += '\n';
        }
        files->add("lines.ap", text);
        return loadAppearance(*pool, "lines.ap");
    }

    SharedPtr<AssetCachePool> pool;
    SharedPtr<SpelledSource> files;
};

/// Returns arbitrary sizes, positions and counts of bytes read.
class LyingStream : public Stream
{
public:
    LyingStream(int32_t size, int32_t place, int32_t count) : m_size(size), m_place(place), m_count(count) {}

    bool valid() const override { return true; }
    bool eof() const override { return false; }
    int32_t size() const override { return m_size; }
    int32_t seek(unsigned int) override { return m_place; }
    int32_t tell() const override { return m_place; }
    int32_t read(void* buffer, unsigned int count) override
    {
        std::fill_n(static_cast<char*>(buffer), count, '\0');
        return m_count;
    }
    int32_t write(const void*, unsigned int) override { return m_count; }

private:
    int32_t m_size;
    int32_t m_place;
    int32_t m_count;
};

class LyingSource : public StreamSource
{
public:
    bool exists(const char*) const override { return true; }
    SharedPtr<Stream> open(const char*, bool) override { return stream; }
    const char* getName() const override { return "lying"; }

    SharedPtr<Stream> stream;
};

} // namespace

// Fault caught: limits that refuse real files, or take those made to exhaust memory.
TEST(LoadLimits, pictures)
{
    const struct
    {
        uint64_t bytes;
        uint64_t fileSize;
        bool allowed;
    } cases[] = {{64 * MEGABYTE, 1, true}, // a flat texture of 4096 pixels
                 {64 * MEGABYTE + 1, 1, false},
                 {192'000'000, 3'000'000, true}, // a photo of 8000 pixels
                 {192'000'001, 3'000'000, false},
                 {256 * MEGABYTE, 4 * MEGABYTE, true},
                 {256 * MEGABYTE + 1, 64 * MEGABYTE, false}};
    LogCapture log;
    for (const auto& test : cases)
        EXPECT_EQ(test.allowed, LoadScope::takePicture(test.bytes, test.fileSize)) << test.bytes;
    EXPECT_EQ(3, log.count('E'));

    setLoadLimits({1024 * MEGABYTE, 1024 * MEGABYTE, 0});
    EXPECT_TRUE(LoadScope::takePicture(1024 * MEGABYTE, 1));
    setLoadLimits({1, 1, 1});
    EXPECT_TRUE(LoadScope::takePicture(6400, 100));
    EXPECT_FALSE(LoadScope::takePicture(6401, 100));
    setLoadLimits({});
}

// Faults caught: a budget that nested loads begin again, that is kept for the next load, or that the same content
// raises as often as it is read.
TEST(LoadLimits, oneBudgetForOneLoad)
{
    LogCapture log;
    for (int load = 0; load < 2; ++load)
    {
        const LoadScope scope("outer");
        const std::string content(1000, 'x');
        EXPECT_TRUE(LoadScope::takeTexture(255 * MEGABYTE));
        const LoadScope nested("inner");
        for (int i = 0; i < 3; ++i)
            LoadScope::addRead(content.data(), content.size());
        EXPECT_FALSE(LoadScope::takeTexture(MEGABYTE + 63001));
        EXPECT_TRUE(LoadScope::takeTexture(MEGABYTE + 63000));
        EXPECT_FALSE(LoadScope::takeTexture(1));
        EXPECT_FALSE(LoadScope::takeTexture(~uint64_t(0)));
        EXPECT_TRUE(LoadScope::takeProgram(MEGABYTE + 1000));
        EXPECT_FALSE(LoadScope::takeProgram(1));
    }
    EXPECT_EQ(4, log.count('E')) << log.text();
    EXPECT_TRUE(log.contains("outer asks for"));
}

// Faults caught: a bad file decoded, or a missing one looked for, once for each mention; a record for each.
TEST_F(LoadTest, failuresAreNotTriedAgainInOneLoad)
{
    files->add("bad.png", std::string("no picture"));
    const struct
    {
        const char* line;
        int opened;
        const char* last; ///< message
    } cases[] = {
        {"property a Texture2D bad.png", 3, "names 500 assets that cannot be loaded; the first is bad.png"},
        {"property a Texture2D lines.ap", 3, "names 500 assets that cannot be loaded; the first is lines.ap"},
        {"property a TextureCube bad.png", 2, "names 500 assets that cannot be loaded"},
        {"property a Texture2D none.png", 1, "names 500 assets that cannot be loaded; the first is none.png"},
        {"shader_program none.sp", 1, "names 500 assets that cannot be loaded; the first is none.sp"},
        {"shader_program bad.png", 2, "names 500 assets that cannot be loaded; the first is bad.png"},
    };
    for (const auto& test : cases)
    {
        LogCapture log;
        files->opened = files->asked = 0;
        EXPECT_TRUE(loadLines(test.line, 500));
        EXPECT_EQ(test.opened, files->opened) << test.line;
        EXPECT_GE(6, files->asked) << test.line;
        EXPECT_GE(2, log.count('E')) << log.text();
        EXPECT_TRUE(log.contains(test.last)) << log.text();
    }
    // The next load tries again.
    files->opened = 0;
    loadLines("property a Texture2D bad.png", 1);
    EXPECT_EQ(3, files->opened);
}

// Fault caught: floods of the log; messages lost altogether.
TEST_F(LoadTest, logStaysShort)
{
    const struct
    {
        const char* line;
        const char* first; ///< message
    } cases[] = {
        {"culling_mode X%", "Appearance file: lines.ap unexpected culling mode X0"},
        {"stencil_function X X 0 0", "Appearance file: lines.ap unexpected stencil face X"},
        {"property a Texture2D none%.png",
         "Appearance file: lines.ap names 500 assets that cannot be loaded; the first is none0.png"},
        {"property a TextureCube none%.png", "TextureCube image \"none0.png\" not found."},
        {"property a%; Texture2D orv:white.png",
         "Use of \"orv:\" to indicate asset namespace is deprecated; use \"orv#\" instead."},
        {"line_width -%", "Appearance file: lines.ap unexpected line width -0"},
    };
    for (const auto& test : cases)
    {
        LogCapture log;
        loadLines(test.line, 500);
        EXPECT_LE(1, log.countMessage(test.first)) << log.text();
        EXPECT_GE(20u, log.records().size()) << test.line;
        const std::vector<LogCapture::Record> records = log.records();
        const auto explains = [](const LogCapture::Record& record)
        { return record.message.find("\"none0.png\" was looked for in: ") == 0; };
        EXPECT_EQ(std::strstr(test.line, "none") ? 1 : 0,
                  std::count_if(records.begin(), records.end(), explains))
            << log.text();
    }
    std::string program = "1.0\nvertex_source_file orv#error.vert\nfragment_source_file orv#error.frag\n";
    for (int i = 0; i < 500; ++i)
        program += "uniform\n";
    files->add("uniforms.sp", program);
    LogCapture log;
    EXPECT_TRUE(pool->getShaderProgramCache()->get("uniforms.sp"));
    EXPECT_EQ(8, log.countMessage("ShaderProgram file: uniforms.sp uniform declaration incomplete"));
    EXPECT_TRUE(log.contains("492 more records like this while loading uniforms.sp")) << log.text();
}

// Faults caught: a picture decoded once for each spelling of its name; a refused one kept as if it were loaded.
TEST_F(LoadTest, picturesOfOneLoadAreCountedTogether)
{
    setLoadLimits({64 * MEGABYTE, 70000, MEGABYTE});
    files->add("a.png", imagefiles::encodeFlat("png", 100, 100, 4)); // 40,000 bytes
    LogCapture log;
    const SharedPtr<Appearance> appearance = loadLines("property a% Texture2D %/a.png", 20);
    int loaded = 0;
    for (int i = 0; i < 20; ++i)
    {
        SharedPtr<Texture2D> texture;
        appearance->getPropertyUniform(("a" + std::to_string(i)).c_str())->getValue(texture, 0);
        loaded += bool(texture);
    }
    EXPECT_LE(1, loaded);
    EXPECT_GE(3, loaded) << log.text();
    EXPECT_TRUE(log.contains("lines.ap asks for textures of more than")) << log.text();
    EXPECT_TRUE(pool->getTexture2DCache()->get("19/a.png")) << "another load";
}

// Faults caught: an unlimited number of programs from one file; a refused one kept under its name.
TEST_F(LoadTest, programsOfOneLoadAreCountedTogether)
{
    setLoadLimits({MEGABYTE, MEGABYTE, 20000});
    LogCapture log;
    glcalls::resetCounts();
    EXPECT_FALSE(loadLines("shader_program orv#max_pvl.sp$A%", 100)->getShaderProgram());
    EXPECT_LE(2u, glcalls::count(glLinkProgram));
    EXPECT_GE(4u, glcalls::count(glLinkProgram));
    EXPECT_TRUE(log.contains("lines.ap asks for shader programs of more than")) << log.text();
    EXPECT_TRUE(pool->getShaderProgramCache()->get("orv#max_pvl.sp$A99")) << "another load";
}

// Fault caught: a large file read again for each spelling of its name.
TEST_F(LoadTest, sameContentIsNotReadWithoutEnd)
{
    files->add("big.bin", std::string(100000, 'x'));
    LogCapture log;
    files->opened = 0;
    loadLines("property a Texture2D %/big.bin", 500);
    EXPECT_GE(1 + 2 * 32, files->opened); // 2 MiB, and 8 times the size
    EXPECT_TRUE(log.contains("lines.ap reads the same files over and over")) << log.text();
}

// Faults caught: six copies of one picture at once; a GL name left by an incomplete cube.
TEST_F(LoadTest, cubesTakeTheirPicturesOneByOne)
{
    files->add("face.png", imagefiles::encodeFlat("png", 64, 64, 3));
    files->add("other.png", imagefiles::encodeFlat("png", 32, 32, 3));
    files->opened = 0;
    EXPECT_TRUE(pool->getTextureCubeCache()->get("face.png;face.png;face.png;face.png;face.png;face.png"));
    EXPECT_EQ(1, files->opened);
    const std::string before = glcalls::describeLiveNames();
    EXPECT_FALSE(pool->getTextureCubeCache()->get("face.png;face.png;face.png;face.png;face.png;other.png"));
    EXPECT_FALSE(pool->getShaderProgramCache()->get("face.png"));
    EXPECT_EQ(before, glcalls::describeLiveNames());
}

// Faults caught: the list of sources used after it was reallocated, or a source after it was deleted; a failure
// remembered although a source was added.
TEST_F(LoadTest, sourcesThatChangeTheListOfSources)
{
    const auto late = makeShared<SpelledSource>();
    late->add("late.png", imagefiles::encodeFlat("png", 4, 4, 3));
    files->whenAsked = [&]
    {
        for (int i = 0; i < 50; ++i)
            pool->registerSource(makeShared<SpelledSource>());
        pool->registerSource(late);
    };
    EXPECT_TRUE(pool->getTexture2DCache()->get("late.png"));

    detail::AssetPath path;
    auto vanishing = makeShared<SpelledSource>();
    vanishing->add("a", std::string("text"));
    vanishing->whenAsked = [&] { path.remove("spelled"); };
    path.add(vanishing);
    vanishing.reset();
    EXPECT_TRUE(path.find("a"));
    EXPECT_FALSE(path.find("a"));

    auto cached = makeShared<SpelledSource>();
    cached->add("a", std::string("text"));
    cached->whenOpened = [&] { pool->setCacheSource({}); };
    pool->setCacheSource(cached);
    cached.reset();
    EXPECT_TRUE(pool->getCacheStream("a", false));
    EXPECT_FALSE(pool->getCacheStream("a", false));
}

// Faults caught, under the undefined-behaviour and address checks: sizes that overflow, and bytes used that no stream gave.
TEST_F(LoadTest, streamsThatLie)
{
    constexpr int32_t LEAST = std::numeric_limits<int32_t>::min();
    constexpr int32_t MOST = std::numeric_limits<int32_t>::max();
    const auto source = makeShared<LyingSource>();
    pool->registerSource(source);
    for (const int32_t size : {LEAST, -1, 0, 100, 100000})
    {
        for (const int32_t place : {LEAST, -1, 0, 99, MOST})
        {
            for (const int32_t count : {LEAST, -1, 0, 1, 16, MOST})
            {
                LogCapture log;
                source->stream = makeShared<LyingStream>(size, place, count);
                EXPECT_FALSE(pool->getTexture2DCache()->get("file.png"));
                EXPECT_FALSE(pool->getTexture2DCache()->get("file.pvr"));
                EXPECT_FALSE(pool->getTextureCubeCache()->get("file.png"));
                EXPECT_FALSE(pool->getShaderProgramCache()->get("file.sp"));
                EXPECT_FALSE(pool->getFontCache()->get("file.ttf;16"));
                EXPECT_TRUE(loadAppearance(*pool, "file.ap"));
                EXPECT_FALSE(pool->getVertexBufferCache()->create(nullptr)->load(source->stream));
                EXPECT_LE(5, log.count('E'));
            }
        }
    }
}
