#include "glmodel.h"

#include "glcalls/glcalls.h"
#include "nulldriver.h"

#include <algorithm>
#include <array>
#include <cstdio>
#include <cstring>
#include <set>
#include <utility>

namespace glmodel
{

namespace
{

constexpr GLuint ATTRIB_COUNT = 8;
constexpr GLuint UNIT_COUNT = 8;
constexpr const char* INPUTS[] = {"a_position", "a_normal", "a_uv0"};
constexpr const char* UNIFORMS[] = {"u_float", "u_texture"};

struct Attrib
{
    bool enabled = false;
    GLuint buffer = 0;
    size_t offset = 0;
    size_t stride = 0;
    size_t size = 0; ///< bytes of one vertex
};

struct Program
{
    std::vector<GLuint> shaders;
    std::vector<const char*> inputs; ///< by location, once linked
    float value = 0;
    GLint unit = 0;
};

struct State
{
    std::array<GLuint, 4> lastNames = {}; ///< by kind, so that each begins with 1 as in a real driver
    std::map<GLuint, std::vector<uint8_t>> buffers;
    std::set<GLuint> textures;
    std::map<GLuint, std::string> shaders;
    std::map<GLuint, Program> programs;
    GLuint arrayBuffer = 0;
    GLuint indexBuffer = 0;
    GLuint program = 0;
    GLuint unit = 0;
    std::array<GLuint, UNIT_COUNT> units = {};
    std::array<Attrib, ATTRIB_COUNT> attribs;
};

State g_state;
std::vector<Draw> g_draws;
std::string g_fault;

void fail(const std::string& fault)
{
    if (g_fault.empty())
        g_fault = fault;
}

Program* currentProgram()
{
    const auto found = g_state.programs.find(g_state.program);
    return found == g_state.programs.end() ? nullptr : &found->second;
}

std::vector<uint8_t>* boundBuffer(GLenum target)
{
    const auto found =
        g_state.buffers.find(target == GL_ARRAY_BUFFER ? g_state.arrayBuffer : g_state.indexBuffer);
    return found == g_state.buffers.end() ? nullptr : &found->second;
}

// --- Names -------------------------------------------------------------------------------------------------

void makeBuffers(GLsizei count, GLuint* names)
{
    for (GLsizei i = 0; i < count; ++i)
        g_state.buffers[names[i] = ++g_state.lastNames[0]];
}

void makeTextures(GLsizei count, GLuint* names)
{
    for (GLsizei i = 0; i < count; ++i)
        g_state.textures.insert(names[i] = ++g_state.lastNames[1]);
}

/// Unbinds a deleted buffer.
void deleteBuffers(GLsizei count, const GLuint* names)
{
    for (const GLuint* name = names; name < names + count; ++name)
    {
        if (*name != 0 && g_state.buffers.erase(*name) == 0)
            fail("deleted buffer " + std::to_string(*name) + ", which is none of this context");
        for (GLuint* binding : {&g_state.arrayBuffer, &g_state.indexBuffer})
            *binding = *binding == *name ? 0 : *binding;
        for (Attrib& attrib : g_state.attribs)
            attrib.buffer = attrib.buffer == *name ? 0 : attrib.buffer;
    }
}

void deleteTextures(GLsizei count, const GLuint* names)
{
    for (const GLuint* name = names; name < names + count; ++name)
    {
        if (*name != 0 && g_state.textures.erase(*name) == 0)
            fail("deleted texture " + std::to_string(*name) + ", which is none of this context");
        std::replace(g_state.units.begin(), g_state.units.end(), *name, 0u);
    }
}

void deleteProgram(GLuint name)
{
    if (name != 0 && g_state.programs.erase(name) == 0)
        fail("deleted program " + std::to_string(name) + ", which is none of this context");
    g_state.program = g_state.program == name ? 0 : g_state.program; // earlier than real GL
}

// --- Programs ----------------------------------------------------------------------------------------------

void linkProgram(GLuint name)
{
    Program& program = g_state.programs[name];
    program.inputs.clear();
    for (const char* input : INPUTS)
    {
        if (std::any_of(program.shaders.begin(), program.shaders.end(),
                        [&](GLuint shader)
                        { return g_state.shaders[shader].find(input) != std::string::npos; }))
            program.inputs.push_back(input);
    }
}

void answerProgram(GLuint name, GLenum question, GLint* answer)
{
    switch (question)
    {
    case GL_LINK_STATUS:
    case GL_VALIDATE_STATUS: *answer = GL_TRUE; break;
    case GL_ACTIVE_UNIFORMS: *answer = GLint(std::size(UNIFORMS)); break;
    case GL_ACTIVE_ATTRIBUTES: *answer = GLint(g_state.programs[name].inputs.size()); break;
    case GL_ACTIVE_UNIFORM_MAX_LENGTH:
    case GL_ACTIVE_ATTRIBUTE_MAX_LENGTH: *answer = 16; break;
    default: *answer = 0;
    }
}

template <class Names>
GLint findName(const Names& names, const char* wanted)
{
    for (size_t i = 0; i < std::size(names); ++i)
    {
        if (std::strcmp(names[i], wanted) == 0)
            return GLint(i);
    }
    return -1;
}

void answerInteger(GLenum question, GLint* answer)
{
    switch (question)
    {
    case GL_MAX_TEXTURE_SIZE: *answer = 4096; break;
    case GL_MAX_TEXTURE_IMAGE_UNITS:
    case GL_MAX_COMBINED_TEXTURE_IMAGE_UNITS: *answer = UNIT_COUNT; break;
    case GL_MAX_VERTEX_ATTRIBS: *answer = ATTRIB_COUNT; break;
    case GL_CURRENT_PROGRAM: *answer = GLint(g_state.program); break;
    case GL_ARRAY_BUFFER_BINDING: *answer = GLint(g_state.arrayBuffer); break;
    case GL_ELEMENT_ARRAY_BUFFER_BINDING: *answer = GLint(g_state.indexBuffer); break;
    case GL_ACTIVE_TEXTURE: *answer = GLint(GL_TEXTURE0 + g_state.unit); break;
    case GL_TEXTURE_BINDING_2D: *answer = GLint(g_state.units[g_state.unit]); break;
    case GL_VIEWPORT: answer[0] = answer[1] = 0, answer[2] = answer[3] = 64; break;
    default: *answer = 0;
    }
}

// --- Drawing -----------------------------------------------------------------------------------------------

size_t sizeOf(GLenum type)
{
    return type == GL_BYTE || type == GL_UNSIGNED_BYTE     ? 1
           : type == GL_SHORT || type == GL_UNSIGNED_SHORT ? 2
                                                           : 4;
}

void pointAttrib(GLuint index, GLint size, GLenum type, GLboolean, GLsizei stride, const void* pointer)
{
    if (index >= ATTRIB_COUNT)
        return fail("attribute " + std::to_string(index));
    Attrib& attrib = g_state.attribs[index];
    attrib.buffer = g_state.arrayBuffer;
    attrib.offset = reinterpret_cast<size_t>(pointer);
    attrib.size = size_t(size) * sizeOf(type);
    attrib.stride = stride ? size_t(stride) : attrib.size;
}

/// Whether every array that is switched on holds this many vertices.
void checkArrays(size_t vertexCount)
{
    for (const Attrib& attrib : g_state.attribs)
    {
        const std::string name = std::to_string(&attrib - g_state.attribs.data());
        if (!attrib.enabled || vertexCount == 0)
            continue;
        const auto buffer = g_state.buffers.find(attrib.buffer);
        if (buffer == g_state.buffers.end())
            fail("array " + name + " is on and has no buffer");
        else if (attrib.offset + (vertexCount - 1) * attrib.stride + attrib.size > buffer->second.size())
            fail("array " + name + " is on and too short");
    }
}

void noteDraw(GLsizei count, size_t vertexCount)
{
    const Program* program = currentProgram();
    if (!program)
        return; // GL draws nothing
    checkArrays(vertexCount);
    const Attrib& position = g_state.attribs[0];
    const GLuint texture = g_state.units[size_t(program->unit) % UNIT_COUNT];
    if (!position.enabled)
        fail("draws without positions");
    g_draws.push_back(
        {g_state.program, g_state.indexBuffer, position.buffer, count, program->value, texture});
}

void drawElements(GLenum, GLsizei count, GLenum, const void* offset)
{
    const std::vector<uint8_t>* indices = boundBuffer(GL_ELEMENT_ARRAY_BUFFER);
    if (!indices)
        return fail("draws by indices from memory");
    const size_t first = reinterpret_cast<size_t>(offset);
    if (first + 2 * size_t(count) > indices->size())
        return fail("draws by more indices than there are");
    size_t last = 0;
    for (size_t i = first; i < first + 2 * size_t(count); i += 2)
        last = std::max<size_t>(last, (*indices)[i] | size_t((*indices)[i + 1]) << 8);
    noteDraw(count, last + 1);
}

void installNames()
{
    using namespace glcalls;
    replace(glGenBuffers, makeBuffers);
    replace(glGenTextures, makeTextures);
    replace(glDeleteBuffers, deleteBuffers);
    replace(glDeleteTextures, deleteTextures);
    replace(glCreateShader,
            [](GLenum)
            {
                g_state.shaders[++g_state.lastNames[2]];
                return g_state.lastNames[2];
            });
    replace(glCreateProgram,
            []
            {
                g_state.programs[++g_state.lastNames[3]];
                return g_state.lastNames[3];
            });
    replace(glDeleteShader, [](GLuint name) { g_state.shaders.erase(name); });
    replace(glDeleteProgram, deleteProgram);
    replace(glIsProgram, [](GLuint name) { return GLboolean(g_state.programs.count(name) != 0); });
    replace(glIsBuffer, [](GLuint name) { return GLboolean(g_state.buffers.count(name) != 0); });
    replace(glIsTexture, [](GLuint name) { return GLboolean(g_state.textures.count(name) != 0); });
}

void installPrograms()
{
    using namespace glcalls;
    replace(glShaderSource, [](GLuint shader, GLsizei count, const GLchar* const* texts, const GLint*)
            { g_state.shaders[shader] = count > 0 ? texts[count - 1] : ""; });
    replace(glGetShaderiv, [](GLuint, GLenum name, GLint* value) { *value = name == GL_COMPILE_STATUS; });
    replace(glAttachShader,
            [](GLuint program, GLuint shader) { g_state.programs[program].shaders.push_back(shader); });
    replace(glLinkProgram, linkProgram);
    replace(glGetProgramiv, answerProgram);
    replace(glGetActiveUniform,
            [](GLuint, GLuint i, GLsizei size, GLsizei*, GLint* count, GLenum* type, GLchar* name)
            {
                std::snprintf(name, size_t(size), "%s", UNIFORMS[i]);
                *count = 1;
                *type = i == 0 ? GL_FLOAT : GL_SAMPLER_2D;
            });
    replace(glGetActiveAttrib,
            [](GLuint program, GLuint i, GLsizei size, GLsizei*, GLint* count, GLenum* type, GLchar* name)
            {
                std::snprintf(name, size_t(size), "%s", g_state.programs[program].inputs[i]);
                *count = 1;
                *type = GL_FLOAT_VEC3;
            });
    replace(glGetUniformLocation, [](GLuint, const GLchar* name) { return findName(UNIFORMS, name); });
    replace(glGetAttribLocation, [](GLuint program, const GLchar* name)
            { return findName(g_state.programs[program].inputs, name); });
    replace(glUseProgram,
            [](GLuint name)
            {
                if (name != 0 && g_state.programs.count(name) == 0)
                    fail("used program " + std::to_string(name) + ", which is none of this context");
                g_state.program = name;
            });
    replace(glUniform1fv,
            [](GLint location, GLsizei, const GLfloat* values)
            {
                if (Program* program = location == 0 ? currentProgram() : nullptr)
                    program->value = *values;
            });
    replace(glUniform1iv,
            [](GLint location, GLsizei, const GLint* values)
            {
                if (Program* program = location == 1 ? currentProgram() : nullptr)
                    program->unit = *values;
            });
}

void installBindings()
{
    using namespace glcalls;
    replace(glGetIntegerv, answerInteger);
    replace(glBindBuffer,
            [](GLenum target, GLuint name)
            {
                if (name != 0 && g_state.buffers.count(name) == 0)
                    fail("bound buffer " + std::to_string(name) + ", which is none of this context");
                (target == GL_ARRAY_BUFFER ? g_state.arrayBuffer : g_state.indexBuffer) = name;
            });
    replace(glBufferData,
            [](GLenum target, GLsizeiptr size, const void* data, GLenum)
            {
                const uint8_t* bytes = static_cast<const uint8_t*>(data);
                if (std::vector<uint8_t>* buffer = boundBuffer(target))
                    *buffer = bytes ? std::vector<uint8_t>(bytes, bytes + size)
                                    : std::vector<uint8_t>(size_t(size));
                else
                    fail("filled no buffer");
            });
    replace(glActiveTexture, [](GLenum unit) { g_state.unit = (unit - GL_TEXTURE0) % UNIT_COUNT; });
    replace(glBindTexture,
            [](GLenum target, GLuint name)
            {
                if (name != 0 && g_state.textures.count(name) == 0)
                    fail("bound texture " + std::to_string(name) + ", which is none of this context");
                if (target == GL_TEXTURE_2D)
                    g_state.units[g_state.unit] = name;
            });
    replace(glEnableVertexAttribArray, [](GLuint i) { g_state.attribs[i % ATTRIB_COUNT].enabled = true; });
    replace(glDisableVertexAttribArray, [](GLuint i) { g_state.attribs[i % ATTRIB_COUNT].enabled = false; });
    replace(glVertexAttribPointer, pointAttrib);
    replace(glDrawElements, drawElements);
    replace(glDrawArrays,
            [](GLenum, GLint first, GLsizei count) { noteDraw(count, size_t(first) + size_t(count)); });
}

} // namespace

void install()
{
    nulldriver::install();
    g_state = State();
    g_draws.clear();
    g_fault.clear();
    installNames();
    installPrograms();
    installBindings();
}

void loseContext()
{
    g_state = State();
}

std::vector<Draw> takeDraws()
{
    return std::exchange(g_draws, {});
}

std::string takeFault()
{
    return std::exchange(g_fault, {});
}

size_t countLiveNames()
{
    return g_state.buffers.size() + g_state.textures.size() + g_state.shaders.size() +
           g_state.programs.size();
}

} // namespace glmodel
