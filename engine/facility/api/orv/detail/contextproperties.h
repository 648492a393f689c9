#pragma once

#include "orv/export.h"
#include "orv/sharedptr.h"

#include <cstdint>
#include <map>
#include <string>

namespace orv
{

class ShaderUniformBase;

namespace detail
{

/// The holders of a render context's global shader properties, by name.
class ORV_LOCAL ContextProperties
{
public:
    ContextProperties();
    ~ContextProperties();
    ContextProperties(const ContextProperties&) = delete;
    ContextProperties& operator=(const ContextProperties&) = delete;

    void add(const SharedPtr<ShaderUniformBase>& property, const char* name);
    void link(SharedPtr<ShaderUniformBase>& uniform, const char* name) const;

    /// Another number after every add() that stored something.
    uint64_t getRevision() const { return m_revision; }

private:
    std::map<std::string, SharedPtr<ShaderUniformBase>, std::less<>> m_holders;
    uint64_t m_revision;
};

} // namespace detail
} // namespace orv
