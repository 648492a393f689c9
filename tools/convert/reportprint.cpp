#include "reportprint.h"

#include "commandline/terminaltext.h"

#include <nlohmann/json.hpp>

#include <algorithm>
#include <cstdio>

namespace convert
{

namespace
{

using commandline::toTerminalText;
using Json = nlohmann::ordered_json;

/// "morph-targets" and 2 become "2 morph targets", "vertices" and 1 become "1 vertex".
std::string spell(const std::string& figure, uint64_t number)
{
    std::string words = figure;
    std::replace(words.begin(), words.end(), '-', ' ');
    const auto endsWith = [&](const std::string& end)
    { return words.size() >= end.size() && words.compare(words.size() - end.size(), end.size(), end) == 0; };
    const auto replaceEnd = [&](size_t length, const char* end)
    { words.replace(words.size() - length, length, end); };
    if (number != 1)
        ;
    else if (endsWith("vertices"))
        replaceEnd(4, "ex");
    else if (endsWith("ies"))
        replaceEnd(3, "y");
    else if (endsWith("meshes"))
        replaceEnd(2, "");
    else if (endsWith("s"))
        replaceEnd(1, "");
    return std::to_string(number) + " " + words;
}

std::string spell(const Report::Figures& figures)
{
    std::string line;
    for (const auto& [figure, number] : figures)
    {
        if (number > 0)
            line += (line.empty() ? "" : ", ") + spell(figure, number);
    }
    return line.empty() ? "nothing" : line;
}

std::string spell(const char* kind, const std::map<Report::Finding, int>& findings)
{
    std::string lines;
    for (const auto& [finding, times] : findings)
    {
        lines += std::string("  ") + kind + ": " + toTerminalText(finding.second);
        if (times > 1)
            lines += " (" + std::to_string(times) + " times)";
        lines += "\n";
    }
    return lines;
}

std::string spell(const ModelClip& clip)
{
    char times[100];
    std::snprintf(times, sizeof times, "from %.2f to %.2f seconds\n", double(clip.start), double(clip.end));
    return "  animation \"" + toTerminalText(clip.name) + "\" " + times;
}

Json toJson(const Report::Figures& figures)
{
    Json json = Json::object();
    for (const auto& [figure, number] : figures)
        json[figure] = number;
    return json;
}

Json toJson(const std::map<Report::Finding, int>& findings)
{
    Json json = Json::array();
    for (const auto& [finding, times] : findings)
        json.push_back({{"code", finding.first}, {"sentence", finding.second}, {"times", times}});
    return json;
}

} // namespace

std::string toText(const std::string& path, const std::vector<OutputFile>& files, const ConvertedModel& model)
{
    const Report& report = model.report;
    std::string text =
        toTerminalText(path) + " (" + report.getFormat() + "): " + spell(report.getIn()) + "\n";
    for (const OutputFile& file : files)
    {
        const bool isScene = &file == &files.back();
        text += toTerminalText(file.path) + ": " + spell("bytes", file.bytes.size());
        text += isScene ? ", " + spell(report.getOut()) + "\n" : "\n";
    }
    for (const ModelClip& clip : model.clips)
        text += spell(clip);
    for (const auto& [figure, number] : report.getFigures())
    {
        if (number > 0)
            text += "  " + spell(figure, number) + "\n";
    }
    return text + spell("approximated", report.getApproximations()) + spell("lost", report.getLosses());
}

std::string toJson(const std::string& path, const std::vector<OutputFile>& files, const ConvertedModel& model)
{
    const Report& report = model.report;
    Json json;
    json["model"] = {{"file", path}, {"format", report.getFormat()}};
    json["model"].update(toJson(report.getIn()));
    json["scene"] = {{"file", files.back().path}, {"bytes", files.back().bytes.size()}};
    json["scene"].update(toJson(report.getOut()));
    json["textures"] = Json::array();
    for (size_t i = 0; i + 1 < files.size(); ++i)
        json["textures"].push_back({{"file", files[i].path}, {"bytes", files[i].bytes.size()}});
    json["clips"] = Json::array();
    for (const ModelClip& clip : model.clips)
        json["clips"].push_back({{"name", clip.name}, {"start", clip.start}, {"end", clip.end}});
    json["figures"] = report.getFigures();
    json["approximated"] = toJson(report.getApproximations());
    json["lost"] = toJson(report.getLosses());
    return json.dump(1, ' ', true, Json::error_handler_t::replace) + "\n"; // names may be in any encoding
}

} // namespace convert
