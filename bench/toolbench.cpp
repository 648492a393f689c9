// The cost of the tools: converting models beside libassimp's own reading of them, and the time from a scene file to a
// finished PNG and to a first frame.
//
//     toolbench [FOLDER]
//
// FOLDER holds models, Debian's assimp-testmodels if none is given. All times are wall time from a process's start to its
// exit, in ms, medians of several. "Read" is a process that only reads the file with libassimp, "for drawing" one that
// also applies libassimp's preset TargetRealtime_Quality. The difference between the first and the converter is the
// converter's own work: normals, tangents, joining, ordering, textures and writing.

#include "timing.h"

#include "glo/glowriter.h"
#include "headless/headless.h"
#include "headless/png.h"

#include "orv/assetcachepool.h"
#include "orv/camera.h"
#include "orv/glo.h"
#include "orv/light.h"
#include "orv/logsink.h"
#include "orv/renderblock.h"
#include "orv/rendercontext.h"
#include "orv/simplerenderer.h"

#include <GLES2/gl2.h>
#include <assimp/Importer.hpp>
#include <assimp/postprocess.h>

#include <fcntl.h>
#include <spawn.h>
#include <sys/wait.h>
#include <unistd.h>

#include <algorithm>
#include <cmath>
#include <cstdio>
#include <cstdlib>
#include <cstring>
#include <filesystem>
#include <fstream>

using namespace orv;
namespace fs = std::filesystem;

namespace
{

constexpr int CONVERSIONS = 7;
constexpr int STARTS = 15;
constexpr int TEXTURE_SIDE = 512;

const char* const READ = "--read"; // MODEL: read it and exit
const char* const READ_FOR_DRAWING = "--read-for-drawing";
const char* const DRAW = "--draw"; // FOLDER SCENE: draw one frame and exit

// The large models of the collection, and one of each kind of file.
const char* const MODELS[] = {
    "glTF2/2CylinderEngine-glTF-Binary/2CylinderEngine.glb",
    "glTF2/ClearCoat-glTF/ClearCoatTest.gltf",
    "FBX/animation_with_skeleton.fbx",
    "FBX/spider.fbx",
    "Collada/duck.dae",
    "Collada/COLLADA.dae",
    "Collada/human.zae",
    "OBJ/WusonOBJ.obj",
    "OBJ/spider.obj",
    "PLY/Wuson.ply",
    "STL/Spider_ascii.stl",
    "X/BCN_Epileptic.X",
    "X/Testwuson.X",
    "ASE/MotionCaptureROM.ase",
    "BVH/01_03.bvh",
    "IFC/AC14-FZK-Haus.ifc",
    "MS3D/jeep1.ms3d",
    "NFF/NFF/positionTest.nff",
};

[[noreturn]] void giveUp(const std::string& reason)
{
    std::fprintf(stderr, "toolbench: %s\n", reason.c_str());
    std::exit(EXIT_FAILURE);
}

/// @return the exit code; what the program prints is dropped.
int run(const std::vector<std::string>& command)
{
    std::vector<char*> arguments;
    for (const std::string& argument : command)
        arguments.push_back(const_cast<char*>(argument.c_str()));
    arguments.push_back(nullptr);
    posix_spawn_file_actions_t files;
    posix_spawn_file_actions_init(&files);
    for (int output : {STDOUT_FILENO, STDERR_FILENO})
        posix_spawn_file_actions_addopen(&files, output, "/dev/null", O_WRONLY, 0);
    pid_t child;
    int status = -1;
    const bool isRunning = posix_spawn(&child, arguments[0], &files, nullptr, arguments.data(), environ) == 0;
    posix_spawn_file_actions_destroy(&files);
    if (!isRunning || waitpid(child, &status, 0) != child || !WIFEXITED(status))
        giveUp(command[0] + " does not run");
    return WEXITSTATUS(status);
}

struct Times
{
    double best = 0.0;
    double median = 0.0;
};

Times measureRuns(int runs, const std::vector<std::string>& command)
{
    std::vector<double> times;
    for (int i = 0; i < runs; ++i)
        times.push_back(measureMs(
            [&]
            {
                if (run(command) != EXIT_SUCCESS)
                    giveUp(command[0] + " fails on " + command.back());
            }));
    return {*std::min_element(times.begin(), times.end()), getMedian(times)};
}

void compareConversions(const fs::path& models, const std::string& folder)
{
    std::printf("%-55s %8s %12s %8s %6s\n", "Converting, ms", "read", "for drawing", "convert", "ratio");
    double read = 0.0, readForDrawing = 0.0, convert = 0.0;
    int slow = 0, count = 0;
    for (const char* model : MODELS)
    {
        const std::string path = (models / model).string();
        if (!fs::exists(path))
            continue;
        const double plain = measureRuns(CONVERSIONS, {getProgram(), READ, path}).median;
        const double forDrawing = measureRuns(CONVERSIONS, {getProgram(), READ_FOR_DRAWING, path}).median;
        const double ours = measureRuns(CONVERSIONS, {ORV_CONVERT, path, folder + "/model.glo"}).median;
        std::printf("%-55s %8.1f %12.1f %8.1f %6.2f\n", model, plain, forDrawing, ours, ours / plain);
        read += plain;
        readForDrawing += forDrawing;
        convert += ours;
        slow += ours > 2.0 * plain;
        ++count;
    }
    if (count == 0)
        giveUp("no models in " + models.string());
    std::printf("%-55s %8.1f %12.1f %8.1f %6.2f\n", "all", read, readForDrawing, convert, convert / read);
    std::printf(
        "%d of %d take more than twice the time of reading; all together %.2f times that for drawing\n\n",
        slow, count, convert / readForDrawing);
}

void writeTexture(const std::string& path)
{
    std::vector<uint8_t> rgba;
    for (int y = 0; y < TEXTURE_SIDE; ++y)
    {
        for (int x = 0; x < TEXTURE_SIDE; ++x)
            rgba.insert(rgba.end(), {uint8_t(x / 2), uint8_t(y / 2), uint8_t((x ^ y) & 0xff), 255});
    }
    std::string error;
    if (!headless::writePng(path, TEXTURE_SIDE, TEXTURE_SIDE, rgba.data(), error))
        giveUp(error);
}

glo::Geometry makeBall(int columns, int rows)
{
    glo::FloatAttribute position{"a_position", 3, {}};
    glo::FloatAttribute normal{"a_normal", 3, {}};
    glo::FloatAttribute uv{"a_uv0", 2, {}};
    for (int row = 0; row <= rows; ++row)
    {
        for (int column = 0; column <= columns; ++column)
        {
            const float u = float(column) / float(columns);
            const float v = float(row) / float(rows);
            const float around = u * 6.2831853f;
            const float up = v * 3.1415927f;
            const float out = std::sin(up);
            const std::initializer_list<float> place = {out * std::sin(around), -std::cos(up),
                                                        out * std::cos(around)};
            position.values.insert(position.values.end(), place);
            normal.values.insert(normal.values.end(), place);
            uv.values.insert(uv.values.end(), {u, v});
        }
    }
    glo::PrimitiveSet set;
    set.indices.emplace();
    for (int row = 0; row < rows; ++row)
    {
        for (int column = 0; column < columns; ++column)
        {
            const int corner = row * (columns + 1) + column;
            for (int index : {corner, corner + 1, corner + columns + 1, corner + 1, corner + columns + 2,
                              corner + columns + 1})
                set.indices->indices.push_back(uint16_t(index));
        }
    }
    glo::Geometry geometry;
    geometry.name = "ball";
    geometry.vertices = glo::makeVertexSet({position, normal, uv});
    geometry.primitiveSets.push_back(set);
    return geometry;
}

/// A textured ball.
void writeScene(const std::string& path, int columns, int rows)
{
    glo::GloScene scene;
    scene.geometries.push_back(makeBall(columns, rows));
    glo::StandardMaterial skin;
    skin.diffuse.colour = Vector4f(1.0f, 1.0f, 1.0f, 1.0f);
    skin.diffuse.sampler.emplace().image = "toolbench.png";
    scene.materials.push_back({"skin", {skin}});
    glo::NodeData& node = scene.scene.emplace().top.children.emplace_back();
    scene.scene->top.name = "top";
    node.name = "ball";
    node.geometry.emplace().geometry = "ball";
    node.geometry->materials.push_back("skin");
    std::vector<uint8_t> bytes;
    std::string error;
    if (!glo::writeGlo(scene, bytes, error))
        giveUp(error);
    std::ofstream(path, std::ios::binary)
        .write(reinterpret_cast<const char*>(bytes.data()), std::streamsize(bytes.size()));
}

void print(const char* what, const Times& times)
{
    std::printf("%-55s median %6.1f, best %6.1f\n", what, times.median, times.best);
}

void measureViews(const std::string& folder)
{
    writeTexture(folder + "/toolbench.png");
    writeScene(folder + "/10000.glo", 100, 50);
    writeScene(folder + "/100000.glo", 500, 100);
    const std::string picture = folder + "/picture.png";
    print("10,000 triangles to PNG by orv-view, ms",
          measureRuns(STARTS, {ORV_VIEW, folder + "/10000.glo", "--out", picture}));
    print("100,000 triangles to PNG by orv-view, ms",
          measureRuns(STARTS, {ORV_VIEW, folder + "/100000.glo", "--out", picture}));
    print("100,000 triangles to first frame in a bare program, ms",
          measureRuns(STARTS, {getProgram(), DRAW, folder, "100000.glo"}));
}

int readModel(const char* path, unsigned steps)
{
    Assimp::Importer importer;
    const bool isRead = importer.ReadFile(path, steps);
    std::fflush(nullptr);
    _exit(isRead ? EXIT_SUCCESS : EXIT_FAILURE); // freeing memory is not part of reading
}

int drawFirstFrame(const char* folder, const char* file)
{
    std::string error;
    headless::Options options;
    options.width = 800;
    options.height = 600;
    const auto surface = headless::Context::create(options, error);
    if (!surface)
        giveUp(error);
    const auto pool = makeShared<AssetCachePool>();
    registerSource(*pool, folder, false);
    const auto scene = makeShared<SceneNode>();
    if (!loadGloFile(*pool, scene, file))
        giveUp("the engine does not load the file");
    const auto camera = makeShared<Camera>();
    camera->setPosition(Vector3f(0.0f, 0.0f, 4.0f));
    makeShared<Light>()->setParent(scene);
    RenderBlock(makeShared<SimpleRenderer>(makeShared<RenderContext>(), pool), scene, camera).render();
    glFinish();
    _exit(EXIT_SUCCESS);
}

} // namespace

int main(int argc, char** argv)
{
    orv::setLogLevel(orv::LogLevel::WARNING);
    if (argc == 3 && !std::strcmp(argv[1], READ))
        return readModel(argv[2], 0);
    if (argc == 3 && !std::strcmp(argv[1], READ_FOR_DRAWING))
        return readModel(argv[2], aiProcessPreset_TargetRealtime_Quality);
    if (argc == 4 && !std::strcmp(argv[1], DRAW))
        return drawFirstFrame(argv[2], argv[3]);

    const std::string folder =
        (fs::temp_directory_path() / ("toolbench." + std::to_string(getpid()))).string();
    fs::create_directories(folder);
    compareConversions(argc > 1 ? argv[1] : "/usr/share/assimp/models", folder);
    measureViews(folder);
    fs::remove_all(folder);
    return EXIT_SUCCESS;
}
