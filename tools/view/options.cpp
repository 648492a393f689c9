#include "options.h"

#include "commandline/commandline.h"

#include <algorithm>
#include <cmath>
#include <cstdio>
#include <cstdlib>
#include <filesystem>
#include <sstream>

namespace view
{

namespace
{

constexpr int MAX_EDGE = 16384; // pixels
constexpr int MAX_PICTURES = 9999;
constexpr int SHEET_WIDTH = 320; // of one picture in it
constexpr int SHEET_HEIGHT = 240;

const char* const EXAMPLES = R"(Keys in the window: press h there.

Examples:
  orv-view duck.glo                              open a window and turn the duck with the mouse
  orv-view walk.fbx                              convert a model on the fly, and again when it is saved
  orv-view walk.fbx -- --up z --fps 60           the same; options after -- are for orv-convert
  orv-view chrome.ap                             a material on a ball, drawn again as you edit it
  orv-view duck.glo --material body=chrome.ap    try a material on a scene

  orv-view duck.glo --out duck.png               draw a picture, without a window
  orv-view walk.glo --out walk.png --sheet 4x3   twelve times of the animation on one sheet
  orv-view walk.glo --out run.png --frames 24 --clip run      run-000.png to run-023.png
  orv-view duck.glo --out duck.png --turntable 36             once around the duck
  orv-view duck.glo --out - --thumbnail 128 >icon.png          a small square one
  orv-view duck.glo --out now.png --compare good.png --tolerance 8,0.1
                     fail if more than 0.1 % of the pixels differ by more than 8 of 255

Exit codes: 0 done, 1 failed or too different, 2 wrong command line.)";

/// "800x600". @return "" or the error, as CLI11 expects.
std::string parsePair(const std::string& text, const char* what, int most, int& first, int& second)
{
    char beyond = 0;
    const int found = std::sscanf(text.c_str(), "%dx%d%c", &first, &second, &beyond);
    if (found == 2 && first >= 1 && first <= most && second >= 1 && second <= most)
        return "";
    return std::string(what) + ", each 1 to " + std::to_string(most) + ", not " + text;
}

std::string checkTime(const std::string& text)
{
    char* end = nullptr;
    const float time = std::strtof(text.c_str(), &end);
    return *end || !std::isfinite(time) || time < 0.0f ? text + ": not a time in seconds, from 0 up" : "";
}

/// "body=chrome.ap"
std::string checkDressing(const std::string& text)
{
    const size_t sign = text.rfind('=');
    return sign != std::string::npos && sign > 0 && sign + 1 < text.size()
               ? ""
               : text + ": not a material's name, = and a file";
}

/// "bounds,axes"
std::string checkMarkings(const std::string& text, std::vector<Marking>& markings)
{
    markings.clear();
    std::istringstream words(text);
    for (std::string word; std::getline(words, word, ',');)
    {
        const Marking marking = findMarking(word);
        if (marking == Marking::COUNT)
            return text + ": \"" + word + "\" is none of " + listMarkings();
        if (std::find(markings.begin(), markings.end(), marking) == markings.end())
            markings.push_back(marking);
    }
    return "";
}

void addSceneOptions(CLI::App& app, Options& options, std::vector<std::string>& dressings)
{
    app.add_option("scene", options.scene.path,
                   "Scene (.glo), material (.ap), shader program (.sp), or a model that orv-convert reads")
        ->required()
        ->type_name("FILE");
    app.add_option("converter", options.converterArguments, "After --: options for orv-convert")
        ->type_name("...");
    app.add_option("--size", "Of the window or picture, in pixels (800x600; in a sheet, 320x240 each)")
        ->type_name("WxH")
        ->check(
            [&options](const std::string& text)
            {
                options.hasSize = true;
                return parsePair(text, "a size is WIDTHxHEIGHT", MAX_EDGE, options.width, options.height);
            });
    app.add_option("--camera", options.camera,
                   "Use this camera of the file instead of a view of the whole scene")
        ->type_name("NAME");
    app.add_option("--clip", options.clip, "Play or draw this animation of the file instead of all")
        ->type_name("NAME");
    app.add_option("--background", "#rrggbb, black, grey or white")
        ->type_name("COLOUR")
        ->check(
            [&options](const std::string& text)
            {
                return parseColour(text, options.background.emplace())
                           ? std::string()
                           : text + ": not a colour (#rrggbb, black, grey, white)";
            });
    app.add_option("--show", "Also draw: bounds, skeletons, axes, grid, wireframe, shadows")
        ->type_name("WHAT,...")
        ->check([&options](const std::string& text) { return checkMarkings(text, options.markings); });
    app.add_option("--material", dressings, "Apply an appearance file to a material of the scene")
        ->type_name("NAME=FILE.ap")
        ->expected(1)
        ->multi_option_policy(CLI::MultiOptionPolicy::TakeAll)
        ->check(checkDressing);
    app.add_option("--font", options.font, "TrueType file for the text in the window")->type_name("FILE.ttf");
}

void addPictureOptions(CLI::App& app, Options& options)
{
    const std::string group = "Pictures, without a window";
    auto* out = app.add_option("--out", options.out, "Picture to write; - for standard output")
                    ->type_name("FRAME.png")
                    ->group(group);
    auto* time = app.add_option("--time", options.time, "Time to draw, from the start of the clip")
                     ->type_name("SECONDS")
                     ->check(checkTime);
    auto* frames = app.add_option("--frames", options.frames,
                                  "N pictures evenly spaced over the clip: FRAME-000.png and so on")
                       ->type_name("N")
                       ->check(CLI::Range(1, MAX_PICTURES))
                       ->excludes(time);
    auto* turntable = app.add_option("--turntable", options.turntable,
                                     "N pictures evenly spaced around the scene, at one time")
                          ->type_name("N")
                          ->check(CLI::Range(1, MAX_PICTURES))
                          ->excludes(frames);
    auto* sheet =
        app.add_option("--sheet", "One sheet of many pictures: over the clip, or around the scene")
            ->type_name("COLSxROWS")
            ->excludes(frames)
            ->check(
                [&options](const std::string& text)
                { return parsePair(text, "a sheet is COLUMNSxROWS", 100, options.columns, options.rows); });
    auto* thumbnail =
        app.add_option("--thumbnail", options.thumbnail,
                       "A square picture of N x N pixels, for file managers: FRAME may be any name")
            ->type_name("N")
            ->check(CLI::Range(1, MAX_EDGE))
            ->excludes(frames)
            ->excludes(turntable)
            ->excludes(sheet)
            ->excludes("--size");
    auto* compare = app.add_option("--compare", options.reference,
                                   "Compare the picture, and save the difference as FRAME-difference.png")
                        ->type_name("REFERENCE.png")
                        ->excludes(frames);
    auto* tolerance =
        app.add_option("--tolerance",
                       "How much a pixel may differ, of 255 (2), and how many pixels may differ "
                       "by more, in percent (0)")
            ->type_name("N[,PERCENT]")
            ->needs(compare)
            ->check(
                [&options](const std::string& text)
                {
                    return parseTolerance(text, options.tolerance)
                               ? std::string()
                               : text + ": not a number from 0 to 255, nor two with a comma";
                });
    auto* stats =
        app.add_flag("--stats", options.wantsStats, "Print what the scene holds and what drawing it costs");
    for (CLI::Option* option : {time, frames, turntable, sheet, thumbnail, compare, tolerance, stats})
        option->needs(out)->group(group);
}

/// Rules for combinations of options, which CLI11 cannot express.
std::string findConflict(const Options& options)
{
    const bool isNumbered = options.columns == 0 && options.frames + options.turntable > 0;
    if (options.out == "-" && (isNumbered || !options.reference.empty() || options.wantsStats))
        return "--out -: one picture, without --compare and --stats";
    if (!options.out.empty() && options.out != "-" && options.thumbnail == 0 &&
        std::filesystem::path(options.out).extension() != ".png")
        return "--out: " + options.out + ": only PNG can be written";
    if (options.columns == 0)
        return options.turntable > 0 && !options.reference.empty()
                   ? "--compare takes one picture: add --sheet, or leave --turntable"
                   : "";
    if (options.turntable > options.columns * options.rows)
        return "--sheet has no room for " + std::to_string(options.turntable) + " pictures";
    if (options.columns * options.width > MAX_EDGE || options.rows * options.height > MAX_EDGE)
        return "--sheet: the whole sheet would be more than " + std::to_string(MAX_EDGE) +
               " pixels wide or high";
    return "";
}

} // namespace

bool parseColour(const std::string& text, orv::Colour4f& colour)
{
    const struct
    {
        const char* name;
        const char* digits;
    } names[] = {{"black", "#000000"}, {"grey", "#808080"}, {"gray", "#808080"}, {"white", "#ffffff"}};
    std::string digits = text;
    for (const auto& known : names)
    {
        if (text == known.name)
            digits = known.digits;
    }
    if (digits.size() == 4)
        digits = {digits[0], digits[1], digits[1], digits[2], digits[2], digits[3], digits[3]};
    unsigned value = 0;
    int end = 0;
    if (digits.size() != 7 || std::sscanf(digits.c_str(), "#%6x%n", &value, &end) != 1 || end != 7)
        return false;
    colour = orv::Colour4f(float(value >> 16) / 255.0f, float(value >> 8 & 255) / 255.0f,
                           float(value & 255) / 255.0f, 1.0f);
    return true;
}

bool parseCommandLine(int argumentCount, char** arguments, Options& options, int& exitCode)
{
    CLI::App app("Shows a scene, a material or a model in a window, or draws it into PNG pictures.",
                 "orv-view");
    app.footer(EXAMPLES);
    std::vector<std::string> dressings;
    addSceneOptions(app, options, dressings);
    addPictureOptions(app, options);
    commandline::addCommon(app);
    exitCode = 0;
    try
    {
        app.parse(argumentCount, arguments);
        if (options.columns > 0 && !options.hasSize)
        {
            options.width = SHEET_WIDTH;
            options.height = SHEET_HEIGHT;
        }
        if (options.thumbnail > 0)
            options.width = options.height = options.thumbnail;
        const std::string conflict = findConflict(options);
        if (!conflict.empty())
            throw CLI::ValidationError(conflict);
    }
    catch (const CLI::ParseError& error)
    {
        exitCode = commandline::finishParsing(app, error);
        return false;
    }
    for (const std::string& text : dressings)
        options.scene.dressings.push_back(
            {text.substr(0, text.rfind('=')), text.substr(text.rfind('=') + 1)});
    return true;
}

} // namespace view
