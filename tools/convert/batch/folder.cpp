#include "folder.h"

#include "commandline/terminaltext.h"
#include "convert/digest.h"
#include "convert/files/filegate.h"
#include "convert/lowercase.h"
#include "convert/outputfiles.h"
#include "orv/version.h"

#include <assimp/Importer.hpp>
#include <nlohmann/json.hpp>

#include <algorithm>
#include <atomic>
#include <csignal>
#include <cstdio>
#include <filesystem>
#include <fstream>
#include <map>
#include <new>
#include <set>

#include <sys/mman.h>
#include <sys/prctl.h>
#include <sys/wait.h>
#include <unistd.h>

namespace convert
{

namespace fs = std::filesystem;
using commandline::toTerminalText;
using Json = nlohmann::ordered_json;

namespace
{

struct Model
{
    fs::path path;  ///< from the folder
    fs::path scene; ///< from the output folder, without its extension
};

/// Shared by the processes.
struct Shared
{
    std::atomic<size_t> next{0};
    std::atomic<unsigned> converted{0};
    std::atomic<unsigned> unchanged{0};
    std::atomic<unsigned> failed{0};
};

/// Whether a name has a model's extension. Files that models refer to, such as materials, are not models.
std::vector<Model> findModels(const FolderJob& job, std::string& error)
{
    const Assimp::Importer importer;
    std::error_code reason;
    const fs::path out = fs::weakly_canonical(job.out, reason);
    std::vector<fs::path> paths;
    fs::recursive_directory_iterator entry(job.folder, reason);
    for (; !reason && entry != fs::recursive_directory_iterator(); entry.increment(reason))
    {
        std::error_code ignored;
        if (entry->is_directory(ignored) && fs::weakly_canonical(entry->path(), ignored) == out)
            entry.disable_recursion_pending();
        const std::string extension = toLowerCase(entry->path().extension().string());
        const bool isModel = extension == ".gltf" || extension == ".glb" ||
                             (extension != ".xml" && importer.IsExtensionSupported(extension));
        if (isModel && entry->is_regular_file(ignored))
            paths.push_back(entry->path().lexically_relative(job.folder)); // links are not resolved
    }
    if (reason)
        error = job.folder + ": " + reason.message();
    std::sort(paths.begin(), paths.end());

    std::map<fs::path, unsigned> stems;
    for (const fs::path& path : paths)
        ++stems[fs::path(path).replace_extension()];
    std::set<fs::path> taken;
    for (const auto& [stem, count] : stems)
        taken.insert(stem);
    std::vector<Model> models;
    for (const fs::path& path : paths)
    {
        fs::path scene = fs::path(path).replace_extension();
        for (bool isTaken = stems[scene] > 1; isTaken; isTaken = !taken.insert(scene).second)
            scene += "-" + path.extension().string().substr(1); // duck.obj beside duck.dae
        if (digest(path.generic_string()) % job.shards == job.shard - 1)
            models.push_back({path, scene});
    }
    return models;
}

/// Everything besides the files that decides the result.
std::string describeSettings(const Job& job)
{
    const Options& options = job.options;
    const orv::Version& version = orv::getVersion();
    Json json = {
        orv::getBuildInfo(),    version.getMajor(),  version.getMinor(), version.getPatch(), options.fps,
        options.sparseKeys,     options.keyError,    options.animation,  options.up,         options.scale,
        options.maxTextureSize, options.powerOfTwo,  options.linear,     options.sky,        job.allowed,
        job.limits.seconds,     job.limits.mebibytes};
    return json.dump(-1, ' ', true, Json::error_handler_t::replace);
}

/// Size and time of a file; null if it does not exist.
Json describeFile(const fs::path& path)
{
    std::error_code reason;
    const uintmax_t size = fs::file_size(path, reason);
    if (reason)
        return nullptr;
    const auto time = fs::last_write_time(path, reason).time_since_epoch().count();
    return Json{{"file", path.string()}, {"bytes", size}, {"time", time}};
}

/// One model of a folder, its scene and its report.
class Item
{
public:
    Item(const FolderJob& job, const Model& model, std::string settings)
        : m_job(job.common)
        , m_report((fs::path(job.out) / model.scene).string() + ".json")
        , m_settings(std::move(settings))
    {
        m_job.model = (fs::path(job.folder) / model.path).string();
        m_job.out = (fs::path(job.out) / model.scene).string() + ".glo";
    }

    /// Whether the report of an earlier run is still valid. @param error  the error in that report.
    bool isUnchanged(std::string& error) const
    {
        std::ifstream file(m_report);
        const Json report = Json::parse(file, nullptr, false);
        if (!report.is_object() || !report.contains("settings") || report["settings"] != m_settings ||
            !report.contains("inputs") || !report["inputs"].is_array() || report["inputs"].empty())
            return false;
        for (const Json& input : report["inputs"])
        {
            if (!input.is_object() || !input.contains("file") || !input["file"].is_string() ||
                describeFile(input["file"].get<std::string>()) != input)
                return false;
        }
        const Json missing = report.value("missing", Json::array());
        for (const Json& path : missing)
        {
            if (!path.is_string() || describeFile(path.get<std::string>()) != nullptr)
                return false;
        }
        if (report.contains("error") && report["error"].is_string())
            error = report["error"].get<std::string>();
        return !error.empty() || areWritten(report);
    }

    bool convert(std::string& error) const
    {
        std::error_code reason;
        fs::create_directories(fs::path(m_job.out).parent_path(), reason);
        const Outcome outcome = convertModel(m_job);
        error = outcome.error;
        std::string reportError;
        if (!writeReport(outcome, reportError) && error.empty())
            error = reportError;
        return error.empty();
    }

private:
    /// Whether the scene and its textures are there.
    bool areWritten(const Json& report) const
    {
        std::error_code ignored;
        const fs::path folder = fs::path(m_job.out).parent_path();
        const Json textures = report.value("textures", Json::array());
        for (const Json& texture : textures)
        {
            const Json file = texture.is_object() ? texture.value("file", Json()) : Json();
            if (!file.is_string() ||
                !fs::is_regular_file(folder / fs::path(file.get<std::string>()).filename(), ignored))
                return false;
        }
        return fs::is_regular_file(m_job.out, ignored);
    }

    bool writeReport(const Outcome& outcome, std::string& error) const
    {
        Json report = Json::parse(outcome.json, nullptr, false);
        if (!report.is_object())
            report = Json::object();
        if (!outcome.error.empty())
            report["error"] = outcome.error;
        report["settings"] = m_settings;
        report["inputs"] = Json::array();
        for (const std::string& input : outcome.inputs)
            report["inputs"].push_back(describeFile(input));
        if (outcome.inputs.empty())
            report["inputs"].push_back(describeFile(m_job.model));
        report["missing"] = outcome.missing;
        const std::string text = report.dump(1, ' ', true, Json::error_handler_t::replace) + "\n";
        return writeFiles({{m_report, {text.begin(), text.end()}}}, FileGate(m_job.model), error);
    }

    Job m_job;
    std::string m_report;
    std::string m_settings;
};

/// Takes models until none is left.
void work(const FolderJob& job, const std::vector<Model>& models, Shared& shared)
{
    const std::string settings = describeSettings(job.common);
    for (size_t i = shared.next++; i < models.size(); i = shared.next++)
    {
        const Item item(job, models[i], settings);
        std::string error;
        const bool isUnchanged = !job.again && item.isUnchanged(error);
        const bool isDone = isUnchanged ? error.empty() : item.convert(error);
        ++(!isDone ? shared.failed : isUnchanged ? shared.unchanged : shared.converted);
        std::printf("%zu of %zu: %s: %s%s\n", i + 1, models.size(), toTerminalText(models[i].path).c_str(),
                    isDone ? (isUnchanged ? "unchanged" : "converted") : "failed",
                    isUnchanged && !isDone ? " before, and unchanged" : "");
        std::fflush(stdout);
        if (!isDone)
            std::fprintf(stderr, "orv-convert: %s\n", toTerminalText(error).c_str());
    }
}

/// @return false if a process did not end as it should.
bool workInProcesses(const FolderJob& job, const std::vector<Model>& models, Shared& shared)
{
    std::vector<pid_t> children;
    for (unsigned i = 1; i < job.processes && i < models.size(); ++i)
    {
        const pid_t child = fork();
        if (child == 0)
        {
            prctl(PR_SET_PDEATHSIG, SIGTERM);
            work(job, models, shared);
            _exit(std::ferror(stdout) ? 1 : 0);
        }
        if (child > 0)
            children.push_back(child);
    }
    work(job, models, shared);
    bool areFine = true;
    for (const pid_t child : children)
    {
        int status = 0;
        areFine = waitpid(child, &status, 0) == child && status == 0 && areFine;
    }
    return areFine;
}

} // namespace

bool convertFolder(const FolderJob& job)
{
    std::string error;
    const std::vector<Model> models = findModels(job, error);
    if (error.empty() && models.empty() && job.shards == 1)
        error = job.folder + ": no models in it";
    if (!error.empty())
    {
        std::fprintf(stderr, "orv-convert: %s\n", toTerminalText(error).c_str());
        return false;
    }
    void* const memory =
        mmap(nullptr, sizeof(Shared), PROT_READ | PROT_WRITE, MAP_SHARED | MAP_ANONYMOUS, -1, 0);
    if (memory == MAP_FAILED)
    {
        std::fprintf(stderr, "orv-convert: no memory\n");
        return false;
    }
    Shared& shared = *new (memory) Shared;
    std::fflush(stdout); // or each process would print its copy
    const bool areFine = workInProcesses(job, models, shared);
    const unsigned failed = shared.failed;
    std::printf("%zu %s: %u converted, %u unchanged, %u failed\n", models.size(),
                models.size() == 1 ? "model" : "models", shared.converted.load(), shared.unchanged.load(),
                failed);
    const bool areAllDone = shared.converted + shared.unchanged + failed == models.size();
    if (!areFine || !areAllDone)
        std::fprintf(stderr, "orv-convert: a process ended early; call it again for the rest\n");
    munmap(memory, sizeof(Shared));
    return areFine && areAllDone && failed == 0;
}

} // namespace convert
