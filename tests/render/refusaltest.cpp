#include "glotest.h"

#include "support/allocation.h"
#include "support/picture.h"
#include "support/tempdir.h"

#include "orv/animationgroup.h"
#include "orv/appearance.h"
#include "orv/filestreamsource.h"
#include "orv/fontcache.h"
#include "orv/motionblurrenderer.h"
#include "orv/orv.h"
#include "orv/text.h"

#include <algorithm>
#include <cstdlib>

using namespace orv;
using support::LogCapture;
using support::Picture;

namespace
{

// --- Files that cannot be opened, read or written ----------------------------------------------------------

uint64_t g_transfersToRefusal = 0; ///< the last of them is refused; 0 for none
const char* g_refusedTransfer = "";

bool isTransferAllowed(const char* source)
{
    if (g_transfersToRefusal == 0 || --g_transfersToRefusal > 0)
        return true;
    g_refusedTransfer = source;
    return false;
}

const char* const COMPILED = "compiled programs"; // the name of the source where they are kept

class RefusingStream : public Stream
{
public:
    RefusingStream(const SharedPtr<Stream>& inner, const char* source) : m_inner(inner), m_source(source) {}

    bool valid() const override { return m_inner->valid(); }
    bool eof() const override { return m_inner->eof(); }
    int32_t size() const override { return m_inner->size(); }
    int32_t seek(unsigned position) override { return m_inner->seek(position); }
    int32_t tell() const override { return m_inner->tell(); }

    int32_t read(void* buffer, unsigned count) override
    {
        return isTransferAllowed(m_source) ? m_inner->read(buffer, count) : 0;
    }

    int32_t write(const void* buffer, unsigned count) override
    {
        return isTransferAllowed(m_source) ? m_inner->write(buffer, count) : 0;
    }

private:
    SharedPtr<Stream> m_inner;
    const char* m_source;
};

class RefusingSource : public StreamSource
{
public:
    RefusingSource(const SharedPtr<StreamSource>& inner, const char* name) : m_inner(inner), m_name(name) {}

    bool exists(const char* name) const override { return m_inner->exists(name); }
    const char* getName() const override { return m_name; }

    SharedPtr<Stream> open(const char* name, bool writable) override
    {
        if (!isTransferAllowed(m_name))
        {
            pssLogError("refusaltest", "open", __LINE__, "Cannot open \"%s\"", name); // as every source says
            return {};
        }
        const SharedPtr<Stream> inner = m_inner->open(name, writable);
        return inner ? makeShared<RefusingStream>(inner, m_name) : SharedPtr<RefusingStream>();
    }

private:
    SharedPtr<StreamSource> m_inner;
    const char* m_name;
};

/// A true-colour TGA.
std::vector<uint8_t> makeTga(uint8_t width, uint8_t height)
{
    std::vector<uint8_t> file = {0, 0, 2, 0, 0, 0, 0, 0, 0, 0, 0, 0, width, 0, height, 0, 24, 0x20};
    for (int i = 0; i < width * height * 3; ++i)
        file.push_back(uint8_t(i * 37));
    return file;
}

// --- The application ---------------------------------------------------------------------------------------

/// What it does once per frame.
void lookForGlError()
{
    const RenderDevice::ErrorCode error = RenderDevice::getError(true);
    if (error != RenderDevice::ErrorCode::NO_ERROR)
        pssLogError("refusaltest", "lookForGlError", __LINE__, "%s", RenderDevice::getErrorString(error));
}

enum class Size
{
    SMALL, ///< one of each kind of asset, in programs that compile quickly
    FULL   ///< and a scene file, lights, shadows, text in the scene, a mirror, motion blur
};

/// A scene with a little of everything, by an application that checks its results.
class Show
{
public:
    Show(const SharedPtr<AssetCachePool>& pool, Size size) : m_pool(pool), m_size(size) {}

    /// @param context  of an earlier show in the same GL context; null for a new one.
    void load(const SharedPtr<RenderContext>& context = {})
    {
        m_context = context ? context : makeShared<RenderContext>();
        m_blocks = makeShared<RenderBlockGroup>();
        m_camera = makeShared<Camera>();
        m_scene = makeShared<SceneNode>();
        m_stage = makeShared<SceneNode>();
        if (!m_context || !m_blocks || !m_camera || !m_scene || !m_stage)
            return;
        m_camera->setPosition(Vector3f(0, 0, 5));
        m_renderer = makeShared<SimpleRenderer>(m_context, m_pool);

        MeshCache& meshes = *m_pool->getMeshCache();
        const Vector2f once(1, 1);
        place(m_scene, createSphereMesh(meshes, 4, 6, once), "sky.ap", {}, 40);
        place(m_stage, createCubeMesh(meshes, once), "tile.ap", {1, 0, 0}, 1);
        addText();
        if (m_size == Size::FULL)
            loadMore();
        // The stage is drawn into a texture, which a square in the scene shows.
        const auto screen = place(m_scene, createSquareMesh(meshes, once), "screen.ap", {0, -1, 1}, 1);
        setTexture(screen, "M_DIFFUSE_TEXTURE", addTarget(m_renderer, m_stage, true));
        addBlock(m_renderer, m_scene, {});
    }

    void draw()
    {
        if (m_glo && m_glo->getAnimationGroup())
            m_glo->getAnimationGroup()->apply(0.5f);
        if (m_blocks)
        {
            if (m_shadows)
                m_shadows->render(*m_scene, m_camera.get());
            m_blocks->update(0.5f);
            m_blocks->render();
        }
        if (m_text)
            m_text->draw(*m_context);
        lookForGlError();
    }

    const SharedPtr<RenderContext>& getContext() const { return m_context; }

private:
    void loadMore()
    {
        MeshCache& meshes = *m_pool->getMeshCache();
        const Vector2f once(1, 1);
        if (const auto light = makeShared<Light>())
        {
            light->setPosition(Vector3f(1, 2, 4));
            light->setAmbientLevel(0.3f);
            light->setLightType(Light::LightType::SPOT);
            light->setSpotOuterAngle(Anglef::fromDegrees(120.0f));
            light->setParent(m_scene, false);
        }
        place(m_scene, createCubeMesh(meshes, once), "crate.ap", {-1.5f, 0, 0}, 0.5f);
        place(m_scene, createSphereMesh(meshes, 4, 6, once), "glass.ap", {1.5f, 0, 1}, 1);
        place(m_scene, createSquareMesh(meshes, once), "mirror.ap", {0, 1, -1}, 2);
        m_glo = loadGloFile(*m_pool, m_stage, "test.glo");
        m_shadows = makeShared<ShadowMap>(m_context, m_pool, 32);
        if (m_shadows)
            m_shadows->attach(*m_scene);
        if (const SharedPtr<Solid> letters = m_text ? m_text->createSolid(*m_pool) : SharedPtr<Solid>())
        {
            letters->setPosition(Vector3f(-1.5f, -0.5f, 1));
            letters->setScale(Vector3f(0.1f, 0.1f, 0.1f));
            letters->setParent(m_scene, false);
        }

        const auto blur = makeShared<MotionBlurRenderer>(m_context, m_pool);
        const SharedPtr<ShaderUniformBase> factor = m_context->getProperty("MOTION_BLUR_FACTOR");
        if (!blur || !factor)
            return;
        factor->setValue(1.0f, 0);
        setTexture(place(m_stage, createSquareMesh(meshes, once), "blur.ap", {}, 1), "M_VELOCITY_TEXTURE",
                   addTarget(blur, m_scene, false));
    }

    SharedPtr<Solid> place(const SharedPtr<SceneNode>& parent, const SharedPtr<Mesh>& mesh,
                           const char* appearance, const Vector3f& position, float size)
    {
        const auto solid = makeShared<Solid>(mesh, loadAppearance(*m_pool, appearance));
        if (!mesh || !solid || !solid->getAppearance() || !solid->getAppearance()->getShaderProgram())
            return {};
        solid->setPosition(position);
        solid->setScale(Vector3f(size, size, size));
        solid->setParent(parent, false);
        return solid;
    }

    static void setTexture(const SharedPtr<Solid>& solid, const char* property,
                           const SharedPtr<Texture2D>& texture)
    {
        if (solid)
            solid->getAppearance()->setProperty(property, texture);
    }

    void addText()
    {
        const Font::Ptr font = get(*m_pool->getFontCache(), "test.ttf", 12);
        m_text = font ? makeShared<Text>(*m_pool, font, Colour4f::RED) : Text::Ptr();
        if (m_text)
            m_text->add("AB", 1, 1);
    }

    /// Into which the scene is drawn before what has been added so far.
    SharedPtr<Texture2D> addTarget(const SharedPtr<Renderer>& renderer, const SharedPtr<SceneNode>& scene,
                                   bool hasStencil)
    {
        const SharedPtr<Texture2D> texture = m_pool->getTexture2DCache()->create(
            16, 16, Texture::Format::RGB, Texture::Type::UNSIGNED_BYTE, nullptr, nullptr);
        if (!texture)
            return {};
        texture->setMinFilter(TextureParameters::FilterMode::LINEAR); // its mipmaps are never drawn
        const auto target = makeShared<RenderTarget>(texture, nullptr, true, hasStencil);
        if (!target || !target->isComplete())
            return {};
        addBlock(renderer, scene, target);
        return texture;
    }

    void addBlock(const SharedPtr<Renderer>& renderer, const SharedPtr<SceneNode>& scene,
                  const SharedPtr<RenderTarget>& target)
    {
        const auto block = makeShared<RenderBlock>(renderer, scene, m_camera);
        if (!block)
            return;
        block->setRenderTarget(target);
        m_blocks->addBlock(block);
    }

    SharedPtr<AssetCachePool> m_pool;
    Size m_size;
    SharedPtr<RenderContext> m_context;
    SharedPtr<SceneNode> m_scene;
    SharedPtr<SceneNode> m_stage;
    SharedPtr<Camera> m_camera;
    SharedPtr<SimpleRenderer> m_renderer;
    SharedPtr<RenderBlockGroup> m_blocks;
    Text::Ptr m_text;
    Glo::Ptr m_glo;
    ShadowMap::Ptr m_shadows;
};

// --- Refusals ----------------------------------------------------------------------------------------------

/// How to refuse one thing of a kind.
struct Refusal
{
    void (*refuse)(uint64_t number); ///< from here on, 1 is the next; 0 ends it
    bool (*isRefused)();
};

constexpr Refusal GL_CALLS = {glcalls::refuseCall, [] { return !glcalls::refusedCall().empty(); }};
constexpr Refusal ALLOCATIONS = {support::refuseAllocation, support::isAllocationRefused};
constexpr Refusal FILE_ACCESS = {[](uint64_t number)
                                 {
                                     g_transfersToRefusal = number;
                                     g_refusedTransfer = "";
                                 },
                                 [] { return *g_refusedTransfer != '\0'; }};

/// Whether the engine must log a message for this refused call.
bool isForTheEngineToTell(const std::string& call)
{
    const char* const calls[] = {"glGen",
                                 "glCreate",
                                 "glCompileShader",
                                 "glLinkProgram",
                                 "glTexImage2D",
                                 "glCompressedTexImage2D",
                                 "glCopyTexImage2D",
                                 "glBufferData",
                                 "glRenderbufferStorage",
                                 "glCheckFramebufferStatus"};
    return std::any_of(std::begin(calls), std::end(calls),
                       [&call](const char* start) { return call.rfind(start, 0) == 0; });
}

/// @param call  the GL call that was refused, "" if it was something else.
bool isTold(const LogCapture& log, const std::string& call)
{
    const std::vector<LogCapture::Record> records = log.records();
    return std::any_of(records.begin(), records.end(),
                       [&call](const LogCapture::Record& record)
                       {
                           const bool isOwn = record.source == "refusaltest";
                           const bool isComplaint =
                               record.level != 'I' || record.message.rfind("Failed", 0) == 0;
                           return isComplaint && !(isOwn && isForTheEngineToTell(call));
                       });
}

class RefusalTest : public support::GlTest
{
protected:
    RefusalTest() : GlTest({.width = 24, .height = 24}) {}

    /// Settings for a driver without compiling for each draw, validation or C++ objects.
    static void SetUpTestSuite() { setenv("GALLIUM_DRIVER", "softpipe", 0); }

    void SetUp() override
    {
        GlTest::SetUp();
        if (context().describe().find("softpipe") == std::string::npos)
            GTEST_SKIP() << "the process has another driver already: run it by itself, as ctest does";
        const std::string sources = ORV_SOURCE_FOLDER;
        for (const char* name : {"sky.ap", "sky.sp", "sky.vert", "sky.frag", "crate.ap", "glass.ap",
                                 "mirror.ap", "mirror.sp", "mirror.vert", "mirror.frag"})
            m_files->set(name, support::readFile(sources + "/samples/showpiece/" + name));
        const std::pair<const char*, std::string> appearances[] = {
            {"tile.ap", "luvane#quad.sp property M_DIFFUSE_TEXTURE Texture2D tile.pvr"},
            {"screen.ap", "luvane#quad.sp property M_SPECULAR_TEXTURE Texture2D crate.png"},
            {"blur.ap", "orv#motionblur.sp property M_SHARP_TEXTURE Texture2D sky.png"}};
        for (const auto& [name, words] : appearances)
        {
            const std::string text = "1.0 shader_program " + words;
            m_files->set(name, {text.begin(), text.end()});
        }
        m_files->set("crate.png", makeTga(4, 4));
        m_files->set("sky.png", makeTga(12, 8));
        m_files->set("tile.pvr", support::readFile(sources + "/fuzz/corpus/pvr/etc1"));
        m_files->set("test.ttf", support::readFile(sources + "/fuzz/corpus/font/map4"));
        std::string error;
        std::vector<uint8_t> file;
        ASSERT_TRUE(glo::writeGlo(makeFullScene(), file, error)) << error;
        m_files->set("test.glo", file);
    }

    SharedPtr<AssetCachePool> makePool()
    {
        const auto pool = makeShared<AssetCachePool>();
        const auto files = makeShared<RefusingSource>(m_files, "files");
        const auto folder = makeShared<FileStreamSource>(m_folder.path().c_str());
        const auto compiled = makeShared<RefusingSource>(folder, COMPILED);
        if (!pool || !pool->isComplete() || !files || !folder || !compiled)
            return {};
        pool->registerSource(files);
        pool->setCacheSource(compiled);
        return pool;
    }

    static void flush(AssetCachePool& pool)
    {
        pool.flush();
        pool.flush(); // what the first one has let go of
    }

    /// Loads, draws and drops the show.
    static Picture show(const SharedPtr<AssetCachePool>& pool, Size size,
                        const SharedPtr<RenderContext>& context = {})
    {
        Show show(pool, size);
        show.load(context);
        show.draw();
        return support::readFrame();
    }

    Picture showFirst(Size size)
    {
        replaceContext();
        LogCapture log;
        const SharedPtr<AssetCachePool> pool = makePool();
        const Picture picture = show(pool, size);
        flush(*pool);
        EXPECT_EQ(0, log.count('E') + log.count('W')) << log.text();
        return picture;
    }

    enum class Hit
    {
        NOTHING,
        FIRST_SHOW,
        LATER
    };

    /// Refuses one thing while the show is loaded and drawn, loses its context and is loaded, drawn and unloaded again.
    /// @param expected  what the second show is to look like after a refusal in the first one.
    Hit refuse(const Refusal& refusal, uint64_t number, Size size, const Picture& expected)
    {
        replaceContext();
        LogCapture log;
        refusal.refuse(number);
        const SharedPtr<AssetCachePool> pool = makePool();
        Hit hit = pool ? Hit::NOTHING : Hit::FIRST_SHOW;
        if (pool)
        {
            {
                Show first(pool, size);
                first.load();
                first.draw();
                replaceContext();
                pool->release();
            }
            flush(*pool);
            hit = refusal.isRefused() ? Hit::FIRST_SHOW : hit;
            const Picture second = show(pool, size);
            if (hit == Hit::FIRST_SHOW)
            {
                EXPECT_TRUE(comparePictures("refusal", expected, second, {.perChannel = 0})) << number;
            }
            flush(*pool);
        }
        lookForGlError();
        if (hit == Hit::NOTHING && refusal.isRefused())
            hit = Hit::LATER;
        const std::string call = glcalls::refusedCall();
        const bool isCompiledProgram = g_refusedTransfer == std::string(COMPILED); // kept to save time alone
        refusal.refuse(0);

        const std::string what = std::to_string(number) + " " + call + ": ";
        const bool isDeletion = call.rfind("glDelete", 0) == 0;
        EXPECT_TRUE(hit == Hit::NOTHING || isCompiledProgram || isTold(log, call)) << what << log.text();
        EXPECT_TRUE(isDeletion || glcalls::describeLiveNames().empty())
            << what << glcalls::describeLiveNames();
        return hit;
    }

    static int64_t countLiveAllocations()
    {
        glcalls::reset(); // has allocations of its own
        return support::countLiveAllocations();
    }

    /// One of each kind of asset, and a target.
    static void loadSome(AssetCachePool& pool)
    {
        const SharedPtr<Texture2D> texture = pool.getTexture2DCache()->get("crate.png");
        const SharedPtr<Appearance> sky = loadAppearance(pool, "sky.ap");
        const SharedPtr<Mesh> cube = createCubeMesh(*pool.getMeshCache(), Vector2f(1, 1));
        const auto target = makeShared<RenderTarget>(texture, nullptr, true, false);
        EXPECT_TRUE(sky->getShaderProgram() && cube && target->isComplete());
    }

    const SharedPtr<GloTestSource> m_files = makeShared<GloTestSource>();
    support::TempDir m_folder;
};

/// Sweeps come in parts, each a test of its own, since a whole one takes minutes.
constexpr uint64_t PARTS = 8;

class RefusalSweep : public RefusalTest, public testing::WithParamInterface<uint64_t>
{
protected:
    /// Refuses the first thing, then the first and step more, until there are no more; fewer after the first show, where
    /// everything comes once again. Of all these, every one in PARTS. With ORV_SWEEP_ALL in the environment, every step
    /// is 1.
    void sweep(const Refusal& refusal, Size size, uint64_t step)
    {
        const Picture expected = showFirst(size);
        refuse(refusal, ~0ull, size, expected); // nothing; what is made once is made now
        const int64_t live = countLiveAllocations();
        const bool isWhole = std::getenv("ORV_SWEEP_ALL");
        const uint64_t usual = isWhole ? PARTS : PARTS * step;
        uint64_t number = 1 + GetParam() * (isWhole ? 1 : step);
        for (Hit hit; (hit = refuse(refusal, number, size, expected)) != Hit::NOTHING && !HasFailure();)
            number += hit == Hit::FIRST_SHOW || isWhole ? usual : 23 * usual;
        EXPECT_GT(live + 16, countLiveAllocations()) << "the driver keeps a few";
        RecordProperty(size == Size::SMALL ? "small" : "full", int(number));
    }
};

} // namespace

INSTANTIATE_TEST_SUITE_P(, RefusalSweep, testing::Range<uint64_t>(0, PARTS));

// Fault caught by the three: a refusal that crashes, leaks, is not logged, or spoils later loads.
TEST_P(RefusalSweep, everyGlCall)
{
    sweep(GL_CALLS, Size::SMALL, 1);
    sweep(GL_CALLS, Size::FULL, 331);
}

TEST_P(RefusalSweep, everyFileAccess)
{
    sweep(FILE_ACCESS, Size::SMALL, 1);
    sweep(FILE_ACCESS, Size::FULL, 149);
}

TEST_P(RefusalSweep, everyAllocation)
{
    sweep(ALLOCATIONS, Size::SMALL, 9);
    sweep(ALLOCATIONS, Size::FULL, 197);
}

// Faults caught: a kind of refusal that is not logged, and one that has effects after it ended.
TEST_F(RefusalTest, kindsThatLast)
{
    const auto refuseMemory = [](auto entry)
    { glcalls::replace(entry, [](auto...) { glcalls::queueError(GL_OUT_OF_MEMORY); }); };
    const char* const incomplete =
        "Combination of internal formats used by framebuffer attachments is not renderable.";
    const struct
    {
        const char* name;
        std::function<void()> begin;
        const char* message;
    } kinds[] = {
        {"no buffer names", [] { glcalls::refuseNames(glGenBuffers); }, "Failed to create OpenGL buffer"},
        {"no texture names", [] { glcalls::refuseNames(glGenTextures); }, "Failed to create OpenGL texture"},
        {"no framebuffer names", [] { glcalls::refuseNames(glGenFramebuffers); },
         "Failed to create framebuffer"},
        {"no renderbuffer names", [] { glcalls::refuseNames(glGenRenderbuffers); },
         "Failed to create depth renderbuffer"},
        {"no programs", [] { glcalls::setDropped(glCreateProgram); }, "Failed to create OpenGL program"},
        {"no shaders", [] { glcalls::setDropped(glCreateShader); }, "Failed to create OpenGL shader"},
        {"nothing compiles", [] { glcalls::failCompiling("no."); }, "Failed to compile shader:\nno.\n"},
        {"nothing links", [] { glcalls::failLinking("no."); }, "Failed to link shader program:\nno.\n"},
        {"incomplete framebuffers", [] { glcalls::setFramebufferStatus(GL_FRAMEBUFFER_UNSUPPORTED); },
         incomplete},
        {"no memory for buffers", [&] { refuseMemory(glBufferData); }, "OpenGL error 5: Out of memory"},
        {"no memory for textures", [&] { refuseMemory(glTexImage2D); }, "OpenGL error 5: Out of memory"},
        {"no memory for compressed textures", [&] { refuseMemory(glCompressedTexImage2D); },
         "PVR texture \"tile.pvr\" failed to load: OpenGL error 5: Out of memory."},
        {"no memory for copies", [&] { refuseMemory(glCopyTexImage2D); },
         "No texture from backbuffer, format 1: OpenGL error 5: Out of memory"},
        {"no memory for renderbuffers", [&] { refuseMemory(glRenderbufferStorage); },
         "Framebuffer attachment points not complete."},
        {"no extensions, so no packed depth and stencil", [] { glcalls::setExtensions(""); }, incomplete},
    };
    const Picture expected = showFirst(Size::FULL);
    replaceContext();
    const SharedPtr<AssetCachePool> pool = makePool();
    const auto context = makeShared<RenderContext>();
    for (const auto& kind : kinds)
    {
        LogCapture log;
        kind.begin();
        show(pool, Size::FULL, context);
        flush(*pool);
        EXPECT_TRUE(log.contains(kind.message)) << kind.name << log.text();
        EXPECT_EQ("", glcalls::describeLiveNames()) << kind.name;
        glcalls::reset();
        EXPECT_TRUE(comparePictures("refusal", expected, show(pool, Size::FULL, context), {.perChannel = 0}))
            << kind.name << log.text();
        flush(*pool);
    }
}

// Fault caught: a name or an object more with every load, or with every context.
TEST_F(RefusalTest, aThousandRoundsAndAHundredLossesLeaveNothing)
{
    LogCapture log;
    const SharedPtr<AssetCachePool> pool = makePool();
    int64_t live = 0;
    for (int round = -100; round < 1000; ++round) // the first ones fill what is kept for later
    {
        if (round == 0)
            live = support::countLiveAllocations();
        if (round % 100 == 0)
        {
            replaceContext();
            show(pool, Size::FULL);
        }
        else
            loadSome(*pool);
        if (round % 10 == 5)
        {
            replaceContext();
            pool->forgetContext();
        }
        flush(*pool);
        ASSERT_EQ("", glcalls::describeLiveNames()) << round;
    }
    EXPECT_EQ(live, support::countLiveAllocations());
    EXPECT_EQ(0, log.count('E')) << log.text();
}
