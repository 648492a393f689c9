#include "job.h"

#include "convert/conversion.h"
#include "convert/files/filegate.h"
#include "convert/page.h"
#include "convert/progress.h"

#include <algorithm>
#include <cctype>
#include <cstring>
#include <filesystem>

namespace convert
{

namespace
{

bool convertGuarded(const Job& job, FileGate& gate, Conversion& made, std::string& error)
{
    const auto work = [&](std::FILE* stream, ModelFiles& files)
    { return send(convertFile(job.model, files, job.out, job.options), stream); };
    const auto accept = [&](std::FILE* stream)
    {
        made = {};
        return receive(made, job.out, stream);
    };
    const bool done = runGuarded(job.limits, job.model, gate, work, accept, error);
    clearProgress();
    if (done)
        error = made.error;
    return done && error.empty();
}

/// Whether a texture would overwrite a file that the model was read from.
bool takesInput(const Conversion& made, const Job& job, const FileGate& gate)
{
    return std::any_of(made.files.begin(), made.files.end(),
                       [&](const OutputFile& file)
                       { return file.path != job.out && gate.wasOpened(file.path); });
}

/// A path escaped for make.
std::string quoteForMake(const std::string& path)
{
    std::string quoted;
    for (const char c : path)
    {
        if (c == ' ' || c == '#')
            quoted += '\\';
        quoted += c == '$' ? "$$" : std::string(1, c);
    }
    return quoted;
}

/// Folders whose time changes when a missing file appears; without the scene's own folder, which each conversion
/// changes.
std::set<std::filesystem::path> findFoldersOfMissing(const Job& job, const FileGate& gate)
{
    std::set<std::filesystem::path> folders;
    std::error_code ignored;
    const std::filesystem::path out = std::filesystem::absolute(job.out, ignored).parent_path();
    for (std::filesystem::path path : gate.getMissing())
    {
        do
            path = path.parent_path();
        while (path.has_relative_path() && !std::filesystem::is_directory(path, ignored));
        if (!std::filesystem::equivalent(path, out, ignored))
            folders.insert(path);
    }
    return folders;
}

/// Whether make, ninja or CMake would read a path as something else than one file: as a rule's commands even.
bool isUnfitForMake(const std::string& path)
{
    return std::any_of(path.begin(), path.end(),
                       [](unsigned char c) {
                           return c < 0x80 && !std::isalnum(c) &&
                                  (c == 0 || !std::strchr("/+,_.~(){}%@[]!- ", c));
                       });
}

/// Instead of inputs with names unfit for make: the folders that they are in.
std::set<std::filesystem::path> findFitInputs(const Job& job, const FileGate& gate)
{
    std::set<std::filesystem::path> inputs = findFoldersOfMissing(job, gate);
    for (std::filesystem::path input : gate.getOpened())
    {
        while (isUnfitForMake(input.string()))
            input = input.parent_path();
        inputs.insert(input);
    }
    return inputs;
}

std::vector<uint8_t> makeDepfile(const Job& job, const FileGate& gate)
{
    const std::set<std::filesystem::path> inputs = findFitInputs(job, gate);
    std::string text = quoteForMake(job.out) + ":";
    for (const std::filesystem::path& input : inputs)
        text += " \\\n  " + quoteForMake(input.string());
    text += "\n";
    return {text.begin(), text.end()};
}

std::vector<OutputFile> listOutputs(const Job& job, const FileGate& gate, Conversion& made)
{
    std::vector<OutputFile> files;
    if (!job.report.empty())
        files.push_back({job.report, {made.json.begin(), made.json.end()}});
    if (job.dryRun)
        return files;
    if (!job.depfile.empty())
        files.push_back({job.depfile, makeDepfile(job, gate)});
    std::move(made.files.begin(), made.files.end(), std::back_inserter(files));
    return files;
}

/// Makes the folder of a page if there is none, and removes it again if it stays empty.
class PageFolder
{
public:
    explicit PageFolder(const std::string& path) : m_path(path) {}
    ~PageFolder()
    {
        std::error_code ignored;
        if (m_isMade)
            std::filesystem::remove(m_path, ignored);
    }
    PageFolder(const PageFolder&) = delete;
    PageFolder& operator=(const PageFolder&) = delete;

    bool make(std::string& error)
    {
        std::error_code reason;
        m_isMade = std::filesystem::create_directory(m_path, reason);
        if (reason)
            error = m_path + ": " + reason.message();
        return !reason;
    }

private:
    std::string m_path;
    bool m_isMade = false;
};

/// @param page  loaded, if the job has one.
bool writeOutputs(const Job& job, const FileGate& gate, const Page& page, Conversion& made,
                  std::string& error)
{
    const bool hasPage = !job.page.empty() && !job.dryRun;
    if (hasPage)
        page.addTo(made.files);
    PageFolder folder(job.page);
    return (!hasPage || folder.make(error)) && writeFiles(listOutputs(job, gate, made), gate, error);
}

} // namespace

Outcome convertModel(Job job)
{
    FileGate gate(job.model, job.allowed);
    Conversion made;
    Outcome outcome;
    Page page;
    if (!job.page.empty() && !page.load(outcome.error))
        return outcome;
    bool done = convertGuarded(job, gate, made, outcome.error);
    if (done && takesInput(made, job, gate)) // only known after reading
    {
        for (const OutputFile& file : made.files)
        {
            if (gate.wasOpened(file.path))
                job.options.takenNames.insert(std::filesystem::path(file.path).stem().string());
        }
        for (const std::filesystem::path& input : gate.getOpened())
            job.options.takenNames.insert(input.stem().string());
        done = convertGuarded(job, gate, made, outcome.error);
    }
    for (const std::filesystem::path& input : gate.getOpened())
        outcome.inputs.insert(input.string());
    outcome.missing = gate.getMissing();
    if (!done)
    {
        outcome.error = job.model + ": " + outcome.error;
        return outcome;
    }
    if (writeOutputs(job, gate, page, made, outcome.error))
        outcome.error.clear();
    outcome.text = std::move(made.text);
    outcome.json = std::move(made.json);
    return outcome;
}

} // namespace convert
