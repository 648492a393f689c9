// orv-view: shows a scene, a material or a model in a window, or draws it into PNG pictures without one.

#include "convertedmodel.h"
#include "loadlog.h"
#include "options.h"
#include "pictures.h"
#include "viewer.h"

#include "commandline/commandline.h"
#include "commandline/terminaltext.h"

#include <cstdio>
#include <cstdlib>
#include <filesystem>

namespace
{

bool run(const view::Options& options, std::string& error)
{
    const std::string& path = options.scene.path;
    std::error_code reason;
    if (!std::filesystem::is_regular_file(path, reason))
    {
        error = path + ": " + (reason ? reason.message() : "not a file");
        return false;
    }
    std::unique_ptr<view::ConvertedModel> conversion;
    if (view::getFileKind(path) == view::FileKind::MODEL)
    {
        conversion = view::ConvertedModel::create(path, options.converterArguments, error);
        if (!conversion || !conversion->run(error))
            return false;
    }
    else if (!options.converterArguments.empty())
    {
        error = path + ": is not converted, so \"" + options.converterArguments[0] + "\" has no meaning";
        return false;
    }
    if (options.out.empty())
        return view::Viewer(options, conversion.get()).run(error);
    return view::drawPictures(options, conversion ? conversion->getScenePath() : path, error);
}

} // namespace

int main(int argumentCount, char** arguments)
{
    view::Options options;
    int exitCode = 0;
    if (!view::parseCommandLine(argumentCount, arguments, options, exitCode))
        return exitCode;
    view::loadlog::start();
    std::string error;
    if (run(options, error))
        return commandline::finishOutput("orv-view", EXIT_SUCCESS);
    if (!error.empty())
        std::fprintf(stderr, "orv-view: %s\n", commandline::toTerminalText(error).c_str());
    return EXIT_FAILURE;
}
