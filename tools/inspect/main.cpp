// orv-inspect: reports the contents, cost and faults of scene files, materials and shader program files.

#include "glochecks.h"
#include "print.h"

#include "commandline/commandline.h"
#include "commandline/terminaltext.h"

#include <cerrno>
#include <cstdio>
#include <cstring>
#include <filesystem>
#include <fstream>
#include <iterator>

namespace
{

namespace fs = std::filesystem;

constexpr int WITH_ERRORS = commandline::FAILED; // exit codes
constexpr int WITH_WARNINGS = 3;

constexpr uintmax_t LARGEST_FILE = 0x7fffffff; ///< as the engine's streams

struct Options
{
    std::vector<std::string> files;
    bool check = false;
    bool json = false;
    bool tree = false;
};

int printCodes()
{
    for (const inspect::KindInfo& info : inspect::getAllInfo())
        std::printf("%-18s %-8s %s\n", info.code, inspect::getName(info.severity), info.meaning);
    return 0;
}

/// @return why it cannot be read, or empty.
std::string readInput(std::vector<uint8_t>& bytes)
{
    uint8_t part[1 << 16];
    for (size_t count = 0; (count = std::fread(part, 1, sizeof part, stdin)) > 0;)
    {
        if (bytes.size() + count > LARGEST_FILE)
            return "larger than two gigabytes";
        bytes.insert(bytes.end(), part, part + count);
    }
    return std::ferror(stdin) ? std::strerror(errno) : "";
}

/// @return why it cannot be read, or empty.
std::string readFile(const std::string& path, std::vector<uint8_t>& bytes)
{
    std::error_code error;
    const uintmax_t size = fs::file_size(path, error);
    if (error)
        return error.message();
    if (size > LARGEST_FILE)
        return "larger than two gigabytes";
    std::ifstream file(path, std::ios::binary);
    bytes.assign(std::istreambuf_iterator<char>(file), {});
    return file.bad() || bytes.size() != size ? "cannot be read" : "";
}

/// @return why it cannot be read, or empty.
std::string inspectFile(const std::string& path, inspect::Report& report)
{
    std::vector<uint8_t> bytes;
    const std::string failure = path == "-" ? readInput(bytes) : readFile(path, bytes);
    if (!failure.empty())
        return failure;
    const fs::path folder = fs::path(path).parent_path();
    const std::string extension = fs::path(path).extension().string();
    const std::string text(bytes.begin(), bytes.end());
    report.path = path;
    report.size = bytes.size();
    report.kind = extension == ".ap" ? "appearance" : extension == ".sp" ? "program" : "scene";
    if (report.kind == "appearance")
        report.text = inspect::checkAppearanceFile(text, folder, report.findings);
    else if (report.kind == "program")
        report.text = inspect::checkProgramFile(text, folder, report.findings);
    else
    {
        report.scene = inspect::scanGlo(bytes, report.findings);
        if (report.scene.top.id != 0)
            inspect::checkGlo(report.scene, folder, report.findings);
        report.forecast = inspect::forecast(report.scene, folder);
    }
    return "";
}

void print(const inspect::Report& report, const Options& options)
{
    if (options.check)
    {
        inspect::printFindings(report);
        return;
    }
    inspect::printTotals(report);
    if (options.tree)
        inspect::printTree(report);
    inspect::printFindings(report);
}

int run(const Options& options)
{
    inspect::Severity worst = inspect::Severity::NOTE;
    bool unread = false;
    nlohmann::ordered_json json = nlohmann::ordered_json::array();
    for (const std::string& path : options.files)
    {
        inspect::Report report;
        const std::string failure = inspectFile(path, report);
        if (!failure.empty())
        {
            std::fprintf(stderr, "orv-inspect: %s: %s\n", commandline::toTerminalText(path).c_str(),
                         failure.c_str());
            json.push_back({{"file", path}, {"error", failure}});
            unread = true;
            continue;
        }
        worst = std::min(worst, report.findings.getWorst());
        if (options.json)
            json.push_back(inspect::toJson(report));
        else
            print(report, options);
    }
    if (options.json)
        std::printf("%s\n",
                    json.dump(1, ' ', true, nlohmann::ordered_json::error_handler_t::replace).c_str());
    return unread || worst == inspect::Severity::ERROR ? WITH_ERRORS
           : worst == inspect::Severity::WARNING       ? WITH_WARNINGS
                                                       : 0;
}

} // namespace

int main(int argc, char** argv)
{
    CLI::App app("Reports the contents and faults of scene files, materials (.ap) and shader programs "
                 "with them.",
                 "orv-inspect");
    app.footer(
        "Exit code: 0 nothing worse than notes, 1 errors (the engine refuses the file), 2 wrong usage,\n"
        "3 warnings.\n\n"
        "Examples:\n"
        "  orv-inspect duck.glo                  contents, cost and faults\n"
        "  orv-inspect --tree duck.glo | less    every chunk and field\n"
        "  orv-inspect --check *.glo *.ap        only faults, one line each\n"
        "  orv-inspect --json duck.glo           everything, for a script (docs/inspect.md)\n"
        "  orv-inspect --codes                   a list of all findings");
    Options options;
    bool codes = false;
    app.add_option(
        "FILE", options.files,
        "the files to read, - for a scene on standard input; pictures and sources are searched beside them");
    app.add_flag("--tree", options.tree, "print every chunk with its fields, every statement of a text file");
    app.add_flag("--check", options.check, "print only findings");
    app.add_flag("--json", options.json, "print one JSON array with an object for each file");
    commandline::addCommon(app);
    app.add_flag("--codes", codes, "list every code with its meaning");
    try
    {
        app.parse(argc, argv);
    }
    catch (const CLI::ParseError& error)
    {
        return commandline::finishParsing(app, error);
    }
    if (codes)
        return commandline::finishOutput("orv-inspect", printCodes());
    if (options.files.empty())
    {
        std::fprintf(stderr, "orv-inspect: no file is named; --help shows how\n");
        return commandline::MISUSED;
    }
    return commandline::finishOutput("orv-inspect", run(options));
}
