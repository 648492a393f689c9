// orv-convert: makes a scene file, with its textures beside it, of a model file.

#include "model.h"
#include "outputfiles.h"

#include <CLI/CLI.hpp>

#include <cstdio>
#include <filesystem>

namespace
{

constexpr int FAILED = 1; // exit codes
constexpr int MISUSED = 2;

int fail(const std::string& path, const std::string& reason)
{
    std::fprintf(stderr, "orv-convert: %s: %s\n", path.c_str(), reason.c_str());
    return FAILED;
}

size_t countNodes(const glo::NodeData& node)
{
    size_t count = 1;
    for (const glo::NodeData& child : node.children)
        count += countNodes(child);
    return count;
}

void print(const std::string& in, const std::string& out, const convert::ConvertedModel& model, size_t size)
{
    const glo::GloScene& scene = model.scene;
    std::printf("%s: %u nodes, %zu vertices, %zu triangles\n", in.c_str(), model.nodeCount, model.vertexCount,
                model.triangleCount);
    std::printf(
        "%s: %zu bytes, %zu nodes, %zu geometries, %zu materials, %zu lights, %zu cameras, %zu animations\n",
        out.c_str(), size, countNodes(scene.scene->top), scene.geometries.size(), scene.materials.size(),
        scene.lights.size(), scene.cameras.size(), scene.animations.size());
    for (const convert::OutputFile& texture : model.textures)
        std::printf("  texture %s: %zu bytes\n", texture.name.c_str(), texture.bytes.size());
    for (const auto& [loss, count] : model.report.getLosses())
        std::printf("  lost: %s%s\n", loss.c_str(),
                    count > 1 ? (" (" + std::to_string(count) + " times)").c_str() : "");
}

int run(const std::string& in, const std::string& out, const convert::Options& options)
{
    const std::filesystem::path path(out);
    convert::ConvertedModel model;
    std::string error;
    if (!convert::convertModel(in, path.stem().string(), options, model, error))
        return fail(in, error);

    convert::OutputFile file{path.filename().string(), {}};
    if (!glo::writeGlo(model.scene, file.bytes, error))
        return fail(in, error);
    std::vector<const convert::OutputFile*> files;
    for (const convert::OutputFile& texture : model.textures)
        files.push_back(&texture);
    files.push_back(&file);
    if (!convert::writeFiles(path.parent_path().string(), files, error))
    {
        std::fprintf(stderr, "orv-convert: %s\n", error.c_str());
        return FAILED;
    }
    print(in, out, model, file.bytes.size());
    return 0;
}

} // namespace

int main(int argc, char** argv)
{
    CLI::App app("Makes a scene file of a model (glTF, Collada, FBX, OBJ, 3DS, X and many more).");
    app.footer("Textures are written beside the scene, their names beginning with its name.\n"
               "Existing files of these names are replaced; on failure nothing is written.\n\n"
               "Examples:\n"
               "  orv-convert duck.dae duck.glo\n"
               "  orv-convert walk.fbx scenes/walk.glo --fps 60");
    std::string in;
    std::string out;
    convert::Options options;
    app.add_option("MODEL", in, "the model file")->required();
    app.add_option("OUT.glo", out, "the scene file to write")->required();
    app.add_option("--fps", options.fps, "samples per second of animations")
        ->check(CLI::Range(1.0, 1000.0))
        ->capture_default_str();
    try
    {
        app.parse(argc, argv);
    }
    catch (const CLI::ParseError& error)
    {
        return app.exit(error) == 0 ? 0 : MISUSED;
    }
    if (std::filesystem::path(out).extension() != ".glo")
    {
        std::fprintf(stderr, "orv-convert: %s: the output's name has to end in .glo\n", out.c_str());
        return MISUSED;
    }
    return run(in, out, options);
}
