#include "orv/shaderprogram.h"

#include "gl/countedgl.h"
#include "shaderprogramdraw.h"
#include "shaderuniformprivate.h"

#include "orv/detail/bindingepoch.h"
#include "orv/detail/boundsrevision.h"
#include "orv/detail/resource.h"
#include "orv/extensions.h"
#include "orv/rendercontext.h"
#include "orv/shaderprogramcache.h"
#include "orv/texture2d.h"
#include "orv/texturecube.h"
#include "orv/vertexbuffer.h"

#include <GLES2/gl2ext.h>

#include <algorithm>
#include <cstring>
#include <memory>
#include <new>

namespace orv
{

namespace
{

const GLfloat MISSING_ATTRIB[4] = {1.0f, 1.0f, 1.0f, 1.0f};

template <class T>
SharedPtr<ShaderUniformBase> makeHolder(int size)
{
    return makeShared<ShaderUniform<T>>(size);
}

/// How a GL uniform type is held. Samplers have a target instead of a holder, which would keep the texture alive.
struct UniformType
{
    GLenum glType;
    SharedPtr<ShaderUniformBase> (*makeHolder)(int size);
    GLenum textureTarget;
};

constexpr UniformType UNIFORM_TYPES[] = {
    {GL_FLOAT, makeHolder<float>, 0},
    {GL_FLOAT_VEC2, makeHolder<Vector2<float>>, 0},
    {GL_FLOAT_VEC3, makeHolder<Vector3<float>>, 0},
    {GL_FLOAT_VEC4, makeHolder<Vector4<float>>, 0},
    {GL_INT, makeHolder<int>, 0},
    {GL_INT_VEC2, makeHolder<Vector2<int>>, 0},
    {GL_INT_VEC3, makeHolder<Vector3<int>>, 0},
    {GL_INT_VEC4, makeHolder<Vector4<int>>, 0},
    {GL_BOOL, makeHolder<bool>, 0},
    {GL_BOOL_VEC2, makeHolder<Vector2<bool>>, 0},
    {GL_BOOL_VEC3, makeHolder<Vector3<bool>>, 0},
    {GL_BOOL_VEC4, makeHolder<Vector4<bool>>, 0},
    {GL_FLOAT_MAT2, makeHolder<Matrix2<float>>, 0},
    {GL_FLOAT_MAT3, makeHolder<Matrix3<float>>, 0},
    {GL_FLOAT_MAT4, makeHolder<Matrix4<float>>, 0},
    {GL_SAMPLER_2D, nullptr, GL_TEXTURE_2D},
    {GL_SAMPLER_CUBE, nullptr, GL_TEXTURE_CUBE_MAP},
    {GL_SAMPLER_EXTERNAL_OES, nullptr, GL_TEXTURE_EXTERNAL_OES},
};

/// Whether a renderer can send the source's transform to the uniform without further checks.
bool takesTransform(const detail::DrawnUniform& uniform, const ShaderUniformBase& source,
                    const detail::UniformSources& sources)
{
    const detail::DrawTransform transform = source.getDrawTransform();
    if (transform == detail::DrawTransform::NONE || uniform.size > 1 || sources.transforms[int(transform)])
        return false;
    return transform == detail::DrawTransform::NORMAL_MODEL ? uniform.sent->holds<Matrix3f>()
                                                            : uniform.sent->holds<Matrix4f>();
}

} // namespace

ShaderProgram::ShaderProgram(const SharedPtr<detail::ProgramResource>& resource)
    : m_sourcesRevision(detail::nextRevision())
    , m_resource(resource)
    , m_handle(makeShared<detail::ProgramHandle>())
    , m_revision(detail::nextRevision())
{
    if (m_handle)
        m_handle->program = this;
    if (!getId())
        return;
    getUniforms();
    getAttributes();
}

ShaderProgram::~ShaderProgram()
{
    if (m_handle)
        m_handle->program = nullptr;
}

unsigned ShaderProgram::getId() const
{
    return m_resource ? m_resource->getId() : 0;
}

void ShaderProgram::getUniforms()
{
    const GLuint program = getId();
    GLint nameSize = 0;
    GLint count = 0;
    glGetProgramiv(program, GL_ACTIVE_UNIFORM_MAX_LENGTH, &nameSize);
    glGetProgramiv(program, GL_ACTIVE_UNIFORMS, &count);

    std::vector<GLchar> name(std::size_t(std::max(nameSize, 0)) + 1);
    int nextUnit = 0;
    for (GLint i = 0; i < count; ++i)
    {
        GLint size = 0;
        GLenum type = 0;
        glGetActiveUniform(program, GLuint(i), GLsizei(name.size()), nullptr, &size, &type, name.data());
        addUniform(name.data(), glGetUniformLocation(program, name.data()), size, type, nextUnit);
    }

    GLint maxUnits = 0;
    glGetIntegerv(GL_MAX_TEXTURE_IMAGE_UNITS, &maxUnits);
    const int lastUnit = nextUnit - 1;
    if (lastUnit > maxUnits)
        ORV_LOG_INFO("Max texture units (%d) exceeded by shader program (%d).", maxUnits, lastUnit);
    if (nextUnit > 0)
        setSamplerUnits();
}

void ShaderProgram::addUniform(const char* name, int location, int size, unsigned glType, int& nextUnit)
{
    const auto type = std::find_if(std::begin(UNIFORM_TYPES), std::end(UNIFORM_TYPES),
                                   [glType](const UniformType& entry) { return entry.glType == glType; });
    if (type == std::end(UNIFORM_TYPES))
    {
        ORV_LOG_ERROR("Unknown shader uniform type (%d)", int(glType));
        return;
    }
    if (glType == GL_SAMPLER_EXTERNAL_OES && !GL_OES_EGL_image_external_supported())
    {
        ORV_LOG_ERROR("Extension \"GL_OES_EGL_image_external\" not supported.");
        return;
    }

    Uniform uniform;
    uniform.location = location;
    uniform.size = size;
    if (type->makeHolder)
    {
        uniform.sent = type->makeHolder(size);
        if (!uniform.sent)
            return; // no memory
    }
    else
    {
        uniform.textureTarget = type->textureTarget;
        uniform.textureUnit = nextUnit;
        nextUnit += size;
    }
    m_uniforms.push_back(std::move(uniform));
    m_names.push_back({std::string(name, std::strcspn(name, "[")), std::string()});
}

void ShaderProgram::setSamplerUnits() const
{
    GLint previous = 0;
    glGetIntegerv(GL_CURRENT_PROGRAM, &previous);
    glUseProgram(getId());
    for (const Uniform& uniform : m_uniforms)
    {
        if (uniform.textureUnit >= 0)
            ShaderUniformPrivate::setSamplerUnits(uniform.location, uniform.textureUnit, uniform.size);
    }
    // A program deleted while in use does not exist any more.
    glUseProgram(glIsProgram(GLuint(previous)) ? GLuint(previous) : 0);
    detail::bindingsChanged();
}

void ShaderProgram::getAttributes()
{
    const GLuint program = getId();
    GLint count = 0;
    glGetProgramiv(program, GL_ACTIVE_ATTRIBUTES, &count);
    for (GLint i = 0; i < count; ++i)
    {
        GLchar name[32] = "";
        GLint size = 0;
        GLenum type = 0;
        glGetActiveAttrib(program, GLuint(i), GLsizei(sizeof(name)), nullptr, &size, &type, name);
        const GLint location = glGetAttribLocation(program, name);
        if (location >= 0)
            m_attribs.push_back({name, location});
    }
}

bool ShaderProgram::indexInRange(int index) const
{
    if (index >= 0 && index < getUniformCount())
        return true;
    ORV_LOG_ERROR("Uniform index (%d) out of range [0:%d).", index, getUniformCount());
    return false;
}

const char* ShaderProgram::getUniformInstanceName(int index) const
{
    return indexInRange(index) ? m_names[std::size_t(index)].instance.c_str() : nullptr;
}

const char* ShaderProgram::getUniformPropertyName(int index) const
{
    return indexInRange(index) ? m_names[std::size_t(index)].property.c_str() : nullptr;
}

void ShaderProgram::setUniformPropertyName(int index, const char* name)
{
    if (!indexInRange(index))
        return;
    m_names[std::size_t(index)].property = name ? name : "";
    m_uniforms[std::size_t(index)].linked.reset(); // it belonged to the old name
    m_linkedRevision = 0;
    m_sourcesRevision = detail::nextRevision();
    m_usesMirrorTexture = uniformExists("M_MIRROR_TEXTURE");
    m_usesJoints = uniformExists("J_WORLD");
    const bool usedModelTransform = m_usesModelTransform;
    m_usesModelTransform =
        uniformExists("T_MODEL_VIEW_PROJECTION") || uniformExists("T_MODEL_VIEW") || uniformExists("T_MODEL");
    if (usedModelTransform && !m_usesModelTransform)
        detail::boundsChanged();
}

void ShaderProgram::setUniformPropertyValue(int index, const SharedPtr<ShaderUniformBase>& value)
{
    if (!indexInRange(index))
        return;
    m_uniforms[std::size_t(index)].value = value;
    m_sourcesRevision = detail::nextRevision();
}

bool ShaderProgram::uniformExists(const char* propertyName) const
{
    return propertyName &&
           std::any_of(m_names.begin(), m_names.end(),
                       [propertyName](const UniformNames& names) { return names.property == propertyName; });
}

void ShaderProgram::linkAnew(RenderContext& context)
{
    for (std::size_t i = 0; i < m_uniforms.size(); ++i)
        context.linkUniform(m_uniforms[i].linked, m_names[i].property.c_str());
    m_linkedRevision = context.getPropertyRevision();
    m_sourcesRevision = detail::nextRevision();
}

namespace
{

void addUnits(const detail::DrawnUniform& sampler, const ShaderUniformBase* source,
              std::vector<detail::UniformSources::Unit>& units)
{
    for (int unit = sampler.textureUnit; unit < sampler.textureUnit + sampler.size; ++unit)
        units.push_back({source, unit, sampler.textureTarget,
                         detail::Bindings::getTextureSlot(unit, sampler.textureTarget), 0});
}

} // namespace

Vector4f* ShaderProgram::getSentVector(const Uniform& uniform, const ShaderUniformBase& source)
{
    const bool isPair = uniform.size == 1 && uniform.sent->holds<Vector4f>() && source.holds<Vector4f>();
    return isPair ? static_cast<ShaderUniform<Vector4f>&>(*uniform.sent.get()).values() : nullptr;
}

void ShaderProgram::resolve(const ShaderUniformBase* const* values, detail::UniformSources& sources)
{
    // One bit for each uniform; with more than 64, each is checked for every material.
    const bool isLarge = m_uniforms.size() > 64;
    std::vector<detail::UniformSources::Value> others;
    sources.values.clear();
    sources.units.clear();
    sources.readyRevision = 0;
    std::fill(std::begin(sources.transforms), std::end(sources.transforms), nullptr);
    sources.ownUniforms = 0;
    sources.readsTransforms = false;
    for (std::size_t i = 0; i < m_uniforms.size(); ++i)
    {
        Uniform& uniform = m_uniforms[i];
        const ShaderUniformBase* const own = values ? values[i] : nullptr;
        const ShaderUniformBase* const other = uniform.value ? uniform.value.get() : uniform.linked.get();
        const ShaderUniformBase* const source = own ? own : other;
        if (uniform.textureUnit >= 0)
            addUnits(uniform, source, sources.units);
        else if (source && takesTransform(uniform, *source, sources))
        {
            sources.transforms[int(source->getDrawTransform())] = &uniform;
            sources.transformSources[int(source->getDrawTransform())] = source;
        }
        else if (own || (source && isLarge))
        {
            sources.values.push_back({source, &uniform, getSentVector(uniform, *source)});
            sources.ownUniforms |= isLarge ? 0 : uint64_t(1) << i;
        }
        else if (source)
            others.push_back({source, &uniform, getSentVector(uniform, *source)});
    }
    sources.ownCount = sources.values.size();
    sources.values.insert(sources.values.end(), others.begin(), others.end());
    sources.readsTransforms =
        std::any_of(sources.values.begin(), sources.values.end(),
                    [](const detail::UniformSources::Value& value)
                    { return value.source->getDrawTransform() != detail::DrawTransform::NONE; });
    sources.revision = m_sourcesRevision;
}

void ShaderProgram::enableUniforms()
{
    for (Uniform& uniform : m_uniforms)
    {
        const SharedPtr<ShaderUniformBase>& source = uniform.value ? uniform.value : uniform.linked;
        if (uniform.textureUnit < 0)
        {
            uniform.sent->enable(source, uniform.location, uniform.textureUnit, false);
            uniform.sentRevision = 0; // makes the draw path compare again
            continue;
        }
        const GLuint texture = source ? detail::getTextureName(*source, uniform.textureTarget) : 0;
        for (int i = 0; i < uniform.size; ++i)
        {
            glActiveTexture(GLenum(GL_TEXTURE0 + uniform.textureUnit + i));
            glBindTexture(uniform.textureTarget, texture);
        }
        detail::bindingsChanged();
    }
}

void ShaderProgram::bind(VertexBuffer& buffer)
{
    if (!getId())
        return;

    for (const detail::ProgramAttrib& attrib : m_attribs)
    {
        if (buffer.enableAttrib(unsigned(attrib.location), attrib.name.c_str()))
            continue;
        glBindBuffer(GL_ARRAY_BUFFER, 0);
        glVertexAttrib4fv(GLuint(attrib.location), MISSING_ATTRIB);
    }
    const int count = int(m_attribs.size());
    for (int i = count; i < detail::g_boundAttribCount; ++i)
        glDisableVertexAttribArray(GLuint(i));
    detail::g_boundAttribCount = count;
    detail::bindingsChanged();
}

bool ShaderProgram::isValid() const
{
    const GLuint program = getId();
    if (!program)
        return false;

    GLint valid = GL_FALSE;
    glValidateProgram(program);
    glGetProgramiv(program, GL_VALIDATE_STATUS, &valid);
    if (valid)
        return true;

    GLint length = 0;
    glGetProgramiv(program, GL_INFO_LOG_LENGTH, &length);
    if (length >= 2)
    {
        std::vector<GLchar> text(std::size_t(length) + 1);
        glGetProgramInfoLog(program, length, nullptr, text.data());
        ORV_LOG_ERROR("Shader program is not in valid state:\n%s\n", text.data());
    }
    return false;
}

bool ShaderProgram::getBinary(unsigned int& length, unsigned int& format, char*& binary) const
{
    if (!getShaderProgramBinariesSupported())
    {
        ORV_LOG_ERROR("Shader program binaries are not supported; please check support using "
                      "getShaderProgramBinariesSupported()");
        return false;
    }
    const GetProgramBinaryFunction getProgramBinary = get_glGetProgramBinaryOES();
    const GLuint program = getId();
    if (!getProgramBinary || !program)
        return false;

    GLint size = 0;
    glGetProgramiv(program, GL_PROGRAM_BINARY_LENGTH_OES, &size);
    if (size <= 0)
        return false; // the driver has the extension but no format to write

    std::unique_ptr<char[]> block(new (std::nothrow) char[std::size_t(size)]);
    if (!block)
    {
        ORV_LOG_ERROR("Failed to allocate memory");
        return false;
    }
    int written = 0;
    unsigned int writtenFormat = 0;
    getProgramBinary(program, size, &written, &writtenFormat, block.get());
    if (written <= 0)
        return false;

    length = unsigned(written);
    format = writtenFormat;
    binary = block.release();
    return true;
}

ShaderProgram* ShaderProgram::getCurrent(const RenderContext& context)
{
    const detail::ProgramHandle* handle = context.getBindings().getCurrentProgram().get();
    ShaderProgram* program = handle ? handle->program : nullptr;
    const bool isCurrent =
        program && program->getId() && program->getId() == context.getBindings().getProgramInUse();
    return isCurrent ? program : nullptr;
}

} // namespace orv
