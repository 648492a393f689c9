// orv-convert: makes a scene file, with its textures beside it, of a model file.

#include "conversion.h"
#include "convert/files/filegate.h"
#include "guard.h"
#include "progress.h"

#include "commandline/commandline.h"

#include <algorithm>
#include <cstdio>
#include <filesystem>

namespace
{

constexpr int LARGEST_TEXTURE = 16384; // pixels, as far as the engine goes

struct Command
{
    std::string model;
    std::string out;
    std::string report;
    bool dryRun = false;
    bool noAnimation = false;
    std::string keys = "stepped";
    std::vector<std::string> allowed;
    convert::Options options;
    convert::Limits limits;
};

const char* const FOOTER =
    "Textures are written beside the scene, their names beginning with its name. Files of these names are\n"
    "replaced; on failure nothing is written. Exit code: 0 converted, 1 not, 2 wrong usage.\n\n"
    "Examples:\n"
    "  orv-convert duck.dae duck.glo                        duck.glo and duck-duckCM.tga\n"
    "  orv-convert walk.fbx scenes/walk.glo --fps 60        smoother animations, larger file\n"
    "  orv-convert walk.fbx walk.glo --keys sparse          smooth animations, smaller file\n"
    "  orv-convert part.stl part.glo --up z --scale 0.001   from millimetres with z up\n"
    "  orv-convert house.gltf house.glo --max-texture-size 1024 --power-of-two\n"
    "  orv-convert big.ifc big.glo --dry-run                only say what would come of it\n"
    "  orv-convert a.glb a.glo --report a.json              for a script (docs/convert.md)\n"
    "  orv-convert source/car.fbx car.glo --allow textures  a model whose pictures lie elsewhere\n"
    "  orv-convert city.obj city.glo --time-limit 0 --memory-limit 16384";

int fail(const std::string& message)
{
    std::fprintf(stderr, "orv-convert: %s\n", message.c_str());
    return commandline::FAILED;
}

/// In a child process.
bool convertGuarded(const Command& command, convert::FileGate& gate, convert::Conversion& made,
                    std::string& error)
{
    const auto work = [&](std::FILE* stream, convert::ModelFiles& files) {
        return convert::send(convert::convertFile(command.model, files, command.out, command.options),
                             stream);
    };
    const auto accept = [&](std::FILE* stream)
    {
        made = {};
        return convert::receive(made, command.out, stream);
    };
    const bool done = convert::runGuarded(command.limits, command.model, gate, work, accept, error);
    convert::clearProgress();
    if (done)
        error = made.error;
    return done && error.empty();
}

/// Whether a texture would get the place of a file that the model was read from.
bool takesInput(const convert::Conversion& made, const Command& command, const convert::FileGate& gate)
{
    return std::any_of(made.files.begin(), made.files.end(),
                       [&](const convert::OutputFile& file)
                       { return file.path != command.out && gate.wasOpened(file.path); });
}

int run(Command command)
{
    convert::FileGate gate(command.model, command.allowed);
    convert::Conversion made;
    std::string error;
    bool done = convertGuarded(command, gate, made, error);
    if (done && takesInput(made, command, gate)) // which only shows when all has been read
    {
        for (const convert::OutputFile& file : made.files)
        {
            if (gate.wasOpened(file.path))
                command.options.takenNames.insert(std::filesystem::path(file.path).stem().string());
        }
        for (const std::filesystem::path& input : gate.getOpened())
            command.options.takenNames.insert(input.stem().string());
        done = convertGuarded(command, gate, made, error);
    }
    if (!done)
        return fail(command.model + ": " + error);

    std::vector<convert::OutputFile> files;
    if (!command.dryRun)
        files = std::move(made.files);
    const bool isReportPrinted = command.report == "-";
    if (!command.report.empty() && !isReportPrinted)
        files.insert(files.begin(), {command.report, {made.json.begin(), made.json.end()}});
    if (!convert::writeFiles(files, gate, error))
        return fail(error);
    std::fputs(isReportPrinted ? made.json.c_str() : made.text.c_str(), stdout);
    if (command.dryRun && !isReportPrinted)
        std::puts("Dry run: no scene or texture has been written.");
    return 0;
}

void addOptions(CLI::App& app, Command& command)
{
    convert::Options& options = command.options;
    app.add_option("MODEL", command.model, "the model file")->required();
    app.add_option("OUT.glo", command.out, "the scene file to write")->required();
    app.add_option("--fps", options.fps, "samples per second of animations")
        ->check(CLI::Range(1.0, 1000.0))
        ->capture_default_str();
    app.add_option("--keys", command.keys,
                   "stepped: a key for each change; sparse: keys where movement bends, to be interpolated")
        ->check(CLI::IsMember({"stepped", "sparse"}))
        ->capture_default_str();
    app.add_option("--key-error", options.keyError,
                   "of sparse keys: a share of the model's size, radians, a share of 1 for scales")
        ->check(CLI::Range(1e-6, 0.1))
        ->capture_default_str();
    app.add_flag("--no-animation", command.noAnimation, "leave animations out");
    app.add_option("--up", options.up, "the axis that points up in the model, if its file has it wrong")
        ->check(CLI::IsMember({"x", "y", "z"}));
    app.add_option("--scale", options.scale, "makes everything larger by this factor")
        ->check(CLI::Range(1e-6, 1e6))
        ->capture_default_str();
    app.add_option("--max-texture-size", options.maxTextureSize, "makes larger textures smaller; in pixels")
        ->check(CLI::Range(1, LARGEST_TEXTURE));
    app.add_flag("--power-of-two", options.powerOfTwo,
                 "gives all textures sizes that can have mipmaps and repeat");
    app.add_option("--allow", command.allowed,
                   "another folder that the model may have files in, with what is below it; may be repeated")
        ->allow_extra_args(false)
        ->check(CLI::ExistingDirectory)
        ->option_text("DIR");
    app.add_option("--linear", options.linear,
                   "whether materials reckon in shares of light; by default those of glTF do")
        ->check(CLI::IsMember({"on", "off"}));
    app.add_flag("--sky", options.sky, "gives metals a plain sky to mirror");
    app.add_option("--report", command.report,
                   "also write what is reported as JSON to this file; - for standard output alone")
        ->option_text("FILE");
    app.add_flag("--dry-run", command.dryRun, "write no scene and no textures");
    app.add_option("--time-limit", command.limits.seconds, "seconds after which to give up; 0 for never")
        ->check(CLI::Range(0.0, 1e6))
        ->capture_default_str();
    app.add_option("--memory-limit", command.limits.mebibytes,
                   convert::CAN_LIMIT_MEMORY ? "MiB of memory above which to give up; 0 for no limit"
                                             : "without effect in this build, which checks addresses")
        ->check(CLI::Range(0, 1 << 24))
        ->capture_default_str();
    app.footer(FOOTER);
}

} // namespace

int main(int argc, char** argv)
{
    CLI::App app("Makes a scene file of a model (glTF, Collada, FBX, OBJ, 3DS, PLY and many more).",
                 "orv-convert");
    Command command;
    addOptions(app, command);
    commandline::addCommon(app);
    try
    {
        app.parse(argc, argv);
    }
    catch (const CLI::ParseError& error)
    {
        return commandline::finishParsing(app, error);
    }
    command.options.animation = !command.noAnimation;
    command.options.sparseKeys = command.keys == "sparse";
    if (std::filesystem::path(command.out).extension() != ".glo")
    {
        fail(command.out + ": the output's name has to end in .glo");
        return commandline::MISUSED;
    }
    return commandline::finishOutput("orv-convert", run(command));
}
