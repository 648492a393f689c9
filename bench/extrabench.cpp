// The cost of engine/extra: a frame with and without shadows, lines over a frame, and picking.
//
//   extrabench [cubes]
//
// "Driver" times are whole frames up to glFinish; for "alone" times every GL call is dropped, which leaves the engine's
// own cost. Medians.

#include "timing.h"

#include "glcalls/glcalls.h"
#include "headless/headless.h"

#include <orv/orv.h>

#include <cmath>
#include <cstdio>
#include <cstdlib>
#include <random>
#include <vector>

using namespace orv;

namespace
{

constexpr int WIDTH = 640;
constexpr int HEIGHT = 360;
constexpr int WARM_FRAMES = 3;
constexpr int TIMED_FRAMES = 21;
constexpr int LINES = 10000;
constexpr int TRIANGLES = 100000;
constexpr int RAYS = 20001;

[[noreturn]] void giveUp(const char* reason)
{
    std::fprintf(stderr, "extrabench: %s\n", reason);
    std::exit(EXIT_FAILURE);
}

/// One line of the table: a frame's times, calls and draws.
template <class Frame>
void report(const char* name, const Frame& frame)
{
    std::vector<double> driver;
    std::vector<double> alone;
    for (int i = 0; i < WARM_FRAMES; ++i)
        frame();
    glcalls::resetCounts();
    frame();
    const uint64_t calls = glcalls::total();
    const uint64_t draws = glcalls::count("glDrawElements") + glcalls::count("glDrawArrays");
    for (int i = 0; i < TIMED_FRAMES; ++i)
        driver.push_back(measureMs(
            [&]
            {
                frame();
                glFinish();
            }));
    glcalls::dropAll();
    for (int i = 0; i < TIMED_FRAMES; ++i)
        alone.push_back(measureMs(frame));
    glcalls::dropAll(false);
    std::printf("%-34s %8.2f %8.3f %8llu %6llu\n", name, getMedian(driver), getMedian(alone),
                static_cast<unsigned long long>(calls), static_cast<unsigned long long>(draws));
}

/// Cubes above a floor, in the light of one sun, which a camera looks down on.
class Yard
{
public:
    explicit Yard(int cubes)
    {
        addCubes(cubes);
        const auto sun = makeShared<Light>();
        sun->setLightType(Light::LightType::DIRECTIONAL);
        sun->setPosition(Vector3f(3.0f, 5.0f, 2.0f));
        sun->setParent(scene);
        point(*sun, Vector3f());
        camera->setPosition(Vector3f(0.0f, 30.0f, 40.0f));
        point(*camera, Vector3f());
        block = makeShared<RenderBlock>(makeShared<SimpleRenderer>(context, pool), scene, camera);
    }

    ~Yard()
    {
        block = nullptr;
        scene = nullptr;
        pool->flush();
        pool->flush();
    }

    SharedPtr<AssetCachePool> pool = makeShared<AssetCachePool>();
    SharedPtr<RenderContext> context = makeShared<RenderContext>();
    SharedPtr<SceneNode> scene = makeShared<SceneNode>();
    SharedPtr<Camera> camera = makeShared<Camera>();
    SharedPtr<RenderBlock> block;

private:
    void addCubes(int count)
    {
        const auto material = makeShared<Appearance>();
        material->setShaderProgram(pool->getShaderProgramCache()->get("orv#max_ppl.sp$DIFF$SPEC$AMBI"));
        const int side = int(std::ceil(std::sqrt(double(count))));
        const float step = 40.0f / float(side);
        for (int i = 0; i <= count; ++i)
        {
            const SharedPtr<Solid> cube = createCube(*pool, Vector2f(1.0f, 1.0f));
            if (!cube)
                giveUp("no cube");
            cube->setAppearance(material);
            const float size = step * 0.25f;
            cube->setScale(i < count ? Vector3f(size, size, size)
                                     : Vector3f(25.0f, 0.1f, 25.0f)); // the floor
            if (i < count)
                cube->setPosition(Vector3f(float(i % side - side / 2) * step, size * 2.0f,
                                           float(i / side - side / 2) * step));
            cube->setParent(scene);
        }
    }
};

void benchFrames(int cubes)
{
    Yard yard(cubes);
    std::printf("%-34s %8s %8s %8s %6s\n", "frame", "driver ms", "alone ms", "GL calls", "draws");
    const auto draw = [&] { yard.block->render(); };
    report("plain", draw);

    const auto lines = makeShared<DebugLines>(*yard.pool);
    for (int i = 0; i < LINES; ++i)
        lines->addLine(Vector3f(float(i % 100), 1.0f, 0.0f), Vector3f(0.0f, 1.0f, float(i / 100)),
                       Colour4f::GREEN);
    report("with 10,000 lines that stay",
           [&]
           {
               draw();
               lines->draw(*yard.context, *yard.camera);
           });
    report("with 10,000 lines made again",
           [&]
           {
               draw();
               lines->clear();
               for (int i = 0; i < LINES; ++i)
                   lines->addLine(Vector3f(float(i % 100), 1.0f, 0.0f), Vector3f(0.0f, 1.0f, float(i / 100)),
                                  Colour4f::GREEN);
               lines->draw(*yard.context, *yard.camera);
           });

    const auto shadows = makeShared<ShadowMap>(yard.context, yard.pool);
    if (shadows->attach(*yard.scene) == 0)
        giveUp("no shadows");
    report("with shadows",
           [&]
           {
               shadows->render(*yard.scene, yard.camera.get());
               draw();
           });
    report("with shadows that stay", draw);
}

void benchPicking()
{
    std::mt19937 random(1);
    const auto number = [&](float reach)
    { return std::uniform_real_distribution<float>(-reach, reach)(random); };
    // A bumpy sheet: the corners of a grid, in strips of triangles.
    const int side = int(std::sqrt(TRIANGLES / 2.0));
    const auto vertices = makeShared<MeshVertices>();
    std::vector<unsigned short> indices;
    for (int i = 0; i <= side; ++i)
        for (int j = 0; j <= side; ++j)
            vertices->places.push_back(Vector3f(float(i - side / 2), number(2.0f), float(j - side / 2)));
    for (int i = 0; i < side * side; ++i)
    {
        const int first = i / side * (side + 1) + i % side;
        for (const int corner :
             {first, first + 1, first + side + 1, first + side + 1, first + 1, first + side + 2})
            indices.push_back(static_cast<unsigned short>(corner));
    }
    const MeshGeometry geometry(vertices, IndexBuffer::Primitive::TRIANGLES, indices.data(), indices.size());
    std::vector<double> times;
    int met = 0;
    const auto look = [&]
    {
        Ray ray = {Vector3f(number(200.0f), 50.0f + number(20.0f), number(200.0f)), Vector3f()};
        ray.direction = Vector3f(number(100.0f), 0.0f, number(100.0f)) - ray.position;
        MeshHit hit;
        hit.distance = 1000.0f;
        met += meet(geometry, ray, TriangleSides::BOTH, hit) ? 1 : 0;
    };
    const double first = measureMs(look);
    for (int i = 0; i < RAYS; ++i)
        times.push_back(measureMs(look));
    const double median = getMedian(times);
    std::printf("\npicking among %zu triangles: the first look %.0f ms, then %.1f microseconds (median of "
                "%d, of which %d met)\n",
                geometry.getTriangles().size() / 3, first, median * 1000.0, RAYS, met);
}

} // namespace

int main(int argc, char** argv)
{
    setLogLevel(LogLevel::WARNING);
    const int cubes = argc > 1 ? std::atoi(argv[1]) : 400;
    if (cubes < 1 || argc > 2)
        giveUp("takes a number of cubes");
    headless::Options options;
    options.width = WIDTH;
    options.height = HEIGHT;
    std::string error;
    const auto gl = headless::Context::create(options, error);
    if (!gl)
        giveUp(error.c_str());
    benchFrames(cubes);
    benchPicking();
    return 0;
}
