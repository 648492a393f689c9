#include "orv/detail/contextproperties.h"

#include "orv/detail/revision.h"
#include "orv/log.h"
#include "orv/rendercontext.h"
#include "orv/shaderuniform.h"

#include <string_view>

namespace orv
{

namespace detail
{

ContextProperties::ContextProperties() : m_revision(nextRevision()) {}

ContextProperties::~ContextProperties() = default;

void ContextProperties::add(const SharedPtr<ShaderUniformBase>& property, const char* name)
{
    if (!property || !name)
    {
        ORV_LOG_ERROR("Property \"%s\" not added: %s.", name ? name : "",
                      name ? "there is no value" : "it has no name");
        return;
    }
    if (!m_holders.try_emplace(name, property).second)
    {
        ORV_LOG_ERROR("Property \"%s\" already exists in context.", name);
        return;
    }
    m_revision = nextRevision();
}

void ContextProperties::link(SharedPtr<ShaderUniformBase>& uniform, const char* name) const
{
    const auto found = name ? m_holders.find(std::string_view(name)) : m_holders.end();
    if (found != m_holders.end())
        uniform = found->second;
}

} // namespace detail

// Here, since the floor of RenderContext is below that of uniforms.

void RenderContext::addProperty(const SharedPtr<ShaderUniformBase>& property, const char* name)
{
    m_properties.add(property, name);
}

SharedPtr<ShaderUniformBase> RenderContext::getProperty(const char* name) const
{
    SharedPtr<ShaderUniformBase> property;
    m_properties.link(property, name);
    return property;
}

void RenderContext::linkUniform(SharedPtr<ShaderUniformBase>& uniform, const char* name) const
{
    m_properties.link(uniform, name);
}

} // namespace orv
