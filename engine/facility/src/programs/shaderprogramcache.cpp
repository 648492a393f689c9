#include "orv/shaderprogramcache.h"

#include "gl/countedgl.h"

#include "orv/detail/resource.h"
#include "orv/extensions.h"
#include "orv/renderdevice.h"

#include <vector>

namespace orv
{

namespace
{

using detail::ProgramResource;
using detail::ShaderResource;

void logShaderError(GLuint shader)
{
    GLint length = 0;
    glGetShaderiv(shader, GL_INFO_LOG_LENGTH, &length);
    if (length < 2)
        return;
    std::vector<GLchar> text(std::size_t(length) + 1);
    glGetShaderInfoLog(shader, length, nullptr, text.data());
    ORV_LOG_ERROR("Failed to compile shader:\n%s\n", text.data());
}

void logProgramError(GLuint program)
{
    GLint length = 0;
    glGetProgramiv(program, GL_INFO_LOG_LENGTH, &length);
    if (length < 2)
        return;
    std::vector<GLchar> text(std::size_t(length) + 1);
    glGetProgramInfoLog(program, length, nullptr, text.data());
    ORV_LOG_ERROR("Failed to link shader program:\n%s\n", text.data());
}

SharedPtr<ProgramResource> makeProgram(detail::ResourceCache& resources)
{
    SharedPtr<ProgramResource> program = makeShared<ProgramResource>();
    if (program)
    {
        resources.add(program);
        if (program->allocate())
            return program;
    }
    ORV_LOG_ERROR("Failed to allocate program resource");
    return {};
}

SharedPtr<ShaderResource> makeShader(detail::ResourceCache& resources, ShaderResource::Kind kind,
                                     const char* source)
{
    SharedPtr<ShaderResource> shader = makeShared<ShaderResource>(kind);
    if (shader)
        resources.add(shader);
    if (!shader || !shader->allocate())
    {
        ORV_LOG_ERROR("Failed to allocate %s shader resource",
                      kind == ShaderResource::Kind::VERTEX ? "vertex" : "fragment");
        return {};
    }

    GLint compiled = GL_FALSE;
    glShaderSource(shader->getId(), 1, &source, nullptr);
    glCompileShader(shader->getId());
    glGetShaderiv(shader->getId(), GL_COMPILE_STATUS, &compiled);
    if (compiled)
        return shader;
    logShaderError(shader->getId());
    shader->deallocate();
    return {};
}

bool isLinked(GLuint program)
{
    GLint linked = GL_FALSE;
    glGetProgramiv(program, GL_LINK_STATUS, &linked);
    return linked;
}

/// @return false, after a message, if linking fails.
bool link(const ProgramResource& program, const ShaderResource& vertex, const ShaderResource& fragment)
{
    glAttachShader(program.getId(), vertex.getId());
    glAttachShader(program.getId(), fragment.getId());
    glLinkProgram(program.getId());
    if (isLinked(program.getId()))
        return true;
    logProgramError(program.getId());
    return false;
}

} // namespace

ShaderProgramCache::ShaderProgramCache()
{
    if (GL_OES_get_program_binary_supported())
        ORV_LOG_INFO("Shader program binaries are supported.");
    else
        ORV_LOG_INFO("Shader program binaries are not supported.");
}

SharedPtr<ShaderProgram> ShaderProgramCache::create(const char* vertexSource, const char* fragmentSource,
                                                    const char* name)
{
    if (!vertexSource || !fragmentSource)
    {
        ORV_LOG_ERROR("ShaderProgram source code cannot be empty");
        return {};
    }

    detail::ResourceCache& resources = *getResourceCache();
    const SharedPtr<ProgramResource> program = makeProgram(resources);
    if (!program)
        return {};
    const SharedPtr<ShaderResource> vertex =
        makeShader(resources, ShaderResource::Kind::VERTEX, vertexSource);
    SharedPtr<ShaderResource> fragment;
    if (vertex)
        fragment = makeShader(resources, ShaderResource::Kind::FRAGMENT, fragmentSource);
    if (!fragment || !link(*program, *vertex, *fragment))
    {
        // Delete at once what belongs to a failed program; shaders of a linked one wait for the next flush().
        program->deallocate();
        if (vertex)
            vertex->deallocate();
        if (fragment)
            fragment->deallocate();
        return {};
    }

    SharedPtr<ShaderProgram> shaderProgram = makeShared<ShaderProgram>(program);
    if (shaderProgram)
        add(shaderProgram, name);
    return shaderProgram;
}

SharedPtr<ShaderProgram> ShaderProgramCache::create(unsigned int length, unsigned int format,
                                                    const char* binary, const char* name)
{
    if (!getShaderProgramBinariesSupported())
    {
        ORV_LOG_ERROR("Shader program binaries are not supported; please check support using "
                      "getShaderProgramBinariesSupported()");
        return {};
    }

    const SharedPtr<ProgramResource> program = makeProgram(*getResourceCache());
    if (!program)
        return {};
    if (const ProgramBinaryFunction programBinary = get_glProgramBinaryOES())
        programBinary(program->getId(), format, binary, int(length));
    if (!isLinked(program->getId()))
    {
        RenderDevice::getError(false); // clears the driver's error, which this message reports
        ORV_LOG_ERROR("ShaderProgram binary load failed");
        program->deallocate();
        return {};
    }

    SharedPtr<ShaderProgram> shaderProgram = makeShared<ShaderProgram>(program);
    if (shaderProgram)
        add(shaderProgram, name);
    return shaderProgram;
}

bool getShaderProgramBinariesSupported()
{
    return GL_OES_get_program_binary_supported();
}

} // namespace orv
