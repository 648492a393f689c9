// orv-convert: converts a model file to a scene file with its textures beside it.

#include "batch/folder.h"

#include "commandline/commandline.h"
#include "commandline/terminaltext.h"

#include <cstdio>
#include <filesystem>

namespace
{

constexpr int LARGEST_TEXTURE = 16384; // pixels; the engine's limit
constexpr int MOST_PROCESSES = 1024;
constexpr unsigned MOST_SHARDS = 1000000;

struct Command
{
    convert::Job job;
    convert::FolderJob folder; ///< if the model is a folder
    std::string shard;
    bool noAnimation = false;
    std::string keys = "stepped";
};

const char* const FOOTER =
    "Textures are written beside the scene; their names begin with its name. Existing files are\n"
    "replaced; on failure nothing is written. In a folder, only new and changed models are "
    "converted, each with\n"
    "a report beside its scene. Exit code: 0 converted, 1 not (or not all), 2 wrong usage.\n\n"
    "Examples:\n"
    "  orv-convert duck.dae duck.glo                        duck.glo and duck-duckCM.tga\n"
    "  orv-convert walk.fbx scenes/walk.glo --fps 60        smoother animations, larger file\n"
    "  orv-convert walk.fbx walk.glo --keys sparse          smooth animations, smaller file\n"
    "  orv-convert part.stl part.glo --up z --scale 0.001   from millimetres with z up\n"
    "  orv-convert house.gltf house.glo --max-texture-size 1024 --power-of-two\n"
    "  orv-convert big.ifc big.glo --dry-run                only report what would be written\n"
    "  orv-convert a.glb a.glo --report a.json              for a script (docs/convert.md)\n"
    "  orv-convert walk.glb --page walk                     a folder that any web server shows\n"
    "  orv-convert source/car.fbx car.glo --allow textures  a model with pictures elsewhere\n"
    "  orv-convert models scenes --jobs 8                   a folder; later only changed models\n"
    "  orv-convert models scenes --shard 2/5                on the second of five machines\n"
    "  orv-convert city.obj city.glo --time-limit 0 --memory-limit 16384";

int fail(const std::string& message)
{
    std::fprintf(stderr, "orv-convert: %s\n", commandline::toTerminalText(message).c_str());
    return commandline::FAILED;
}

int run(convert::Job& job)
{
    const bool isReportPrinted = job.report == "-";
    if (isReportPrinted)
        job.report.clear();
    const convert::Outcome outcome = convert::convertModel(job);
    if (!outcome.error.empty())
        return fail(outcome.error);
    std::fputs(isReportPrinted ? outcome.json.c_str() : outcome.text.c_str(), stdout);
    if (!job.page.empty() && !job.dryRun && !isReportPrinted)
        std::printf("%s is a page for any web server, here and now: python3 -m http.server -d %s\n",
                    job.page.c_str(), job.page.c_str());
    if (job.dryRun && !isReportPrinted)
        std::puts("Dry run: no scene or texture has been written.");
    return 0;
}

int runFolder(Command& command)
{
    convert::FolderJob& folder = command.folder;
    folder.folder = command.job.model;
    folder.out = command.job.out;
    folder.common = command.job;
    return convert::convertFolder(folder) ? 0 : commandline::FAILED;
}

/// "2/5". @return "" or the error, as CLI11 expects.
std::string parseShard(const std::string& text, convert::FolderJob& job)
{
    char beyond = 0;
    const int found = std::sscanf(text.c_str(), "%u/%u%c", &job.shard, &job.shards, &beyond);
    const bool isFine = found == 2 && job.shard >= 1 && job.shard <= job.shards && job.shards <= MOST_SHARDS;
    return isFine ? "" : text + ": not a part and a number of parts, such as 2/5";
}

/// Rules for combinations of options, which CLI11 cannot express. @return the error, or empty.
std::string findConflict(const Command& command, bool isFolder)
{
    const convert::FolderJob& folder = command.folder;
    const convert::Job& job = command.job;
    if (job.out.empty())
        return "OUT.glo is required";
    if (isFolder && (job.dryRun || !job.report.empty() || !job.depfile.empty() || !job.page.empty()))
        return job.model + " is a folder: --dry-run, --report, --depfile and --page are for single models";
    if (!isFolder && (folder.again || folder.processes > 1 || !command.shard.empty()))
        return job.model + " is no folder: --again, --jobs and --shard are for folders";
    const bool isScene = std::filesystem::path(job.out).extension() == ".glo";
    if (isFolder && isScene)
        return job.model + " is a folder and " + job.out + " a scene: name a folder for the scenes";
    if (!isFolder && !isScene)
        return job.out + ": the output's name has to end in .glo";
    return "";
}

void addFolderOptions(CLI::App& app, Command& command)
{
    app.add_option("--jobs", command.folder.processes, "for a folder: how many models to convert in parallel")
        ->check(CLI::Range(1, MOST_PROCESSES))
        ->capture_default_str();
    app.add_option("--shard", command.shard,
                   "for a folder: convert only part I of N, to share the work among machines")
        ->option_text("I/N")
        ->check([&command](const std::string& text) { return parseShard(text, command.folder); });
    app.add_flag("--again", command.folder.again, "for a folder: convert unchanged models too");
    app.add_option("--depfile", command.job.depfile, "also write a dependency file for make and ninja")
        ->option_text("FILE");
}

void addOptions(CLI::App& app, Command& command)
{
    convert::Options& options = command.job.options;
    app.add_option("MODEL", command.job.model, "the model file, or a folder of models")->required();
    CLI::Option* const out = app.add_option("OUT.glo", command.job.out,
                                            "the scene file to write, or a folder for scenes and reports");
    app.add_option("--page", command.job.page,
                   "instead of OUT.glo: a folder for the scene and a web page that shows it, with "
                   "--power-of-two")
        ->option_text("DIR")
        ->excludes(out);
    app.add_option("--fps", options.fps, "samples per second of animations")
        ->check(CLI::Range(1.0, 1000.0))
        ->check(commandline::refuseNan())
        ->capture_default_str();
    app.add_option("--keys", command.keys,
                   "stepped: a key for each change; sparse: keys where movement bends, to be interpolated")
        ->check(CLI::IsMember({"stepped", "sparse"}))
        ->capture_default_str();
    app.add_option("--key-error", options.keyError,
                   "error limit of sparse keys: fraction of the model's size, radians, difference of scales")
        ->check(CLI::Range(1e-6, 0.1))
        ->check(commandline::refuseNan())
        ->capture_default_str();
    app.add_flag("--no-animation", command.noAnimation, "leave animations out");
    app.add_option("--up", options.up, "the model's up axis, if the file's own is wrong")
        ->check(CLI::IsMember({"x", "y", "z"}));
    app.add_option("--scale", options.scale, "scales everything by this factor")
        ->check(CLI::Range(1e-6, 1e6))
        ->check(commandline::refuseNan())
        ->capture_default_str();
    app.add_option("--max-texture-size", options.maxTextureSize,
                   "limit of the longer side of textures, in pixels")
        ->check(CLI::Range(1, LARGEST_TEXTURE));
    app.add_flag("--power-of-two", options.powerOfTwo,
                 "gives all textures sizes that can repeat and have mipmaps");
    app.add_option("--allow", command.job.allowed,
                   "another folder, with all below it, that the model may read files from; may be repeated")
        ->allow_extra_args(false)
        ->check(CLI::ExistingDirectory)
        ->option_text("DIR");
    app.add_option("--linear", options.linear,
                   "whether materials use linear light; by default those of glTF do")
        ->check(CLI::IsMember({"on", "off"}));
    app.add_flag("--sky", options.sky, "gives metals a plain sky to mirror");
    app.add_option("--report", command.job.report,
                   "also write the report as JSON to this file; - prints only that")
        ->option_text("FILE");
    app.add_flag("--dry-run", command.job.dryRun, "write no scene and no textures");
    app.add_option("--time-limit", command.job.limits.seconds, "time limit in seconds; 0 for none")
        ->check(CLI::Range(0.0, 1e6))
        ->check(commandline::refuseNan())
        ->capture_default_str();
    app.add_option("--memory-limit", command.job.limits.mebibytes,
                   convert::CAN_LIMIT_MEMORY ? "memory limit in MiB; 0 for none"
                                             : "without effect in this build with address checks")
        ->check(CLI::Range(0, 1 << 24))
        ->capture_default_str();
    addFolderOptions(app, command);
    app.footer(FOOTER);
}

/// The scene is named after the model, and its textures get sizes that WebGL supports.
void usePage(convert::Job& job)
{
    const std::string name = std::filesystem::path(job.model).stem().string() + ".glo";
    job.out = (std::filesystem::path(job.page) / name).string();
    job.options.powerOfTwo = true;
}

} // namespace

int main(int argc, char** argv)
{
    CLI::App app("Converts a model to a scene file (glTF, Collada, FBX, OBJ, 3DS, PLY and many more).",
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
    command.job.options.animation = !command.noAnimation;
    command.job.options.sparseKeys = command.keys == "sparse";
    if (!command.job.page.empty())
        usePage(command.job);
    std::error_code ignored;
    const bool isFolder = std::filesystem::is_directory(command.job.model, ignored);
    const std::string conflict = findConflict(command, isFolder);
    if (!conflict.empty())
    {
        fail(conflict);
        return commandline::MISUSED;
    }
    return commandline::finishOutput("orv-convert", isFolder ? runFolder(command) : run(command.job));
}
