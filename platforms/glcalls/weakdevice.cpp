#include "glcalls/weakdevice.h"

#include <GLES2/gl2ext.h>

#include <algorithm>
#include <array>
#include <cctype>
#include <cstring>
#include <map>
#include <sstream>

namespace glcalls
{

const Device WEAK_DEVICES[9] = {
    {.name = "128 vertex uniform vectors", .vertexUniformVectors = 128},
    {.name = "8 texture units", .textureUnits = 8},
    {.name = "no NPOT textures", .hasNpotTextures = false},
    {.name = "no ETC1", .hasEtc1 = false},
    {.name = "no packed depth and stencil", .hasPackedDepthStencil = false},
    {.name = "no depth textures", .hasDepthTextures = false},
    {.name = "no program binaries", .hasProgramBinaries = false},
    {.name = "no highp in fragments", .hasFragmentHighp = false},
    {.name = "none of these",
     .vertexUniformVectors = 128,
     .textureUnits = 8,
     .hasNpotTextures = false,
     .hasEtc1 = false,
     .hasPackedDepthStencil = false,
     .hasDepthTextures = false,
     .hasProgramBinaries = false,
     .hasFragmentHighp = false},
};

namespace
{

struct Size
{
    GLsizei width = 0;
    GLsizei height = 0;
};

struct Emulation
{
    Device device;
    std::string extensions;
    std::map<GLuint, Size> textures;
    std::map<GLuint, std::string> refusedPrograms; ///< by name: why they do not link
    GLuint blackTextures[2] = {};                  ///< 2D and cube; made when first needed
};

Emulation g_emulation;

// --- Words and answers -------------------------------------------------------------------------------------

bool isWordCharacter(char c)
{
    return std::isalnum(static_cast<unsigned char>(c)) || c == '_';
}

/// The position of word as a whole word in text, from position on; npos if there is none.
size_t findWord(const std::string& text, const std::string& word, size_t position = 0)
{
    for (; (position = text.find(word, position)) != std::string::npos; ++position)
    {
        const size_t end = position + word.size();
        if ((position == 0 || !isWordCharacter(text[position - 1])) &&
            (end == text.size() || !isWordCharacter(text[end])))
            return position;
    }
    return std::string::npos;
}

void replaceWord(std::string& text, const std::string& word, const std::string& replacement)
{
    for (size_t position = 0; (position = findWord(text, word, position)) != std::string::npos;)
        text.replace(position, word.size(), replacement);
}

std::string listExtensions(const Device& device)
{
    const std::pair<bool, const char*> offers[] = {
        {device.hasNpotTextures, "GL_OES_texture_npot"},
        {device.hasEtc1, "GL_OES_compressed_ETC1_RGB8_texture"},
        {device.hasPackedDepthStencil, "GL_OES_packed_depth_stencil"},
        {device.hasDepthTextures, "GL_OES_depth_texture"},
        {device.hasProgramBinaries, "GL_OES_get_program_binary"}};
    std::istringstream words(reinterpret_cast<const char*>(real(glGetString)(GL_EXTENSIONS)));
    std::string list;
    for (std::string word; words >> word;)
    {
        const bool isMissing = std::any_of(
            std::begin(offers),
            std::end(offers), // GL_OES_depth_texture_cube_map requires GL_OES_depth_texture
            [&word](const auto& offer) { return !offer.first && word.rfind(offer.second, 0) == 0; });
        if (!isMissing)
            list += (list.empty() ? "" : " ") + word;
    }
    return list;
}

void answerInteger(GLenum name, GLint* value)
{
    const Device& device = g_emulation.device;
    real(glGetIntegerv)(name, value);
    const auto limit = [value](int most) { *value = most > 0 ? std::min(*value, most) : *value; };
    switch (name)
    {
    case GL_MAX_VERTEX_UNIFORM_VECTORS: return limit(device.vertexUniformVectors);
    case GL_MAX_TEXTURE_IMAGE_UNITS:
    case GL_MAX_COMBINED_TEXTURE_IMAGE_UNITS: return limit(device.textureUnits);
    case GL_MAX_VERTEX_TEXTURE_IMAGE_UNITS: *value = device.textureUnits > 0 ? 0 : *value; return;
    case GL_NUM_PROGRAM_BINARY_FORMATS_OES: *value = device.hasProgramBinaries ? *value : 0; return;
    default: return;
    }
}

// --- Shaders -----------------------------------------------------------------------------------------------

/// A stage's uniforms in rows of four components.
class UniformPacker
{
public:
    /// @return false if there is no room left below the limit.
    bool add(int rows, int columns, int limit)
    {
        for (int top = 0; top + rows <= limit; ++top)
        {
            for (const int left : {0, 2, 1, 3})
            {
                if (left + columns > 4 || (columns > 1 && left % 2 != 0) || !isFree(top, left, rows, columns))
                    continue;
                m_rows.resize(std::max(m_rows.size(), size_t(top + rows)));
                for (int row = top; row < top + rows; ++row)
                    std::fill_n(m_rows[size_t(row)].begin() + left, columns, true);
                return true;
            }
        }
        return false;
    }

private:
    bool isFree(int top, int left, int rows, int columns) const
    {
        for (size_t row = size_t(top); row < std::min(m_rows.size(), size_t(top + rows)); ++row)
        {
            const auto begin = m_rows[row].begin() + left;
            if (std::find(begin, begin + columns, true) != begin + columns)
                return false;
        }
        return true;
    }

    std::vector<std::array<bool, 4>> m_rows;
};

struct UniformShape
{
    GLenum type;
    int rows, columns;
};

/// In packing order. Other types are scalars or samplers.
constexpr UniformShape UNIFORM_SHAPES[] = {
    {GL_FLOAT_MAT4, 4, 4}, {GL_FLOAT_MAT2, 2, 4}, {GL_FLOAT_VEC4, 1, 4}, {GL_INT_VEC4, 1, 4},
    {GL_BOOL_VEC4, 1, 4},  {GL_FLOAT_MAT3, 3, 3}, {GL_FLOAT_VEC3, 1, 3}, {GL_INT_VEC3, 1, 3},
    {GL_BOOL_VEC3, 1, 3},  {GL_FLOAT_VEC2, 1, 2}, {GL_INT_VEC2, 1, 2},   {GL_BOOL_VEC2, 1, 2},
    {GL_FLOAT, 1, 1},      {GL_INT, 1, 1},        {GL_BOOL, 1, 1}};

struct Uniform
{
    std::string name; ///< without "[0]"
    GLenum type;
    int size;
};

std::vector<Uniform> listUniforms(GLuint program)
{
    GLint count = 0;
    real(glGetProgramiv)(program, GL_ACTIVE_UNIFORMS, &count);
    std::vector<Uniform> uniforms;
    for (GLint i = 0; i < count; ++i)
    {
        char name[256] = "";
        Uniform uniform = {};
        real(glGetActiveUniform)(program, GLuint(i), sizeof name, nullptr, &uniform.size, &uniform.type,
                                 name);
        uniform.name = std::string(name, std::strcspn(name, "["));
        uniforms.push_back(uniform);
    }
    return uniforms;
}

std::string findVertexSource(GLuint program)
{
    GLuint shaders[2] = {};
    GLsizei count = 0;
    real(glGetAttachedShaders)(program, 2, &count, shaders);
    for (GLsizei i = 0; i < count; ++i)
    {
        GLint kind = 0;
        GLint length = 0;
        real(glGetShaderiv)(shaders[i], GL_SHADER_TYPE, &kind);
        real(glGetShaderiv)(shaders[i], GL_SHADER_SOURCE_LENGTH, &length);
        if (kind != GL_VERTEX_SHADER || length <= 0)
            continue;
        std::string source(size_t(length), '\0');
        real(glGetShaderSource)(shaders[i], length, nullptr, source.data());
        return source;
    }
    return "";
}

/// Why the device refuses to link a program that the driver has linked; "" if it does not.
std::string findRefusal(GLuint program)
{
    const Device& device = g_emulation.device;
    const std::string vertexSource = findVertexSource(program);
    std::vector<Uniform> uniforms = listUniforms(program);
    std::stable_sort(uniforms.begin(), uniforms.end(),
                     [](const Uniform& a, const Uniform& b) { return a.size > b.size; });
    int samplers = 0;
    for (const Uniform& uniform : uniforms)
    {
        if (uniform.type == GL_SAMPLER_2D || uniform.type == GL_SAMPLER_CUBE)
            samplers += uniform.size;
    }
    if (device.textureUnits > 0 && samplers > device.textureUnits)
        return "too many samplers";

    UniformPacker packer;
    for (const UniformShape& shape : UNIFORM_SHAPES)
    {
        for (const Uniform& uniform : uniforms)
        {
            if (device.vertexUniformVectors > 0 && uniform.type == shape.type &&
                findWord(vertexSource, uniform.name) != std::string::npos &&
                !packer.add(shape.rows * uniform.size, shape.columns, device.vertexUniformVectors))
                return "too many vertex uniform vectors: no room for " + uniform.name;
        }
    }
    return "";
}

void linkProgram(GLuint program)
{
    real(glLinkProgram)(program);
    g_emulation.refusedPrograms.erase(program);
    const std::string refusal = findRefusal(program);
    if (!refusal.empty())
        g_emulation.refusedPrograms[program] = refusal;
}

void answerProgram(GLuint program, GLenum name, GLint* value)
{
    real(glGetProgramiv)(program, name, value);
    if (name == GL_PROGRAM_BINARY_LENGTH_OES && !g_emulation.device.hasProgramBinaries)
        *value = 0;
    const auto refused = g_emulation.refusedPrograms.find(program);
    if (refused == g_emulation.refusedPrograms.end())
        return;
    if (name == GL_INFO_LOG_LENGTH)
        *value = GLint(refused->second.size()) + 1;
    else if (name == GL_LINK_STATUS || name == GL_VALIDATE_STATUS || name == GL_ACTIVE_UNIFORMS ||
             name == GL_ACTIVE_ATTRIBUTES)
        *value = 0;
}

void giveProgramLog(GLuint program, GLsizei size, GLsizei* length, GLchar* text)
{
    const auto refused = g_emulation.refusedPrograms.find(program);
    if (refused == g_emulation.refusedPrograms.end())
        return real(glGetProgramInfoLog)(program, size, length, text);
    const GLsizei written = std::clamp(GLsizei(refused->second.size()), 0, std::max(size - 1, 0));
    std::copy_n(refused->second.c_str(), written, text);
    if (size > 0)
        text[written] = '\0';
    if (length)
        *length = written;
}

void useProgram(GLuint program)
{
    if (g_emulation.refusedPrograms.count(program) == 0)
        real(glUseProgram)(program);
    else
        queueError(GL_INVALID_OPERATION);
}

/// Without highp, its macro is undefined in both stages, and in fragment shaders the word is a syntax error.
void takeSource(GLuint shader, GLsizei count, const GLchar* const* strings, const GLint* lengths)
{
    GLint kind = 0;
    real(glGetShaderiv)(shader, GL_SHADER_TYPE, &kind);
    std::string source;
    for (GLsizei i = 0; i < count; ++i)
        source += lengths && lengths[i] >= 0 ? std::string(strings[i], size_t(lengths[i])) : strings[i];
    replaceWord(source, "GL_FRAGMENT_PRECISION_HIGH", "NO_FRAGMENT_PRECISION_HIGH");
    if (kind == GL_FRAGMENT_SHADER)
        replaceWord(source, "highp", "highp_is_not_supported");
    const GLchar* text = source.c_str();
    real(glShaderSource)(shader, 1, &text, nullptr);
}

void answerPrecision(GLenum shader, GLenum kind, GLint* range, GLint* precision)
{
    real(glGetShaderPrecisionFormat)(shader, kind, range, precision);
    if (shader == GL_FRAGMENT_SHADER && (kind == GL_HIGH_FLOAT || kind == GL_HIGH_INT))
        range[0] = range[1] = *precision = 0;
}

// --- Textures ----------------------------------------------------------------------------------------------

GLuint getBoundTexture(GLenum target)
{
    GLint name = 0;
    real(glGetIntegerv)(target == GL_TEXTURE_2D ? GL_TEXTURE_BINDING_2D : GL_TEXTURE_BINDING_CUBE_MAP, &name);
    return GLuint(name);
}

bool isPowerOfTwo(GLsizei size)
{
    return (size & (size - 1)) == 0;
}

bool isNpot(GLuint texture)
{
    const auto found = g_emulation.textures.find(texture);
    return found != g_emulation.textures.end() &&
           !(isPowerOfTwo(found->second.width) && isPowerOfTwo(found->second.height));
}

/// Notes the size of level 0 and raises the error of a texture that the device does not support.
/// @return whether to make the call.
bool takeImage(GLenum target, GLint level, GLenum format, GLsizei width, GLsizei height)
{
    const Device& device = g_emulation.device;
    const bool isDepth = format == GL_DEPTH_COMPONENT || format == GL_DEPTH_STENCIL_OES;
    const bool isMissing = (isDepth && !device.hasDepthTextures) ||
                           (format == GL_DEPTH_STENCIL_OES && !device.hasPackedDepthStencil) ||
                           (format == GL_ETC1_RGB8_OES && !device.hasEtc1);
    if (isMissing)
        queueError(GL_INVALID_ENUM);
    else if (level > 0 && !device.hasNpotTextures && !(isPowerOfTwo(width) && isPowerOfTwo(height)))
        queueError(GL_INVALID_VALUE);
    else
    {
        if (level == 0)
            g_emulation.textures[getBoundTexture(target)] = {width, height};
        return true;
    }
    return false;
}

/// Whether a texture is incomplete, and so black, on a device without NPOT textures.
bool isIncomplete(GLenum target)
{
    GLint filter = 0;
    GLint wraps[2] = {};
    real(glGetTexParameteriv)(target, GL_TEXTURE_MIN_FILTER, &filter);
    real(glGetTexParameteriv)(target, GL_TEXTURE_WRAP_S, &wraps[0]);
    real(glGetTexParameteriv)(target, GL_TEXTURE_WRAP_T, &wraps[1]);
    const bool isPlain = (filter == GL_NEAREST || filter == GL_LINEAR) && wraps[0] == GL_CLAMP_TO_EDGE &&
                         wraps[1] == GL_CLAMP_TO_EDGE;
    return !isPlain && isNpot(getBoundTexture(target));
}

/// Bound; opaque black, as an incomplete texture reads.
void bindBlack(GLenum target)
{
    GLuint& name = g_emulation.blackTextures[target == GL_TEXTURE_2D ? 0 : 1];
    const bool isNew = name == 0;
    if (isNew)
        real(glGenTextures)(1, &name);
    real(glBindTexture)(target, name);
    if (!isNew)
        return;
    const uint8_t black[4] = {0, 0, 0, 255};
    const bool isCube = target == GL_TEXTURE_CUBE_MAP;
    for (GLenum face = 0; face < (isCube ? 6u : 1u); ++face)
        real(glTexImage2D)(isCube ? GL_TEXTURE_CUBE_MAP_POSITIVE_X + face : target, 0, GL_RGBA, 1, 1, 0,
                           GL_RGBA, GL_UNSIGNED_BYTE, black);
    real(glTexParameteri)(target, GL_TEXTURE_MIN_FILTER, GL_NEAREST);
}

/// Draws with black instead of every incomplete texture.
template <class Draw>
void drawWithoutIncomplete(const Draw& draw)
{
    struct Hidden
    {
        GLenum unit, target;
        GLuint texture;
    };
    std::vector<Hidden> hidden;
    GLint active = 0;
    GLint units = 0;
    real(glGetIntegerv)(GL_ACTIVE_TEXTURE, &active);
    real(glGetIntegerv)(GL_MAX_COMBINED_TEXTURE_IMAGE_UNITS, &units);
    for (GLenum unit = GL_TEXTURE0; unit < GLenum(GL_TEXTURE0 + units); ++unit)
    {
        real(glActiveTexture)(unit);
        for (const GLenum target : {GL_TEXTURE_2D, GL_TEXTURE_CUBE_MAP})
        {
            if (!isIncomplete(target))
                continue;
            hidden.push_back({unit, target, getBoundTexture(target)});
            bindBlack(target);
        }
    }
    draw();
    for (const Hidden& entry : hidden)
    {
        real(glActiveTexture)(entry.unit);
        real(glBindTexture)(entry.target, entry.texture);
    }
    real(glActiveTexture)(GLenum(active));
}

void emulateTextures()
{
    replace(glTexImage2D,
            [](GLenum target, GLint level, GLint internalFormat, GLsizei width, GLsizei height, GLint border,
               GLenum format, GLenum type, const void* pixels)
            {
                if (takeImage(target, level, format, width, height))
                    real(glTexImage2D)(target, level, internalFormat, width, height, border, format, type,
                                       pixels);
            });
    replace(glCompressedTexImage2D,
            [](GLenum target, GLint level, GLenum format, GLsizei width, GLsizei height, GLint border,
               GLsizei size, const void* data)
            {
                if (takeImage(target, level, format, width, height))
                    real(glCompressedTexImage2D)(target, level, format, width, height, border, size, data);
            });
    replace(glCopyTexImage2D,
            [](GLenum target, GLint level, GLenum format, GLint x, GLint y, GLsizei width, GLsizei height,
               GLint border)
            {
                if (takeImage(target, level, format, width, height))
                    real(glCopyTexImage2D)(target, level, format, x, y, width, height, border);
            });
    replace(glDeleteTextures,
            [](GLsizei count, const GLuint* names)
            {
                for (GLsizei i = 0; i < count; ++i)
                    g_emulation.textures.erase(names[i]);
                real(glDeleteTextures)(count, names);
            });
    if (g_emulation.device.hasNpotTextures)
        return;
    replace(glGenerateMipmap,
            [](GLenum target) {
                isNpot(getBoundTexture(target)) ? queueError(GL_INVALID_OPERATION)
                                                : real(glGenerateMipmap)(target);
            });
    replace(glDrawArrays, [](GLenum mode, GLint first, GLsizei count)
            { drawWithoutIncomplete([&] { real(glDrawArrays)(mode, first, count); }); });
    replace(glDrawElements, [](GLenum mode, GLsizei count, GLenum type, const void* indices)
            { drawWithoutIncomplete([&] { real(glDrawElements)(mode, count, type, indices); }); });
}

} // namespace

void emulate(const Device& device)
{
    g_emulation = Emulation();
    g_emulation.device = device;
    setExtensions(listExtensions(device));
    replace(glGetIntegerv, answerInteger);
    replace(glLinkProgram, linkProgram);
    replace(glGetProgramiv, answerProgram);
    replace(glGetProgramInfoLog, giveProgramLog);
    replace(glUseProgram, useProgram);
    emulateTextures();
    if (!device.hasFragmentHighp)
    {
        replace(glShaderSource, takeSource);
        replace(glGetShaderPrecisionFormat, answerPrecision);
    }
    if (device.textureUnits > 0)
        replace(glActiveTexture, [units = GLenum(device.textureUnits)](GLenum unit)
                { unit - GL_TEXTURE0 < units ? real(glActiveTexture)(unit) : queueError(GL_INVALID_ENUM); });
    if (!device.hasPackedDepthStencil)
        replace(glRenderbufferStorage,
                [](GLenum target, GLenum format, GLsizei width, GLsizei height)
                {
                    format == GL_DEPTH24_STENCIL8_OES
                        ? queueError(GL_INVALID_ENUM)
                        : real(glRenderbufferStorage)(target, format, width, height);
                });
}

} // namespace glcalls
