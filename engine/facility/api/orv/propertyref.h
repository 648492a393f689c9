#pragma once

#include "orv/appearance.h"

#include <cstdint>
#include <string>

namespace orv
{

/// Remembers where an appearance keeps a property, for those who write it again and again: names are compared
/// only on the first use with an appearance and after its set of properties changed.
class PropertyRef
{
public:
    /// @param name  copied.
    explicit PropertyRef(const char* name) : m_name(name ? name : "") {}

    const char* getName() const { return m_name.c_str(); } ///< The property's name.

    /// The same as Appearance::setProperty.
    template <class T>
    bool set(Appearance& appearance, const T& value, int index = 0)
    {
        if (m_revision != appearance.getPropertyRevision())
            find(appearance);
        if (m_holder && index >= 0) [[likely]]
            return m_holder->setValue(value, index);
        return appearance.setProperty<T>(m_name.c_str(), value, index);
    }

    /// @param value  what the property has; untouched if nothing is returned.
    /// @return what tells the property from all others while the appearance has it; null if it has none of that type.
    template <class T>
    const void* get(Appearance& appearance, T& value, int index = 0)
    {
        if (m_revision != appearance.getPropertyRevision())
            find(appearance);
        return m_holder && m_holder->getValue(value, index) ? m_holder : nullptr;
    }

private:
    void find(Appearance& appearance)
    {
        m_holder = appearance.getPropertyUniform(m_name.c_str()).get();
        m_revision = appearance.getPropertyRevision();
    }

    std::string m_name;
    ShaderUniformBase* m_holder = nullptr; ///< valid while the appearance still has m_revision
    uint64_t m_revision = 0;
};

} // namespace orv
