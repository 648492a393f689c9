#include "orv/detail/embeddedassets.h"
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
#include <cstdlib>
#include <cstring>
#include <filesystem>
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
    const detail::EmbeddedArchive& shadows = detail::SHADOW_ARCHIVE;
    for (size_t i = 0; i < shadows.count; ++i)
    {
        if (name == shadows.assets[i].name)
            return std::string(reinterpret_cast<const char*>(shadows.assets[i].bytes),
                               size_t(shadows.assets[i].size));
    }
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
    // The features of a scene file's SURF chunk can be combined with all others.
    for (const char* base : {"orv#max_pvl", "orv#max_ppl"})
    {
        for (const char* usual : {"", "$DIFF", "$SPEC$AMBI", "$DIFF$SPEC$AMBI$REFL$EMIS$SKIN",
                                  "$BUMP$INVY$DIFF$SPEC$AMBI$REFL$CUBE$EMIS"})
        {
            for (const char* more : {"$VCOL", "$CUTOFF", "$BACK", "$UNLIT", "$LINEAR",
                                     "$VCOL$CUTOFF$BACK$LINEAR", "$VCOL$CUTOFF$BACK$UNLIT$LINEAR"})
                requests.push_back(std::string(base) + usual + more);
        }
    }
    for (const char* base : {"shadow#max_pvl$DIFF", "shadow#max_ppl$BUMP$DIFF"})
    {
        for (const char* more :
             {"", "$SPEC$AMBI$REFL$EMIS$SKIN", "$SPEC$AMBI$REFL$CUBE$VCOL$CUTOFF$BACK$LINEAR"})
        {
            for (const char* sides : {"$SHADOW", "$SHADOW$SHEET"})
                requests.push_back(std::string(base) + more + sides);
        }
    }
    for (const char* name : {"shadow#depth", "shadow#depth$SKIN$CUTOFF$DIFF$VCOL", "shadow#depth$CUTOFF",
                             "shadow#max_pvl$SPEC$SHADOW", "shadow#max_ppl$SPEC$SHADOW"})
        requests.push_back(name);
    for (const char* name :
         {"base", "base$TRANSFORM$TEXTURE$COLOUR$VERTEX_COLOUR", "error", "fallback", "fog",
          "fog$TRANSFORM$TEXTURE$FOG", "gen_velocity", "gen_velocity$SKIN", "motionblur", "motionblur$STEREO",
          "ripple", "ripple$TRANSFORM$TEXTURE$ANIMATED"})
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

/// A shader's text without comments, blanks and code for shadows.
Words codeOf(const std::string& text)
{
    Words lines;
    bool isForShadows = false;
    for (const std::string& line : split(text, '\n'))
    {
        if (line == "#ifdef SHADOW" || line == "#else // SHADOW" || line == "#endif // SHADOW")
            isForShadows = line == "#ifdef SHADOW";
        else if (!isForShadows)
            lines.push_back(line);
    }
    for (std::string& line : lines)
    {
        line = line.substr(0, line.find("//"));
        line.erase(std::remove_if(line.begin(), line.end(), [](char c) { return c == ' ' || c == '\t'; }),
                   line.end());
    }
    lines.erase(std::remove(lines.begin(), lines.end(), ""), lines.end());
    return lines;
}

const std::string VALIDATOR =
    std::string(ORV_GLSLANG_VALIDATOR) + " " + ORV_SOURCE_FOLDER + "/tests/facility/es20limits.conf ";

} // namespace

// Fault caught: a built-in asset that is missing, misnamed, truncated or changed by the build, which may only remove
// comments and blanks of shaders.
TEST(BuiltInAssets, areTheFilesOfTheirFolders)
{
    for (const auto& [space, count] : std::map<std::string, size_t>{{"orv", 34}, {"luvane", 37}})
    {
        size_t found = 0;
        for (const auto& entry : std::filesystem::directory_iterator(std::string(ORV_SOURCE_FOLDER) +
                                                                     "/engine/facility/assets/" + space))
        {
            const std::vector<uint8_t> bytes = support::readFile(entry.path());
            const std::string text(bytes.begin(), bytes.end());
            const std::string asset = readAsset(space + "#" + entry.path().filename().string());
            const std::string kind = entry.path().extension().string();
            if (kind == ".vert" || kind == ".frag")
                EXPECT_EQ(codeOf(text), codeOf(asset)) << entry.path();
            else
                EXPECT_EQ(std::regex_replace(text, std::regex("\n(uniform u_s_.*\n)+"), ""), asset)
                    << entry.path();
            ++found;
        }
        EXPECT_EQ(count, found) << space;
    }

    const SharedPtr<MemoryStreamSource> source = create_memfilesource_orv();
    for (const char* wrong : {"orv#White.png", "white.png", "luvane#white.png", "orv#"})
        EXPECT_FALSE(source->exists(wrong)) << wrong;
}

// Fault caught: bytes that exit handlers free before the program's last object has read them.
TEST(BuiltInAssets, lastUntilTheProcessEnds)
{
    static SharedPtr<Stream>* picture; // as a global of the program would hold it
    const auto readLate = []
    {
        unsigned char start[4] = {};
        (*picture)->read(start, sizeof(start));
        std::_Exit(std::memcmp(start, "\x89PNG", 4) == 0 ? 0 : 1);
    };
    EXPECT_EXIT(
        {
            std::atexit(readLate); // runs after what the engine registers from now on
            picture = new SharedPtr<Stream>(create_memfilesource_orv()->open("orv#white.png", false));
            std::exit(2);
        },
        testing::ExitedWithCode(0), "");
}

// Fault caught: a picture that other programs do not take for what it should be.
TEST(BuiltInAssets, picturesHaveTheirSizesAndKinds)
{
    using Pixel = std::vector<unsigned char>;
    const struct
    {
        const char* name;
        int size, kind;
        Pixel corner;
    } pictures[] = {{"orv#black.png", 1, 6, {0, 0, 0, 255}},
                    {"orv#error.png", 16, 6, {0, 0, 0, 255}},
                    {"orv#missing.png", 16, 6, {255, 0, 255, 255}},
                    {"orv#white.png", 1, 3, {255, 255, 255}}};
    for (const auto& picture : pictures)
    {
        const std::string bytes = readAsset(picture.name);
        EXPECT_EQ(picture.kind, bytes.at(25)) << picture.name;
        MemoryStream stream(bytes.data(), int(bytes.size()));
        const Image image(stream);
        ASSERT_TRUE(image.data()) << picture.name;
        EXPECT_TRUE(image.width() == picture.size && image.height() == picture.size) << picture.name;
        EXPECT_EQ(picture.corner, Pixel(image.data(), image.data() + image.channelCount())) << picture.name;
    }
}

// Fault caught: source that a tolerant driver accepts but the language does not allow.
TEST(ShaderAssets, compileByTheRulesOfTheLanguage)
{
    std::set<std::array<std::string, 2>> stages; // suffix and text
    for (const std::string& request : everyProgram())
    {
        const auto sources = readSources(request);
        stages.insert({{".vert", sources[0]}, {".frag", sources[1]}});
    }
    support::TempDir folder;
    std::string list;
    for (const auto& [suffix, text] : stages)
    {
        const std::string name = std::to_string(list.size()) + suffix;
        folder.write(name, text);
        list += name + " ";
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

/// Whether the declarations can be packed into this many vectors of four, by the rules of the language's appendix A.7: wide
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

/// The distinct literals of a preprocessed stage: they may take space among the uniforms. Array sizes and operands of
/// constants do not.
std::vector<Declaration> readLiterals(std::string source)
{
    source = std::regex_replace(source, std::regex(R"((uniform|attribute|varying|const int|#)[^\n]*)"), "");
    const std::regex number(R"([^\w.](\d+\.?\d*(?:e-?\d+)?))");
    std::set<float> values;
    for (std::sregex_iterator i(source.begin(), source.end(), number), end; i != end; ++i)
        values.insert(std::stof((*i)[1]));
    return std::vector<Declaration>(values.size(), {"", "float", "literal"});
}

size_t packedRows(const std::vector<Declaration>& declarations)
{
    size_t rows = 1;
    while (rows < 512 && !fits(declarations, rows))
        ++rows;
    return rows;
}

} // namespace

// Fault caught: a program that only fits on desktop drivers. 128 vertex and 16 fragment vectors, 8 varyings, 8
// attributes and 8 textures are what every device has.
TEST(ShaderAssets, fitTheSmallestDevice)
{
    EXPECT_EQ(2u, packedRows({{"", "vec3", "a"}, {"", "float", "b"}, {"", "vec2", "c"}, {"", "vec2", "d"}}));
    EXPECT_EQ(5u, packedRows({{"", "mat3", "a"}, {"", "vec3", "b", 2}, {"", "float", "c", 5}}));
    EXPECT_EQ(6u, packedRows({{"", "vec3", "b", 5}, {"", "float", "c", 5}, {"", "float", "d"}}));

    support::TempDir folder;
    for (const char* request :
         {"orv#max_pvl$INVSQROOT$DIFF$SPEC$AMBI$REFL$EMIS$SKIN",
          "orv#max_pvl$INVSQROOT$DIFF$SPEC$AMBI$REFL$CUBE$EMIS$SKIN",
          "orv#max_ppl$BUMP$INVY$INVSQROOT$DIFF$SPEC$AMBI$REFL$EMIS$SKIN",
          "orv#max_ppl$BUMP$INVY$INVSQROOT$DIFF$SPEC$AMBI$REFL$CUBE$EMIS$SKIN",
          "orv#max_pvl$INVSQROOT$DIFF$SPEC$AMBI$REFL$CUBE$EMIS$VCOL$CUTOFF$BACK$LINEAR$SKIN",
          "orv#max_pvl$INVSQROOT$DIFF$SPEC$AMBI$REFL$EMIS$VCOL$CUTOFF$BACK$LINEAR$SKIN",
          "orv#max_ppl$BUMP$INVY$INVSQROOT$DIFF$SPEC$AMBI$REFL$EMIS$VCOL$CUTOFF$LINEAR$SKIN",
          "orv#max_ppl$BUMP$INVSQROOT$DIFF$SPEC$AMBI$REFL$CUBE$EMIS$VCOL$CUTOFF$LINEAR$SKIN",
          "shadow#max_pvl$INVSQROOT$DIFF$SPEC$AMBI$REFL$CUBE$EMIS$VCOL$CUTOFF$BACK$LINEAR$SKIN$SHADOW$SHEET",
          "shadow#max_pvl$INVSQROOT$DIFF$SPEC$AMBI$REFL$EMIS$VCOL$CUTOFF$BACK$SKIN$SHADOW$SHEET",
          "shadow#max_ppl$BUMP$INVSQROOT$DIFF$AMBI$REFL$EMIS$VCOL$CUTOFF$LINEAR$SKIN$SHADOW$SHEET",
          "shadow#max_ppl$BUMP$INVSQROOT$DIFF$SPEC$AMBI$REFL$CUBE$VCOL$CUTOFF$LINEAR$SKIN$SHADOW$SHEET",
          "shadow#max_ppl$BUMP$INVSQROOT$AMBI$SPEC$REFL$EMIS$VCOL$CUTOFF$LINEAR$SKIN$SHADOW$SHEET",
          "shadow#depth$SKIN$CUTOFF$DIFF$VCOL", "orv#fallback", "orv#gen_velocity$SKIN"})
    {
        const auto sources = readSources(request);
        const std::string vertex = run(VALIDATOR + "-E " + folder.write("a.vert", sources[0]));
        const std::string fragment = run(VALIDATOR + "-E " + folder.write("a.frag", sources[1]));
        auto vertexUniforms = readDeclarations(vertex, "uniform", 5);
        std::smatch lights; // the constant's value on a device with 16 vectors
        std::regex_search(fragment, lights, std::regex(R"(gl_MaxFragmentUniformVectors < 32 \? (\d+) :)"));
        auto fragmentUniforms =
            readDeclarations(fragment, "uniform", lights.empty() ? 0 : std::stoi(lights[1]));
        const auto add = [](std::vector<Declaration>& all, const std::vector<Declaration>& more)
        { all.insert(all.end(), more.begin(), more.end()); };
        const auto vertexLiterals = readLiterals(vertex);
        EXPECT_LE(packedRows(vertexUniforms) + vertexLiterals.size(), 128u)
            << request << ", a vector for each literal";
        add(vertexUniforms, vertexLiterals);
        add(fragmentUniforms, readLiterals(fragment));
        const size_t vertexRows = packedRows(vertexUniforms), fragmentRows = packedRows(fragmentUniforms);
        const size_t varyingRows = packedRows(readDeclarations(fragment, "varying", 0));
        const size_t attributes = readDeclarations(vertex, "attribute", 0).size();
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
                for (const char* name : {"u_t_modelViewProjection", "u_m_uvOffsetScale", "u_m_diffuseTexture",
                                         "u_m_diffuseColour", "u_m_opacity", "u_fogDensity", "u_fogColour",
                                         "u_time", "u_t_modelView"})
                    bindings[name] = "";
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

/// Numbers. "3*" repeats all that follow it, "scale x y z moved" is a matrix.
Floats readFloats(std::istringstream& words)
{
    Floats values;
    for (std::string word; words >> word;)
    {
        Floats more = {0};
        if (word == "scale")
        {
            more = {0, 0, 0, 0, 0, 0, 0, 0, 0, 0, 0, 0, 0, 0, 0, 1};
            words >> more[0] >> more[5] >> more[10] >> more[12];
        }
        else if (word.back() == '*')
            more = readFloats(words);
        else
            more[0] = std::stof(word);
        for (int i = word.back() == '*' ? std::stoi(word) : 1; i > 0; --i)
            values.insert(values.end(), more.begin(), more.end());
    }
    return values;
}

/// Values by name: "u_a 1 2; u_b 3".
std::map<std::string, Floats> readValues(const std::string& text)
{
    std::map<std::string, Floats> values;
    for (const std::string& part : split(text, ';'))
    {
        std::istringstream words(part);
        std::string name;
        if (words >> name)
            values[name] = readFloats(words);
    }
    return values;
}

/// Uniforms, "a_..." constant attributes and textures (a column of RGBA texels) that do not disturb: an eye at z = 1, a
/// white directional light from there, a white material, identity transforms.
const char* const STANDARD = R"(
a_normal 0 0 1 1; a_tangent 1 0 0 1; a_binormal 0 1 0 1; a_colour 1 1 1 1; a_joints 0 0 0 0; a_weights 1 0 0 0;
u_t_model scale 1 1 1 0; u_t_view scale 1 1 1 0; u_t_viewProjection scale 1 1 1 0;
u_t_modelViewProjection scale 1 1 1 0; u_t_oldModelViewProjection scale 1 1 1 0; u_j_weightFilled 0;
u_t_modelView 1 0 0 0 0 1 0 0 0 0 1 0 0 0 -1 1;
u_t_normalModel 1 0 0 0 1 0 0 0 1; u_t_cameraPosition 0 0 1 1; u_j_count 0; u_j_world 320* 0;
u_l_count 1; u_l_position 5* 0 0 1 0; u_l_diffuseColour 20* 1; u_l_ambientColour 20* 0; u_l_attenuationNear 5* 0;
u_l_attenuationReciprocal 5* 0; u_l_spotInnerCos 5* -1; u_l_spotOuterCos 5* -1; u_l_spotDirection 15* 0;
u_m_diffuseColour 1 1 1 1; u_m_specularColour 0 0 0 1; u_m_ambientColour 0 0 0 1; u_m_emissiveColour 0 0 0 1;
u_m_uvOffsetScale 0 0 1 1; u_m_cutoff .5; u_m_shininess 5; u_m_specularLevel 1; u_m_opacity 1; u_m_selfIllumination 0;
u_blurFactor 1; u_deltaTime 1; u_fogColour 0 1 0 1)";

/// Drawings of a small square that faces the eye: the fault that it catches | programs that all have to give the same |
/// changes to STANDARD | RGBA in the upper half of the square (-1 for any), tolerance (3 if none is given). BOTH stands
/// for max_pvl and max_ppl, LIT and PICTURES for the programs below.
const char* const LIT = "BOTH$DIFF orv#fallback";
const char* const PICTURES = "luvane#quad luvane#quad_premultiply luvane#blur luvane#fog luvane#depthoffield";
const char* const SHADINGS = R"(
light that does not arrive | LIT | | 255 255 255 255
lights beyond the count | LIT | u_l_count 0 | 0 0 0 255
a light too few | LIT | u_l_count 5; u_l_diffuseColour 5* .1 .1 .1 1 | 128 128 128 255
fall-off of a directional light | LIT | u_l_attenuationReciprocal 10 | 255 255 255 255
fall-off that is not a straight line | LIT
  | u_l_position 0 0 2 1; u_l_attenuationNear 1; u_l_attenuationReciprocal .5 | 128 128 128 255
fall-off without its root | BOTH$DIFF$INVSQROOT
  | u_l_position 0 0 2 1; u_l_attenuationNear 1; u_l_attenuationReciprocal .5 | 180 180 180 255
root of nothing | BOTH$DIFF$INVSQROOT | u_l_position 0 0 9 1; u_l_attenuationReciprocal .5 | 0 0 0 255
dark side of a cone without end | LIT | u_l_spotDirection 0 0 -1 | 255 255 255 255
inside of a cone without a soft edge | LIT
  | u_l_spotInnerCos .9; u_l_spotOuterCos .9; u_l_spotDirection 0 0 1 | 255 255 255 255
outside of a cone | LIT | u_l_spotInnerCos .9; u_l_spotOuterCos .9; u_l_spotDirection .6 0 .8 | 0 0 0 255
soft edge of a cone | LIT | u_l_spotInnerCos .9; u_l_spotOuterCos .7; u_l_spotDirection .6 0 .8 | 128 128 128 255
pow(x, 0) | BOTH$SPEC | u_m_shininess 0; u_m_specularColour .5 .5 .5 1 | 128 128 128 255
pow(0, 0), half vector of opposites | BOTH$SPEC$EMIS | u_m_shininess 0; u_m_specularColour 1 1 1 1;
  u_m_emissiveColour .5 .5 .5 1; u_t_cameraPosition 0 0 -1e18 1 | 128 128 128 255
highlights from behind | BOTH$SPEC | u_m_specularColour 1 1 1 1; u_l_position 0 0 -1 0 | 0 0 0 255
exponent of highlights | BOTH$SPEC | u_m_specularColour 1 1 1 1; u_l_position .96 0 .28 0; u_m_shininess 3;
  u_t_cameraPosition 0 0 1e4 1 | 131 131 131 255
level without effect | BOTH$SPEC | u_m_specularColour 1 1 1 1; u_m_specularLevel .25 | 64 64 64 255
ambient light of one light only | BOTH$AMBI
  | u_l_count 2; u_l_ambientColour 2* .5 .5 .5 1; u_m_ambientColour .5 1 0 1 | 128 255 0 255
emission that needs light | BOTH$EMIS | u_l_count 0; u_m_emissiveColour .5 0 1 1 | 128 0 255 255
self-illumination that needs light | BOTH$DIFF | u_l_count 0; u_m_selfIllumination .5 | 128 128 128 255
opacity from the colour | LIT luvane#quad
  | u_m_diffuseTexture 1 1 1 .5; u_m_opacity .5; u_m_diffuseColour 1 1 1 .1 | 255 255 255 64
picture upside down | LIT PICTURES | u_m_diffuseTexture 1 0 0 1 0 0 1 1 | 255 0 0 255
error picture upside down | orv#error | u_m_errorTexture 1 0 0 1 0 0 1 1 | 255 0 0 255
render target upside down | LIT PICTURES
  | u_m_diffuseTexture 1 0 0 1 0 0 1 1; u_m_uvOffsetScale 0 1 1 -1 | 0 0 255 255
sphere map upside down | BOTH$REFL | a_normal 0 .6 .8 1; u_m_reflectionTexture 1 0 0 1 0 0 1 1 | 255 0 0 255
sphere map that does not follow the eye | BOTH$REFL
  | a_normal 0 .6 .8 1; u_t_view scale -1 -1 1 0; u_m_reflectionTexture 1 0 0 1 0 0 1 1 | 0 0 255 255
sphere map in a mirror image | BOTH$REFL
  | a_normal 0 .6 .8 1; u_t_view scale -1 1 1 0; u_m_reflectionTexture 0 0 1 1 1 0 0 1 6* 0 0 1 1 | 255 0 0 255
wrong side of a cube map | BOTH$REFL$CUBE
  | a_normal 0 .7 .7 1; u_m_reflectionTexture 1 0 0 1 1 0 0 1 0 1 0 1 3* 0 0 1 1 | 0 255 0 255
bumps along u | orv#max_ppl$DIFF$BUMP | u_m_bumpTexture 1 .5 .5 1; u_l_position 1 0 0 0 | 255 255 255 255
green that points down | orv#max_ppl$DIFF$BUMP | u_m_bumpTexture .5 1 .5 1; u_l_position 0 1 0 0 | 255 255 255 255
INVY without effect | orv#max_ppl$DIFF$BUMP$INVY
  | u_m_bumpTexture .5 1 .5 1; u_l_position 0 -1 0 0 | 255 255 255 255
bumps on a mesh without tangents | orv#max_ppl$DIFF$BUMP
  | u_m_bumpTexture .9 .6 .8 1; a_tangent 1 1 1 1; a_binormal 1 1 1 1 | 255 255 255 255
dark back of a sheet | orv#max_ppl$DIFF
  | u_t_modelViewProjection scale -1 1 1 0; u_l_position 0 0 -1 0 | 255 255 255 255
colours of vertices without effect | BOTH$DIFF$VCOL | a_colour .5 1 0 .5 | 128 255 0 128
ambient light without them | BOTH$AMBI$VCOL
  | u_l_count 5; a_colour .5 1 0 1; u_l_ambientColour 20* .2; u_m_ambientColour 1 1 1 1 | 128 255 0 255
hole that is drawn | BOTH$DIFF$CUTOFF | u_m_diffuseTexture 1 1 1 .4; u_m_cutoff .5 | 0 0 0 0
rim of a hole that is not opaque | BOTH$DIFF$CUTOFF | u_m_diffuseTexture 1 1 1 .6; u_m_cutoff .5 | 255 255 255 255
hole by the colours of vertices | BOTH$VCOL$CUTOFF | a_colour 1 1 1 .4; u_m_cutoff .5 | 0 0 0 0
dark back of a sheet lit at its vertices | orv#max_pvl$DIFF$BACK
  | u_t_modelViewProjection scale -1 1 1 0; u_l_position 0 0 -1 0 | 255 255 255 255
back lit like the front | orv#max_pvl$DIFF$BACK | u_t_modelViewProjection scale -1 1 1 0 | 0 0 0 255
front lit like the back | orv#max_pvl$DIFF$BACK | | 255 255 255 255
highlights of the front on the back | orv#max_pvl$SPEC$BACK
  | u_t_modelViewProjection scale -1 1 1 0; u_m_specularColour 1 1 1 1 | 0 0 0 255
back without highlights | orv#max_pvl$SPEC$BACK | u_t_modelViewProjection scale -1 1 1 0; u_m_specularColour 1 1 1 1;
  u_l_position 0 0 -1 0; u_t_cameraPosition 0 0 -1 1 | 255 255 255 255
own colour that needs light | orv#max_pvl$DIFF$SPEC$UNLIT
  | u_l_count 0; u_m_diffuseColour .5 1 0 1; u_m_specularColour 1 1 1 1 | 128 255 0 255
own colour that light adds to | orv#max_pvl$DIFF$UNLIT | u_l_count 5; u_m_diffuseColour .5 1 0 1 | 128 255 0 255
light in the screen's shares | BOTH$DIFF$LINEAR | u_l_diffuseColour 20* .5 | 186 186 186 255
texture in other shares than the colour | BOTH$DIFF$LINEAR$VCOL
  | u_m_diffuseTexture .5 1 1 1; u_m_diffuseColour 1 .5 1 1; a_colour 1 1 .5 1 | 128 128 128 255
emission in other shares | BOTH$DIFF$EMIS$LINEAR
  | u_m_diffuseTexture .5 .5 .5 1; u_m_emissiveColour .5 .5 .5 1 | 175 175 175 255
ambient light in other shares | BOTH$AMBI$LINEAR | u_l_ambientColour .5 .5 .5 1; u_m_ambientColour .5 1 .5 1;
  u_m_ambientTexture 1 1 .5 1 | 93 186 47 255
highlights in other shares | BOTH$SPEC$LINEAR
  | u_l_diffuseColour 20* .5; u_m_specularColour .5 1 1 1; u_m_specularTexture 1 .5 1 1 | 93 93 186 255
nothing drawn without joints | BOTH$DIFF$SKIN | | 255 255 255 255
model transform ignored without joints | BOTH$DIFF$SKIN | u_t_model scale 1 1 1 9 | 0 0 0 0
model transform on top of the joints | BOTH$DIFF$SKIN
  | u_t_model scale 1 1 1 9; u_j_count 1; u_j_world scale 1 1 1 0 | 255 255 255 255
last weight that GL has filled in | BOTH$DIFF$SKIN orv#gen_velocity$SKIN
  | u_j_count 2; u_j_world scale 1 1 1 0 scale 1 1 1 9; a_joints 0 1 0 1; a_weights 1 0 0 1; u_j_weightFilled 1
  | -1 -1 255 255
last weight that is one | BOTH$DIFF$SKIN orv#gen_velocity$SKIN
  | u_j_count 2; u_j_world scale 1 1 1 9 scale 1 1 1 0; a_joints 0 0 0 1; a_weights 0 0 0 1 | -1 -1 255 255
last weight that is one beside a tiny one | BOTH$DIFF$SKIN orv#gen_velocity$SKIN
  | u_j_count 2; u_j_world scale 1 1 1 9 scale 1 1 1 0; a_joints 0 0 0 1; a_weights 1e-9 0 0 1 | -1 -1 255 255
no weights | BOTH$DIFF$SKIN | u_j_count 1; u_j_world scale 1 1 1 0; a_weights 0 0 0 0 | 255 255 255 255
joint beyond the last | BOTH$DIFF$SKIN | u_j_count 1; u_j_world scale 1 1 1 0; a_joints 25 0 0 0 | 255 255 255 255
normals scaled like positions | BOTH$DIFF$SKIN
  | u_j_count 1; u_j_world scale 4 1 1 0; a_normal 1 0 1 1 | 247 247 247 255
normals of a mirrored joint | BOTH$DIFF$SKIN
  | u_j_count 1; u_j_world scale 1 1 -1 0; u_l_position 0 0 -1 0 | 255 255 255 255
rest that is blurred | orv#gen_velocity orv#gen_velocity$SKIN | | 127 127 255 255 0
velocity coded otherwise | orv#gen_velocity | u_t_oldModelViewProjection scale 1 1 1 -.1 | 178 127 255 255 1
velocity too long | orv#gen_velocity | u_t_oldModelViewProjection scale 1 1 1 -9 | 254 127 255 255 1
blurred picture upside down | orv#motionblur
  | u_m_sharpTexture 1 0 0 1 0 0 1 1; u_m_velocityTexture .498 .498 1 1 | 0 0 255 255
no clay | orv#base | | 182 173 160 255
no fog | orv#fog | | 181 193 204 255
no waves | orv#ripple | | 61 122 168 255 40
fog that does not come | luvane#fog | u_fogDensity 9 | 0 255 0 255
fog that an orthographic camera has not | luvane#fog orv#fog$TRANSFORM$FOG
  | u_fogDensity .5; u_t_modelView 1 0 0 0 0 1 0 0 0 0 1 0 0 0 -2 1 | 94 255 94 255
fog lost without a view transform | orv#fog$TRANSFORM$FOG | u_fogDensity .5; u_t_modelView 16* 0 | 199 255 199 255
colour of text from its picture | luvane#textfadequad
  | u_m_diffuseTexture 0 0 0 .5; u_m_diffuseColour 1 .5 0 1 | 255 128 0 128
)";

/// Program names, with what BOTH, LIT and PICTURES stand for.
Words readPrograms(const std::string& text)
{
    std::istringstream words(std::regex_replace(std::regex_replace(text, std::regex("\\bLIT\\b"), LIT),
                                                std::regex("PICTURES"), PICTURES));
    Words programs;
    for (std::string word; words >> word;)
    {
        if (word.rfind("BOTH", 0) != 0)
            programs.push_back(word);
        else
            for (const char* base : {"orv#max_pvl", "orv#max_ppl"})
                programs.push_back(base + word.substr(4));
    }
    return programs;
}

/// Gives a uniform its value, and a sampler a texture on a unit of its own.
void feed(GLuint program, GLuint index, const std::map<std::string, Floats>& inputs, int& unit)
{
    char name[64];
    GLint size;
    GLenum type;
    glGetActiveUniform(program, index, sizeof(name), nullptr, &size, &type, name);
    const GLint location = glGetUniformLocation(program, name);
    const auto given = inputs.find(split(name, '[')[0]);
    Floats values = given != inputs.end() ? given->second : Floats();
    if (type == GL_SAMPLER_2D || type == GL_SAMPLER_CUBE)
    {
        const GLenum target = type == GL_SAMPLER_2D ? GL_TEXTURE_2D : GL_TEXTURE_CUBE_MAP;
        std::vector<uint8_t> texels;
        for (const float value : values.empty() ? Floats(4, 1) : values)
            texels.push_back(uint8_t(std::lround(value * 255)));
        const auto upload = [&](GLenum face, size_t first, GLsizei height) {
            glTexImage2D(face, 0, GL_RGBA, 1, height, 0, GL_RGBA, GL_UNSIGNED_BYTE,
                         &texels[first % texels.size()]);
        };
        GLuint texture;
        glGenTextures(1, &texture);
        glActiveTexture(GLenum(GL_TEXTURE0 + unit));
        glBindTexture(target, texture);
        glTexParameteri(target, GL_TEXTURE_MIN_FILTER, GL_NEAREST);
        glTexParameteri(target, GL_TEXTURE_MAG_FILTER, GL_NEAREST);
        if (target == GL_TEXTURE_2D)
            upload(target, 0, GLsizei(texels.size() / 4));
        for (unsigned face = 0; face < 6 && target == GL_TEXTURE_CUBE_MAP; ++face)
            upload(GL_TEXTURE_CUBE_MAP_POSITIVE_X + face, face * 4, 1);
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
    for (const std::string& shading : split(std::regex_replace(SHADINGS, std::regex("\n  "), " "), '\n'))
    {
        if (shading.empty())
            continue;
        const Words columns = split(shading, '|');
        ASSERT_EQ(4u, columns.size()) << shading;
        auto inputs = readValues(columns.at(2));
        inputs.merge(readValues(STANDARD));
        std::istringstream words(columns.at(3));
        Floats wanted = readFloats(words);
        wanted.resize(std::max<size_t>(wanted.size(), 5), 3);
        for (const std::string& name : readPrograms(columns[1]))
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
                feed(program, GLuint(i), inputs, unit);
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
                if (!place && !uv)
                {
                    glVertexAttrib4fv(location, inputs.at(attribute).data());
                    continue;
                }
                glEnableVertexAttribArray(location);
                glVertexAttribPointer(location, place ? 3 : 2, GL_FLOAT, GL_FALSE, 20,
                                      place ? corners : corners + 3);
            }
            glClear(GL_COLOR_BUFFER_BIT);
            glDrawArrays(GL_TRIANGLE_STRIP, 0, 4);
            uint8_t pixel[4];
            glReadPixels(31, 33, 1, 1, GL_RGBA, GL_UNSIGNED_BYTE, pixel);
            for (size_t i = 0; i < 4; ++i)
            {
                if (wanted[i] >= 0)
                {
                    EXPECT_NEAR(wanted[i], pixel[i], wanted[4]) << columns[0] << ", " << name << " " << i;
                }
            }
        }
    }
}
