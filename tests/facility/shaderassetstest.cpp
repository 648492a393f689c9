#include "orv/image.h"
#include "orv/memfilesource.h"

#include "support/gltest.h"
#include "support/tempdir.h"

#include <GLES2/gl2.h>
#include <GLES2/gl2ext.h>

#include <algorithm>
#include <array>
#include <cmath>
#include <cstdio>
#include <filesystem>
#include <fstream>
#include <map>
#include <regex>
#include <set>
#include <sstream>

using namespace orv;

namespace
{

using Floats = std::vector<float>;
using Words = std::vector<std::string>;

std::string readAsset(const std::string& name)
{
    const SharedPtr<MemoryStreamSource> source =
        name.rfind("orv#", 0) == 0 ? create_memfilesource_orv() : create_memfilesource_luvane();
    const SharedPtr<Stream> stream = source->open(name.c_str(), false);
    EXPECT_TRUE(stream) << name;
    std::string text(stream ? size_t(stream->size()) : 0, '\0');
    if (stream)
        stream->read(text.data(), unsigned(text.size()));
    return text;
}

Words split(const std::string& text, char separator)
{
    Words words;
    std::istringstream stream(text);
    for (std::string word; std::getline(stream, word, separator);)
        words.push_back(word);
    return words;
}

/// The two sources of a program asked for as "orv#name$FEATURE$FEATURE", as the program loader puts them together.
std::array<std::string, 2> readSources(const std::string& request)
{
    const Words parts = split(request, '$');
    std::string defines;
    for (size_t i = 1; i < parts.size(); ++i)
        defines += "#define " + parts[i] + "\n";
    return {defines + readAsset(parts[0] + ".vert"), defines + readAsset(parts[0] + ".frag")};
}

/// Uniform names and the properties that the program file feeds them from.
std::map<std::string, std::string> readBindings(const std::string& request)
{
    std::map<std::string, std::string> bindings;
    std::istringstream text(readAsset(split(request, '$')[0] + ".sp"));
    for (std::string word; text >> word;)
    {
        if (word == "uniform")
        {
            text >> word;
            text >> bindings[word];
        }
    }
    return bindings;
}

/// Every set of features that a scene file can ask for, skinned and not, and every other program.
Words everyProgram()
{
    const Words features = {"BUMP", "INVY", "INVSQROOT", "DIFF", "SPEC",
                            "AMBI", "REFL", "CUBE",      "EMIS", "SKIN"};
    Words requests;
    for (const char* base : {"orv#max_pvl", "orv#max_ppl"})
    {
        for (unsigned set = 0; set < 1u << features.size(); ++set)
        {
            const bool bump = set & 1, invertY = set & 2, inverseRoot = set & 4, reflect = set & 64,
                       cube = set & 128;
            if ((bump && base == std::string("orv#max_pvl")) || (invertY != (bump && inverseRoot)) ||
                (cube && !reflect))
                continue;
            std::string request = base;
            for (size_t i = 0; i < features.size(); ++i)
                request += set >> i & 1 ? "$" + features[i] : "";
            requests.push_back(request);
        }
    }
    for (const char* name : {"base", "base$TRANSFORM$TEXTURE$COLOUR$VERTEX_COLOUR", "error", "fallback",
                             "fog", "fog$TRANSFORM$TEXTURE$FOG", "gen_velocity", "gen_velocity$SKIN",
                             "motionblur", "ripple", "ripple$TRANSFORM$TEXTURE$ANIMATED"})
        requests.push_back(std::string("orv#") + name);
    for (const char* name : {"blur", "depthoffield", "fog", "quad", "quad_premultiply", "ripple",
                             "textfadequad", "vidquad", "weather"})
        requests.push_back(std::string("luvane#") + name);
    return requests;
}

std::string run(const std::string& command)
{
    std::string output;
    FILE* pipe = popen((command + " 2>&1").c_str(), "r");
    char buffer[4096];
    for (size_t count; pipe && (count = fread(buffer, 1, sizeof(buffer), pipe)) > 0;)
        output.append(buffer, count);
    const int status = pipe ? pclose(pipe) : -1;
    EXPECT_EQ(0, status) << command << "\n" << output;
    return output;
}

const std::string VALIDATOR =
    std::string(ORV_GLSLANG_VALIDATOR) + " " + ORV_SOURCE_FOLDER + "/tests/facility/es20limits.conf ";

} // namespace

// Fault caught: a built-in asset that is missing, misnamed, cut or changed on its way into the library.
TEST(BuiltInAssets, areTheFilesOfTheirFolders)
{
    const std::map<std::string, size_t> counts = {{"orv", 33}, {"luvane", 37}};
    for (const auto& [space, count] : counts)
    {
        size_t found = 0;
        for (const auto& entry : std::filesystem::directory_iterator(std::string(ORV_SOURCE_FOLDER) +
                                                                     "/engine/facility/assets/" + space))
        {
            const std::vector<uint8_t> bytes = support::readFile(entry.path());
            EXPECT_EQ(std::string(bytes.begin(), bytes.end()),
                      readAsset(space + "#" + entry.path().filename().string()));
            ++found;
        }
        EXPECT_EQ(count, found) << space;
    }

    Words names = {"orv#default_pvl.ap", "orv#fallback.ap", "luvane#weather_blend.mat"};
    for (const char* name :
         {"base", "error", "fallback", "fog", "gen_velocity", "max_ppl", "max_pvl", "motionblur", "ripple"})
        for (const char* suffix : {".vert", ".frag", ".sp"})
            names.push_back(std::string("orv#") + name + suffix);
    for (const char* name : {"blur", "depthoffield", "fog", "quad", "quad_premultiply", "ripple",
                             "textfadequad", "vidquad", "weather"})
        for (const char* suffix : {".vert", ".frag", ".sp", ".mat"})
            names.push_back(std::string("luvane#") + name + suffix);
    for (const std::string& name : names)
    {
        const std::string text = readAsset(name);
        const bool source =
            name.find(".vert") != std::string::npos || name.find(".frag") != std::string::npos;
        EXPECT_EQ(0u, text.rfind(source ? "// " : "1.0\n", 0)) << name;
        EXPECT_EQ(std::string::npos, text.find("#version")) << name << ": defines come before it";
    }

    const SharedPtr<MemoryStreamSource> source = create_memfilesource_orv();
    for (const char* wrong : {"orv#White.png", "white.png", "luvane#white.png", "orv#"})
        EXPECT_FALSE(source->exists(wrong)) << wrong;
}

// Fault caught: a picture that other programs do not take for what it should be.
TEST(BuiltInAssets, picturesHaveTheirSizesAndKinds)
{
    const struct
    {
        const char* name;
        size_t bytes;
        int size, kind, channels;
        std::array<unsigned char, 4> corner;
    } pictures[] = {
        {"orv#black.png", 124, 1, 6, 4, {0, 0, 0, 255}},
        {"orv#error.png", 288, 16, 6, 4, {0, 0, 0, 255}},
        {"orv#missing.png", 210, 16, 6, 4, {255, 0, 255, 255}},
        {"orv#white.png", 957, 1, 3, 3, {255, 255, 255, 0}},
    };
    for (const auto& picture : pictures)
    {
        std::string bytes = readAsset(picture.name);
        ASSERT_EQ(picture.bytes, bytes.size()) << picture.name;
        EXPECT_EQ(8, bytes[24]) << picture.name;
        EXPECT_EQ(picture.kind, bytes[25]) << picture.name;
        MemoryStream stream(bytes.data(), int(bytes.size()));
        const Image image(stream);
        ASSERT_TRUE(image.data()) << picture.name;
        EXPECT_EQ(picture.size, image.width()) << picture.name;
        EXPECT_EQ(picture.size, image.height()) << picture.name;
        ASSERT_EQ(picture.channels, image.channelCount()) << picture.name;
        for (int i = 0; i < picture.channels; ++i)
            EXPECT_EQ(picture.corner[size_t(i)], image.data()[i]) << picture.name;
    }
}

// Fault caught: what a forgiving driver takes but the language does not allow.
TEST(ShaderAssets, compileByTheRulesOfTheLanguage)
{
    support::TempDir folder;
    std::string list;
    std::set<std::array<std::string, 2>> sources;
    for (const std::string& request : everyProgram())
        sources.insert(readSources(request));
    size_t index = 0;
    std::set<std::string> written;
    for (const auto& pair : sources)
    {
        for (int stage = 0; stage < 2; ++stage)
        {
            if (written.insert(pair[size_t(stage)]).second)
            {
                const std::string name = std::to_string(index++) + (stage ? ".frag" : ".vert");
                folder.write(name, pair[size_t(stage)]);
                list += name + " ";
            }
        }
    }
    const std::string output = run("cd " + folder.path() + " && " + VALIDATOR + list);
    EXPECT_EQ(std::string::npos, output.find("WARNING")) << output;
}

namespace
{

struct Declaration
{
    std::string precision, type, name;
    int count = 1;
};

/// What a preprocessed stage declares with a storage word.
std::vector<Declaration> readDeclarations(const std::string& source, const std::string& storage, int lights)
{
    std::vector<Declaration> found;
    const std::regex pattern(storage +
                             R"(\s+(?:(lowp|mediump|highp)\s+)?(\w+)\s+(\w+)\s*(?:\[\s*(\w+)\s*\])?\s*;)");
    for (std::sregex_iterator i(source.begin(), source.end(), pattern), end; i != end; ++i)
    {
        const std::string size = (*i)[4];
        found.push_back({(*i)[1], (*i)[2], (*i)[3],
                         size.empty()       ? 1
                         : size == "LIGHTS" ? lights
                                            : std::stoi(size)});
    }
    return found;
}

/// Whether the declarations can be packed into so many vectors of four, by the rules of the language's appendix A.7: wide
/// types first, from the top; pairs in the left columns from the top, then in the right ones from the bottom; single
/// components, the longest first, where they leave the smallest gap. Samplers count as single ones, to be safe.
bool fits(std::vector<Declaration> declarations, size_t rows)
{
    const std::map<std::string, std::array<size_t, 2>> shapes = {
        {"mat4", {4, 4}},  {"vec4", {1, 4}}, {"mat3", {3, 3}},      {"vec3", {1, 3}},       {"vec2", {1, 2}},
        {"float", {1, 1}}, {"int", {1, 1}},  {"sampler2D", {1, 1}}, {"samplerCube", {1, 1}}};
    const auto shape = [&](const Declaration& d)
    {
        const auto [height, width] = shapes.at(d.type);
        return std::array<size_t, 2>{width, height * size_t(d.count)};
    };
    std::stable_sort(declarations.begin(), declarations.end(),
                     [&](const Declaration& a, const Declaration& b) { return shape(a) > shape(b); });

    std::vector<std::array<bool, 4>> taken(rows);
    const auto freeRows = [&](size_t row, size_t column, size_t width)
    {
        size_t count = 0;
        while (row + count < rows &&
               std::count(&taken[row + count][column], &taken[row + count][column] + width, true) == 0)
            ++count;
        return count;
    };
    for (const Declaration& declaration : declarations)
    {
        const auto [width, height] = shape(declaration);
        size_t bestRow = rows, bestColumn = 0, bestGap = rows + 1;
        for (size_t column = 0; column + width <= 4 && (width < 3 || column == 0); column += width)
        {
            for (size_t row = 0, gap; row < rows; row += gap + 1)
            {
                gap = freeRows(row, column, width);
                const bool better = width == 1 ? gap < bestGap : bestRow == rows;
                if (gap >= height && better)
                {
                    bestRow = column == 2 && width == 2 ? row + gap - height : row;
                    bestColumn = column;
                    bestGap = gap;
                }
            }
        }
        if (bestRow == rows)
            return false;
        for (size_t row = bestRow; row < bestRow + height; ++row)
            std::fill_n(&taken[row][bestColumn], width, true);
    }
    return true;
}

size_t packedRows(const std::vector<Declaration>& declarations)
{
    size_t rows = 1;
    while (rows < 512 && !fits(declarations, rows))
        ++rows;
    return rows;
}

} // namespace

// Fault caught: a program that only the roomy drivers of desktops take. 128 vertex and 16 fragment vectors, 8 varyings,
// 8 attributes and 8 textures are what every device has.
TEST(ShaderAssets, fitTheSmallestDevice)
{
    EXPECT_EQ(2u, packedRows({{"", "vec3", "a"}, {"", "float", "b"}, {"", "vec2", "c"}, {"", "vec2", "d"}}));
    EXPECT_EQ(5u, packedRows({{"", "mat3", "a"}, {"", "vec3", "b", 2}, {"", "float", "c", 5}}));
    EXPECT_EQ(6u, packedRows({{"", "vec3", "b", 5}, {"", "float", "c", 5}, {"", "float", "d"}}));

    support::TempDir folder;
    for (const char* request : {"orv#max_pvl$INVSQROOT$DIFF$SPEC$AMBI$REFL$EMIS$SKIN",
                                "orv#max_pvl$INVSQROOT$DIFF$SPEC$AMBI$REFL$CUBE$EMIS$SKIN",
                                "orv#max_ppl$BUMP$INVY$INVSQROOT$DIFF$SPEC$AMBI$REFL$EMIS$SKIN",
                                "orv#max_ppl$BUMP$INVY$INVSQROOT$DIFF$SPEC$AMBI$REFL$CUBE$EMIS$SKIN",
                                "orv#fallback", "orv#gen_velocity$SKIN"})
    {
        const auto sources = readSources(request);
        const std::string vertex = run(VALIDATOR + "-E " + folder.write("a.vert", sources[0]));
        const std::string fragment = run(VALIDATOR + "-E " + folder.write("a.frag", sources[1]));
        const auto vertexUniforms = readDeclarations(vertex, "uniform", 5);
        std::smatch lights; // how many the constant comes to on a device with 16 vectors
        std::regex_search(fragment, lights, std::regex(R"(gl_MaxFragmentUniformVectors < 32 \? (\d+) :)"));
        const auto fragmentUniforms =
            readDeclarations(fragment, "uniform", lights.empty() ? 0 : std::stoi(lights[1]));
        const size_t vertexRows = packedRows(vertexUniforms), fragmentRows = packedRows(fragmentUniforms);
        const size_t varyingRows = packedRows(readDeclarations(fragment, "varying", 0));
        const size_t attributes = readDeclarations(vertex, "attribute", 0).size();
        std::printf("%s: %zu vertex and %zu fragment vectors, %zu varyings, %zu attributes\n", request,
                    vertexRows, fragmentRows, varyingRows, attributes);
        EXPECT_GT(vertexRows, 3u) << request;
        EXPECT_LE(vertexRows, 128u) << request;
        EXPECT_LE(fragmentRows, 16u) << request;
        EXPECT_LE(varyingRows, 8u) << request;
        EXPECT_LE(attributes, 8u) << request;
        EXPECT_LE(std::count_if(fragmentUniforms.begin(), fragmentUniforms.end(),
                                [](const Declaration& d) { return d.type.rfind("sampler", 0) == 0; }),
                  8)
            << request;
    }
}

namespace
{

/// Programs on the real driver, drawn with one square and read back.
class ShaderAssetsGl : public support::GlTest
{
protected:
    /// @return 0, with a test failure, if it does not compile or link.
    GLuint build(const std::array<std::string, 2>& sources, const std::string& name)
    {
        const GLuint program = glCreateProgram();
        std::string log;
        for (int stage = 0; stage < 2; ++stage)
        {
            const GLuint shader = glCreateShader(stage ? GL_FRAGMENT_SHADER : GL_VERTEX_SHADER);
            const char* text = sources[size_t(stage)].c_str();
            glShaderSource(shader, 1, &text, nullptr);
            glCompileShader(shader);
            char buffer[1000] = "";
            glGetShaderInfoLog(shader, sizeof(buffer), nullptr, buffer);
            log += buffer;
            glAttachShader(program, shader);
            glDeleteShader(shader);
        }
        glLinkProgram(program);
        GLint linked = 0;
        glGetProgramiv(program, GL_LINK_STATUS, &linked);
        char buffer[1000] = "";
        glGetProgramInfoLog(program, sizeof(buffer), nullptr, buffer);
        EXPECT_TRUE(linked) << name << "\n" << log << buffer;
        return linked ? program : 0;
    }
};

} // namespace

// Faults caught: features that do not go together on the real driver, precisions that differ between the stages, and
// uniforms that the program file does not bind: they would stay zero, with a warning for each.
TEST_F(ShaderAssetsGl, everyProgramLinksAndIsFed)
{
    for (const std::string& request : everyProgram())
    {
        const GLuint program = build(readSources(request), request);
        ASSERT_NE(0u, program) << request;
        auto bindings = readBindings(request);
        if (request.rfind("orv#base", 0) == 0 || request.rfind("orv#fog", 0) == 0 ||
            request.rfind("orv#ripple", 0) == 0)
        {
            EXPECT_TRUE(bindings.empty()) << request;
            if (request.find('$') != std::string::npos)
                bindings = {{"u_t_modelViewProjection", ""},
                            {"u_m_uvOffsetScale", ""},
                            {"u_m_diffuseTexture", ""},
                            {"u_m_diffuseColour", ""},
                            {"u_m_opacity", ""},
                            {"u_fogDensity", ""},
                            {"u_fogColour", ""},
                            {"u_time", ""}};
        }
        GLint count = 0, attributes = 0;
        glGetProgramiv(program, GL_ACTIVE_UNIFORMS, &count);
        for (GLint i = 0; i < count; ++i)
        {
            char name[64];
            GLint size;
            GLenum type;
            glGetActiveUniform(program, GLuint(i), sizeof(name), nullptr, &size, &type, name);
            EXPECT_TRUE(bindings.count(split(name, '[')[0])) << request << ": " << name;
        }
        glGetProgramiv(program, GL_ACTIVE_ATTRIBUTES, &attributes);
        EXPECT_LE(attributes, 8) << request;
        glDeleteProgram(program);
    }

    // A device with few fragment vectors gets another text of the language's constant.
    auto few = readSources("orv#max_ppl$BUMP$DIFF$SPEC$AMBI$REFL$EMIS");
    few[1] = std::regex_replace(few[1], std::regex("gl_MaxFragmentUniformVectors"), "16");
    EXPECT_NE(0u, build(few, "two lights"));
}

namespace
{

template <class T>
std::vector<T> operator+(std::vector<T> a, const std::vector<T>& b)
{
    a.insert(a.end(), b.begin(), b.end());
    return a;
}

Floats operator*(int count, const Floats& values)
{
    return count > 1 ? (count - 1) * values + values : values;
}

Floats scaling(float x, float y, float z, float movedX = 0)
{
    return {x, 0, 0, 0, 0, y, 0, 0, 0, 0, z, 0, movedX, 0, 0, 1};
}

/// One drawing of a small square that faces the eye. What a case does not change is at a value that does not disturb:
/// an eye at z = 1, a white directional light from there, a white material, identity transforms.
struct Shading
{
    const char* fault; ///< what the case catches
    Words programs;    ///< each has to give the same
    std::map<std::string, Floats>
        changes;               ///< uniforms, "a_..." constant attributes, textures (a column of RGBA texels)
    std::array<int, 4> wanted; ///< RGBA in the upper half of the square; -1 for any
    int tolerance = 3;
};

const Floats WHITE = {1, 1, 1, 1};
const Floats BLUE = {0, 0, 1, 1};
const Floats RED_OVER_BLUE = Floats{1, 0, 0, 1} + BLUE;
const std::map<std::string, Floats> STANDARD = {
    {"a_normal", {0, 0, 1, 1}},
    {"a_tangent", {1, 0, 0, 1}},
    {"a_binormal", {0, 1, 0, 1}},
    {"a_colour", WHITE},
    {"a_joints", {0, 0, 0, 0}},
    {"a_weights", {1, 0, 0, 0}},
    {"u_t_model", scaling(1, 1, 1)},
    {"u_t_view", scaling(1, 1, 1)},
    {"u_t_viewProjection", scaling(1, 1, 1)},
    {"u_t_modelViewProjection", scaling(1, 1, 1)},
    {"u_t_oldModelViewProjection", scaling(1, 1, 1)},
    {"u_t_normalModel", {1, 0, 0, 0, 1, 0, 0, 0, 1}},
    {"u_t_cameraPosition", {0, 0, 1, 1}},
    {"u_j_count", {0}},
    {"u_j_world", Floats(320)},
    {"u_l_count", {1}},
    {"u_l_position", 5 * Floats{0, 0, 1, 0}},
    {"u_l_diffuseColour", 5 * WHITE},
    {"u_l_ambientColour", Floats(20)},
    {"u_l_attenuationNear", Floats(5)},
    {"u_l_attenuationReciprocal", Floats(5)},
    {"u_l_spotInnerCos", 5 * Floats{-1}},
    {"u_l_spotOuterCos", 5 * Floats{-1}},
    {"u_l_spotDirection", Floats(15)},
    {"u_m_diffuseColour", WHITE},
    {"u_m_specularColour", {0, 0, 0, 1}},
    {"u_m_ambientColour", {0, 0, 0, 1}},
    {"u_m_emissiveColour", {0, 0, 0, 1}},
    {"u_m_uvOffsetScale", {0, 0, 1, 1}},
    {"u_m_shininess", {5}},
    {"u_m_specularLevel", {1}},
    {"u_m_opacity", {1}},
    {"u_m_selfIllumination", {0}},
    {"u_blurFactor", {1}},
    {"u_deltaTime", {1}},
    {"u_fogColour", {0, 1, 0, 1}},
};

const Words LIT = {"orv#max_pvl$DIFF", "orv#max_ppl$DIFF", "orv#fallback"};
const Words ROOT = {"orv#max_pvl$DIFF$INVSQROOT", "orv#max_ppl$DIFF$INVSQROOT"};
const Words GLOSSY = {"orv#max_pvl$SPEC", "orv#max_ppl$SPEC"};
const Words SKINNED = {"orv#max_pvl$DIFF$SKIN", "orv#max_ppl$DIFF$SKIN"};
const Words BUMPED = {"orv#max_ppl$DIFF$BUMP"};
const Words SPHERE = {"orv#max_pvl$REFL", "orv#max_ppl$REFL"};
const Words PICTURES = {"luvane#quad", "luvane#quad_premultiply", "luvane#blur", "luvane#fog",
                        "luvane#depthoffield"};

const Shading SHADINGS[] = {
    {"light that does not arrive", LIT, {}, {255, 255, 255, 255}},
    {"lights beyond the count", LIT, {{"u_l_count", {0}}}, {0, 0, 0, 255}},
    {"a light too few",
     LIT,
     {{"u_l_count", {5}}, {"u_l_diffuseColour", 5 * Floats{.1f, .1f, .1f, 1}}},
     {128, 128, 128, 255}},
    {"fall-off of a directional light", LIT, {{"u_l_attenuationReciprocal", {10}}}, {255, 255, 255, 255}},
    {"fall-off that is not a straight line",
     LIT,
     {{"u_l_position", {0, 0, 2, 1}}, {"u_l_attenuationNear", {1}}, {"u_l_attenuationReciprocal", {.5f}}},
     {128, 128, 128, 255}},
    {"fall-off without its root",
     ROOT,
     {{"u_l_position", {0, 0, 2, 1}}, {"u_l_attenuationNear", {1}}, {"u_l_attenuationReciprocal", {.5f}}},
     {180, 180, 180, 255}},
    {"root of nothing",
     ROOT,
     {{"u_l_position", {0, 0, 9, 1}}, {"u_l_attenuationReciprocal", {.5f}}},
     {0, 0, 0, 255}},
    {"dark side of a cone without end", LIT, {{"u_l_spotDirection", {0, 0, -1}}}, {255, 255, 255, 255}},
    {"inside of a cone without a soft edge",
     LIT,
     {{"u_l_spotInnerCos", {.9f}}, {"u_l_spotOuterCos", {.9f}}, {"u_l_spotDirection", {0, 0, 1}}},
     {255, 255, 255, 255}},
    {"outside of a cone",
     LIT,
     {{"u_l_spotInnerCos", {.9f}}, {"u_l_spotOuterCos", {.9f}}, {"u_l_spotDirection", {.6f, 0, .8f}}},
     {0, 0, 0, 255}},
    {"soft edge of a cone",
     LIT,
     {{"u_l_spotInnerCos", {.9f}}, {"u_l_spotOuterCos", {.7f}}, {"u_l_spotDirection", {.6f, 0, .8f}}},
     {128, 128, 128, 255}},

    {"pow(x, 0)",
     GLOSSY,
     {{"u_m_shininess", {0}}, {"u_m_specularColour", {.5f, .5f, .5f, 1}}},
     {128, 128, 128, 255}},
    {"pow(0, 0), half vector of opposites",
     {"orv#max_pvl$SPEC$EMIS", "orv#max_ppl$SPEC$EMIS"},
     {{"u_m_shininess", {0}},
      {"u_m_specularColour", WHITE},
      {"u_m_emissiveColour", {.5f, .5f, .5f, 1}},
      {"u_t_cameraPosition", {0, 0, -1.0e18f, 1}}},
     {128, 128, 128, 255}},
    {"highlights from behind",
     GLOSSY,
     {{"u_m_specularColour", WHITE}, {"u_l_position", {0, 0, -1, 0}}},
     {0, 0, 0, 255}},
    {"level without effect",
     GLOSSY,
     {{"u_m_specularColour", WHITE}, {"u_m_specularLevel", {.25f}}},
     {64, 64, 64, 255}},
    {"ambient light of one light only",
     {"orv#max_pvl$AMBI", "orv#max_ppl$AMBI"},
     {{"u_l_count", {2}},
      {"u_l_ambientColour", 2 * Floats{.5f, .5f, .5f, 1}},
      {"u_m_ambientColour", {.5f, 1, 0, 1}}},
     {128, 255, 0, 255}},
    {"emission that needs light",
     {"orv#max_pvl$EMIS", "orv#max_ppl$EMIS"},
     {{"u_l_count", {0}}, {"u_m_emissiveColour", {.5f, 0, 1, 1}}},
     {128, 0, 255, 255}},
    {"self-illumination that needs light",
     {"orv#max_pvl$DIFF", "orv#max_ppl$DIFF"},
     {{"u_l_count", {0}}, {"u_m_selfIllumination", {.5f}}},
     {128, 128, 128, 255}},
    {"opacity from the colour",
     LIT + Words{"luvane#quad"},
     {{"u_m_diffuseTexture", {1, 1, 1, .5f}}, {"u_m_opacity", {.5f}}, {"u_m_diffuseColour", {1, 1, 1, .1f}}},
     {255, 255, 255, 64}},

    {"picture upside down", LIT + PICTURES, {{"u_m_diffuseTexture", RED_OVER_BLUE}}, {255, 0, 0, 255}},
    {"error picture upside down", {"orv#error"}, {{"u_m_errorTexture", RED_OVER_BLUE}}, {255, 0, 0, 255}},
    {"render target upside down",
     LIT + PICTURES,
     {{"u_m_diffuseTexture", RED_OVER_BLUE}, {"u_m_uvOffsetScale", {0, 1, 1, -1}}},
     {0, 0, 255, 255}},
    {"sphere map upside down",
     SPHERE,
     {{"a_normal", {0, .6f, .8f, 1}}, {"u_m_reflectionTexture", RED_OVER_BLUE}},
     {255, 0, 0, 255}},
    {"sphere map that does not follow the eye",
     SPHERE,
     {{"a_normal", {0, .6f, .8f, 1}},
      {"u_t_view", scaling(-1, -1, 1)},
      {"u_m_reflectionTexture", RED_OVER_BLUE}},
     {0, 0, 255, 255}},
    {"sphere map in a mirror image",
     SPHERE,
     {{"a_normal", {0, .6f, .8f, 1}},
      {"u_t_view", scaling(-1, 1, 1)},
      {"u_m_reflectionTexture", BLUE + Floats{1, 0, 0, 1} + 6 * BLUE}},
     {255, 0, 0, 255}},
    {"wrong side of a cube map",
     {"orv#max_pvl$REFL$CUBE", "orv#max_ppl$REFL$CUBE"},
     {{"a_normal", {0, .7f, .7f, 1}},
      {"u_m_reflectionTexture", 2 * Floats{1, 0, 0, 1} + Floats{0, 1, 0, 1} + 3 * Floats{0, 0, 1, 1}}},
     {0, 255, 0, 255}},

    {"bumps along u",
     BUMPED,
     {{"u_m_bumpTexture", {1, .5f, .5f, 1}}, {"u_l_position", {1, 0, 0, 0}}},
     {255, 255, 255, 255}},
    {"green that points down",
     BUMPED,
     {{"u_m_bumpTexture", {.5f, 1, .5f, 1}}, {"u_l_position", {0, 1, 0, 0}}},
     {255, 255, 255, 255}},
    {"INVY without effect",
     {"orv#max_ppl$DIFF$BUMP$INVY"},
     {{"u_m_bumpTexture", {.5f, 1, .5f, 1}}, {"u_l_position", {0, -1, 0, 0}}},
     {255, 255, 255, 255}},
    {"bumps on a mesh without tangents",
     BUMPED,
     {{"u_m_bumpTexture", {.9f, .6f, .8f, 1}}, {"a_tangent", WHITE}, {"a_binormal", WHITE}},
     {255, 255, 255, 255}},
    {"dark back of a sheet",
     {"orv#max_ppl$DIFF"},
     {{"u_t_modelViewProjection", scaling(-1, 1, 1)}, {"u_l_position", {0, 0, -1, 0}}},
     {255, 255, 255, 255}},

    {"nothing drawn without joints", SKINNED, {}, {255, 255, 255, 255}},
    {"model transform ignored without joints", SKINNED, {{"u_t_model", scaling(1, 1, 1, 9)}}, {0, 0, 0, 0}},
    {"model transform on top of the joints",
     SKINNED,
     {{"u_t_model", scaling(1, 1, 1, 9)}, {"u_j_count", {1}}, {"u_j_world", scaling(1, 1, 1)}},
     {255, 255, 255, 255}},
    {"last weight that GL has filled in",
     SKINNED + Words{"orv#gen_velocity$SKIN"},
     {{"u_j_count", {2}},
      {"u_j_world", scaling(1, 1, 1) + scaling(1, 1, 1, 9)},
      {"a_joints", {0, 1, 0, 1}},
      {"a_weights", {1, 0, 0, 1}}},
     {-1, -1, 255, 255}},
    {"last weight that is one",
     SKINNED + Words{"orv#gen_velocity$SKIN"},
     {{"u_j_count", {2}},
      {"u_j_world", scaling(1, 1, 1, 9) + scaling(1, 1, 1)},
      {"a_joints", {0, 0, 0, 1}},
      {"a_weights", {0, 0, 0, 1}}},
     {-1, -1, 255, 255}},
    {"no weights",
     SKINNED,
     {{"u_j_count", {1}}, {"u_j_world", scaling(1, 1, 1)}, {"a_weights", {0, 0, 0, 0}}},
     {255, 255, 255, 255}},
    {"joint beyond the last",
     SKINNED,
     {{"u_j_count", {1}}, {"u_j_world", scaling(1, 1, 1)}, {"a_joints", {25, 0, 0, 0}}},
     {255, 255, 255, 255}},
    {"normals scaled like positions",
     SKINNED,
     {{"u_j_count", {1}}, {"u_j_world", scaling(4, 1, 1)}, {"a_normal", {1, 0, 1, 1}}},
     {247, 247, 247, 255}},
    {"normals of a mirrored joint",
     SKINNED,
     {{"u_j_count", {1}}, {"u_j_world", scaling(1, 1, -1)}, {"u_l_position", {0, 0, -1, 0}}},
     {255, 255, 255, 255}},

    {"rest that is blurred", {"orv#gen_velocity", "orv#gen_velocity$SKIN"}, {}, {127, 127, 255, 255}, 0},
    {"velocity coded otherwise",
     {"orv#gen_velocity"},
     {{"u_t_oldModelViewProjection", scaling(1, 1, 1, -.1f)}},
     {178, 127, 255, 255},
     1},
    {"velocity too long",
     {"orv#gen_velocity"},
     {{"u_t_oldModelViewProjection", scaling(1, 1, 1, -9)}},
     {254, 127, 255, 255},
     1},
    {"blurred picture upside down",
     {"orv#motionblur"},
     {{"u_m_sharpTexture", RED_OVER_BLUE}, {"u_m_velocityTexture", {127 / 255.f, 127 / 255.f, 1, 1}}},
     {0, 0, 255, 255}},

    {"no clay", {"orv#base"}, {}, {182, 173, 160, 255}},
    {"no fog", {"orv#fog"}, {}, {181, 193, 204, 255}},
    {"no waves", {"orv#ripple"}, {}, {61, 122, 168, 255}, 40},
    {"fog that does not come", {"luvane#fog"}, {{"u_fogDensity", {9}}}, {0, 255, 0, 255}},
    {"colour of text from its picture",
     {"luvane#textfadequad"},
     {{"u_m_diffuseTexture", {0, 0, 0, .5f}}, {"u_m_diffuseColour", {1, .5f, 0, 1}}},
     {255, 128, 0, 128}},
};

/// Gives a uniform its value, and a sampler a texture on a unit of its own.
void feed(GLuint program, GLuint index, const Shading& shading, int& unit)
{
    char name[64];
    GLint size;
    GLenum type;
    glGetActiveUniform(program, index, sizeof(name), nullptr, &size, &type, name);
    const GLint location = glGetUniformLocation(program, name);
    const std::string key = split(name, '[')[0];
    const bool sampler = type == GL_SAMPLER_2D || type == GL_SAMPLER_CUBE;
    Floats values = sampler ? WHITE : Floats();
    if (STANDARD.count(key))
        values = STANDARD.at(key);
    if (shading.changes.count(key))
        values = shading.changes.at(key);

    if (sampler)
    {
        const GLenum target = type == GL_SAMPLER_2D ? GL_TEXTURE_2D : GL_TEXTURE_CUBE_MAP;
        std::vector<uint8_t> texels;
        for (const float value : values)
            texels.push_back(uint8_t(std::lround(value * 255)));
        GLuint texture;
        glGenTextures(1, &texture);
        glActiveTexture(GLenum(GL_TEXTURE0 + unit));
        glBindTexture(target, texture);
        glTexParameteri(target, GL_TEXTURE_MIN_FILTER, GL_NEAREST);
        glTexParameteri(target, GL_TEXTURE_MAG_FILTER, GL_NEAREST);
        if (target == GL_TEXTURE_2D)
            glTexImage2D(target, 0, GL_RGBA, 1, GLsizei(texels.size() / 4), 0, GL_RGBA, GL_UNSIGNED_BYTE,
                         texels.data());
        for (unsigned face = 0; face < 6 && target == GL_TEXTURE_CUBE_MAP; ++face)
            glTexImage2D(GL_TEXTURE_CUBE_MAP_POSITIVE_X + face, 0, GL_RGBA, 1, 1, 0, GL_RGBA,
                         GL_UNSIGNED_BYTE, &texels[face * 4]);
        glUniform1i(location, unit++);
        return;
    }
    values.resize(400);
    switch (type)
    {
    case GL_INT: glUniform1i(location, int(values[0])); break;
    case GL_FLOAT: glUniform1fv(location, size, values.data()); break;
    case GL_FLOAT_VEC2: glUniform2fv(location, size, values.data()); break;
    case GL_FLOAT_VEC3: glUniform3fv(location, size, values.data()); break;
    case GL_FLOAT_VEC4: glUniform4fv(location, size, values.data()); break;
    case GL_FLOAT_MAT3: glUniformMatrix3fv(location, size, GL_FALSE, values.data()); break;
    case GL_FLOAT_MAT4: glUniformMatrix4fv(location, size, GL_FALSE, values.data()); break;
    default: ADD_FAILURE() << "type of " << name;
    }
}

} // namespace

TEST_F(ShaderAssetsGl, shadeAsTheyShould)
{
    const float corners[] = {-.1f, -.1f, 0, 0, 0, .1f, -.1f, 0, 1, 0, -.1f, .1f, 0, 0, 1, .1f, .1f, 0, 1, 1};
    std::map<std::string, GLuint> programs; // the driver takes its time for the first draw with each
    for (const Shading& shading : SHADINGS)
    {
        for (const std::string& name : shading.programs)
        {
            if (!programs.count(name))
                programs[name] = build(readSources(name), name);
            const GLuint program = programs[name];
            ASSERT_NE(0u, program);
            glUseProgram(program);
            GLint count = 0;
            int unit = 0;
            glGetProgramiv(program, GL_ACTIVE_UNIFORMS, &count);
            for (GLint i = 0; i < count; ++i)
                feed(program, GLuint(i), shading, unit);
            glGetProgramiv(program, GL_ACTIVE_ATTRIBUTES, &count);
            for (GLuint i = 0; i < 8; ++i)
                glDisableVertexAttribArray(i);
            for (GLint i = 0; i < count; ++i)
            {
                char attribute[64];
                GLint size;
                GLenum type;
                glGetActiveAttrib(program, GLuint(i), sizeof(attribute), nullptr, &size, &type, attribute);
                const GLuint location = GLuint(glGetAttribLocation(program, attribute));
                const bool place = attribute == std::string("a_position"),
                           uv = attribute == std::string("a_uv0");
                if (place || uv)
                {
                    glEnableVertexAttribArray(location);
                    glVertexAttribPointer(location, place ? 3 : 2, GL_FLOAT, GL_FALSE, 20,
                                          place ? corners : corners + 3);
                    continue;
                }
                const auto changed = shading.changes.find(attribute);
                glVertexAttrib4fv(location, changed != shading.changes.end() ? changed->second.data()
                                                                             : STANDARD.at(attribute).data());
            }
            glClear(GL_COLOR_BUFFER_BIT);
            glDrawArrays(GL_TRIANGLE_STRIP, 0, 4);
            uint8_t pixel[4];
            glReadPixels(31, 33, 1, 1, GL_RGBA, GL_UNSIGNED_BYTE, pixel);
            for (size_t i = 0; i < 4; ++i)
            {
                if (shading.wanted[i] >= 0)
                {
                    EXPECT_NEAR(shading.wanted[i], pixel[i], shading.tolerance)
                        << shading.fault << ", " << name << ", channel " << i;
                }
            }
        }
    }
}
