#include "orv/detail/resource.h"

#include "countedgl.h"

#include "orv/detail/bindingepoch.h"

namespace orv::detail
{

Resource::~Resource() = default;

GlResource::GlResource(unsigned int name) : m_state(ALLOCATED), m_name(name) {}

GlResource::~GlResource()
{
    ORV_ASSERT(m_state != Resource::ALLOCATED);
}

bool GlResource::allocate()
{
    if (m_state != UNALLOCATED)
    {
        ORV_LOG_ERROR("Cannot allocate resource more than once");
        return false;
    }
    m_name = doAllocate();
    bindingsChanged(); // a texture has a name from now on
    m_state = m_name != 0 ? ALLOCATED : RELEASED;
    return m_state == ALLOCATED;
}

bool GlResource::deallocate()
{
    if (m_state == UNALLOCATED)
        m_state = RELEASED;
    if (m_state != ALLOCATED)
        return false;
    doDeallocate(m_name);
    bindingsChanged(); // GL unbinds deleted objects, and may reuse the name
    m_name = 0;
    m_state = DEALLOCATED;
    return true;
}

bool GlResource::release()
{
    if (m_state == DEALLOCATED)
        return false;
    bindingsChanged();
    m_name = 0;
    m_state = RELEASED;
    return true;
}

BufferResource::~BufferResource() = default;

unsigned int BufferResource::doAllocate()
{
    GLuint name = 0;
    glGenBuffers(1, &name);
    if (name == 0)
        ORV_LOG_ERROR("Failed to create OpenGL buffer");
    return name;
}

void BufferResource::doDeallocate(unsigned int name)
{
    glDeleteBuffers(1, &name);
}

ProgramResource::~ProgramResource() = default;

unsigned int ProgramResource::doAllocate()
{
    const GLuint name = glCreateProgram();
    if (name == 0)
        ORV_LOG_ERROR("Failed to create OpenGL program");
    return name;
}

void ProgramResource::doDeallocate(unsigned int name)
{
    glDeleteProgram(name);
}

ShaderResource::~ShaderResource() = default;

unsigned int ShaderResource::getGlShaderType() const
{
    switch (m_kind)
    {
    case Kind::VERTEX: return GL_VERTEX_SHADER;
    case Kind::FRAGMENT: return GL_FRAGMENT_SHADER;
    }
    return GL_INVALID_ENUM;
}

unsigned int ShaderResource::doAllocate()
{
    const GLuint name = glCreateShader(getGlShaderType());
    if (name == 0)
        ORV_LOG_ERROR("Failed to create OpenGL shader");
    return name;
}

void ShaderResource::doDeallocate(unsigned int name)
{
    glDeleteShader(name);
}

TextureResource::~TextureResource() = default;

unsigned int TextureResource::doAllocate()
{
    GLuint name = 0;
    glGenTextures(1, &name);
    if (name == 0)
        ORV_LOG_ERROR("Failed to create OpenGL texture");
    return name;
}

void TextureResource::doDeallocate(unsigned int name)
{
    glDeleteTextures(1, &name);
}

ResourceCache::~ResourceCache()
{
    // Each resource that dies with its GL object asserts: one record, and the number of the others.
    int lost = 0;
    for (const SharedPtr<Resource>& resource : m_resources)
    {
        const bool isLost = resource->sharedGetCount() == 1 && resource->getState() == Resource::ALLOCATED;
        if (isLost && ++lost > 1)
            resource->release();
    }
    m_resources.clear();
    if (lost > 0)
        ORV_LOG_ERROR("OpenGL objects of one cache left behind: %d; flush() the pool before dropping it",
                      lost);
}

void ResourceCache::add(const SharedPtr<Resource>& resource)
{
    if (resource)
        m_resources.push_back(resource);
}

void ResourceCache::release()
{
    for (const SharedPtr<Resource>& resource : m_resources)
        resource->release();
    m_resources.clear();
}

void ResourceCache::flush()
{
    m_resources.remove_if(
        [](const SharedPtr<Resource>& resource)
        {
            const Resource::State state = resource->getState();
            if (state == Resource::DEALLOCATED || state == Resource::RELEASED)
                return true;
            if (resource->sharedGetCount() != 1)
                return false;
            resource->deallocate();
            return true;
        });
}

} // namespace orv::detail
