#pragma once

#include "compare.h"
#include "markings.h"

#include "stage/stage.h"

#include "orv/colour.h"

#include <optional>
#include <string>
#include <vector>

namespace view
{

/// The options of a command line.
struct Options
{
    SceneFile scene; ///< as named; a model until it is converted
    std::vector<std::string> converterArguments;

    int width = 800; ///< of the window, or of a picture, in pixels
    int height = 600;
    bool hasSize = false; ///< both were given
    std::string camera;   ///< "" for the free one
    std::string clip;     ///< "" for the whole time line
    std::optional<orv::Colour4f> background;
    std::vector<Marking> markings; ///< to show, each once

    std::string out;   ///< "" opens a window, "-" is standard output
    float time = 0.0f; ///< seconds from the start of the clip
    int frames = 0;    ///< pictures over the clip; 0 for one without a number
    int turntable = 0; ///< pictures around the scene
    int columns = 0;   ///< of the contact sheet; 0 for none
    int rows = 0;
    int thumbnail = 0;     ///< width and height of a picture that may have any name; 0 for none
    std::string reference; ///< "" compares with nothing
    Tolerance tolerance;
    bool wantsStats = false;

    std::string font; ///< "" for the best available
};

/// @param exitCode  of the program if there is nothing to do, after --help or an error.
/// @return whether there is something to do.
bool parseCommandLine(int argumentCount, char** arguments, Options& options, int& exitCode);

/// "#rrggbb", "#rgb", or one of a few names. @return false if it is none of them.
bool parseColour(const std::string& text, orv::Colour4f& colour);

} // namespace view
