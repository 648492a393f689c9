#include "print.h"

#include "commandline/terminaltext.h"

#include <algorithm>
#include <cstdio>

namespace inspect
{

using namespace orv::detail::glo;
using commandline::toTerminalText;
using nlohmann::ordered_json;

namespace
{

constexpr size_t LONGEST_VALUE = 60;

const char* getContent(uint32_t id)
{
    for (const ChunkKind& kind : CHUNKS)
    {
        if (kind.id == id)
            return kind.content;
    }
    return "unknown chunk";
}

/// Short enough for a line, and safe for a terminal.
std::string toText(const ordered_json& value)
{
    std::string text = value.dump(-1, ' ', true, ordered_json::error_handler_t::replace);
    if (text.size() > LONGEST_VALUE)
        text = text.substr(0, LONGEST_VALUE) + "...";
    return text;
}

void printChunk(const Chunk& chunk, int depth)
{
    const std::string name = chunk.path.substr(chunk.path.rfind('/') + 1);
    std::printf("%*s%-4s  %s, %u bytes at %llu\n", depth * 2, "", name.c_str(),
                chunk.known ? getContent(chunk.id) : "unknown chunk", chunk.size,
                static_cast<unsigned long long>(chunk.offset));
    for (const Field& field : chunk.fields)
        std::printf("%*s    %s: %s\n", depth * 2, "", field.label.c_str(), toText(field.value).c_str());
    for (const Chunk& child : chunk.children)
        printChunk(child, depth + 1);
}

ordered_json chunkToJson(const Chunk& chunk)
{
    ordered_json fields = ordered_json::array();
    for (const Field& field : chunk.fields)
        fields.push_back({{"label", field.label}, {"offset", field.offset}, {"value", field.value}});
    ordered_json json = {{"id", ChunkName(chunk.id).text}, {"path", chunk.path},
                         {"offset", chunk.offset},         {"size", chunk.size},
                         {"known", chunk.known},           {"fields", fields}};
    json["chunks"] = ordered_json::array();
    for (const Chunk& child : chunk.children)
        json["chunks"].push_back(chunkToJson(child));
    return json;
}

ordered_json sceneToJson(const Report& report)
{
    const GloScene& scene = report.scene.scene;
    const Forecast& forecast = report.forecast;
    const FileVersion version = report.scene.version;
    ordered_json programs = ordered_json::array();
    for (const Forecast::Program& program : forecast.programs)
        programs.push_back({{"name", program.name}, {"draws", program.draws}});
    return {
        {"version", std::to_string(version.first) + "." + std::to_string(version.second) + "." +
                        std::to_string(version.third)},
        {"totals",
         {{"nodes", forecast.nodes},
          {"geometries", scene.geometries.size()},
          {"materials", scene.materials.size()},
          {"skins", scene.skins.size()},
          {"lights", scene.lights.size()},
          {"cameras", scene.cameras.size()},
          {"animations", scene.animations.size()},
          {"vertices", forecast.vertices},
          {"keys", forecast.keys},
          {"interpolatedKeys", forecast.interpolated}}},
        {"engine",
         {{"draws", forecast.draws},
          {"triangles", forecast.triangles},
          {"programs", programs},
          {"vertexBytes", forecast.vertexBytes},
          {"indexBytes", forecast.indexBytes},
          {"textureBytes", forecast.textureBytes}}},
        {"tree", chunkToJson(report.scene.top)},
    };
}

} // namespace

void printTree(const Report& report)
{
    if (report.kind == "scene")
        printChunk(report.scene.top, 0);
    for (const TextFile::Statement& statement : report.text.statements)
    {
        std::printf("%4d ", statement.line);
        for (const std::string& word : statement.words)
            std::printf(" %s", toTerminalText(word).c_str());
        std::printf("\n");
    }
}

void printTotals(const Report& report)
{
    std::printf("%s: %s, %s\n", toTerminalText(report.path).c_str(), report.kind.c_str(),
                counted(report.size, "byte", "bytes").c_str());
    if (report.kind != "scene")
        return;
    const GloScene& scene = report.scene.scene;
    const Forecast& forecast = report.forecast;
    const std::string holds[] = {
        counted(uint64_t(forecast.nodes), "node", "nodes"),
        counted(scene.geometries.size(), "geometry", "geometries") + " (" +
            counted(forecast.vertices, "vertex", "vertices") + ")",
        counted(scene.materials.size(), "material", "materials"),
        counted(scene.skins.size(), "skin", "skins"),
        counted(scene.lights.size(), "light", "lights"),
        counted(scene.cameras.size(), "camera", "cameras"),
        counted(scene.animations.size(), "animation", "animations") + " (" +
            counted(forecast.keys, "key", "keys") +
            (forecast.interpolated > 0 ? ", " + std::to_string(forecast.interpolated) + " interpolated)"
                                       : ")"),
    };
    std::string line = "  holds   ";
    for (const std::string& item : holds)
        line += (&item == holds ? "" : ", ") + item;
    std::printf("%s\n  drawn   %s, %s\n", line.c_str(),
                counted(uint64_t(forecast.draws), "draw", "draws").c_str(),
                counted(forecast.triangles, "triangle", "triangles").c_str());
    std::printf("  memory  %llu bytes on the GPU: %llu vertices, %llu indices, %llu textures\n",
                static_cast<unsigned long long>(forecast.vertexBytes) + forecast.indexBytes +
                    forecast.textureBytes,
                static_cast<unsigned long long>(forecast.vertexBytes),
                static_cast<unsigned long long>(forecast.indexBytes),
                static_cast<unsigned long long>(forecast.textureBytes));
    for (const Forecast::Program& program : forecast.programs)
        std::printf("  program %s for %s\n", program.name.c_str(),
                    counted(uint64_t(program.draws), "draw", "draws").c_str());
}

void printFindings(const Report& report)
{
    const std::string file = toTerminalText(report.path);
    for (const Finding& finding : report.findings.getSorted())
    {
        const KindInfo& info = getInfo(finding.kind);
        const std::string place = finding.path.empty() ? "" : ", " + toTerminalText(finding.path);
        std::printf("%s: %s %s at %llu%s: %s\n", file.c_str(), getName(info.severity), info.code,
                    static_cast<unsigned long long>(finding.offset), place.c_str(),
                    toTerminalText(finding.sentence).c_str());
    }
    const auto count = [&report](Severity severity, const char* one, const char* many)
    { return counted(uint64_t(report.findings.count(severity)), one, many); };
    std::printf("%s: %s, %s, %s\n", file.c_str(), count(Severity::ERROR, "error", "errors").c_str(),
                count(Severity::WARNING, "warning", "warnings").c_str(),
                count(Severity::NOTE, "note", "notes").c_str());
}

ordered_json toJson(const Report& report)
{
    ordered_json json = {{"file", report.path}, {"kind", report.kind}, {"size", report.size}};
    if (report.kind == "scene")
        json["scene"] = sceneToJson(report);
    else
    {
        json["statements"] = ordered_json::array();
        for (const TextFile::Statement& statement : report.text.statements)
            json["statements"].push_back({{"line", statement.line}, {"words", statement.words}});
    }
    json["findings"] = ordered_json::array();
    for (const Finding& finding : report.findings.getSorted())
    {
        const KindInfo& info = getInfo(finding.kind);
        json["findings"].push_back({{"code", info.code},
                                    {"severity", getName(info.severity)},
                                    {"offset", finding.offset},
                                    {"path", finding.path},
                                    {"sentence", finding.sentence}});
    }
    return json;
}

} // namespace inspect
