#include "print.h"

#include <algorithm>
#include <cstdio>

namespace inspect
{

using namespace orv::detail::glo;
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

/// The code point that begins there; its length is 0 if it is invalid UTF-8.
uint32_t readCodePoint(const std::string& text, size_t at, size_t& length)
{
    const auto byte = [&](size_t i) { return i < text.size() ? uint32_t(uint8_t(text[i])) : 0u; };
    const uint32_t first = byte(at);
    constexpr uint32_t LEAST[] = {0, 0, 0x80, 0x800, 0x10000};
    length = first < 0x80 ? 1 : first >> 5 == 6 ? 2 : first >> 4 == 14 ? 3 : first >> 3 == 30 ? 4 : 0;
    if (length < 2)
        return first;
    uint32_t point = first & (0x7fu >> length);
    for (size_t i = 1; i < length; ++i)
    {
        if (byte(at + i) >> 6 != 2)
            length = 0;
        point = point << 6 | (byte(at + i) & 0x3f);
    }
    if (length > 0 && (point < LEAST[length] || point > 0x10ffff))
        length = 0;
    return point;
}

/// Characters that move the cursor, set colours, begin a line or change the direction of writing.
bool isControl(uint32_t point)
{
    return point < 0x20 || (point >= 0x7f && point < 0xa0) || point == 0x61c || point == 0x200e ||
           point == 0x200f || (point >= 0x2028 && point <= 0x202e) || (point >= 0x2066 && point <= 0x2069) ||
           (point >= 0xd800 && point < 0xe000);
}

/// Escapes text from files for terminals and line-based readers: control characters and invalid bytes become "\x1b".
std::string escape(const std::string& text)
{
    std::string escaped;
    for (size_t at = 0; at < text.size();)
    {
        size_t length;
        const uint32_t point = readCodePoint(text, at, length);
        const bool isPlain = length > 0 && !isControl(point);
        const size_t size = std::max<size_t>(length, 1);
        for (size_t i = at; i < at + size; ++i)
        {
            char code[8];
            std::snprintf(code, sizeof(code), "\\x%02x", unsigned(uint8_t(text[i])));
            escaped += isPlain ? std::string(1, text[i]) : code;
        }
        at += size;
    }
    return escaped;
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
            std::printf(" %s", escape(word).c_str());
        std::printf("\n");
    }
}

void printTotals(const Report& report)
{
    std::printf("%s: %s, %s\n", escape(report.path).c_str(), report.kind.c_str(),
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
    const std::string file = escape(report.path);
    for (const Finding& finding : report.findings.getSorted())
    {
        const KindInfo& info = getInfo(finding.kind);
        const std::string place = finding.path.empty() ? "" : ", " + escape(finding.path);
        std::printf("%s: %s %s at %llu%s: %s\n", file.c_str(), getName(info.severity), info.code,
                    static_cast<unsigned long long>(finding.offset), place.c_str(),
                    escape(finding.sentence).c_str());
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
