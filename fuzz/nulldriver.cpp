#include "nulldriver.h"

#include "glcalls/glcalls.h"

#include <GLES2/gl2ext.h>

#include <cstdio>
#include <cstring>
#include <set>

namespace nulldriver
{

namespace
{

struct Variable
{
    const char* name;
    GLenum type;
};

constexpr Variable UNIFORMS[] = {
    {"u_float", GL_FLOAT}, {"u_texture", GL_SAMPLER_2D}, {"u_cube", GL_SAMPLER_CUBE}};
constexpr GLint NAME_SIZE = 16;

GLuint g_lastName = 0;
std::set<GLuint> g_failed; ///< shaders that do not compile, programs whose binary was not taken

void makeNames(GLsizei count, GLuint* names)
{
    for (GLsizei i = 0; i < count; ++i)
        names[i] = ++g_lastName;
}

void setFailed(GLuint name, bool failed)
{
    if (failed)
        g_failed.insert(name);
    else
        g_failed.erase(name);
}

Given g_given;

size_t countPixelBytes(GLsizei width, GLsizei height, GLenum format, GLenum type)
{
    const size_t channels = format == GL_RGBA              ? 4
                            : format == GL_RGB             ? 3
                            : format == GL_LUMINANCE_ALPHA ? 2
                                                           : 1;
    return size_t(width) * size_t(height) * (type == GL_UNSIGNED_BYTE ? channels : 2);
}

void countGiven()
{
    glcalls::replace(glTexImage2D, [](GLenum, GLint, GLint, GLsizei width, GLsizei height, GLint,
                                      GLenum format, GLenum type, const void* pixels)
                     { g_given.pixels += pixels ? countPixelBytes(width, height, format, type) : 0; });
    glcalls::replace(glCompressedTexImage2D, [](GLenum, GLint, GLenum, GLsizei, GLsizei, GLint, GLsizei size,
                                                const void*) { g_given.pixels += size_t(size); });
    glcalls::replace(glBufferData,
                     [](GLenum, GLsizeiptr size, const void*, GLenum) { g_given.vertices += size_t(size); });
    glcalls::replace(glShaderSource,
                     [](GLuint shader, GLsizei, const GLchar* const* text, const GLint*)
                     {
                         g_given.sources += std::strlen(*text);
                         setFailed(shader, std::strstr(*text, "#error"));
                     });
}

void giveVariable(const Variable& variable, GLsizei size, GLint* count, GLenum* type, GLchar* name)
{
    std::snprintf(name, size_t(size), "%s", variable.name);
    *count = 1;
    *type = variable.type;
}

void GL_APIENTRY takeBinary(GLuint program, GLenum format, const void* binary, GLint length)
{
    constexpr char START[] = "binary";
    constexpr GLint SIZE = sizeof(START) - 1;
    setFailed(program, format != 1 || length < SIZE || std::memcmp(binary, START, SIZE) != 0);
}

} // namespace

void install()
{
    g_failed.clear();
    g_given = {};
    glcalls::replace(glGenBuffers, makeNames);
    glcalls::replace(glGenTextures, makeNames);
    glcalls::replace(glGenFramebuffers, makeNames);
    glcalls::replace(glGenRenderbuffers, makeNames);
    glcalls::replace(glCreateProgram, [] { return ++g_lastName; });
    glcalls::replace(glCreateShader, [](GLenum) { return ++g_lastName; });
    glcalls::replace(glGetError, [] { return GLenum(GL_NO_ERROR); });
    glcalls::replace(glCheckFramebufferStatus, [](GLenum) { return GLenum(GL_FRAMEBUFFER_COMPLETE); });
    glcalls::setExtensions("GL_OES_get_program_binary GL_OES_packed_depth_stencil GL_OES_depth_texture");
    glcalls::setProcAddress("glProgramBinaryOES", reinterpret_cast<void (*)()>(&takeBinary));

    countGiven();
    glcalls::replace(glGetShaderiv, [](GLuint shader, GLenum name, GLint* value)
                     { *value = name == GL_COMPILE_STATUS && !g_failed.count(shader); });
    glcalls::replace(glGetProgramiv,
                     [](GLuint program, GLenum name, GLint* value)
                     {
                         switch (name)
                         {
                         case GL_LINK_STATUS: *value = !g_failed.count(program); break;
                         case GL_ACTIVE_UNIFORMS: *value = std::size(UNIFORMS); break;
                         case GL_ACTIVE_UNIFORM_MAX_LENGTH: *value = NAME_SIZE; break;
                         case GL_ACTIVE_ATTRIBUTES: *value = 1; break;
                         default: *value = 0;
                         }
                     });
    glcalls::replace(glGetActiveUniform,
                     [](GLuint, GLuint index, GLsizei size, GLsizei*, GLint* count, GLenum* type,
                        GLchar* name) { giveVariable(UNIFORMS[index], size, count, type, name); });
    glcalls::replace(glGetActiveAttrib,
                     [](GLuint, GLuint, GLsizei size, GLsizei*, GLint* count, GLenum* type, GLchar* name) {
                         giveVariable({"a_position", GL_FLOAT_VEC3}, size, count, type, name);
                     });
    glcalls::replace(glGetUniformLocation, [](GLuint, const GLchar*) { return GLint(0); });
    glcalls::replace(glGetAttribLocation, [](GLuint, const GLchar*) { return GLint(0); });
    glcalls::replace(glGetIntegerv,
                     [](GLenum name, GLint* value)
                     {
                         switch (name)
                         {
                         case GL_MAX_TEXTURE_SIZE: *value = 4096; break;
                         case GL_MAX_TEXTURE_IMAGE_UNITS:
                         case GL_MAX_COMBINED_TEXTURE_IMAGE_UNITS: *value = 8; break;
                         case GL_VIEWPORT: value[0] = value[1] = 0, value[2] = value[3] = 64; break;
                         default: *value = 0;
                         }
                     });
}

Given& given()
{
    return g_given;
}

} // namespace nulldriver
