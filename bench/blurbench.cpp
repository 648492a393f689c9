// The cost of motion blur: a frame drawn directly to the surface, a blurred frame, and the three parts of the latter:
// the scene into a texture, its velocities into another, and the composition of the two.
//
//   blurbench [cubes]
//
// "Driver" times are whole frames up to glFinish; for "alone" times every GL call is dropped, which leaves the engine's
// own cost. Medians of many frames.

#include "timing.h"

#include "glcalls/glcalls.h"
#include "headless/headless.h"

#include <orv/orv.h>

#include <cstdio>
#include <cstdlib>
#include <vector>

using namespace orv;

namespace
{

constexpr int WIDTH = 640;
constexpr int HEIGHT = 360;
constexpr int WARM_FRAMES = 5;
constexpr int TIMED_FRAMES = 31;
constexpr float FRAME_SECONDS = 1.0f / 60.0f;
constexpr int COLUMNS = 25;

[[noreturn]] void giveUp(const char* reason)
{
    std::fprintf(stderr, "blurbench: %s\n", reason);
    std::exit(EXIT_FAILURE);
}

/// A wall of cubes, every other one spinning, and the blocks that draw it in both ways.
class Wall
{
public:
    explicit Wall(int cubes)
        : m_pool(makeShared<AssetCachePool>())
        , m_context(makeShared<RenderContext>())
        , m_scene(makeShared<SceneNode>())
        , m_camera(makeShared<Camera>())
    {
        addCubes(cubes);
        const auto sun = makeShared<Light>();
        sun->setLightType(Light::LightType::DIRECTIONAL);
        sun->setParent(m_scene);
        m_camera->setPosition(Vector3f(0.0f, 0.0f, 50.0f));

        m_renderer = makeShared<SimpleRenderer>(m_context, m_pool);
        const auto velocityRenderer = makeShared<MotionBlurRenderer>(m_context, m_pool);
        m_context->getProperty("MOTION_BLUR_FACTOR")->setValue(1.0f, 0);

        plain = makeShared<RenderBlock>(m_renderer, m_scene, m_camera);
        sharp = makeShared<RenderBlock>(m_renderer, m_scene, m_camera);
        sharp->setRenderTarget(makeTarget());
        velocity = makeShared<RenderBlock>(velocityRenderer, m_scene, m_camera);
        velocity->setRenderTarget(makeTarget());
        blurred = makeShared<RenderBlockGroup>();
        blurred->addBlock(sharp);
        blurred->addBlock(velocity);
        composed = makeComposition(*sharp->getRenderTarget(), *velocity->getRenderTarget());
        blurred->addBlock(composed);
        for (const RenderBlock::Ptr& block : {plain, sharp, velocity})
            block->setBackgroundColour(Colour4f::BLACK);
    }

    ~Wall()
    {
        plain.reset();
        sharp.reset();
        velocity.reset();
        composed.reset();
        blurred.reset();
        m_renderer.reset();
        m_spinning.clear();
        m_scene.reset();
        m_pool->flush();
        m_pool->flush();
    }

    void draw(RenderBlockBase& frame, int number) const
    {
        for (const Solid::Ptr& cube : m_spinning)
            cube->setRotation(
                quaternionFromAxisAngle(Vector3f::Z_AXIS, Anglef::fromDegrees(10.0f * float(number))));
        frame.update(float(number) * FRAME_SECONDS);
        frame.render();
    }

    RenderBlock::Ptr plain;
    RenderBlock::Ptr sharp;
    RenderBlock::Ptr velocity;
    RenderBlock::Ptr composed;
    RenderBlockGroup::Ptr blurred; ///< the three

private:
    void addCubes(int count)
    {
        const Appearance::Ptr appearance = loadAppearance(*m_pool, "orv#default_pvl.ap");
        const Solid::Ptr first = createCube(*m_pool, Vector2f(1.0f, 1.0f));
        if (!first)
            giveUp("no cube");
        const int rows = (count + COLUMNS - 1) / COLUMNS;
        for (int i = 0; i < count; ++i)
        {
            const auto cube = makeShared<Solid>(first->getMesh(), appearance);
            cube->setPosition(
                Vector3f(float(i % COLUMNS - COLUMNS / 2), float(i / COLUMNS - rows / 2), 0.0f) * 3.0f);
            cube->setParent(m_scene);
            if (i % 2)
                m_spinning.push_back(cube);
        }
    }

    SharedPtr<RenderTarget> makeTarget()
    {
        const auto texture = m_pool->getTexture2DCache()->create(
            WIDTH, HEIGHT, Texture::Format::RGBA, Texture::Type::UNSIGNED_BYTE, nullptr, nullptr);
        const auto target = makeShared<RenderTarget>(texture, nullptr, true, false);
        if (!target->isComplete())
            giveUp("no render target");
        return target;
    }

    RenderBlock::Ptr makeComposition(const RenderTarget& scene, const RenderTarget& velocities)
    {
        const auto appearance = makeShared<Appearance>();
        appearance->setShaderProgram(m_pool->getShaderProgramCache()->get("orv#motionblur.sp"));
        appearance->setProperty("M_SHARP_TEXTURE", scene.getColourTexture());
        appearance->setProperty("M_VELOCITY_TEXTURE", velocities.getColourTexture());
        const Solid::Ptr square = createSquare(*m_pool, Vector2f(1.0f, 1.0f));
        square->setAppearance(appearance);
        const auto block = makeShared<RenderBlock>(m_renderer, square, nullptr);
        block->setViewport(0, 0, WIDTH, HEIGHT);
        return block;
    }

    SharedPtr<AssetCachePool> m_pool;
    SharedPtr<RenderContext> m_context;
    SceneNode::Ptr m_scene;
    Camera::Ptr m_camera;
    SimpleRenderer::Ptr m_renderer;
    std::vector<Solid::Ptr> m_spinning;
};

double measureMedianMs(const Wall& wall, RenderBlockBase& frame)
{
    std::vector<double> times;
    for (int i = 0; i < WARM_FRAMES + TIMED_FRAMES; ++i)
        times.push_back(measureMs(
            [&]
            {
                wall.draw(frame, i + 1);
                glFinish();
            }));
    times.erase(times.begin(), times.begin() + WARM_FRAMES);
    return getMedian(times);
}

void report(const char* name, const Wall& wall, RenderBlockBase& frame)
{
    const double driverMs = measureMedianMs(wall, frame);
    if (glGetError() != GL_NO_ERROR)
        giveUp("GL reports an error");
    glcalls::resetCounts();
    wall.draw(frame, WARM_FRAMES + TIMED_FRAMES + 1);
    const double glCalls = double(glcalls::total());
    glcalls::dropAll();
    const double aloneMs = measureMedianMs(wall, frame);
    glcalls::dropAll(false);
    std::printf("%-10s  %8.0f  %9.3f  %9.3f\n", name, glCalls, driverMs, aloneMs);
}

} // namespace

int main(int argc, char** argv)
{
    orv::setLogLevel(orv::LogLevel::WARNING);
    const int cubes = argc > 1 ? std::atoi(argv[1]) : 250;
    if (cubes < 1)
        giveUp("usage: blurbench [cubes]");
    headless::Options options;
    options.width = WIDTH;
    options.height = HEIGHT;
    std::string error;
    const auto surface = headless::Context::create(options, error);
    if (!surface)
        giveUp(error.c_str());

    const Wall wall(cubes);
    std::printf("%s\n%d cubes, every other one spinning, %d x %d\n\n", surface->describe().c_str(), cubes,
                WIDTH, HEIGHT);
    std::printf("%-10s  %8s  %9s  %9s\n", "frame", "GL calls", "driver ms", "alone ms");
    report("plain", wall, *wall.plain);
    report("blurred", wall, *wall.blurred);
    report("- sharp", wall, *wall.sharp);
    report("- velocity", wall, *wall.velocity);
    report("- composed", wall, *wall.composed);
    return EXIT_SUCCESS;
}
